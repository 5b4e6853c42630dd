#!/usr/bin/env python3
"""Stands in for commands that build for minutes or change the machine: checks what it is asked.

usage: stand_in.py NAME WORDS...

$TVX_BUILD is the build that takes the place of every preset's, $TVX_SOURCE the tree, $TVX_ASKED the file to which
each command line is added.
"""
import json
import os
import re
import shutil
import subprocess
import sys
from pathlib import Path

BUILD, SOURCE = Path(os.environ["TVX_BUILD"]), Path(os.environ["TVX_SOURCE"])


def fail(text):
    sys.exit("%s: %s" % (sys.argv[1], text))


def real(name):
    """The program behind this one on the PATH."""
    rest = [folder for folder in os.environ["PATH"].split(":") if folder != os.environ["TVX_STAND_INS"]]
    return shutil.which(name, path=":".join(rest)) or fail("there is none")


def check_preset(kind, name):
    presets = json.loads((SOURCE / "CMakePresets.json").read_text(encoding="utf-8"))[kind]
    if not any(each["name"] == name and not each.get("hidden") for each in presets):
        fail("there is no preset '%s' among the %s" % (name, kind))


def cmake(words):
    """Presets have to exist; an installation is made, of the build, below $DESTDIR."""
    if words[0] == "--install":
        if not os.environ.get("DESTDIR"):
            fail("an installation without DESTDIR would change the machine")
        return subprocess.call([real("cmake"), "--install", str(BUILD)], stdout=subprocess.DEVNULL)
    kind = {"--preset": "configurePresets", "--build": "buildPresets"}[words[0]]
    check_preset(kind, words[words.index("--preset") + 1])
    return 0


def ctest(words):
    """Lists the tests that would run: some have to."""
    at = words.index("--preset")
    check_preset("testPresets", words[at + 1])
    listed = subprocess.run([real("ctest"), "--test-dir", str(BUILD), "-N", *words[:at], *words[at + 2:]], text=True,
                            stdout=subprocess.PIPE, check=True).stdout
    total = re.search(r"Total Tests: (\d+)", listed)
    return 0 if total and int(total[1]) > 0 else fail("no test is meant: " + listed)


def ninja(words):
    """The targets have to exist."""
    targets = subprocess.run([real("ninja"), "-C", str(BUILD), "-t", "targets", "all"], text=True,
                             stdout=subprocess.PIPE, check=True).stdout
    for target in words[words.index("-C") + 2:]:
        if not re.search(r"^(\S*/)?%s: " % re.escape(target), targets, re.M):
            fail("there is no target '%s'" % target)
    return 0


def cpack(words):
    """Empty files by the names that the packages get."""
    config = (BUILD / "CPackConfig.cmake").read_text(encoding="utf-8")
    if words != ["-G", "DEB"] or 'set(CPACK_DEB_COMPONENT_INSTALL "ON")' not in config:
        fail("Debian packages of the components are wanted")
    version = re.search(r'set\(CPACK_PACKAGE_VERSION "([^"]+)"\)', config)[1]
    for name in re.findall(r'set\(CPACK_DEBIAN_[A-Z]+_PACKAGE_NAME "([^"]+)"\)', config):
        Path("%s_%s_amd64.deb" % (name, version)).touch()
    return 0


def existing_files(words):
    """Files that are named have to be there; a CIM server's command wants them not to be empty."""
    for word in words:
        if "/" in word and word.endswith((".deb", ".mof", ".reg")):
            path = Path(word)
            if not path.is_file() or (path.suffix != ".deb" and path.stat().st_size == 0):
                fail("no file '%s'" % word)
    return 0


def main():
    name, words = sys.argv[1], sys.argv[2:]
    with open(os.environ["TVX_ASKED"], "a", encoding="utf-8") as asked:
        asked.write(" ".join([name, *words]) + "\n")
    return {"cmake": cmake, "ctest": ctest, "ninja": ninja, "cpack": cpack}.get(name, existing_files)(words)


if __name__ == "__main__":
    sys.exit(main())
