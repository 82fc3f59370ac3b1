"""What the tool says of zon files: info, dump, verify, diff."""
import pathlib
import struct

import tool
from zon_files import array, obj, part, stream

STREAMS = pathlib.Path(__file__).resolve().parents[1] / "corpus/streams"
VALID = STREAMS / "valid"


def floats(*numbers):
    return array("f", numbers)


def u32(number):
    return [2, number]


class Reports(tool.ToolTest):
    def test_every_file_of_the_corpus_is_told_verified_dumped_and_equals_itself(self):
        files = sorted(VALID.glob("*.zon"))
        self.assertGreater(len(files), 20)
        for path in files:
            for command in (["info", path], ["verify", path], ["dump", path], ["diff", path, path]):
                self.zon(*command)

    def test_report_of_a_cube(self):
        self.zon("make", "cube", "cube.zon", "--size", "2", "--level", "3")
        report = self.json("info", "cube.zon")
        normal = report["objects"][0]["properties"][-1]
        # Six normals, the default of three floats, the mode of four bytes, and the length of the target's name.
        self.assertEqual((report["level"], report["handles"], report["bytes"], normal["decoded_bytes"]),
                         (3, False, (self.folder / "cube.zon").stat().st_size, 72 + 12 + 4 + 24))
        self.assertTrue(0 < normal["stored_alone_bytes"] < report["bytes"])

    def test_the_damaged_entry_is_found_and_the_library_s_message_told(self):
        self.import_text("three.obj", "".join(f"o {name}\nv {name} 0 0\n" for name in (1, 22, 333)))
        second = self.json("verify", "three.zon")["entries"][1]
        whole = bytearray((self.folder / "three.zon").read_bytes())
        whole[second["position"] + second["bytes"] - 1] ^= 1
        self.write("hurt.zon", bytes(whole))
        report = self.json("verify", "hurt.zon", code=1)
        self.assertEqual([(e["role"], e["type"], e["ok"]) for e in report["entries"]],
                         [("top", "object", True), ("top", "object", False), ("top", "object", True)])
        self.assertEqual((report["ok"], report["read_fault"], report["objects"]), (False, "Checksum mismatch", None))
        for name, code, message in (("table_role_3", 1, "Corrupt handles"), ("reference_cycle", 1, "ptr not found in map"),
                                    ("header_odd", 2, "Unknown msgpack error occurred"), ("v4_cut", 1, "Unknown msgpack error")):
            result = self.zon("verify", STREAMS / f"bad/{name}.zon", code=code)
            self.assertIn(message, result.stdout + result.stderr, name)
        report = self.json("verify", VALID / "v5.zon")
        self.assertEqual((report["hashes_checked"], len(report["entries"]), report["objects"]), (False, 4, 3))


class Diff(tool.ToolTest):
    def test_a_change_in_a_value_of_any_type_is_found(self):
        report = self.json("diff", VALID / "v6_every_type_level9.zon", VALID / "v6_every_type_other.zon", "--max", "100000",
                           code=1)
        self.assertTrue(report["complete"])
        self.assertEqual({tuple(d["path"][:2]) for d in report["differences"]},
                         {("object 0", f"code_{c}") for c in range(370)})
        report = self.json("diff", VALID / "v6_every_type_level9.zon", VALID / "v6_every_type_other.zon", "--max", "3", code=1)
        self.assertEqual((len(report["differences"]), report["complete"]), (3, False))
        self.assertIn("objects: size: 1 | 0",
                      self.zon("diff", VALID / "v6_every_type_level9.zon", VALID / "v6_empty.zon", code=1).stdout)

    def test_differences_by_path(self):
        nan, = struct.unpack("<f", bytes.fromhex("0000c07f"))
        numbers, others = {"a": floats(1, 2, 3)}, {"a": floats(1, 2.5, 3)}
        for first, second, options, expected in (
                ({"a": u32(1)}, {"a": [6, 1]}, [], [("a", "type", "unsigned int", "int")]),
                ({"a": u32(1)}, {"b": u32(1)}, [], [("a", "missing", "unsigned int", "nothing"),
                                                    ("b", "missing", "nothing", "unsigned int")]),
                ({"a": u32(1), "b": u32(2)}, {"b": u32(2), "a": u32(1)}, [], [("", "order", '"a"', '"b"')]),
                (numbers, others, ["--tolerance", "0.5"], []),
                (numbers, others, ["--tolerance", "0.4"], [("a/[1]", "value", "2", "2.5")]),
                ({"a": floats(0)}, {"a": floats(-0.0)}, [], [("a/[0]", "value", "0", "-0")]),
                ({"a": floats(0)}, {"a": floats(-0.0)}, ["--tolerance", "0"], []),
                ({"a": floats(nan)}, {"a": floats(nan)}, ["--tolerance", "0"], []),
                ({"a": floats(nan)}, {"a": floats(1)}, ["--tolerance", "1e30"],
                 [("a/[0]", "value", "nan(0x7fc00000)", "1")]),
                ({"a": floats(1, 2)}, {"a": floats(1)}, [], [("a", "size", "2", "1")]),
                ({"a": None}, {"a": u32(1)}, [], [("a", "type", "nothing", "unsigned int")]),
                ({"a": part(None)}, {"a": part(obj({}))}, [], [("a", "null", "null", "a value")])):
            self.write("a.zon", stream([first]))
            self.write("b.zon", stream([second]))
            report = self.json("diff", "a.zon", "b.zon", *options, code=1 if expected else 0)
            self.assertEqual([("/".join(d["path"][1:]), d["what"], d["first"], d["second"])
                              for d in report["differences"]], expected, (first, second))

    def test_shared_objects_are_compared_once_and_deep_ones_without_a_stack(self):
        # Level k holds level k - 1 twice: 2^60 paths, 60 objects. Then a chain of 100000 objects.
        for depth, width in ((60, 2), (100000, 1)):
            for name, bottom in (("a.zon", 1), ("b.zon", 2)):
                levels = [{"n": u32(bottom)}]
                levels += [{f"p{i}": [362, level] for i in range(width)} for level in range(1, depth + 1)]
                self.write(name, stream(levels[-1:], levels[:-1]))
            report = self.json("diff", "a.zon", "b.zon", code=1)
            self.assertEqual([len(each["path"]) for each in report["differences"]], [depth + 2])
            self.zon("info", "a.zon")
