#!/usr/bin/env python3
"""Writes a table of what the compiler says about every field and size of the typed records.

usage: record_offsets.py Records.h OUTPUT. Reads the record definitions as text, knowing nothing of how they were made.
"""

import re
import sys

records, fields, name = [], [], None
for line in open(sys.argv[1], encoding="utf-8"):
    start = re.match(r"struct (\w+) : Instance \{", line)
    if start:
        name = start.group(1)
        records.append(f'    {{"{name}", sizeof({name})}},\n')
    field = re.match(r"  (?:Property<.*>|\w+\*) (\w+);$", line)
    if field:
        fields.append(f'    {{"{name}", "{field.group(1)}", offsetof({name}, {field.group(1)})}},\n')

with open(sys.argv[2], "w", encoding="utf-8") as output:
    output.write(f"""// Generated from Records.h by tests/schema/record_offsets.py; changes here are lost.
#include <cstddef>

#include "generated/Records.h"
#include "schema/record_offsets.h"

// The records derive from Instance, for which offsetof is only conditionally supported; GCC supports it.
#pragma GCC diagnostic ignored "-Winvalid-offsetof"

namespace cimrt::test {{

const Record_Size record_sizes[] = {{
{"".join(records)}}};
const std::size_t num_record_sizes = {len(records)};

const Field_Offset field_offsets[] = {{
{"".join(fields)}}};
const std::size_t num_field_offsets = {len(fields)};

}}  // namespace cimrt::test
""")
