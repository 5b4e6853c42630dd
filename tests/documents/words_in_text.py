"""Checks commands, files and manual pages that stand in running text."""
import re
import subprocess
from pathlib import Path

import listed

RUN = re.compile(r"(?:[A-Z_]+=\S+ )?(?:cmake|ctest|ninja|python3|torvex-fc-register|cimprovider) [a-z-]")
FOLDERS = "src|tests|host|sim|docs|scripts|packaging|fuzz|bench|include"


class Checker:
    """Takes what stands in backquotes; tells what is wrong with it, or None."""

    program = None  # the built tvxcim
    helps = {}

    def __init__(self, source, folder):
        self.source, self.folder = Path(source), folder

    @classmethod
    def help_of(cls, words):
        """The help of a command of tvxcim, or None if there is no such command."""
        key = tuple(words)
        if key not in cls.helps:
            done = subprocess.run([cls.program, *words, "--help"], text=True, stdout=subprocess.PIPE,
                                  stderr=subprocess.STDOUT, timeout=20)
            cls.helps[key] = done.stdout if done.returncode == 0 else None
        return cls.helps[key]

    def families(self):
        section = self.help_of([]).partition("Subcommands:\n")[2].partition("\n\n")[0]
        return [line.split()[0] for line in section.splitlines() if line.strip()]

    def check(self, text):
        words = text.split()
        while len(words) > 1 and re.fullmatch(r"[A-Z_]+=\S*", words[0]):
            words = words[1:]
        if page := re.fullmatch(r"([a-z-]+)\(([18])\)", text):
            return None if list(self.source.glob("*/**/%s.%s" % page.groups())) else "there is no such page"
        if words[0].startswith("scripts/") and words[0].endswith(".sh"):
            return self._script(words)
        if built := re.fullmatch(r"build/\w+/bin/(\w+)", words[0]):
            return self._tool(built[1], words[1:])
        if words[0] == "tvxcim" or (len(words) > 1 and words[0] in self.families()):
            return self._command(words[1:] if words[0] == "tvxcim" else words)
        if re.fullmatch(r"(%s)/[\w./*-]+" % FOLDERS, text):
            found = any(list(place.glob(text.rstrip("/"))) for place in (self.source, self.folder))
            return None if found else "there is no such file"
        return None

    def _script(self, words):
        if len(words) == 1:
            return None if (self.source / words[0]).is_file() else "there is no such script"
        if words[0] not in listed.LISTED_SCRIPTS:
            return "is not among the scripts of listed.py"
        return listed.script_help(self.source, words)

    def _tool(self, name, words):
        """A program that the build makes, and options that its sources know."""
        if name == "tvxcim":
            return self._command(words)
        for lists in self.source.glob("*/**/CMakeLists.txt"):
            if re.search(r"\b(add_executable|tvx_add_\w+)\(%s\b" % name, lists.read_text(encoding="utf-8")):
                sources = "".join(each.read_text(encoding="utf-8") for each in lists.parent.glob("*.cpp"))
                missing = [word for word in words if word.startswith("-") and '"%s"' % word not in sources]
                return "no source has %s" % ", ".join(missing) if missing else None
        return "no CMakeLists.txt makes it"

    def _command(self, words):
        """The command of tvxcim exists with each of its alternatives, and its help has the options."""
        text = " ".join(words).replace("[", " ").replace("]", " ")
        variants = [[]]
        for word in text.split():
            if not re.fullmatch(r"[a-z|]+", word):
                break
            variants = [before + [each] for before in variants for each in word.split("|")]
        for variant in variants:
            known = self.help_of(variant)
            while known is None and len(variant) > 1 and self.help_of(variant[:1]) and not self._has_parts(variant[:1]):
                variant = variant[:-1]
                known = self.help_of(variant)
            if known is None:
                return "there is no command '%s'" % " ".join(variant)
            known += self.help_of([])
            for option in re.findall(r"(?<!\S)--[a-z-]+", text):
                if option not in known:
                    return "'%s' has no %s" % (" ".join(variant), option)
        return None

    def _has_parts(self, words):
        return "Subcommands:" in self.help_of(words)
