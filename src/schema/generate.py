#!/usr/bin/env python3
"""Makes the class data of the provider and of the host programs from the class descriptions.

    generate.py --output FOLDER     write the generated files
    generate.py --check             only read and check the descriptions
    generate.py --reference FILE    write the class reference for people

The schema folder holds *.mof, catalogue.txt and agent_maps.txt; the providers file says how classes are served. A mistake in one of them is reported as
"file:line: what is wrong" and ends the program with status 1. Files whose text does not change are not touched.
"""

import argparse
import sys
from pathlib import Path

sys.dont_write_bytecode = True

from generator import (catalogue, class_model, emit_host, emit_methods, emit_module, emit_mof, emit_records,
                       emit_reference, emit_repository, mof_reader)
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


def generate(classes, served, maps, servings, version, output):
    order = served + [name for name in classes if name not in set(served)]
    emit_records.records(output, classes)
    emit_records.agent_maps(output, maps)
    emit_repository.repository(output, classes, order, len(served))
    emit_methods.methods(output, classes, served)
    emit_module.registrations(output, classes, served, servings, maps)
    emit_module.factories(output, classes, served)
    emit_module.exports(output, classes, served)
    emit_host.class_data(output, classes, set(served), servings)
    emit_mof.server_files(output, classes, served, servings, version)


def main(words=None):
    parser = argparse.ArgumentParser(description=__doc__.split("\n")[0])
    here = Path(__file__).resolve().parent
    parser.add_argument("--schema", type=Path, default=here)
    parser.add_argument("--providers", type=Path, default=here.parent / "derivedObjects" / "providers.txt")
    parser.add_argument("--output", type=Path)
    parser.add_argument("--product-version", default="0", help="what servers are told of the library")
    parser.add_argument("--check", action="store_true")
    parser.add_argument("--reference", type=Path)
    arguments = parser.parse_args(words)
    if not arguments.check and arguments.output is None and arguments.reference is None:
        parser.error("--output, --reference or --check is needed")
    try:
        classes, rows = read_schema(arguments.schema)
        maps = emit_records.read_maps(arguments.schema / "agent_maps.txt", classes)
        served = [row.name for row in rows]
        servings = emit_module.read_providers(arguments.providers, served)
        texts = emit_reference.read_descriptions(arguments.schema / "descriptions.txt", set(served))
        page = emit_reference.reference(classes, served, servings, texts)
        if arguments.reference is not None:
            arguments.reference.write_text(page, encoding="utf-8")
        if not arguments.check and arguments.output is not None:
            generate(classes, served, maps, servings, arguments.product_version, Output(arguments.output))
    except SchemaError as error:
        print(error, file=sys.stderr)
        return 1
    return 0


if __name__ == "__main__":
    sys.exit(main())
