#!/usr/bin/env python3
"""torvex-fc-register runs the right commands of the right server, and stops at the first that fails.

usage: register_test.py PROGRAM
"""

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
        for name in ("sh", "sed", "dirname"):
            (self.folder / "bin" / name).symlink_to(Path("/bin" if name != "dirname" else "/usr/bin") / name)

    def tools(self, names, status=0):
        for name in names:
            path = self.folder / "bin" / name
            path.write_text(f'#!/bin/sh\necho "{name} $*" >>"{self.log}"\nexit {status}\n')
            path.chmod(0o755)

    def run_program(self, *words):
        return subprocess.run(["/bin/sh", PROGRAM, "--data", str(self.folder / "data"), *words], text=True,
                              capture_output=True, env={"PATH": str(self.folder / "bin")}, check=False)

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


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])
