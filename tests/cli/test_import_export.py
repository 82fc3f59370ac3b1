"""Mesh files become objects and objects become mesh files."""
import random
import re
import struct

import tool

QUAD_AND_TRIANGLE = """\
# a quad and a triangle behind it
v 0 0 0
v 1 0 0
v 1 1 0
v 0 1 0
v 2 .5 -1e-3
f 1 2 3 4
f -4 -1 \\
  -3
"""

TWO_OBJECTS = """\
v 0 0 0
v 1 0 0
v 0 1 0
v 9 9 9
vn 0 0 1
vt 0.25 0.75
vt 1 1
o front side
f 1/1/1 2/2/1 3//1
o back
v 5 5 5
f 3 2 1 5
"""

PLY = """\
ply
format {} 1.0
comment made by hand
element face 1
property list uchar int vertex_indices
property uchar flags
element vertex 3
property double nx
property double x
property float y
property short z
property list uchar short ignored
property float ny
property float nz
end_header
"""
PLY_POINTS = [((0, 0, 1), (0.1, 2, -3), [5]), ((0, 1, 0), (4, 5.5, 6), []), ((1, 0, 0), (7, 8, 9), [1, 2])]


def text_ply():
    return PLY.format("ascii") + "3 2 0 1 77\n" + "".join(
        f"{n[0]} {p[0]} {p[1]} {p[2]} {len(rest)} {' '.join(map(str, rest))} {n[1]} {n[2]}\n" for n, p, rest in PLY_POINTS)


def binary_ply(order, name):
    return PLY.format(name).encode() + struct.pack(order + "B3iB", 3, 2, 0, 1, 77) + b"".join(
        struct.pack(f"{order}ddfhB{len(rest)}hff", n[0], *p, len(rest), *rest, n[1], n[2]) for n, p, rest in PLY_POINTS)


NOFF = "NOFF # kind\n\n3 1\n# points\n0 0 0 0 0 1\n1 0 0  0 0 1 0 1 0\n0 0 1\n\n3 0 1 2 255 0 0\n"

STL = "solid part one\n" + "".join(
    "facet normal 0 0 1\nouter loop\n" + "".join(f"vertex {corner}\n" for corner in corners) + "endloop\nendfacet\n"
    for corners in (("0 0 0", "1 0 0", "1 1 0"), ("-0 0 0", "1 1 0", "0 1 0"))) + "endsolid part one\n"
# A binary file may start with the same word.
BINARY_STL = b"solid".ljust(80) + struct.pack("<I", 2) + b"".join(
    struct.pack("<12fH", 0, 0, 1, *corners, 0) for corners in ((0, 0, 0, 1, 0, 0, 1, 1, 0), (0, 0, 0, 1, 1, 0, 0, 1, 0)))


def float32(text):
    return struct.unpack("f", struct.pack("f", float(text)))[0]


