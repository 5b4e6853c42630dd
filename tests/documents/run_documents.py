#!/usr/bin/env python3
"""Runs the commands that the documents show and compares what they print.

A block marked `console` holds lines "$ command" with the expected output behind each; a line "..." in
it stands for any number of lines. Every command must end with 0, unless the block shows otherwise by
`; echo "exit code $?"`. The commands of one document share a folder and a simulated host of its own.

usage: run_documents.py --bin FOLDER FILE.md...
"""
import argparse
import os
import re
import subprocess
import sys
import tempfile

SECONDS = 120


def blocks(path):
    """(line number, lines) of each console block."""
    inside, first, lines, indent = False, 0, [], 0
    for number, line in enumerate(open(path, encoding="utf-8"), 1):
        line = line.rstrip("\n")
        if not inside and line.strip() == "```console":
            inside, first, lines, indent = True, number + 1, [], line.index("`")
        elif inside and line.strip() == "```":
            inside = False
            yield first, lines
        elif inside:
            lines.append(line[indent:])


def commands(first, lines):
    """(line number, command, expected lines) of each command of a block; a trailing backslash goes on."""
    found = []
    for offset, line in enumerate(lines):
        if line.startswith("$ "):
            found.append([first + offset, line[2:], []])
        elif found and found[-1][1].endswith("\\"):
            found[-1][1] = found[-1][1][:-1] + line.strip()
        elif found:
            found[-1][2].append(line)
        else:
            raise ValueError("line %d: a console block starts with '$ command'" % first)
    return found


def matches(expected, actual):
    """Whether the printed lines are the expected ones, "..." standing for any."""
    if not expected:
        return True
    pattern = ""
    for line in expected:
        pattern += "(?:.*\n)*" if line.strip() == "..." else re.escape(line.rstrip()) + " *\n"
    return re.fullmatch(pattern, "".join(line.rstrip() + "\n" for line in actual)) is not None


def run(path, environment, folder):
    """Failures of one document."""
    failures, count = [], 0
    for first, lines in blocks(path):
        for number, command, expected in commands(first, lines):
            count += 1
            done = subprocess.run(["bash", "-c", command], cwd=folder, env=environment, text=True,
                                  stdout=subprocess.PIPE, stderr=subprocess.STDOUT, timeout=SECONDS)
            place = "%s:%d: %s" % (os.path.basename(path), number, command)
            if done.returncode != 0:
                failures.append("%s\n  ended with %d:\n%s" % (place, done.returncode, done.stdout))
            elif not matches(expected, done.stdout.splitlines()):
                failures.append("%s\n  printed:\n%s  instead of:\n%s" %
                                (place, done.stdout, "\n".join(expected)))
    return count, failures


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--bin", required=True, help="folder of tvxcim")
    parser.add_argument("--source", required=True, help="the source tree, $TVX_SOURCE for the commands")
    parser.add_argument("documents", nargs="+")
    words = parser.parse_args()
    total, failures = 0, []
    for document in words.documents:
        with tempfile.TemporaryDirectory(prefix="tvx_documents_") as folder:
            environment = {**os.environ, "PATH": words.bin + ":" + os.environ["PATH"], "TMPDIR": folder,
                           "HOME": folder, "TVX_SOURCE": words.source}
            for name in ("TVX_ROOT", "TVX_SIM_STATE", "TVX_SIM_SCENARIO", "LD_LIBRARY_PATH"):
                environment.pop(name, None)
            count, found = run(document, environment, folder)
        print("%s: %d commands, %d failures" % (os.path.basename(document), count, len(found)))
        total += count
        failures += found
    print("\n".join(failures))
    return 1 if failures or total == 0 else 0


if __name__ == "__main__":
    sys.exit(main())
