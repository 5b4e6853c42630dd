"""Class descriptions for the host programs, which know nothing of the provider's meta data."""

from .class_model import ROOT
from .writer import Pool, braces

NAME_SPACE = "root/torvex"
INTEROP_NAME_SPACE = "root/pg_interop"


def text(value):
    return "nullptr" if value is None else '"' + value.replace("\\", "\\\\").replace('"', '\\"') + '"'


def truth(value):
    return "true" if value else "false"


def cmpi_type(variable):
    if variable.is_reference:
        return "CMPI_instance" if variable.embedded else "CMPI_ref"
    return f"CMPI_{variable.type}" if variable.type != "datetime" else "CMPI_dateTime"


def feature(variable):
    q = variable.qualifiers
    target = None if variable.target in (None, ROOT) else variable.target.name
    bools = (variable.is_array, variable.is_key, q.get("In"), q.get("Out"), q.get("Write"))
    return (f"{{{text(variable.name)}, {cmpi_type(variable)}, {', '.join(truth(b) for b in bools)}, "
            f"{text(target)}, {text(variable.default)}, {text(variable.origin)}}}")


def name_space(cls, served, servings):
    """Where the class's instances live; None if nothing here serves it."""
    if cls.name not in served:
        return None
    return INTEROP_NAME_SPACE if cls.name in servings and servings[cls.name].interop else NAME_SPACE


def class_data(output, classes, served, servings):
    features, methods = Pool(), Pool()
    rows = []
    for cls in classes.values():
        feature_start = features.place([feature(v) for v in cls.variables])
        entries = []
        for m in cls.methods:
            start = features.place([feature(p) for p in m.parameters[:-1]])
            entries.append(f"{{{text(m.name)}, {cmpi_type(m.parameters[-1])}, &features[{start}], "
                           f"{len(m.parameters) - 1}, {text(m.origin)}}}")
        method_start = methods.place(entries)
        bools = ("Association" in cls.qualifiers, "Aggregation" in cls.qualifiers, "Abstract" in cls.qualifiers,
                 "Indication" in cls.qualifiers, cls.name in served)
        rows.append(f"{{{text(cls.name)}, {text(cls.super_class.name if cls.super_class else None)}, "
                    f"{', '.join(truth(b) for b in bools)}, {text(name_space(cls, served, servings))}, "
                    f"&features[{feature_start}], {len(cls.variables)}, &methods[{method_start}], {len(cls.methods)}}}")
    output.write("host_class_data.cpp", "src/schema/*.mof and src/derivedObjects/providers.txt", f"""#include "cmpi/cmpidt.h"
#include "schema/ClassData.h"

namespace tvx::host {{

namespace {{

constexpr FeatureData features[] = {{
{braces(features.items)}}};

constexpr MethodData methods[] = {{
{braces(methods.items)}}};

}}  // namespace

const ClassData allClasses[] = {{
{braces(rows)}}};

const std::size_t allClassCount = {len(rows)};

}}  // namespace tvx::host
""")
