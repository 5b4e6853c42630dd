#!/usr/bin/env python3
"""Writes the factories, the list of exports and the names of the test library's classes, with the functions that write those of
the provider library:

    factories.py SCHEMA_FOLDER OUTPUT_FOLDER CLASS...

Every class gets factories of all three kinds, also those that are no associations: their walks are tried as well.
"""

import sys
from pathlib import Path
from types import SimpleNamespace

sys.dont_write_bytecode = True


def main(schema, folder, *names):
    sys.path.insert(0, schema)
    from generator import emit_module
    from generator.writer import Output

    class Own_Output(Output):
        """Names the true source of the files, and writes them whether their text changes or not."""

        def write(self, name, inputs, text, comment="//"):
            text = text.replace("    cimrt_module;\n", "    cimrt_module;\n    cmpi_test_control;\n")
            self.folder.mkdir(parents=True, exist_ok=True)
            (self.folder / name).write_text(f"{comment} Generated from tests/cmpi/CMakeLists.txt.\n{text}")

    output = Own_Output(Path(folder))
    classes = {name: SimpleNamespace(is_association=True) for name in names}
    emit_module.factories(output, classes, names)
    emit_module.exports(output, classes, names)
    texts = ", ".join(f'"{name}"' for name in names)
    output.write("Served_Names.h", "", f"#pragma once\n\nnamespace cimrt::test {{\n"
                                       f"inline constexpr const char* served_names[] = {{{texts}}};\n}}\n")


main(*sys.argv[1:])
