#!/usr/bin/env python3
"""Makes a firmware image that the simulated adapters accept."""
import argparse
import os
import struct
import sys
import zlib


def main() -> int:
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("output", help="file to write")
    parser.add_argument("--version", required=True, help='firmware version, such as "2.02a1"')
    parser.add_argument("--model", default="", help="start of the models it is for; default: all")
    parser.add_argument("--size", type=int, default=4096, help="bytes of payload")
    options = parser.parse_args()
    version, model = options.version.encode(), options.model.encode()
    if not 0 < len(version) < 16 or len(model) > 15 or options.size < 0:
        print("make_firmware: a text is too long, or the size is negative", file=sys.stderr)
        return 2
    payload = os.urandom(options.size)
    header = struct.pack("<8sII16s16sI12s", b"TVXFWIMG", 1, len(payload), version, model,
                         zlib.crc32(payload), b"")
    with open(options.output, "wb") as image:
        image.write(header + payload)
    return 0


if __name__ == "__main__":
    sys.exit(main())
