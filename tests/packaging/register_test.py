#!/usr/bin/env python3
"""torvex-fc-register runs the right commands of the right server, and stops at the first that fails.

usage: register_test.py PROGRAM
"""

import shutil
import subprocess
import sys
import tempfile
import unittest
from pathlib import Path

PROGRAM = sys.argv[1]
PEGASUS, SFCB = ("cimmof", "cimprovider"), ("sfcbstage", "sfcbrepos", "sfcbunstage")


class RegisterTest(unittest.TestCase):
    def setUp(self):
        holder = tempfile.TemporaryDirectory()
        self.addCleanup(holder.cleanup)
        self.folder = Path(holder.name)
        self.log = self.folder / "log"
        for part in ("bin", "data/mof", "data/registration"):
            (self.folder / part).mkdir(parents=True)
        for name in ("sh", "sed", "dirname", "grep", "awk", "mktemp", "rm", "cat"):
            (self.folder / "bin" / name).symlink_to(shutil.which(name))

    def tools(self, names, status=0):
        for name in names:
            path = self.folder / "bin" / name
            path.write_text(f'#!/bin/sh\necho "{name} $*" >>"{self.log}"\nexit {status}\n')
            path.chmod(0o755)

    def run_program(self, *words, **environment):
        return subprocess.run(["/bin/sh", PROGRAM, "--data", str(self.folder / "data"), *words], text=True,
                              capture_output=True, check=False,
                              env={"PATH": str(self.folder / "bin"), **environment})

    def logged(self):
        text = self.log.read_text() if self.log.exists() else ""
        return text.replace(str(self.folder / "data") + "/", "").splitlines()

    def test_pegasus_gets_classes_and_registration(self):
        self.tools(PEGASUS)
        self.assertEqual(self.run_program("--interop", "root/interop").returncode, 0)
        self.assertEqual(self.logged(), [
            "cimmof -w -aE -n root/torvex mof/torvex_fc_cim.mof",
            "cimmof -w -aE -n root/torvex mof/torvex_fc_provider.mof",
            "cimmof -w -aE -n root/pg_interop mof/torvex_fc_cim.mof",
            "cimmof -w -aE -n root/pg_interop mof/torvex_fc_interop.mof",
            "cimmof -n root/interop registration/torvex_fc_pegasus.mof"])

    def test_commands_and_options_can_be_others(self):
        self.tools(("my-mof", "my-provider", "my-stage", "my-unstage", "my-repos"))
        names = {"CIMMOF": "my-mof", "CIMPROVIDER": "my-provider", "CIMMOF_OPTIONS": "", "SFCBSTAGE": "my-stage",
                 "SFCBUNSTAGE": "my-unstage", "SFCBREPOS": "my-repos"}
        for words in ([], ["unregister"], ["--server", "sfcb"], ["--server", "sfcb", "unregister"]):
            self.assertEqual(self.run_program(*words, **names).returncode, 0)
        self.assertEqual(self.logged()[0], "my-mof -n root/torvex mof/torvex_fc_cim.mof")
        self.assertEqual({line.split()[0] for line in self.logged()},
                         {"my-mof", "my-provider", "my-stage", "my-unstage", "my-repos"})
        self.assertEqual(len(self.logged()), 5 + 2 + 3 + 3)

    def test_schemas_are_looked_for_in_three_folders(self):
        told = (Path(PROGRAM).parent / "torvex-fc-register.8").read_text().replace("\\-", "-")
        script = Path(PROGRAM).read_text()
        for folder in ("/usr/share/sfcb/CIM", "/usr/share/mof/cim-current", "/usr/local/share/sfcb/CIM"):
            self.assertIn(folder, script)
            self.assertIn(folder, told)

    def test_pegasus_loses_the_module(self):
        self.tools(PEGASUS)
        self.assertEqual(self.run_program("unregister").returncode, 0)
        self.assertEqual(self.logged(), ["cimprovider -d -m TorvexFCProviderModule",
                                         "cimprovider -r -m TorvexFCProviderModule"])

    def test_sfcb_gets_stages_and_a_repository(self):
        self.tools(SFCB)
        self.assertEqual(self.run_program().returncode, 0)
        self.assertEqual(self.logged(), [
            "sfcbstage -n root/torvex -r registration/torvex_fc_sfcb.reg mof/torvex_fc_provider.mof",
            "sfcbstage -n root/pg_interop mof/torvex_fc_interop.mof", "sfcbrepos -f"])

    def schema(self, text):
        """A schema of the server in a folder with folders, and the shipped classes."""
        folder = self.folder / "schema" / "Core"
        folder.mkdir(parents=True)
        (folder / "Some.mof").write_text(text)
        (self.folder / "data/mof/torvex_fc_cim.mof").write_text(
            "// Shipped.\n[Abstract]\nclass CIM_Old {\n  string A;\n};\n\n"
            "[Abstract]\nclass CIM_Newer : CIM_Old {\n  string B;\n};\n")
        (self.folder / "data/mof/torvex_fc_provider.mof").write_text("class TVXHBA_X : CIM_Newer {\n};\n")
        (self.folder / "data/mof/torvex_fc_interop.mof").write_text("class TVXHBA_Y : CIM_Old {\n};\n")
        return str(self.folder / "schema")

    def keep_staged(self):
        """A stand-in that keeps the class files that it was given."""
        path = self.folder / "bin/sfcbstage"
        path.write_text(f'#!/bin/sh\nfor last; do :; done\ncat "$last" >>"{self.folder}/staged"\n')
        path.chmod(0o755)

    def test_sfcb_gets_the_classes_that_its_schema_lacks(self):
        self.tools(SFCB)
        self.keep_staged()
        result = self.run_program("--schema", self.schema("[Abstract]\n   class cim_nothing {};\nclass CIM_Old {\n};\n"))
        self.assertEqual(result.returncode, 0, result.stderr)
        self.assertIn("the server's schema lacks, and gets: CIM_Newer\n", result.stdout)
        newer = "[Abstract]\nclass CIM_Newer : CIM_Old {\n  string B;\n};\n\n"
        self.assertEqual((self.folder / "staged").read_text(),
                         newer + "class TVXHBA_X : CIM_Newer {\n};\n" + newer + "class TVXHBA_Y : CIM_Old {\n};\n")
        self.assertFalse(any(Path(word).exists() for word in result.stdout.split() if word.startswith(tempfile.gettempdir())
                             and not word.startswith(str(self.folder))), "a temporary folder was left behind")

    def test_sfcb_with_a_whole_schema_gets_the_shipped_files(self):
        self.tools(SFCB)
        result = self.run_program("--schema", self.schema("class CIM_Old {\n};\nclass CIM_Newer : CIM_Old {\n};\n"))
        self.assertEqual(result.returncode, 0, result.stderr)
        self.assertNotIn("lacks", result.stdout)
        self.assertEqual(self.logged()[0], "sfcbstage -n root/torvex -r registration/torvex_fc_sfcb.reg "
                                           "mof/torvex_fc_provider.mof")

    def test_sfcb_loses_its_stages(self):
        self.tools(SFCB)
        self.assertEqual(self.run_program("unregister").returncode, 0)
        self.assertEqual(self.logged(), [
            "sfcbunstage -n root/torvex -r torvex_fc_sfcb.reg torvex_fc_provider.mof",
            "sfcbunstage -n root/pg_interop torvex_fc_interop.mof", "sfcbrepos -f"])

    def test_a_dry_run_only_prints(self):
        self.tools(PEGASUS)
        result = self.run_program("--dry-run")
        self.assertEqual((result.returncode, self.logged()), (0, []))
        self.assertEqual(len(result.stdout.splitlines()), 5)

    def test_the_first_failure_ends_it(self):
        self.tools(PEGASUS, status=1)
        result = self.run_program()
        self.assertEqual((result.returncode, len(self.logged())), (4, 1))

    def test_a_machine_without_server_and_wrong_words_are_told(self):
        self.assertEqual(self.run_program().returncode, 3)
        self.assertEqual(self.run_program("dance").returncode, 2)
        self.assertEqual(self.run_program("--server", "other").returncode, 2)
        self.assertEqual(self.run_program("--server", "sfcb", "--data", "/nowhere").returncode, 5)
        self.assertEqual(self.run_program("--server", "sfcb", "--schema", "/nowhere").returncode, 5)
        self.assertEqual(self.run_program("--server").returncode, 2)

    def test_each_command_is_told_before_it_runs(self):
        self.tools(PEGASUS)
        told = self.run_program().stdout.replace(str(self.folder / "data") + "/", "").splitlines()
        self.assertEqual(told, self.logged())
        self.assertEqual(len(told), 5)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])
