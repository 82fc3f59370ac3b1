"""What the tool says of zon files: info, dump, verify, diff."""
import pathlib
import struct
import sys

import tool

HERE = pathlib.Path(__file__).resolve().parent
sys.path.insert(0, str(HERE.parent / "zon_reader"))
import make_streams as streams  # noqa: E402  (found by the line above)
from msgpack import packb as pack  # noqa: E402

VALID = HERE.parent / "corpus/streams/valid"


def other_payload(code):
    """As `payload` of make_streams, with another value of the same type and size."""
    other_scalars = [pack(1)] * 4 + [pack(-1)] * 4 + [streams.single(2.5), pack(0.1), pack(False), pack("other")]
    if code < 12:
        return other_scalars[code]
    if code < 120:
        memory = streams.memory_of(code, 2)
        return streams.chunks(memory, len(memory), 0)
    if code < 360:
        base = (code - 120) % 120
        count = 2 if code < 240 else 1
        if base == 11:
            array = streams.elements(*[pack("other")] * count)
        else:
            array = streams.blob(streams.memory_of(base, 2) * count, len(streams.memory_of(base)), 0)
        empty = streams.array_payload(base, 0, 0)
        return array if code < 240 else streams.elements(array, streams.NIL, empty)
    eight = streams.u32(8)
    geo = streams.geo_location(streams.u32s([4, 6]), streams.f32s([0.5]))
    return {
        360: pack(1),
        361: streams.elements(pack(0), pack(1), pack(1)),
        362: streams.obj(inner=eight, none=streams.NIL),
        363: streams.elements(streams.obj(), streams.NIL, streams.obj(inner=eight)),
        364: streams.elements(streams.elements(streams.NIL), streams.NIL, streams.elements()),
        365: streams.curve((0.0, 1.0, 0.0, 0.25, 2), (1.0, -3.5, 0.5, 0.0, 0)),
        366: streams.elements(streams.curve(), streams.NIL, streams.curve((2.0, 2.0, 0.0, 0.0, 1), pre=2, post=4)),
        367: geo,
        368: streams.elements(geo, streams.geo_location(streams.NIL, streams.f32s([]))),
        369: streams.elements(eight, streams.NIL, streams.frame(11, pack("any")),
                              streams.frame(362, streams.NIL), streams.frame(14, streams.chunks(bytes(8), 8, 0)),
                              streams.frame(369, streams.elements(streams.NIL))),
    }[code]


def one_object(*properties):
    return streams.stream([streams.frame(362, streams.obj(*properties))])


class Info(tool.ToolTest):
    def test_every_file_of_the_corpus_is_told_verified_dumped_and_equals_itself(self):
        files = sorted(VALID.glob("*.zon"))
        self.assertGreater(len(files), 20)
        for path in files:
            for command in (["info", path], ["verify", path], ["dump", path], ["diff", path, path]):
                self.zon(*command)

    def test_report_of_a_cube(self):
        self.zon("make", "cube", "cube.zon", "--size", "2", "--level", "3")
        report = self.json("info", "cube.zon")
        self.assertEqual((report["version"], report["level"], report["handles"]), (6, 3, False))
        self.assertEqual(report["bytes"], (self.folder / "cube.zon").stat().st_size)
        cube, = report["objects"]
        self.assertEqual(cube["kind"], "mesh")
        self.assertEqual([(c["name"], c["count"]) for c in cube["components"]],
                         [("point_component", 8), ("face_vertex_component", 24), ("face_component", 6)])
        lines = {line.pop("name"): line for line in cube["properties"]}
        self.assertEqual(list(lines), ["point_position", "face_vertex", "face_offset", "face_vertex_normal_index",
                                       "face_vertex_normal"])
        normal = lines["face_vertex_normal"]
        # Six normals, the default of three floats, the mode of four bytes, and the length of the target's name.
        self.assertEqual(normal["decoded_bytes"], 6 * 12 + 12 + 4 + len("face_vertex_normal_index"))
        self.assertTrue(0 < normal["stored_alone_bytes"] < report["bytes"])
        text = self.zon("info", "cube.zon").stdout
        for word in ("mesh", "face_component: 6", "stored (alone)", "array<Math::float3>", "face_vertex_normal_index"):
            self.assertIn(word, text)

    def test_kinds(self):
        self.write("cloud.off", "OFF 1 0 0\n0 0 0\n")
        self.zon("import", "cloud.off", "cloud.zon")
        self.assertEqual(self.objects("cloud.zon")[0][0], "point cloud")
        self.assertEqual(self.objects(VALID / "v6_walk.zon")[0][0], "object")

    def test_dump_stops_at_the_asked_number_of_elements(self):
        self.zon("make", "cube", "cube.zon")
        text = self.zon("dump", "cube.zon", "--max", "2").stdout
        self.assertIn("data: [ 0, 1, ... ] 24 elements (array<unsigned int>)", text)


