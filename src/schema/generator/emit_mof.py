"""The classes in MOF and the registrations for CIM servers."""

from .class_model import ROOT
from .emit_host import INTEROP_NAME_SPACE, NAME_SPACE

INPUTS = "src/schema/*.mof and src/derivedObjects/providers.txt"
LIBRARY = "torvex_fc_provider"
MODULE = "TorvexFCProviderModule"
# Class of the associations that tell which elements conform to a profile.
CONFORMANCE = "CIM_ElementConformsToProfile"
INSTANCE, ASSOCIATION, METHOD = "instance", "association", "method"
# Values of PG_ProviderCapabilities.ProviderType.
TYPE_NUMBERS = {INSTANCE: 2, ASSOCIATION: 3, METHOD: 5}


# ---- What is registered ----

def interfaces(cls):
    """The kinds of requests that a class's provider takes."""
    return [INSTANCE] + ([ASSOCIATION] if cls.is_association else []) + ([METHOD] if cls.methods else [])


def is_a(cls, name):
    return cls.name == name or (cls.super_class is not None and is_a(cls.super_class, name))


def name_spaces(cls, servings):
    """Profiles and what conforms to them are also seen from the interop namespace."""
    interop = (cls.name in servings and servings[cls.name].interop) or is_a(cls, CONFORMANCE)
    return [NAME_SPACE] + ([INTEROP_NAME_SPACE] if interop else [])


# ---- Classes ----

def qualifier(name, value):
    if isinstance(value, str):
        return f'{name}("{value}")'
    return name if value else f"{name}(false)"


def qualifiers(values):
    return f"[{', '.join(qualifier(*each) for each in values.items())}] " if values else ""


def declared(variable):
    """Type and name."""
    if variable.is_reference and not variable.embedded:
        target = "CIM_ManagedElement" if variable.target is ROOT else variable.target.name
        return f"{target} REF {variable.name}"
    return f"{variable.type} {variable.name}"


def feature_text(feature):
    start = qualifiers(feature.qualifiers)
    if feature.kind == "method":
        parameters = ",".join(f"\n    {qualifiers(p.qualifiers)}{declared(p)}{'[]' if p.is_array else ''}"
                              for p in feature.parameters[:-1])
        return f"  {start}{feature.type} {feature.name}({parameters});\n"
    default = "" if feature.default is None else f" = {feature.default}"
    return f"  {start}{declared(feature)}{'[]' if feature.is_array else ''}{default};\n"


def class_text(cls):
    start = f"[{', '.join(qualifier(*each) for each in cls.qualifiers.items())}]\n" if cls.qualifiers else ""
    parent = f" : {cls.super_class.name}" if cls.super_class else ""
    own = "".join(feature_text(f) for f, local in zip(cls.features, cls.locals) if local)
    return f"{start}class {cls.name}{parent} {{\n{own}}};\n"


def in_order(classes):
    """Superclasses before subclasses, and associations behind the classes that they join."""
    done = []

    def place(cls):
        if cls.super_class is not None:
            place(cls.super_class)
        if cls not in done:
            done.append(cls)

    for cls in classes:
        place(cls)
    return [c for c in done if not c.is_association] + [c for c in done if c.is_association]


def classes_text(classes, wanted):
    return "\n".join(class_text(cls) for cls in in_order(classes.values()) if cls.name in wanted)


# ---- Registrations ----

def instance_text(class_name, properties):
    lines = "".join(f"  {name} = {value};\n" for name, value in properties)
    return f"instance of {class_name} {{\n{lines}}};\n"


def provider_name(cls):
    return f"{cls.name}_Provider"


def capabilities(cls, servings):
    spaces = ", ".join(f'"{each}"' for each in name_spaces(cls, servings))
    types = ", ".join(str(TYPE_NUMBERS[each]) for each in interfaces(cls))
    return instance_text("PG_ProviderCapabilities", [
        ("ProviderModuleName", f'"{MODULE}"'), ("ProviderName", f'"{provider_name(cls)}"'),
        ("CapabilityID", f'"{cls.name}"'), ("ClassName", f'"{cls.name}"'), ("Namespaces", f"{{{spaces}}}"),
        ("ProviderType", f"{{{types}}}"), ("SupportedProperties", "NULL"), ("SupportedMethods", "NULL")])


def pegasus_text(served, servings, version):
    module = instance_text("PG_ProviderModule", [
        ("Name", f'"{MODULE}"'), ("Vendor", '"Torvex Corporation"'), ("Version", f'"{version}"'),
        ("InterfaceType", '"CMPI"'), ("InterfaceVersion", '"2.0.0"'), ("Location", f'"{LIBRARY}"')])
    providers = [instance_text("PG_Provider", [("ProviderModuleName", f'"{MODULE}"'),
                                               ("Name", f'"{provider_name(cls)}"')]) for cls in served]
    return "\n".join([module, *providers, *(capabilities(cls, servings) for cls in served)])


def stanza(cls, servings):
    """All classes share one process, since they share what is found of the adapters."""
    return (f"[{cls.name}]\n"
            f"   provider: {provider_name(cls)}\n"
            f"   location: {LIBRARY}\n"
            f"   type: {' '.join(interfaces(cls))}\n"
            f"   namespace: {' '.join(name_spaces(cls, servings))}\n"
            f"   group: {LIBRARY}\n"
            f"   unload: never\n")


def server_files(output, classes, served, servings, version):
    """`served` are names; `version` is the product's."""
    own = [classes[name] for name in served]
    interop = {cls.name for cls in own if INTEROP_NAME_SPACE in name_spaces(cls, servings)}
    output.write("server/mof/torvex_fc_cim.mof", INPUTS, classes_text(classes, set(classes) - set(served)))
    output.write("server/mof/torvex_fc_provider.mof", INPUTS, classes_text(classes, set(served)))
    output.write("server/mof/torvex_fc_interop.mof", INPUTS, classes_text(classes, interop))
    output.write("server/registration/torvex_fc_pegasus.mof", INPUTS, pegasus_text(own, servings, version))
    output.write("server/registration/torvex_fc_sfcb.reg", INPUTS,
                 "\n".join(stanza(cls, servings) for cls in own), comment="#")
