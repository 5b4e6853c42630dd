"""The commands of the documents that a test cannot run: why not, and what can be looked at instead."""
import os
import re
import subprocess
from pathlib import Path


def script_help(source, words):
    """The script runs, and its help, or the text at its head, names the words that go with it."""
    script = Path(source) / words[0]
    if not os.access(script, os.X_OK):
        return "%s is no program" % words[0]
    head = "".join(re.findall(r"^#(?!!).*\n", script.read_text(encoding="utf-8"), re.M))
    if "--help)" in script.read_text(encoding="utf-8"):
        done = subprocess.run([script, "--help"], text=True, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, timeout=20)
        if done.returncode != 0 or not done.stdout.strip():
            return "%s has no help" % words[0]
        head = done.stdout
    missing = [word for word in words[1:] if not word.isdigit() and not re.search(r"(?<![\w-])%s(?!\w)" % re.escape(word), head)]
    return "%s does not tell of %s" % (words[0], ", ".join(missing)) if missing else None


# Whole commands of blocks, and the reason.
LISTED = {
    "scripts/test.sh": "runs every test, this one too",
}

# Beginnings of commands in running text, and the reason. Their words are looked for in the script's help.
LISTED_SCRIPTS = {
    "scripts/test.sh": "runs every test, this one too",
    "scripts/coverage.sh": "builds with counters and runs every test",
    "scripts/fuzz.sh": "builds with another compiler and runs for minutes",
    "scripts/reliability.sh": "builds with sanitizers and runs for hours",
    "scripts/package_trial.sh": "needs root and a mirror of Debian",
    "scripts/fresh_debian.sh": "needs root and a mirror of Debian",
    "scripts/package.sh": "is run where it stands in a block",
    "scripts/demo.sh": "is run where it stands in a block",
    "scripts/setup.sh": "is run where it stands in a block",
}