class Verify(tool.ToolTest):
    def test_each_entry_is_told_and_the_damaged_one_is_found(self):
        items = [streams.frame(362, streams.obj(number=streams.u32(number))) for number in (300, 301, 302)]
        whole = streams.stream(items)
        self.write("whole.zon", whole)
        report = self.json("verify", "whole.zon")
        self.assertTrue(report["ok"] and report["hashes_checked"])
        self.assertEqual([(e["bytes"], e["role"], e["type"], e["ok"]) for e in report["entries"]],
                         [(len(item), "top", "object", True) for item in items])
        at = whole.index(items[1]) + len(items[1]) - 1
        self.write("hurt.zon", whole[:at] + bytes([whole[at] ^ 1]) + whole[at + 1:])
        report = self.json("verify", "hurt.zon", code=1)
        self.assertEqual([e["ok"] for e in report["entries"]], [True, False, True])
        self.assertEqual((report["ok"], report["read_fault"], report["objects"]), (False, "Checksum mismatch", None))
        self.assertIn("Checksum mismatch", self.zon("verify", "hurt.zon", code=1).stdout)

    def test_every_cut_and_every_flipped_byte_is_damage(self):
        self.zon("make", "cube", "cube.zon", "--level", "0")
        whole = (self.folder / "cube.zon").read_bytes()
        step = max(1, len(whole) // 60)
        for length in range(0, len(whole), step):
            self.write("cut.zon", whole[:length])
            self.zon("verify", "cut.zon", code=1 if length >= 82 else 2)
        for at in range(82, len(whole), step):
            self.write("flip.zon", whole[:at] + bytes([whole[at] ^ 4]) + whole[at + 1:])
            self.zon("verify", "flip.zon", code=1)

    def test_bad_streams_of_the_corpus_are_damaged_with_the_library_s_message(self):
        folder = VALID.parent / "bad"
        lines = (folder / "expected.tsv").read_text().splitlines()
        self.assertGreater(len(lines), 100)
        for line in lines:
            name, _, message = line.partition("\t")
            path = folder / (name if name.endswith(".zon") else name + ".zon")
            result = tool.subprocess.run([tool.ZON, "verify", path], capture_output=True, encoding="utf-8")
            self.assertIn(result.returncode, (1, 2), name)
            self.assertIn(message, result.stdout + result.stderr, name)

    def test_old_versions_are_read_without_hashes(self):
        self.assertIn("version 3 has no hashes", self.zon("verify", VALID / "v3.zon").stdout)
        report = self.json("verify", VALID / "v5.zon")
        self.assertEqual((report["hashes_checked"], len(report["entries"]), report["objects"]), (False, 4, 3))


class Diff(tool.ToolTest):
    def test_a_change_in_a_value_of_any_type_is_found(self):
        codes = range(370)
        self.write("a.zon", one_object(*((f"p{c}", streams.frame(c, streams.payload(c, 0))) for c in codes)))
        self.write("b.zon", one_object(*((f"p{c}", streams.frame(c, other_payload(c))) for c in codes)))
        report = self.json("diff", "a.zon", "b.zon", "--max", "100000", code=1)
        self.assertTrue(report["complete"])
        self.assertEqual({d["path"][1] for d in report["differences"]}, {f"p{c}" for c in codes})
        self.assertEqual({d["path"][0] for d in report["differences"]}, {"object 0"})
        self.assertEqual({d["what"] for d in report["differences"]}, {"value", "null", "size"} - {"size"})

    def test_differences_by_path(self):
        def floats(*numbers):
            return streams.frame(128, streams.f32s(numbers))
        u32 = streams.u32
        nan, other_nan = struct.unpack("<2f", bytes.fromhex("0000c07f0100c07f"))
        for first, second, options, expected in (
                ([("a", u32(1))], [("a", u32(1))], [], []),
                ([("a", u32(1))], [("a", streams.i32(1))], [], [("a", "type", "unsigned int", "int")]),
                ([("a", u32(1))], [("b", u32(1))], [], [("a", "missing", "unsigned int", "nothing"),
                                                        ("b", "missing", "nothing", "unsigned int")]),
                ([("a", u32(1)), ("b", u32(2))], [("b", u32(2)), ("a", u32(1))], [], [("", "order", '"a"', '"b"')]),
                ([("a", floats(1, 2, 3))], [("a", floats(1, 2.5, 3))], [], [("a/[1]", "value", "2", "2.5")]),
                ([("a", floats(1, 2, 3))], [("a", floats(1, 2.5, 3))], ["--tolerance", "0.5"], []),
                ([("a", floats(1, 2, 3))], [("a", floats(1, 2.5, 3))], ["--tolerance", "0.4"],
                 [("a/[1]", "value", "2", "2.5")]),
                ([("a", floats(0))], [("a", floats(-0.0))], [], [("a/[0]", "value", "0", "-0")]),
                ([("a", floats(0))], [("a", floats(-0.0))], ["--tolerance", "0"], []),
                ([("a", floats(nan))], [("a", floats(nan))], [], []),
                ([("a", floats(nan))], [("a", floats(1))], ["--tolerance", "1e30"],
                 [("a/[0]", "value", "nan(0x7fc00000)", "1")]),
                ([("a", floats(1, 2))], [("a", floats(1))], [], [("a", "size", "2", "1")]),
                ([("a", streams.NIL)], [("a", u32(1))], [], [("a", "type", "nothing", "unsigned int")]),
                ([("a", streams.frame(362, streams.NIL))], [("a", streams.frame(362, streams.obj()))], [],
                 [("a", "null", "null", "a value")])):
            self.write("a.zon", one_object(*first))
            self.write("b.zon", one_object(*second))
            report = self.json("diff", "a.zon", "b.zon", *options, code=1 if expected else 0)
            self.assertEqual([("/".join(d["path"][1:]), d["what"], d["first"], d["second"])
                              for d in report["differences"]], expected, (first, second))
            self.assertEqual(report["equal"], not expected)
        self.zon("make", "cube", "one.zon")
        self.assertIn("objects: size: 1 | 0", self.zon("diff", "one.zon", VALID / "v6_empty.zon", code=1).stdout)

    def test_the_asked_number_of_differences_is_not_exceeded(self):
        self.zon("make", "cube", "a.zon")
        self.zon("make", "cube", "b.zon", "--size", "3")
        report = self.json("diff", "a.zon", "b.zon", "--max", "3", code=1)
        self.assertEqual((len(report["differences"]), report["complete"]), (3, False))

    def test_shared_objects_are_compared_once_and_deep_ones_without_a_stack(self):
        # Level k holds level k - 1 twice: 2^60 paths, 60 objects. Then a chain of 100000 objects.
        def graph(depth, width, bottom):
            items = [streams.frame(362, streams.obj(n=streams.u32(bottom)))]
            for level in range(depth):
                items.append(streams.frame(362, streams.obj(*((f"p{i}", streams.frame(362, pack(level + 1)))
                                                              for i in range(width)))))
            # The top is entry 0, the others are shared values in the order of the file.
            entries = [(depth, 1)] + [(number, 0) for number in range(depth)]
            return streams.stream(items, entries=entries)
        for depth, width in ((60, 2), (100000, 1)):
            self.write("a.zon", graph(depth, width, 1))
            self.write("b.zon", graph(depth, width, 2))
            self.zon("diff", "a.zon", "a.zon")
            report = self.json("diff", "a.zon", "b.zon", code=1)
            self.assertEqual(len(report["differences"]), 1)
            self.assertEqual(len(report["differences"][0]["path"]), depth + 2)
            self.zon("info", "a.zon")


if __name__ == "__main__":
    tool.main()
