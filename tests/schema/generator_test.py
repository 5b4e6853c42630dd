#!/usr/bin/env python3
"""The generator refuses wrong descriptions, saying what is wrong and where, and writes nothing needlessly."""

import contextlib
import io
import shutil
import sys
import tempfile
import unittest
from pathlib import Path

sys.dont_write_bytecode = True
sys.path.insert(0, str(Path(__file__).resolve().parents[2] / "src" / "schema"))

import generate  # noqa: E402

GOOD = """// A small family.
[Abstract]
class CIM_Base {
  [Key] string InstanceID;
  uint16 State = 5;
  string Notes[];
  uint32 Stop([In] boolean Now);
};

class CIM_Thing : CIM_Base {
  [Override("State")] uint16 State = 3;
  sint32 Depth = -4;
  datetime Age = "00000000000500.000000:000";
  boolean Ready = true;
};

class CIM_Part : CIM_Thing {
};

[Association]
class CIM_Holds {
  [Key] CIM_Base REF Whole;
  [Key] CIM_Base REF Part;
};
"""


class GeneratorTest(unittest.TestCase):
    def setUp(self):
        self.folder = Path(tempfile.mkdtemp())
        self.addCleanup(shutil.rmtree, self.folder)
        (self.folder / "schema").mkdir()
        (self.folder / "derived").mkdir()
        self.write(GOOD)
        self.put("schema/catalogue.txt", "")
        self.put("schema/agent_maps.txt", "CIM_Thing\n")
        self.put("schema/descriptions.txt", "")
        self.put("derived/providers.txt", "# none\n")

    def put(self, name, text):
        (self.folder / name).write_text(text, encoding="utf-8")

    def write(self, text):
        self.put("schema/family.mof", text)

    def run_generator(self, *words):
        """Status and text on standard error."""
        errors = io.StringIO()
        with contextlib.redirect_stderr(errors):
            status = generate.main(["--schema", str(self.folder / "schema"), "--providers",
                                    str(self.folder / "derived/providers.txt"), *map(str, words)])
        return status, errors.getvalue()

    def expect_error(self, where, message):
        self.assertEqual(self.run_generator("--check"), (1, f"{where}: {message}\n"))

    def expect_refused(self, addition, line, message):
        """`addition` follows the good family, whose last line is 27; `line` counts from the addition's first."""
        self.write(GOOD + addition)
        self.expect_error(f"family.mof:{GOOD.count(chr(10)) + line}", message)

    def test_accepts_a_good_family(self):
        self.assertEqual(self.run_generator("--check"), (0, ""))

    def test_refuses_an_unknown_type(self):
        self.expect_refused("class CIM_X : CIM_Thing {\n  uint128 Big;\n};\n", 2, "unknown type 'uint128' of 'Big'")

    def test_refuses_an_unknown_result_type(self):
        self.expect_refused("class CIM_X : CIM_Thing {\n  void Go();\n};\n", 2,
                            "unknown result type 'void' of method 'Go'")

    def test_refuses_a_missing_superclass(self):
        self.expect_refused("class CIM_X : CIM_Nothing {\n};\n", 1, "missing superclass 'CIM_Nothing' of 'CIM_X'")

    def test_refuses_a_class_that_descends_from_itself(self):
        self.expect_refused("class CIM_X : CIM_Y {\n};\nclass CIM_Y : CIM_X {\n};\n", 1,
                            "class 'CIM_X' is its own ancestor")

    def test_refuses_a_class_declared_twice_in_any_case_of_letters(self):
        self.expect_refused("class cim_thing : CIM_Base {\n};\n", 1,
                            "class 'cim_thing' is declared twice, first at family.mof:10")

    def test_refuses_a_feature_declared_twice(self):
        self.expect_refused("class CIM_X : CIM_Thing {\n  uint8 One;\n  uint8 one;\n};\n", 3,
                            "'one' is declared twice in 'CIM_X'")

    def test_refuses_a_parameter_declared_twice(self):
        self.expect_refused("class CIM_X : CIM_Thing {\n  uint32 Go([In] uint8 A, [In] uint8 a);\n};\n", 2,
                            "parameter 'a' is declared twice")

    def test_refuses_a_class_without_a_key(self):
        self.expect_refused("class CIM_X {\n  string Name;\n};\n", 1, "class 'CIM_X' has no key")

    def test_refuses_bad_defaults(self):
        for declaration, name in (("uint8 A = 256", "uint8 'A'"), ("uint8 A = -1", "uint8 'A'"),
                                  ("boolean A = 1", "boolean 'A'"), ("string A = 1", "string 'A'"),
                                  ("uint16 A = \"5\"", "uint16 'A'"), ("datetime A = \"tomorrow\"", "datetime 'A'"),
                                  ("real32 A = true", "real32 'A'"), ("uint16 A[] = 1", "uint16 'A'")):
            with self.subTest(declaration):
                value = declaration.split("= ")[1]
                self.expect_refused(f"class CIM_X : CIM_Thing {{\n  {declaration};\n}};\n", 2,
                                    f"bad default {value} of {name}")

    def test_refuses_an_override_of_nothing(self):
        self.expect_refused('class CIM_X : CIM_Thing {\n  [Override("Colour")] string Colour;\n};\n', 2,
                            "'Colour' overrides nothing")

    def test_refuses_a_repeated_name_without_override(self):
        self.expect_refused("class CIM_X : CIM_Thing {\n  uint16 State;\n};\n", 2,
                            "'State' is inherited from 'CIM_Base': it needs Override(\"State\")")

    def test_refuses_an_override_with_another_type(self):
        for declaration in ("uint32 State", "uint16 State[]", "CIM_Base REF State"):
            with self.subTest(declaration):
                self.expect_refused(f'class CIM_X : CIM_Thing {{\n  [Override("State")] {declaration};\n}};\n', 2,
                                    "'State' overrides a feature of another type")

    def test_refuses_an_override_of_another_kind(self):
        self.expect_refused('class CIM_X : CIM_Thing {\n  [Override("Stop")] uint32 Stop;\n};\n', 2,
                            "'Stop' overrides a feature of another kind")

    def test_refuses_a_wider_reference_in_an_override(self):
        self.expect_refused('[Association]\nclass CIM_A {\n  [Key] CIM_Thing REF Whole;\n  [Key] CIM_Base REF Part;\n};\n'
                            '[Association]\nclass CIM_B : CIM_A {\n  [Override("Whole")] CIM_Base REF Whole;\n};\n', 8,
                            "'CIM_Base' of 'Whole' is no subclass of 'CIM_Thing', which it overrides")

    def test_refuses_a_reference_to_an_unknown_class(self):
        self.expect_refused("class CIM_X : CIM_Thing {\n  uint32 Go([In] CIM_Nothing REF To);\n};\n", 2,
                            "unknown class 'CIM_Nothing'")

    def test_refuses_an_embedded_instance_that_is_no_string(self):
        self.expect_refused('class CIM_X : CIM_Thing {\n  [EmbeddedInstance("CIM_Base")] uint8 It;\n};\n', 2,
                            "embedded 'It' must be a string")

    def test_refuses_unknown_and_repeated_qualifiers(self):
        self.expect_refused("class CIM_X : CIM_Thing {\n  [Shiny] uint8 A;\n};\n", 2,
                            "unknown qualifier 'Shiny' on a feature")
        self.expect_refused("[Abstract, Abstract]\nclass CIM_X : CIM_Thing {\n};\n", 1,
                            "qualifier 'Abstract' stands twice")
        self.expect_refused("class CIM_X : CIM_Thing {\n  [Override] uint16 State;\n};\n", 2,
                            "qualifier 'Override' needs a text in brackets")

    def test_refuses_a_parameter_without_direction(self):
        self.expect_refused("class CIM_X : CIM_Thing {\n  uint32 Go(uint8 A);\n};\n", 2,
                            "parameter 'A' is neither In nor Out")

    def test_refuses_an_association_with_one_end(self):
        self.expect_refused("[Association]\nclass CIM_X {\n  [Key] CIM_Base REF Whole;\n};\n", 2,
                            "association 'CIM_X' has fewer than two references")

    def test_refuses_a_subclass_that_drops_the_association(self):
        self.expect_refused("class CIM_X : CIM_Holds {\n};\n", 1,
                            "'CIM_X' must repeat [Association] of 'CIM_Holds'")

    def test_refuses_an_aggregation_that_is_no_association(self):
        self.expect_refused("[Aggregation]\nclass CIM_X : CIM_Thing {\n};\n", 2,
                            "'CIM_X' is an aggregation and no association")

    def test_refuses_names_that_cannot_be_fields(self):
        self.expect_refused("class CIM_X : CIM_Thing {\n  uint8 register;\n};\n", 2,
                            "'register' cannot be the name of a feature")

    def test_refuses_broken_text(self):
        self.expect_refused("class CIM_X : CIM_Thing {\n  uint8 A\n};\n", 3, "expected ';', found '}'")
        self.expect_refused("class CIM_X : CIM_Thing {\n  uint8 A;\n", 3, "expected a type, found 'end of file'")
        self.expect_refused("class CIM_X ? {\n", 1, "unexpected character '?'")

    def test_refuses_a_catalogue_row_that_differs(self):
        self.put("schema/catalogue.txt", "CIM_Thing CIM_Base I 1 6 0 1 S\n")
        self.put("schema/descriptions.txt", "CIM_Thing A thing.\n")
        self.assertEqual(self.run_generator("--check"), (0, ""))
        self.put("schema/catalogue.txt", "CIM_Thing CIM_Base I 1 7 0 1 S\n")
        self.expect_error("catalogue.txt:1", "class 'CIM_Thing' differs from its row: described "
                          "('CIM_Base', 'I', (1, 6, 0, 1)), listed ('CIM_Base', 'I', (1, 7, 0, 1))")
        self.put("schema/catalogue.txt", "CIM_Gone CIM_Base I 1 7 0 1 S\n")
        self.expect_error("catalogue.txt:1", "class 'CIM_Gone' is not described")

    def test_refuses_a_provider_class_without_a_row(self):
        self.expect_refused("class TVXHBA_X : CIM_Thing {\n};\n", 1, "class 'TVXHBA_X' is not in the catalogue")

    def test_refuses_a_map_of_an_unknown_class_and_two_of_one_name(self):
        self.put("schema/agent_maps.txt", "# maps\nCIM_Gone\n")
        self.expect_error("agent_maps.txt:2", "unknown class 'CIM_Gone'")
        self.put("schema/agent_maps.txt", "CIM_Thing\nCIM_Thing\n")
        self.expect_error("agent_maps.txt:2", "map 'm_CIM_Thing_map' is declared twice")

    def test_refuses_wrong_lines_in_the_providers_file(self):
        self.put("derived/providers.txt", "CIM_Thing san\n")
        self.expect_error("providers.txt:1", "'CIM_Thing' is not a provider class")
        self.put("schema/catalogue.txt", "CIM_Thing CIM_Base I 1 6 0 1 S\n")
        self.put("schema/descriptions.txt", "CIM_Thing A thing.\n")
        self.put("derived/providers.txt", "CIM_Thing services/None.h\n")
        self.expect_error("providers.txt:1", "there is no header 'services/None.h'")
        self.put("derived/providers.txt", "CIM_Thing slow\n")
        self.expect_error("providers.txt:1", "expected 'san', 'interop' or a header, found 'slow'")

    def test_wants_a_description_of_each_class(self):
        self.put("schema/catalogue.txt", "CIM_Thing CIM_Base I 1 6 0 1 S\n")
        self.expect_error("descriptions.txt", "no text for CIM_Thing")
        self.put("schema/descriptions.txt", "# about\nCIM_Thing A thing.\nCIM_Gone Nothing.\n")
        self.expect_error("descriptions.txt:3", "'CIM_Gone' is no class of the provider")
        self.put("schema/descriptions.txt", "CIM_Thing A thing.\nCIM_Thing Again.\n")
        self.expect_error("descriptions.txt:2", "'CIM_Thing' has no text, or a second one")

    def test_writes_the_reference(self):
        self.put("schema/catalogue.txt", "CIM_Thing CIM_Base I 1 6 0 1 S\n")
        self.put("schema/descriptions.txt", "CIM_Thing A thing.\n")
        page = self.folder / "page.md"
        self.assertEqual(self.run_generator("--reference", page), (0, ""))
        text = page.read_text(encoding="utf-8")
        self.assertIn("### CIM_Thing\n\nA thing.\n\nAn instance of `CIM_Base` in `root/torvex`. Keys: `InstanceID`.", text)
        self.assertIn("| `Depth` | sint32 |", text)
        self.assertIn("Inherited: `InstanceID`", text)

    def test_touches_only_what_changes(self):
        output = self.folder / "out"
        self.assertEqual(self.run_generator("--output", output), (0, ""))
        before = {path: path.stat().st_mtime_ns for path in output.iterdir()}
        self.put("schema/agent_maps.txt", "CIM_Thing\nCIM_Part\n")
        self.assertEqual(self.run_generator("--output", output), (0, ""))
        changed = {path.name for path, time in before.items() if path.stat().st_mtime_ns != time}
        self.assertEqual(changed, {"Agent_Maps.h"})

    def test_says_in_the_first_line_what_a_file_is_made_from(self):
        output = self.folder / "out"
        self.assertEqual(self.run_generator("--output", output), (0, ""))
        files = sorted(path for path in output.rglob("*") if path.is_file())
        self.assertGreater(len(files), 5)
        for path in files:
            first = path.read_text(encoding="utf-8").splitlines()[0]
            self.assertRegex(first, r"^(//|#) Generated from src/.* by src/schema/generate\.py; changes here are lost\.$")


if __name__ == "__main__":
    unittest.main()
