"""Runs the commands of one block in one shell, in a tree of its own, and tells what each printed."""
import os
import random
import shutil
import signal
import socket
import subprocess
import sys
import tempfile
from dataclasses import dataclass
from pathlib import Path

SECONDS = 90
HERE = Path(__file__).parent
PORT = "5988"  # of a listener in the documents
PRESETS = ("dev", "demo", "release")  # of which documents and scripts run programs
BUILDING = ("cmake", "ctest", "ninja", "cpack", "lintian", "apt", "apt-get", "sudo")
SERVERS = {"pegasus": ("cimmof", "cimprovider"), "sfcb": ("sfcbstage", "sfcbunstage", "sfcbrepos")}

# A listener runs behind the block that starts it, as in another terminal, and is ended like by Ctrl-C.
PRELUDE = r"""
start_listener() {
  rm -f "$TMPDIR/listener"
  "$@" --port "$TVX_PORT" >"$TMPDIR/listener" 2>&1 &
  TVX_LISTENER=$!
  for ((tries = 0; tries < 200; tries++)); do
    if grep -qs "^serving" "$TMPDIR/listener"; then return 0; fi
    kill -0 $TVX_LISTENER 2>/dev/null || break
    sleep 0.05
  done
  cat "$TMPDIR/listener"; return 1
}
"""
EPILOGUE = r"""
if [ -n "${TVX_LISTENER:-}" ]; then kill -INT $TVX_LISTENER; wait $TVX_LISTENER; fi
printf '\n\001end %d\n' $?
"""


@dataclass
class Result:
    status: int
    output: str


def free_port():
    """A port below those that the system gives to others that ask for any."""
    while True:
        port = random.randrange(20000, 32000)
        with socket.socket() as probe:
            if probe.connect_ex(("127.0.0.1", port)) != 0:
                return str(port)


class Session:
    """A copy of the tree in which the build stands for each preset's, and stand-ins for what changes the machine."""

    def __init__(self, source, build):
        self.source, self.build = Path(source), Path(build)
        self._holder = tempfile.TemporaryDirectory(prefix="tvx_documents_")
        self.folder = Path(self._holder.name)
        self.tree, self.root = self.folder / "tree", self.folder / "root"
        self.asked = self.folder / "asked"
        self._make_tree()
        self._make_commands("stand_ins", BUILDING)
        for server, names in SERVERS.items():
            self._make_commands(server, names)
        self.asked.touch()

    def close(self):
        self._holder.cleanup()

    def _make_tree(self):
        (self.tree / "build/package").mkdir(parents=True)
        for preset in PRESETS:
            (self.tree / "build" / preset).mkdir()  # a build folder itself would meet the real commands
            for part in ("bin", "lib"):
                (self.tree / "build" / preset / part).symlink_to(self.build / part)
        for entry in self.source.iterdir():
            if entry.name in ("docs", "scripts"):  # written by some, and the scripts look for the tree around them
                shutil.copytree(entry, self.tree / entry.name)
            elif entry.name not in ("build", ".git"):
                (self.tree / entry.name).symlink_to(entry)

    def _make_commands(self, folder, names):
        (self.folder / folder).mkdir()
        for name in names:
            program = self.folder / folder / name
            program.write_text('#!/bin/sh\nexec "%s" -B "%s" %s "$@"\n' % (sys.executable, HERE / "stand_in.py", name))
            program.chmod(0o755)

    def environment(self, server):
        (self.folder / "tmp").mkdir(exist_ok=True)
        places = [self.folder / "stand_ins", self.folder / server, self.build / "bin",
                  *self.root.glob("usr/**/sbin"), os.environ["PATH"]]
        environment = {**os.environ, "PATH": ":".join(map(str, places)), "TMPDIR": str(self.folder / "tmp"),
                       "HOME": str(self.folder), "TVX_SOURCE": str(self.source), "TVX_BUILD": str(self.build),
                       "TVX_ASKED": str(self.asked), "TVX_STAND_INS": str(self.folder / "stand_ins"), "DESTDIR": str(self.root), "TVX_PORT": free_port(),
                       "PYTHONDONTWRITEBYTECODE": "1"}
        environment["TVX_DEV_PORT"] = environment["TVX_PORT"]
        for name in ("TVX_ROOT", "TVX_SIM_STATE", "TVX_SIM_SCENARIO", "LD_LIBRARY_PATH"):
            environment.pop(name, None)
        return environment

    def run(self, texts, server="pegasus"):
        """Results of the commands, and the last one of what they left running."""
        environment = self.environment(server)
        script = PRELUDE
        for number, text in enumerate(texts):
            text = text.replace(":" + PORT, ":" + environment["TVX_PORT"])
            if text.startswith("tvxcim ") and text.removesuffix("&").split()[-1] == "serve":
                text = "start_listener " + text.removesuffix("&")
            script += "eval %s\nprintf '\\n\\001%d %%d\\n' $?\n" % (shell_word(text), number)
        output = self.folder / "output"
        with open(output, "wb") as file:
            shell = subprocess.Popen(["bash", "-c", script + EPILOGUE], cwd=self.tree, env=environment, stdout=file,
                                     stderr=subprocess.STDOUT, stdin=subprocess.DEVNULL, start_new_session=True)
            try:
                shell.wait(SECONDS)
            except subprocess.TimeoutExpired:
                file.write(b"\nit did not end within %d seconds\n" % SECONDS)
            finally:
                end_group(shell)
        return read_results(output.read_text(encoding="utf-8", errors="replace"), len(texts))


def shell_word(text):
    return "'" + text.replace("'", "'\\''") + "'"


def end_group(shell):
    """Ends what a shell of this test left behind."""
    try:
        os.killpg(shell.pid, signal.SIGKILL)
    except ProcessLookupError:
        pass
    shell.wait()


def read_results(text, count):
    results, pieces = [], text.split("\n\001")
    for output, mark in zip(pieces, pieces[1:]):
        printed = output if not results else output.partition("\n")[2]
        results.append(Result(int(mark.split()[1]), printed))
    while len(results) < count + 1:
        results.append(Result(-1, pieces[-1]))  # the shell ended early
    return results
