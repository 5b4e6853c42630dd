#!/usr/bin/env python3
"""The files for CIM servers, read back strictly, say what the class data say.

usage: server_files_test.py SCHEMA_FOLDER GENERATED_FOLDER
"""

import re
import sys
import unittest
from pathlib import Path

sys.dont_write_bytecode = True
SCHEMA, GENERATED = Path(sys.argv[1]), Path(sys.argv[2])
sys.path.insert(0, str(SCHEMA))

import generate  # noqa: E402
from generator import class_model, mof_reader  # noqa: E402

TYPES = {"instance": 2, "association": 3, "method": 5}
KEYS = ["provider", "location", "type", "namespace", "group", "unload"]


def shape(cls):
    """Everything that a MOF file says of a class, without its places in files."""
    def variable(v):
        target = None if v.target is None else v.target.name
        return v.name, v.type, v.is_array, tuple(v.qualifiers.items()), v.default, v.origin, target, v.embedded

    features = [(f.kind, f.name, f.type, tuple(f.qualifiers.items()), tuple(map(variable, f.parameters)), f.origin)
                if f.kind == "method" else variable(f) for f in cls.features]
    return cls.name, cls.super_class and cls.super_class.name, tuple(cls.qualifiers.items()), features


def stanzas(text):
    result = {}
    for line in text.splitlines():
        if not line or line.startswith("#"):
            continue
        if head := re.fullmatch(r"\[(\w+)\]", line):
            assert head[1] not in result, f"{head[1]} is there twice"
            current = result[head[1]] = {}
        else:
            key, value = re.fullmatch(r"   (\w+): (.+)", line).groups()
            assert key not in current, f"{key} is there twice"
            current[key] = value
    return result


def instances(text):
    result, position = [], text.index("\n") + 1
    pattern = re.compile(r"\s*instance of (\w+) \{\n((?:  \w+ = [^;\n]+;\n)+)\};\n")
    while position < len(text):
        match = pattern.match(text, position)
        assert match, f"no instance at {text[position:position + 60]!r}"
        result.append((match[1], dict(re.findall(r"  (\w+) = ([^;\n]+);\n", match[2]))))
        position = match.end()
    return result


class ServerFilesTest(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.classes, rows = generate.read_schema(SCHEMA)
        cls.served = [row.name for row in rows]
        cls.server = GENERATED / "server"
        cls.symbols = set(re.findall(r"\w+MI(?=;)", (GENERATED / "exports.map").read_text(encoding="utf-8")))

    def read(self, name):
        return (self.server / name).read_text(encoding="utf-8")

    def kinds(self, name):
        cls = self.classes[name]
        return ["instance"] + ["association"] * cls.is_association + ["method"] * bool(cls.methods)

    def spaces(self, name):
        profile = name in ("TVXHBA_RegisteredProfile", "TVXHBA_ReferencedProfile",
                           "TVXHBA_BaseServerReferencedProfile") or name.endswith("ConformsToProfile")
        return ["root/torvex"] + ["root/pg_interop"] * profile

    def test_the_mof_files_hold_the_classes_whole(self):
        base = mof_reader.read_file(self.server / "mof/torvex_fc_cim.mof")
        own = mof_reader.read_file(self.server / "mof/torvex_fc_provider.mof")
        self.assertEqual({c.name for c in own}, set(self.served))
        again = class_model.build(base + own)
        self.assertEqual(list(again), list(self.classes))
        for name, cls in self.classes.items():
            self.assertEqual(shape(again[name]), shape(cls))

    def test_superclasses_stand_before_their_subclasses(self):
        seen = set()
        for part in ("torvex_fc_cim.mof", "torvex_fc_provider.mof"):
            for declaration in mof_reader.read_file(self.server / "mof" / part):
                self.assertIn(declaration.super_name, seen | {None}, declaration.name)
                seen.add(declaration.name)

    def test_the_interop_file_holds_profiles_and_conformance(self):
        names = {c.name for c in mof_reader.read_file(self.server / "mof/torvex_fc_interop.mof")}
        self.assertEqual(names, {n for n in self.served if len(self.spaces(n)) == 2})
        self.assertEqual(len(names), 12)

    def test_every_class_has_one_stanza(self):
        found = stanzas(self.read("registration/torvex_fc_sfcb.reg"))
        self.assertEqual(list(found), self.served)
        for name, stanza in found.items():
            self.assertEqual(list(stanza), KEYS)
            self.assertEqual(stanza["provider"], f"{name}_Provider")
            self.assertEqual(stanza["location"], "torvex_fc_provider")
            self.assertEqual(stanza["type"].split(), self.kinds(name))
            self.assertEqual(stanza["namespace"].split(), self.spaces(name))
            self.assertEqual(stanza["unload"], "never")

    def test_every_class_has_its_provider_and_capabilities(self):
        found = instances(self.read("registration/torvex_fc_pegasus.mof"))
        kind, module = found[0]
        self.assertEqual(kind, "PG_ProviderModule")
        self.assertEqual(module["InterfaceType"], '"CMPI"')
        self.assertEqual(module["InterfaceVersion"], '"2.0.0"')
        self.assertEqual(module["Location"], '"torvex_fc_provider"')
        self.assertRegex(module["Version"], r'^"\d+(\.\d+)+"$')
        providers = [i["Name"] for k, i in found if k == "PG_Provider"]
        self.assertEqual(providers, [f'"{n}_Provider"' for n in self.served])
        capabilities = {i["ClassName"].strip('"'): i for k, i in found if k == "PG_ProviderCapabilities"}
        self.assertEqual(list(capabilities), self.served)
        self.assertEqual(len(found), 1 + 2 * len(self.served))
        for name, each in capabilities.items():
            self.assertEqual(each["ProviderName"], f'"{name}_Provider"')
            self.assertEqual(each["ProviderModuleName"], module["Name"])
            self.assertEqual(each["ProviderType"], "{" + ", ".join(str(TYPES[k]) for k in self.kinds(name)) + "}")
            self.assertEqual(each["Namespaces"], "{" + ", ".join(f'"{s}"' for s in self.spaces(name)) + "}")
            self.assertEqual((each["SupportedProperties"], each["SupportedMethods"]), ("NULL", "NULL"))

    def test_every_registered_kind_has_its_factory(self):
        for name in self.served:
            for kind in self.kinds(name):
                self.assertIn(f"{name}_Provider_Create_{kind.capitalize()}MI", self.symbols)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])
