"""Mesh files become objects and objects become mesh files."""
import itertools
import math
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


def float32(text):
    return struct.unpack("f", struct.pack("f", float(text)))[0]


def stl_facet(*corners):
    return "facet normal 0 0 1\nouter loop\n" + "".join(f"vertex {c}\n" for c in corners) + "endloop\nendfacet\n"


class Import(tool.ToolTest):
    def imported(self, name, content):
        return self.zon("import", self.write(name, content), "out.zon").stderr

    def counted(self):
        """Name and number of faces of each object."""
        return [(each["name"], each["components"][2]["count"]) for each in self.json("info", "out.zon")["objects"]]

    def test_polygons_stay_and_negative_indices_count_back(self):
        self.assertEqual(self.imported("a.obj", QUAD_AND_TRIANGLE), "")
        self.assertEqual(self.dumped("out.zon", "face_vertex", "data"), "0, 1, 2, 3, 1, 4, 2")
        self.assertEqual(self.dumped("out.zon", "face_offset", "data"), "0, 4, 7")
        self.assertEqual(self.objects("out.zon")[0][0], "mesh")

    def test_objects_get_their_own_points_and_names(self):
        self.imported("two.obj", TWO_OBJECTS)
        front, back = self.objects("out.zon")
        # The point that no face names goes to the first object, because it comes before any.
        self.assertEqual((front[2]["point_component"], back[2]["point_component"]), (4, 4))
        self.assertEqual(front[1]["face_vertex_normal"],
                         ("data", "array<Math::float3>", 1, "face_vertex_normal_index"))
        self.assertEqual(front[1]["face_vertex_uv"], ("data", "array<Math::float2>", 2, "face_vertex_uv_index"))
        self.assertEqual(front[1]["face_vertex_uv_index"], ("range", "array<unsigned int>", 3, "face_vertex_component"))
        self.assertNotIn("face_vertex_normal", back[1])
        self.assertEqual(self.counted(), [("front side", 1), ("back", 1)])
        self.assertEqual(self.dumped("out.zon", "face_vertex_uv_index", "indices"), "0, 1, 4294967295")

    def test_a_lone_carriage_return_begins_no_statement(self):
        self.imported("names.obj", "v 0 0 0\nv 1 0 0\nv 0 1 0\ng side\rf 1 1 1\nf 1 2 3\r\n")
        self.assertEqual(self.counted(), [("side f 1 1 1", 1)])

    def test_groups_make_objects_only_where_there_is_no_object(self):
        faces = "v 0 0 0\nv 1 0 0\nv 0 1 0\n{}f 1 2 3\n{}f 3 2 1\n{}f 1 3 2\n"
        self.assertEqual(self.imported("g.obj", faces.format("g a\n", "g b\n", "g a\n")), "")
        self.assertEqual(self.counted(), [("a", 2), ("b", 1)])
        self.assertIn("groups", self.imported("o.obj", faces.format("o a\n", "g b\n", "")))
        self.assertEqual(len(self.counted()), 1)

    def test_numbers_are_the_nearest_floats(self):
        texts = ["0.1", "-.5", "+3.", "1e-45", "1e-60", "16777217", "0.30000001192092896", "8388609.5", "3.4028235e38",
                 "1.000000059604644"]
        draw = random.Random(7)
        texts += [repr(draw.uniform(-1, 1) * 10 ** draw.randint(-30, 30)) for _ in range(2000)]
        triples = list(zip(*[iter(texts)] * 3))
        def rows(form):
            return "".join(form.format(*triple) + "\n" for triple in triples)

        axes = "".join(f"property float {axis}\n" for axis in "xyz")
        for name, text in (("a.obj", rows("v {} {} {}")), ("a.off", f"OFF {len(triples)} 0 0\n" + rows("{} {} {}")),
                           ("a.ply", f"ply\nformat ascii 1.0\nelement vertex {len(triples)}\n{axes}end_header\n" +
                            rows("{} {} {}"))):
            self.imported(name, text)
            self.zon("export", "out.zon", "back.obj")
            got = [float32(word) for word in (self.folder / "back.obj").read_text().split() if word != "v"]
            self.assertEqual(got, list(map(float32, texts)), name)
        # Half-way between two floats, give or take a digit that a double does not hold: rounded once.
        self.imported("a.obj", "v 1.00000005960464477539062 1.000000059604644775390625 1.00000005960464477539063\n")
        self.zon("export", "out.zon", "back.obj")
        self.assertEqual((self.folder / "back.obj").read_text(), "v 1 1 1.0000001\n")

    def test_off_with_normals_colours_comments_and_free_lines(self):
        text = "NOFF # kind\n\n3 1\n# points\n0 0 0 0 0 1\n1 0 0  0 0 1 0 1 0\n0 0 1\n\n3 0 1 2 255 0 0\n"
        self.assertIn("colours", self.imported("a.off", text))
        self.assertEqual(self.objects("out.zon")[0][1]["point_normal"],
                         ("data", "array<Math::float3>", 3, "point_component"))
        self.assertEqual(self.dumped("out.zon", "point_position", "data"), "{0f, 0f, 0f}, {1f, 0f, 0f}, {0f, 1f, 0f}")
        self.assertEqual(self.dumped("out.zon", "face_vertex", "data"), "0, 1, 2")
        self.assertEqual(self.dumped("out.zon", "face_offset", "data"), "0, 3")

    def test_ply_in_its_three_formats_gives_the_same_object(self):
        points = [((0, 0, 1), (0.1, 2, -3), [5]), ((0, 1, 0), (4, 5.5, 6), []), ((1, 0, 0), (7, 8, 9), [1, 2])]
        body = "3 2 0 1 77\n" + "".join(f"{n[0]} {p[0]} {p[1]} {p[2]} {len(l)} {' '.join(map(str, l))} {n[1]} {n[2]}\n"
                                        for n, p, l in points)
        self.assertIn("face.flags, vertex.ignored", self.imported("a.ply", PLY.format("ascii") + body))
        self.zon("import", "a.ply", "text.zon")
        self.assertEqual(self.dumped("text.zon", "face_vertex", "data"), "2, 0, 1")
        for order, name in (("<", "binary_little_endian"), (">", "binary_big_endian")):
            binary = struct.pack(order + "B3iB", 3, 2, 0, 1, 77)
            for n, p, l in points:
                binary += struct.pack(f"{order}ddfhB{len(l)}hff", n[0], *p, len(l), *l, n[1], n[2])
            self.imported("b.ply", PLY.format(name).encode() + binary)
            self.zon("diff", "text.zon", "out.zon")

    def test_stl_joins_equal_positions_in_order(self):
        self.imported("a.stl", "solid part one\n" + stl_facet("0 0 0", "1 0 0", "1 1 0") +
                      stl_facet("-0 0 0", "1 1 0", "0 1 0") + "endsolid part one\n")
        self.assertEqual(self.json("info", "out.zon")["objects"][0]["name"], "part one")
        self.assertEqual(self.dumped("out.zon", "face_vertex", "data"), "0, 1, 2, 0, 2, 3")
        # A binary file may start with the same word.
        triangles = [(0, 0, 0, 1, 0, 0, 1, 1, 0), (0, 0, 0, 1, 1, 0, 0, 1, 0)]
        self.imported("b.stl", b"solid".ljust(80) + struct.pack("<I", 2) + b"".join(
            struct.pack("<12fH", 0, 0, 1, *corners, 0) for corners in triangles))
        self.assertEqual(self.dumped("out.zon", "face_vertex", "data"), "0, 1, 2, 0, 2, 3")

    def test_broken_files_give_line_and_reason(self):
        for name, text, line, reason in (
                ("a.obj", "v 0 0 0\nv 1 0\n", 2, "2 numbers where 3 belong"),
                ("a.obj", "v 0 0 0\n\nv 1 0 x\n", 3, "'x' is no number"),
                ("a.obj", "v 0 0 1e39\n", 1, "'1e39' is no number that a float holds"),
                ("a.obj", "v 0 0 0\nf 1 1 2\n", 2, "point index 2, but only 1 were stated so far"),
                ("a.obj", "v 0 0 0\nf 1 0 1\n", 2, "index 0"),
                ("a.obj", "v 0 0 0\nf 1 1 -2\n", 2, "point index -2"),
                ("a.obj", "v 0 0 0\nf 1//1 1//1 1//1\n", 2, "normal index 1"),
                ("a.obj", "v 0 0 0\nf 1 1 one\n", 2, "'one' is no corner"),
                ("a.obj", "v 0 0 0\nf 1 1 4294967297\n", 2, "is no corner"),
                ("a.obj", "v 0 0 0\nf 1/2/3/4 1 1\n", 2, "is no corner"),
                ("a.obj", "v 0 0 0\nf\n", 2, "a face without corners"),
                ("a.obj", "v 0 0 0\nhello world\n", 2, "'hello' is no statement"),
                ("a.obj", "v 0 0 0\nv \0 1 2\n", 2, "a zero byte"),
                ("a.obj", "# nothing\n", 1, "no points"),
                ("a.off", "OFT\n1 0 0\n0 0 0\n", 1, "'OFT' is not the word OFF"),
                ("a.off", "OFF\n3 1 0\n0 0 0\n1 0 0\n0 1 0\n3 0 1 3\n", 6, "a point index is 3, outside of 0 to 2"),
                ("a.off", "OFF\n3 2 0\n0 0 0\n1 0 0\n0 1 0\n3 0 1 2\n", 6, "the file ends before"),
                ("a.off", "OFF\n4000000000 1 0\n0 0 0\n", 3, "the file ends before"),
                ("a.off", "OFF\n1 1 0\n0 0 0\n0\n", 4, "a face without corners"),
                ("a.off", "OFF BINARY\n1 1 0\n", 1, "binary OFF is not read"),
                ("a.ply", "plx\n", 1, "does not start with"),
                ("a.ply", "ply\nformat binary_", 2, "'binary_' is no format"),
                ("a.ply", "ply\nformat ascii 1.0\nelement vertex 1\nproperty quad x\n", 4, "'quad' is no type"),
                ("a.ply", "ply\nformat ascii 1.0\nelement vertex 1\n" + 2 * "property float x\n", 5, "'x' is named twice"),
                ("a.ply", "ply\nformat ascii 1.0\nelement vertex 9\nproperty float x\nend_header\n1\n", 5, "lack x, y or z"),
                ("a.stl", "solid a\nfacet normal 0 0 1\nouter loop\nvertex 0 0\nendloop\n", 5, "'endloop' is no number"),
                ("a.stl", "solid a\nfacet normal 0 0 1\nloop\n", 3, "'loop' where 'outer' belongs")):
            with self.subTest(text):
                self.write(name, text)
                error = self.zon("import", name, "out.zon", code=2).stderr
                self.assertRegex(error, f"{name}:{line}: .*{re.escape(reason)}")
                self.assertNotIn("out.zon", self.names())

    def test_no_prefix_of_a_file_crashes(self):
        binary = PLY.format("binary_little_endian").encode() + struct.pack("<B3iB", 3, 2, 0, 1, 77) + b"".join(
            struct.pack("<ddfhBff", 0, 1, 2, 3, 0, 4, 5) for _ in range(3))
        stl = b"head".ljust(80) + struct.pack("<I", 1) + struct.pack("<12fH", *range(12), 1)
        for name, data in (("a.obj", TWO_OBJECTS.encode()), ("a.ply", binary), ("a.stl", stl),
                           ("a.off", b"NOFF\n3 1 0\n" + b"0 0 0 0 0 1\n" * 3 + b"3 0 1 2\n")):
            for length in itertools.chain(range(0, len(data), 3), (len(data),)):
                self.write(name, data[:length])
                # The program reports every fault itself: never a signal, never an unknown exception.
                result = self.zon("import", name, "out.zon", code=(0, 2))
                self.assertTrue(result.returncode == 0 or f"error: {name}:" in result.stderr, result.stderr)


