"""Typed records of the classes and the agent's struct of instance maps."""

from . import catalogue, cpp_types
from .errors import SchemaError


def record(cls):
    lines = [f"struct {cls.name} : Instance {{"]
    lines += [f"  {cpp_types.field(v)}" for v in cls.variables]
    lines += ["", "  static const Meta_Class static_meta_class;",
              f"  static {cls.name}* create(bool defaults = true) {{",
              f"    return static_cast<{cls.name}*>(cimrt::create(&static_meta_class, defaults));",
              "  }", "};", ""]
    return "\n".join(lines)


def records(output, classes):
    names = "".join(f"struct {name};\n" for name in classes)
    bodies = "\n".join(record(cls) for cls in classes.values())
    output.write("Records.h", "src/schema/*.mof", f"""//
// One typed record for each class. The fields of a class begin with those of its superclass, at the
// same places, so an instance may be read through any class that it descends from. A reference
// field owns one count of what it points at.
#pragma once

#include "runtime/Instance.h"

namespace cimrt {{

{names}
{bodies}
}}  // namespace cimrt
""")


def read_maps(path, classes):
    """(class name, member name) of every map, in order of declaration."""
    maps, members = [], set()
    for where, words in catalogue.read_lines(path):
        if len(words) > 2:
            raise SchemaError(where, "expected: class [member]")
        if words[0] not in classes:
            raise SchemaError(where, f"unknown class '{words[0]}'")
        member = words[1] if len(words) == 2 else f"m_{words[0]}_map"
        if member in members:
            raise SchemaError(where, f"map '{member}' is declared twice")
        members.add(member)
        maps.append((words[0], member))
    return maps


def agent_maps(output, maps):
    members = "".join(f"  Instance_Map<{name}> {member};\n" for name, member in maps)
    output.write("Agent_Maps.h", "src/schema/agent_maps.txt", f"""//
// The instance maps of the agent, in the order of their construction.
#pragma once

#include "generated/Records.h"
#include "runtime/Instance_Map.h"

namespace cimrt {{

struct Agent_Maps {{
{members}}};

}}  // namespace cimrt
""")
