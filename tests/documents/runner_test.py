#!/usr/bin/env python3
"""The runner of the documents lets no wrong command pass."""
import sys
import tempfile
import types
import unittest
from pathlib import Path

sys.dont_write_bytecode = True

import documents  # noqa: E402
import run_documents  # noqa: E402
import words_in_text  # noqa: E402

PROGRAM = """#!/bin/sh
case "$*" in
  --help) printf 'Subcommands:\\n  ports   a table\\n  diag    tests\\n\\n  --sim\\n' ;;
  "diag --help") printf 'Subcommands:\\n  run   one\\n' ;;
  "ports --help"|"diag run --help") echo "--set NAME" ;;
  *) exit 3 ;;
esac
"""


class RunnerTest(unittest.TestCase):
    def setUp(self):
        holder = tempfile.TemporaryDirectory()
        self.addCleanup(holder.cleanup)
        self.source, self.build = Path(holder.name) / "source", Path(holder.name) / "build"
        for folder in ("docs", "scripts", "sim"):
            (self.source / folder).mkdir(parents=True)
        for folder in ("bin", "lib"):
            (self.build / folder).mkdir(parents=True)
        self.script("scripts/go.sh", "# usage: go.sh [fast]\n")
        (self.build / "bin/tvxcim").write_text(PROGRAM)
        (self.build / "bin/tvxcim").chmod(0o755)
        (self.source / "CMakePresets.json").write_text(
            '{"configurePresets": [{"name": "dev"}], "buildPresets": [], "testPresets": []}')
        words_in_text.Checker.program = self.build / "bin/tvxcim"
        words_in_text.Checker.helps.clear()

    def script(self, name, text):
        (self.source / name).write_text("#!/bin/sh\n" + text)
        (self.source / name).chmod(0o755)

    def failures(self, text):
        """What is wrong with a document of this text."""
        path = self.source / "docs/page.md"
        path.write_text(text)
        try:
            blocks, wrong = run_documents.read_document(path, self.source)
        except documents.Mistake as mistake:
            return [str(mistake)]
        words = types.SimpleNamespace(source=self.source, build=self.build)
        return wrong + run_documents.run_blocks("page", blocks, words)[2]

    def assert_fails(self, text, reason):
        found = self.failures(text)
        self.assertEqual(len(found), 1, found)
        self.assertIn(reason, found[0])

    def test_commands_run_in_one_shell_and_their_output_counts(self):
        self.assertEqual(self.failures("```console\n$ a=1\n$ echo $a\n1\n$ seq 9\n1\n...\n9\n```\n"), [])
        self.assert_fails("```console\n$ echo 1\n2\n```\n", "instead of")
        self.assert_fails("```console\n$ (exit 4)\n```\n", "ended with 4")
        self.assert_fails("```sh\nnothing-of-that-name\n```\n", "ended with 127")
        self.assert_fails("```sh\nexit 0\n```\n", "ended with -1")

    def test_loops_and_long_lines_are_one_command(self):
        self.assertEqual(self.failures("```console\n$ for i in 1 2; do\n>   echo $i\n> done\n1\n2\n```\n"), [])
        self.assertEqual(self.failures("```console\n$ echo 1 \\\n    2\n1 2\n```\n"), [])

    def test_no_block_escapes_by_its_form(self):
        self.assert_fails("```\ntext\n```\n", "a block is one of")
        self.assert_fails("```bash\ntrue\n```\n", "a block is one of")
        self.assert_fails("Text.\n\n    scripts/go.sh\n", "not an indented one")
        self.assert_fails("```text\n$ scripts/go.sh\n```\n", "holds a command")
        self.assert_fails("```text\nscripts/go.sh fast\n```\n", "holds a command")
        self.assert_fails("```sh\ntrue\n", "has no end")
        self.assertEqual(self.failures("```text\nonly text\n```\n"), [])

    def test_stand_ins_check_what_they_are_asked(self):
        self.assertEqual(self.failures("```sh\ncmake --preset dev\n```\n"), [])
        self.assert_fails("```sh\ncmake --preset other\n```\n", "there is no preset 'other'")
        self.assert_fails("```sh\napt install ./build/none_*.deb\n```\n", "no file")
        self.assert_fails("```sh\ncimmof -n root/x /nowhere/x.mof\n```\n", "no file")

    def test_words_in_text_are_checked(self):
        self.assertEqual(self.failures("`tvxcim --sim ports`, `diag run TEST PORT [--set A=B]`, `scripts/go.sh`\n"), [])
        self.assert_fails("`tvxcim dance`\n", "there is no command 'dance'")
        self.assert_fails("`diag walk TEST`\n", "there is no command 'diag walk'")
        self.assert_fails("`tvxcim ports --fly`\n", "has no --fly")
        self.assert_fails("`scripts/none.sh`\n", "there is no such script")
        self.assert_fails("`scripts/go.sh fast`\n", "listed.py")
        self.assert_fails("`docs/none.md`\n", "there is no such file")
        self.assert_fails("`other(1)`\n", "there is no such page")
        self.assert_fails("`build/dev/bin/other`\n", "no CMakeLists.txt makes it")
        self.assert_fails("Say `cmake --preset other`.\n", "there is no preset")

    def test_examples_of_manuals_and_helps_are_found(self):
        page = self.source / "a.1"
        page.write_text(".SH EXAMPLES\n.nf\ntvxcim \\-\\-sim ports \\e\n  --json\n.fi\n.SH OTHER\n.nf\nno\n.fi\n")
        found = documents.shell_commands(documents.manual_examples(page))
        self.assertEqual([each.text for each in found], ["tvxcim --sim ports --json"])
        found = documents.shell_commands(documents.help_examples("Options:\n  a\n\nExamples:\n  b c\n\nEnd\n"))
        self.assertEqual([each.text for each in found], ["b c"])


if __name__ == "__main__":
    unittest.main()
