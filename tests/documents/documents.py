"""What the documents hold: blocks of commands, words in code, examples of manual pages."""
import re
from dataclasses import dataclass, field
from pathlib import Path

COMMANDS = ("console", "sh")  # languages of blocks that are commands
OTHERS = ("text", "mof", "json", "cpp")  # what a block may hold besides
COMMAND_LIKE = re.compile(r"\$ |(scripts/\w+\.sh|tvxcim|wbemcli|torvex-fc-register|cmake|ctest|ninja|python3|apt|source)( |$)")
FENCE = re.compile(r"^(\s*)```(\S*)\s*$")


@dataclass
class Command:
    line: int
    text: str  # as written, a trailing backslash joined with what follows
    expected: list = field(default_factory=list)  # lines that it prints, if the document shows any


@dataclass
class Block:
    line: int
    language: str
    lines: list


class Mistake(Exception):
    """What is wrong with a document, and where."""


def blocks(path):
    """The fenced blocks of a document, and its text without them, by line number."""
    found, prose, inside = [], [], None
    for number, line in enumerate(path.read_text(encoding="utf-8").splitlines(), 1):
        fence = FENCE.match(line)
        if inside is None and fence:
            inside, indent = Block(number, fence[2], []), len(fence[1])
        elif inside is not None and fence and not fence[2]:
            found.append(inside)
            inside = None
        elif inside is not None:
            inside.lines.append(line[indent:])
        else:
            prose.append((number, line))
    if inside is not None:
        raise Mistake("%s:%d: the block has no end" % (path.name, inside.line))
    return found, prose


def check_forms(path, found, prose):
    """Every block tells what it holds, so that no command hides in one that is not run."""
    for block in found:
        if block.language not in COMMANDS + OTHERS:
            raise Mistake("%s:%d: a block is one of %s, not '%s'" %
                          (path.name, block.line, ", ".join(COMMANDS + OTHERS), block.language))
        hidden = [line for line in block.lines if COMMAND_LIKE.match(line)] if block.language in OTHERS else []
        if hidden:
            raise Mistake("%s:%d: the block holds a command, '%s'" % (path.name, block.line, hidden[0]))
    blank = True
    for number, line in prose:
        if blank and re.match(r" {4}|\t", line) and not re.match(r"\s*([-*]|\d+\.) ", line):
            raise Mistake("%s:%d: write a block with its language, not an indented one" % (path.name, number))
        blank = not line.strip() or (blank and line.startswith("    "))


def shell_commands(block):
    """The commands of a block. In one marked `console` they begin with "$ ", further lines with
    "> ", and their output follows."""
    found = []
    for offset, line in enumerate(block.lines):
        number = block.line + 1 + offset
        if found and found[-1].text.endswith("\\"):
            found[-1].text = found[-1].text[:-1] + line.strip()
        elif block.language == "sh":
            if line.strip() and not line.lstrip().startswith("#"):
                found.append(Command(number, line.strip()))
        elif line.startswith("$ "):
            found.append(Command(number, line[2:]))
        elif line.startswith("> ") and found and not found[-1].expected:
            found[-1].text += "\n" + line[2:]
        elif found:
            found[-1].expected.append(line)
        else:
            raise Mistake("line %d: a console block begins with '$ command'" % number)
    return found


def code_words(prose):
    """(line number, text) of everything that stands in backquotes outside of blocks."""
    whole = "\n".join(line for _, line in prose)
    starts = [number for number, _ in prose]
    for match in re.finditer(r"`([^`\n]+)`", whole):
        yield starts[whole.count("\n", 0, match.start())], match[1]


def manual_examples(path):
    """The commands of a manual page's section EXAMPLES."""
    text = path.read_text(encoding="utf-8")
    section = re.search(r"^\.SH EXAMPLES\n(.*?)(?=^\.SH |\Z)", text, re.M | re.S)
    if not section:
        raise Mistake("%s has no examples" % path.name)
    first = text.count("\n", 0, section.start(1)) + 1
    block = Block(first, "sh", [])
    for line in section[1].splitlines():
        block.lines.append("" if line.startswith(".") else line.replace("\\-", "-").replace("\\e", "\\"))
    return block


def help_examples(text):
    """The commands behind "Examples:" of a program's help."""
    return Block(0, "sh", [line for line in text.partition("Examples:\n")[2].splitlines() if line.startswith("  ")])


def all_documents(source):
    """Documents for people: those of docs, and every README of the tree."""
    return sorted(Path(source).glob("docs/*.md")) + [Path(source) / "README.md", Path(source) / "sim/README.md"]
