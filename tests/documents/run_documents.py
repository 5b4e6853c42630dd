#!/usr/bin/env python3
"""Runs the commands that the documents show, and compares what they print.

A block marked `console` holds lines "$ command" with the expected output behind each; a line "..." in it stands
for any number of lines. A block marked `sh` holds commands alone. Both run in a shell of their own, in a copy of
the tree that a document keeps; a listener runs until its block ends. Every command must end with 0, unless the block
shows otherwise by `; echo "exit code $?"`. Commands that build or change the machine meet stand-ins (stand_in.py);
the few that are not run are listed with their reasons (listed.py). Commands in running text are checked by what
their programs tell of themselves. Blocks of other kinds say so, so that no command escapes.

usage: run_documents.py --build FOLDER --source FOLDER
"""
import argparse
import re
import sys
from concurrent.futures import ThreadPoolExecutor
from pathlib import Path

import documents
import listed
import words_in_text
from session import SERVERS, Session


def matches(expected, actual):
    """Whether the printed lines are the expected ones, "..." standing for any."""
    if not expected:
        return True
    pattern = ""
    for line in expected:
        pattern += "(?:.*\n)*" if line.strip() == "..." else re.escape(line.rstrip()) + " *\n"
    return re.fullmatch(pattern, "".join(line.rstrip() + "\n" for line in actual)) is not None


def without_comment(text):
    return re.sub(r"\s+# .*$", "", text)


def run_block(session, place, block, used):
    """(number of commands run, failures) of a block; one that registers is run with both kinds of servers."""
    commands, failures = [], []
    for command in documents.shell_commands(block):
        text = without_comment(command.text)
        if text in listed.LISTED:
            used.add(text)
            wrong = listed.script_help(session.source, text.split())
            failures += ["%s:%d: %s" % (place, command.line, wrong)] if wrong else []
        else:
            commands.append(command)
    registers = any(command.text.startswith("torvex-fc-register") for command in commands)
    for server in SERVERS if registers else ["pegasus"]:
        session.asked.write_text("")
        results = session.run([command.text for command in commands], server)
        for command, result in zip(commands, results):
            where = "%s:%d: %s" % (place, command.line, command.text)
            if result.status != 0:
                failures.append("%s\n  ended with %d:\n%s" % (where, result.status, result.output))
            elif not matches(command.expected, result.output.splitlines()):
                failures.append("%s\n  printed:\n%s  instead of:\n%s" %
                                (where, result.output, "\n".join(command.expected)))
        if results[-1].status > 0:
            failures.append("%s:%d: the listener ended with %d" % (place, block.line, results[-1].status))
    return len(commands), failures


def run_blocks(place, blocks, words):
    """What run_block gives, over several blocks in one tree; and the listed commands that were met."""
    session, used, count, failures = Session(words.source, words.build), set(), 0, []
    try:
        if any(line.startswith("torvex-fc-register") for block in blocks for line in block.lines):
            installed = session.run(["cmake --install build/release"])[0]
            failures += [installed.output] if installed.status != 0 else []
        for block in blocks:
            run, wrong = run_block(session, place, block, used)
            count, failures = count + run, failures + wrong
    finally:
        session.close()
    return place, count, failures, used


def read_document(path, source):
    """Blocks of commands, those in running text among them, and failures of what else stands there."""
    found, prose = documents.blocks(path)
    documents.check_forms(path, found, prose)
    checker = words_in_text.Checker(source, path.parent)
    result, failures = [block for block in found if block.language in documents.COMMANDS], []
    for line, text in documents.code_words(prose):
        wrong = checker.check(text)
        failures += ["%s:%d: `%s`: %s" % (path.name, line, text, wrong)] if wrong else []
        if words_in_text.RUN.match(text):
            result.append(documents.Block(line - 1, "sh", [text]))
    return result, failures


def collect(words):
    """(name, blocks) of all places of commands, and failures of reading them."""
    places, failures = [], []
    source = Path(words.source)
    words_in_text.Checker.program = Path(words.build) / "bin/tvxcim"
    for path in documents.all_documents(source):
        try:
            blocks, wrong = read_document(path, source)
            places.append((str(path.relative_to(source)), blocks))
            failures += wrong
        except documents.Mistake as mistake:
            failures.append(str(mistake))
    for page in sorted(source.glob("*/*.[18]")) + sorted(source.glob("*/man/*.[18]")):
        places.append((page.name, [documents.manual_examples(page)]))
    help_text = words_in_text.Checker.help_of([])
    places.append(("tvxcim --help", [documents.help_examples(help_text)]))
    return places, failures


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--build", required=True, help="the build whose programs are run")
    parser.add_argument("--source", required=True, help="the source tree")
    words = parser.parse_args()
    places, failures = collect(words)
    used = set()
    with ThreadPoolExecutor(2) as pool:
        for place, count, wrong, met in pool.map(lambda each: run_blocks(*each, words), [p for p in places if p[1]]):
            print("%s: %d commands, %d failures" % (place, count, len(wrong)))
            failures += wrong
            used |= met
            if count == 0 and not met:
                failures.append("%s: no command was found" % place)
    failures += ["%s is listed, and no document has it" % text for text in set(listed.LISTED) - used]
    print("\n".join(failures))
    return 1 if failures else 0


if __name__ == "__main__":
    sys.dont_write_bytecode = True
    sys.exit(main())
