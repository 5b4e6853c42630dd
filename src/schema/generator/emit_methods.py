"""Typed records of method calls, and the dispatch of a call to a hand-written provider."""

from . import cpp_types


def record_name(cls, method):
    """Records are shared by all classes that inherit the method; the class that declares it gives the name."""
    owner = cls
    while owner.super_class and method in owner.super_class.features:
        owner = owner.super_class
    return f"{owner.name}_{method.name}"


def record(name, method):
    fields = "".join(f"  {cpp_types.field(p)}\n" for p in method.parameters)
    return f"struct {name} : Instance {{\n{fields}}};\n\n"


def case(cls, method):
    name = record_name(cls, method)
    arguments = ", ".join(["instance"] + [f"call->{p.name}" for p in method.parameters])
    return (f"  if constexpr (requires {{ &P::{method.name}; }}) {{\n"
            f"    if (name_eq(method, \"{method.name}\")) {{\n"
            f"      auto* call = static_cast<{name}*>(record);\n"
            f"      return provider.{method.name}({arguments});\n"
            f"    }}\n"
            f"  }}\n")


def dispatch(cls):
    cases = "".join(case(cls, m) for m in cls.methods)
    return (f"template <class P>\nstd::int32_t invoke_method([[maybe_unused]] P& provider, [[maybe_unused]] const char* method,\n"
            f"                           [[maybe_unused]] {cls.name}* instance,\n"
            f"                           [[maybe_unused]] Instance* record) {{\n{cases}"
            f"  return INVOKE_METHOD_UNSUPPORTED;\n}}\n\n")


def methods(output, classes, served):
    with_methods = [classes[name] for name in served if classes[name].methods]
    records = {record_name(cls, m): m for cls in with_methods for m in cls.methods}
    output.write("Methods.h", "src/schema/*.mof", f"""//
// The record of a method call, for each method of the provider's classes, and the step from it to
// the method of a hand-written provider. A provider that lacks the method answers "unsupported".
#pragma once

#include "generated/Records.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {{

{"".join(record(name, m) for name, m in sorted(records.items()))}/// For a class without methods.
template <class P>
std::int32_t invoke_method(P&, const char*, Instance*, Instance*) {{
  return INVOKE_METHOD_UNSUPPORTED;
}}

{"".join(dispatch(cls) for cls in with_methods)}}}  // namespace cimrt
""")
