"""Constant meta data of all classes: a few big tables that need no code to be built."""

from . import cpp_types
from .mof_reader import TYPES
from .writer import Pool, braces

# Names of the type codes in the runtime.
CODE_NAME = {name: name.upper() for name in TYPES}
FLAG_OF_QUALIFIER = {
    "Abstract": "ABSTRACT", "Aggregate": "AGGREGATE", "Aggregation": "AGGREGATION", "Association": "ASSOCIATION",
    "Composition": "COMPOSITION", "Counter": "COUNTER", "Delete": "DELETE", "DN": "DN",
    "EmbeddedObject": "EMBEDDED_OBJECT", "Exception": "EXCEPTION", "Expensive": "EXPENSIVE",
    "Experimental": "EXPERIMENTAL", "Gauge": "GAUGE", "IfDeleted": "IF_DELETED", "In": "IN",
    "Indication": "INDICATION", "Invisible": "INVISIBLE", "Key": "KEY", "Large": "LARGE",
    "OctetString": "OCTET_STRING", "Out": "OUT", "Required": "REQUIRED", "Static": "STATIC",
    "Terminal": "TERMINAL", "Weak": "WEAK", "Write": "WRITE", "EmbeddedInstance": "EMBEDDED_INSTANCE"}


def flags(names, qualifiers):
    names = names + [FLAG_OF_QUALIFIER[q] for q, value in sorted(qualifiers.items()) if value and q in FLAG_OF_QUALIFIER]
    return " | ".join(f"FLAG_{name}" for name in names)


def head(flag_text, name):
    return f'{{0, {flag_text}, "{name}", nullptr, 0}}'


class Tables:
    """Numbers every object once; an inherited feature is the superclass's very object."""

    def __init__(self, classes):
        self.classes = classes
        self.values, self.value_index = [], {}
        self.properties, self.references, self.methods = [], [], []
        self.places = {}
        self.parameters, self.features = Pool(), Pool()
        for cls in classes.values():
            for feature in cls.features:
                self.place(feature)

    def place(self, feature):
        """Expression for the address of a feature's description."""
        if feature not in self.places:
            if feature.kind == "method":
                self.places[feature] = self.add_method(feature)
            elif feature.is_reference:
                self.places[feature] = self.add_reference(feature)
            else:
                self.places[feature] = self.add_property(feature)
        return self.places[feature]

    def value(self, variable):
        if variable.default is None:
            return "nullptr"
        key = (variable.type, variable.default)
        if key not in self.value_index:
            self.value_index[key] = len(self.value_index)
        return f"&values[{self.value_index[key]}]"

    def add_property(self, p):
        self.properties.append(f"{{{head(flags(['PROPERTY', 'READ'], p.qualifiers), p.name)}, "
                               f"{CODE_NAME[p.type]}, {-1 if p.is_array else 0}, {p.offset}, {self.value(p)}}}")
        return f"&properties[{len(self.properties) - 1}]"

    def add_reference(self, r):
        target = f"&{r.target.name}::static_meta_class"
        self.references.append(f"{{{head(flags(['REFERENCE', 'READ'], r.qualifiers), r.name)}, "
                               f"{-1 if r.is_array else 0}, {target}, {r.offset}}}")
        return f"&references[{len(self.references) - 1}]"

    def add_method(self, m):
        start = self.parameters.place([self.place(p) for p in m.parameters])
        self.methods.append(f"{{{{{head(flags(['METHOD'], m.qualifiers), m.name)}, &parameters[{start}], "
                            f"{len(m.parameters)}, {m.size}}}, {CODE_NAME[m.type]}}}")
        return f"&methods[{len(self.methods) - 1}]"

    def value_definitions(self):
        plain, rows = [], []
        for (kind, text), index in self.value_index.items():
            if kind in ("string", "datetime"):
                rows.append(f"{{{text}, 1}}")
            else:
                plain.append(f"constexpr {cpp_types.CPP_TYPE[kind]} value_{index} = {text};\n")
                rows.append(f"{{&value_{index}, 1}}")
        return "".join(plain), braces(rows)


def class_definition(cls, tables, locals_pool):
    kind = [] if cls.is_association or "Indication" in cls.qualifiers else ["CLASS"]
    features = tables.features.place([tables.place(f) for f in cls.features])
    local = locals_pool.place([str(byte) for byte in cls.locals])
    parent = f"&{cls.super_class.name}::static_meta_class" if cls.super_class else "nullptr"
    text = flags(kind, cls.qualifiers) or "0"
    return (f"constinit const Meta_Class {cls.name}::static_meta_class = {{\n"
            f"    {{{head(text, cls.name)}, &features[{features}], {len(cls.features)}, {cls.size}}},\n"
            f"    &locals[{local}], {parent}, {len(cls.keys)}, &meta_repository}};\n")


def repository(output, classes, order, num_served):
    tables, locals_pool = Tables(classes), Pool()
    definitions = "".join(class_definition(classes[name], tables, locals_pool) for name in order)
    plain, values = tables.value_definitions()
    output.write("Repository.h", "src/schema/*.mof", f"""#pragma once

#include "runtime/Meta_Class.h"

namespace cimrt {{

/// Every class that the system knows, the provider's own first.
extern const Meta_Repository meta_repository;

/// Number of the provider's own classes.
inline constexpr std::size_t num_provider_classes = {num_served};

}}  // namespace cimrt
""")
    output.write("Repository.cpp", "src/schema/*.mof", f"""#include "generated/Repository.h"

#include "generated/Records.h"

namespace cimrt {{

namespace {{

{plain}
constinit const Meta_Value values[] = {{
{values}}};

constinit const Meta_Property properties[] = {{
{braces(tables.properties)}}};

constinit const Meta_Reference references[] = {{
{braces(tables.references)}}};

constinit const Meta_Feature* const parameters[] = {{
{braces(tables.parameters.items)}}};

constinit const Meta_Method methods[] = {{
{braces(tables.methods)}}};

constinit const Meta_Feature* const features[] = {{
{braces(tables.features.items)}}};

constexpr std::uint8_t locals[] = {{
{braces([", ".join(locals_pool.items[i:i + 40]) for i in range(0, len(locals_pool.items), 40)])}}};

constinit const Meta_Class* const classes[] = {{
{braces([f"&{name}::static_meta_class" for name in order])}}};

}}  // namespace

constinit const Meta_Repository meta_repository = {{classes, {len(order)}}};

{definitions}
}}  // namespace cimrt
""")