class Import(tool.ToolTest):
    def imported(self, name, content):
        return self.zon("import", self.write(name, content), "out.zon").stderr

    def counted(self):
        """Name and number of faces of each object."""
        return [(each["name"], each["components"][2]["count"]) for each in self.json("info", "out.zon")["objects"]]

    def test_every_format_gives_its_faces_in_order(self):
        for name, content, corners, last_point, warning in (
                ("a.obj", QUAD_AND_TRIANGLE, "0, 1, 2, 3, 1, 4, 2", (2, 0.5, -0.001), ""),
                ("a.off", NOFF, "0, 1, 2", (0, 1, 0), "colours"),
                ("a.stl", STL, "0, 1, 2, 0, 2, 3", (0, 1, 0), ""),
                ("b.stl", BINARY_STL, "0, 1, 2, 0, 2, 3", (0, 1, 0), ""),
                ("a.ply", text_ply(), "2, 0, 1", (7, 8, 9), "face.flags, vertex.ignored"),
                ("b.ply", binary_ply("<", "binary_little_endian"), "2, 0, 1", (7, 8, 9), "face.flags, vertex.ignored"),
                ("c.ply", binary_ply(">", "binary_big_endian"), "2, 0, 1", (7, 8, 9), "face.flags, vertex.ignored")):
            self.assertIn(warning, self.imported(name, content), name)
            self.assertEqual(self.dumped("out.zon", "face_vertex", "data"), corners, name)
            self.assertEqual(self.vectors("out.zon", "point_position")[-1], last_point, name)
            if name.endswith("ply"):
                self.assertEqual(self.vectors("out.zon", "point_normal"), [n for n, _, _ in PLY_POINTS])

    def test_objects_get_their_own_points_and_names(self):
        self.imported("two.obj", TWO_OBJECTS)
        front, back = self.objects("out.zon")
        # The point that no face names goes to the first object, because it comes before any.
        self.assertEqual((front[2]["point_component"], back[2]["point_component"]), (4, 4))
        self.assertEqual(front[1]["face_vertex_uv"], ("data", "array<Math::float2>", 2, "face_vertex_uv_index"))
        self.assertNotIn("face_vertex_normal", back[1])
        self.assertEqual(self.counted(), [("front side", 1), ("back", 1)])
        self.assertEqual(self.dumped("out.zon", "face_vertex_uv_index", "indices"), "0, 1, 4294967295")
        # Groups count only where there is no object; a lone carriage return begins no statement.
        faces = "v 0 0 0\nv 1 0 0\nv 0 1 0\n{}f 1 2 3\n{}f 3 2 1\n{}f 1 3 2\r\n"
        self.assertEqual(self.imported("g.obj", faces.format("g a\rf 1 1 1\n", "g b\n", "g a f 1 1 1\n")), "")
        self.assertEqual(self.counted(), [("a f 1 1 1", 2), ("b", 1)])
        self.assertIn("groups", self.imported("o.obj", faces.format("o a\n", "g b\n", "")))
        self.assertEqual(len(self.counted()), 1)

    def test_numbers_are_the_nearest_floats(self):
        # The first is half-way between two floats, but for a digit that a double does not hold: rounded once.
        texts = ["1.00000005960464477539063", "-.5", "+3.", "1e-45", "1e-60", "16777217", "8388609.5", "3.4028235e38", "0.1"]
        draw = random.Random(7)
        texts += [repr(draw.uniform(-1, 1) * 10 ** draw.randint(-30, 30)) for _ in range(2001)]
        rows = [" ".join(triple) for triple in zip(*[iter(texts)] * 3)]
        for name, text in (("a.obj", "\n".join("v " + row for row in rows)),
                           ("a.off", f"OFF {len(rows)} 0 0\n" + "\n".join(rows))):
            self.imported(name, text)
            self.zon("export", "out.zon", "back.obj")
            got = [float32(word) for word in (self.folder / "back.obj").read_text().split() if word != "v"]
            self.assertEqual(got, [float32("1.0000001"), *map(float32, texts[1:])], name)

    def test_broken_files_give_line_and_reason(self):
        for name, text, line, reason in (
                ("a.obj", "v 0 0 0\n\nv 1 0 x\n", 3, "'x' is no number"),
                ("a.obj", "v 0 0 1e39\n", 1, "'1e39' is no number that a float holds"),
                ("a.obj", "v 0 0 0\nf 1 1 2\n", 2, "point index 2, but only 1 were stated so far"),
                ("a.obj", "v 0 0 0\nf 1 0 1\n", 2, "index 0"),
                ("a.obj", "v 0 0 0\nf 1 1 -2\n", 2, "point index -2"),
                ("a.obj", "v 0 0 0\nf 1//1 1//1 1//1\n", 2, "normal index 1"),
                ("a.obj", "v 0 0 0\nf 1 1 4294967297\n", 2, "is no corner"),
                ("a.obj", "v 0 0 0\nf\n", 2, "a face without corners"),
                ("a.obj", "v 0 0 0\nhello world\n", 2, "'hello' is no statement"),
                ("a.obj", "v 0 0 0\nv \0 1 2\n", 2, "a zero byte"),
                ("a.obj", "# nothing\n", 1, "no points"),
                ("a.off", "OFT\n1 0 0\n0 0 0\n", 1, "'OFT' is not the word OFF"),
                ("a.off", "OFF\n3 1 0\n0 0 0\n1 0 0\n0 1 0\n3 0 1 3\n", 6, "a point index is 3, outside of 0 to 2"),
                ("a.off", "OFF\n4000000000 1 0\n0 0 0\n", 3, "the file ends before"),
                ("a.ply", "ply\nformat binary_", 2, "'binary_' is no format"),
                ("a.ply", "ply\nformat ascii 1.0\nelement vertex 1\n" + 2 * "property float x\n", 5, "'x' is named twice"),
                ("a.ply", "ply\nformat ascii 1.0\nelement vertex 9\nproperty float x\nend_header\n1\n", 5, "lack x, y or z"),
                ("a.stl", "solid a\nfacet normal 0 0 1\nloop\n", 3, "'loop' where 'outer' belongs")):
            with self.subTest(text):
                error = self.zon("import", self.write(name, text), "out.zon", code=2).stderr
                self.assertRegex(error, f"{name}:{line}: .*{re.escape(reason)}")
                self.assertNotIn("out.zon", self.names())

    def test_no_prefix_of_a_file_crashes(self):
        for name, data in (("a.ply", binary_ply("<", "binary_little_endian")), ("a.stl", BINARY_STL), ("a.off", NOFF.encode())):
            for length in range(0, len(data), 5):
                self.write(name, data[:length])
                # The program reports every fault itself: never a signal, never an unknown exception.
                result = self.zon("import", name, "out.zon", code=(0, 2))
                self.assertTrue(result.returncode == 0 or f"error: {name}:" in result.stderr, result.stderr)