class Export(tool.ToolTest):
    def test_import_of_an_export_is_the_same_object(self):
        self.write("quad.obj", QUAD_AND_TRIANGLE)
        self.write("two.obj", TWO_OBJECTS)
        self.write("points.off", "OFF 2 0 0\nnan -0 inf\n-inf 1e-45 16777216\n")
        self.write("three.obj", "o a\nv 0 0 0\no b\nv 1 1 1\nv 2 2 2\nvn 1 0 0\nvn 0 0 1\no a\nf 2//2 3 1\nf 1 1\n")
        for name in ("quad.obj", "two.obj", "points.off", "three.obj"):
            self.zon("import", name, "first.zon")
            self.assertEqual(self.zon("export", "first.zon", "back.obj").stderr, "", name)
            self.zon("import", "back.obj", "second.zon")
            self.zon("diff", "first.zon", "second.zon")
            self.zon("export", "second.zon", "again.obj")
            self.assertEqual((self.folder / "back.obj").read_bytes(), (self.folder / "again.obj").read_bytes())

    def test_shapes_come_back_and_losses_are_named(self):
        for shape, loss in (("cube", ""), ("plane", ""), ("sphere", "not kept: object 0: point_normal")):
            self.zon("make", shape, "first.zon")
            self.assertIn(loss, self.zon("export", "first.zon", "back.obj").stderr)
            self.zon("import", "back.obj", "second.zon")
            self.zon("diff", "first.zon", "second.zon", code=1 if loss else 0)
        walk = tool.pathlib.Path(__file__).parents[1] / "corpus/streams/valid/v6_walk.zon"
        self.assertIn("no mesh", self.zon("export", walk, "out.obj", code=2).stderr)
        self.assertNotIn("out.obj", self.names())

    def test_the_file_that_is_read_is_never_written_over(self):
        self.write("quad.obj", QUAD_AND_TRIANGLE)
        self.zon("import", "quad.obj", "quad.zon")
        for command, name in (("import", "quad.obj"), ("export", "quad.zon")):
            before = (self.folder / name).read_bytes()
            self.assertIn("is the file that is read", self.zon(command, name, "./" + name, code=2).stderr)
            self.assertEqual((self.folder / name).read_bytes(), before)

    def test_names_from_a_file_send_nothing_to_the_terminal(self):
        self.write("named.obj", "\ufeffo \x1b[2Jred\nv 0 0 0\nv 1 0 0\nvn 0 0 1\n")
        self.assertIn("normals that no face uses", self.zon("import", "named.obj", "named.zon").stderr)
        for command in ("info", "dump"):
            text = self.zon(command, "named.zon").stdout
            self.assertIn("?[2Jred", text)
            self.assertNotIn("\x1b", text)


if __name__ == "__main__":
    tool.main()
