"""What makes the shared library: registrations, exported factories and the list of exports."""

from dataclasses import dataclass

from . import catalogue
from .errors import SchemaError
from .writer import braces

MODULE_NAME = "torvex_fc_provider_Module"


@dataclass
class Serving:
    """How a class is served."""
    san: bool = False
    interop: bool = False
    header: str = None


def read_providers(path, served):
    """Line by line of the providers file; headers are looked for beside the folder of that file."""
    servings = {}
    for where, words in catalogue.read_lines(path):
        name = words[0]
        if name not in served:
            raise SchemaError(where, f"'{name}' is not a provider class")
        if name in servings:
            raise SchemaError(where, f"'{name}' is named twice")
        serving = servings[name] = Serving()
        for word in words[1:]:
            if word in ("san", "interop"):
                setattr(serving, word, True)
            elif word.endswith(".h"):
                if not (path.parent.parent / word).is_file():
                    raise SchemaError(where, f"there is no header '{word}'")
                serving.header = word
            else:
                raise SchemaError(where, f"expected 'san', 'interop' or a header, found '{word}'")
    return servings


def shape(cls):
    return "association_proc" if cls.is_association else "method_proc" if cls.methods else "plain_proc"


def creator(name, serving):
    return f"create_hand_written<{name}_Provider, {name}>" if serving.header else "create_skeleton"


def enumeration(name, serving, mapped):
    if name not in mapped:
        return "nullptr"
    function = "enumSANInstances" if serving.san else "enumInstances"
    return (f"[](ProviderAgent& agent, const Instance_Handler& handler) {{ "
            f"agent.{function}(agent.m_{name}_map, handler); }}")


def registrations(output, classes, served, servings, maps):
    mapped = {name for name, member in maps if member == f"m_{name}_map"}
    rows = []
    for index, name in enumerate(served):
        serving = servings.get(name, Serving())
        previous = f"&provider_entries[{index - 1}]" if index else "nullptr"
        rows.append(f'{{{{"{MODULE_NAME}", "{name}_Provider", {shape(classes[name])}, '
                    f"&{name}::static_meta_class, {previous}}},\n     {creator(name, serving)},\n"
                    f"     {enumeration(name, serving, mapped)}}}")
    headers = sorted({s.header for s in servings.values() if s.header})
    includes = "".join(f'#include "{header}"\n' for header in headers)
    output.write("Registrations.cpp", "src/schema/*.mof and src/derivedObjects/providers.txt", f"""#include "agent/ProviderAgent.h"
#include "derivedObjects/Dispatcher.h"
#include "derivedObjects/Hand_Written_Provider.h"
{includes}
namespace cimrt {{

constinit const Provider_Entry provider_entries[] = {{
{braces(rows)}}};

}}  // namespace cimrt
""")


def kinds(cls):
    return ("Instance", "Method", "Association") if cls.is_association else ("Instance", "Method")


def factory(index, name, kind):
    result = f"CMPI{kind}MI*"
    arguments = "const CMPIBroker* broker, const CMPIContext* context, CMPIStatus*"
    full = f"{name}_Provider_Create_{kind}MI"
    return (f'extern "C" TVX_EXPORT {result} {full}({arguments}) {{\n'
            f"  return static_cast<{result}>(cimrt::make_interface({index}, broker, context, '{kind[0]}'));\n}}\n"
            f'extern "C" TVX_EXPORT {result} {name}_Create_{kind}MI({arguments} status) {{\n'
            f"  return {full}(broker, context, status);\n}}\n")


def factories(output, classes, served):
    text = "\n".join(factory(i, name, kind) for i, name in enumerate(served) for kind in kinds(classes[name]))
    output.write("Factories.cpp", "src/schema/*.mof", f"""#include "derivedObjects/Factory.h"

{text}""")


def exports(output, classes, served):
    """The linker's version script: these symbols and no others leave the library."""
    names = [f"{name}{form}_Create_{kind}MI" for name in served for kind in kinds(classes[name])
             for form in ("_Provider", "")]
    symbols = "".join(f"    {name};\n" for name in sorted(names) + ["cimrt_module"])
    output.write("exports.map", "src/schema/*.mof", f"{{\n  global:\n{symbols}  local:\n    *;\n}};\n", comment="#")