class Export(tool.ToolTest):
    def test_import_of_an_export_is_the_same_object(self):
        for name, content in (("quad.obj", QUAD_AND_TRIANGLE), ("two.obj", TWO_OBJECTS),
                              ("points.off", "OFF 2 0 0\nnan -0 inf\n-inf 1e-45 16777216\n"),
                              ("three.obj", "o a\nv 0 0 0\no b\nv 1 1 1\nv 2 2 2\nvn 1 0 0\nvn 0 0 1\no a\nf 2//2 3 1\nf 1 1\n")):
            self.zon("import", self.write(name, content), "first.zon")
            self.assertEqual(self.zon("export", "first.zon", "back.obj").stderr, "", name)
            self.zon("import", "back.obj", "second.zon")
            self.zon("diff", "first.zon", "second.zon")

    def test_what_has_no_mesh_and_what_would_overwrite_its_source_is_refused(self):
        walk = tool.pathlib.Path(__file__).parents[1] / "corpus/streams/valid/v6_walk.zon"
        self.assertIn("no mesh", self.zon("export", walk, "out.obj", code=2).stderr)
        self.import_text("quad.obj", QUAD_AND_TRIANGLE)
        for command, name in (("import", "quad.obj"), ("export", "quad.zon")):
            before = (self.folder / name).read_bytes()
            self.assertIn("is the file that is read", self.zon(command, name, "./" + name, code=2).stderr)
            self.assertEqual((self.folder / name).read_bytes(), before)

    def test_names_from_a_file_send_nothing_to_the_terminal(self):
        self.assertIn("normals that no face uses",
                      self.import_text("named.obj", "\ufeffo \x1b[2Jred\nv 0 0 0\nv 1 0 0\nvn 0 0 1\n"))
        for command in ("info", "dump"):
            text = self.zon(command, "named.zon").stdout
            self.assertIn("?[2Jred", text)
            self.assertNotIn("\x1b", text)
        self.import_text("c1.obj", "o \x9b31m\nv 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\n")
        self.assertIn("??31m", self.zon("info", "c1.zon").stdout)
        # A name that OBJ cannot keep comes in a warning.
        self.import_text("red.obj", "o a\x1b[31mb\nv 0 0 0\nv 1 0 0\nv 0 1 0\nf 1 2 3\n")
        said = self.zon("export", "red.zon", "back.obj").stderr
        self.assertIn('"a?[31mb"', said)
        self.assertNotIn("\x1b", said)
