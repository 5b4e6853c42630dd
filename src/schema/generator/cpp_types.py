"""How CIM types are written in C++."""

CPP_TYPE = {"boolean": "bool", "uint8": "std::uint8_t", "sint8": "std::int8_t", "uint16": "std::uint16_t",
            "sint16": "std::int16_t", "uint32": "std::uint32_t", "sint32": "std::int32_t", "uint64": "std::uint64_t",
            "sint64": "std::int64_t", "real32": "float", "real64": "double", "char16": "char16_t",
            "string": "String", "datetime": "Datetime"}


def field(variable):
    """Declaration of the storage of a property, reference or parameter in a typed record."""
    if variable.is_reference and variable.is_array:
        return f"Property<Array<Instance*>> {variable.name};"
    if variable.is_reference:
        return f"{variable.target.name}* {variable.name};"
    inner = CPP_TYPE[variable.type]
    return f"Property<Array<{inner}>> {variable.name};" if variable.is_array else f"Property<{inner}> {variable.name};"
