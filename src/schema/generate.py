#!/usr/bin/env python3
"""Makes the class data of the provider and of the host programs from the class descriptions.

    generate.py --output FOLDER [--schema FOLDER]     write the generated files
    generate.py --check [--schema FOLDER]             only read and check the descriptions

The schema folder holds *.mof, catalogue.txt and agent_maps.txt. A mistake in one of them is reported as
"file:line: what is wrong" and ends the program with status 1. Files whose text does not change are not touched.
"""

import argparse
import sys
from pathlib import Path

sys.dont_write_bytecode = True

from generator import catalogue, class_model, emit_host, emit_records, emit_repository, mof_reader
from generator.errors import SchemaError
from generator.writer import Output


def read_schema(folder):
    declarations = []
    for path in sorted(folder.glob("*.mof")):
        declarations += mof_reader.read_file(path)
    classes = class_model.build(declarations)
    rows = catalogue.read(folder / "catalogue.txt")
    catalogue.check(rows, classes)
    return classes, rows


def generate(classes, rows, maps, output):
    served = [row.name for row in rows]
    order = served + [name for name in classes if name not in set(served)]
    emit_records.records(output, classes)
    emit_records.agent_maps(output, maps)
    emit_repository.repository(output, classes, order)
    emit_host.class_data(output, classes, set(served))


def main():
    parser = argparse.ArgumentParser(description=__doc__.split("\n")[0])
    parser.add_argument("--schema", type=Path, default=Path(__file__).resolve().parent)
    parser.add_argument("--output", type=Path)
    parser.add_argument("--check", action="store_true")
    arguments = parser.parse_args()
    if not arguments.check and arguments.output is None:
        parser.error("--output or --check is needed")
    try:
        classes, rows = read_schema(arguments.schema)
        maps = emit_records.read_maps(arguments.schema / "agent_maps.txt", classes)
        if not arguments.check:
            generate(classes, rows, maps, Output(arguments.output))
    except SchemaError as error:
        print(error, file=sys.stderr)
        return 1
    return 0


if __name__ == "__main__":
    sys.exit(main())
