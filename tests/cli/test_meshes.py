"""zon normals, zon diagnose and zon strands: what they compute, store and report."""
import math

import tool
import zon_files

# Two quads that meet in a ridge along z at 90 degrees, as a roof.
ROOF = "OFF 6 2 0\n-1 0 0\n-1 0 1\n0 1 0\n0 1 1\n1 0 0\n1 0 1\n4 0 1 3 2\n4 2 3 5 4\n"


class Normals(tool.ToolTest):
    def assert_vectors(self, found, expected):
        self.assertEqual(len(found), len(expected))
        for vector, right in zip(found, expected):
            for a, b in zip(vector, right):
                self.assertAlmostEqual(a, b, places=5)

    def setUp(self):
        super().setUp()
        self.write("roof.off", ROOF)
        self.zon("import", "roof.off", "roof.zon")

    def test_each_kind_is_stored_under_its_name(self):
        left, right = (-math.sqrt(0.5), math.sqrt(0.5), 0), (math.sqrt(0.5), math.sqrt(0.5), 0)
        self.zon("normals", "roof.zon", "--face")
        self.assert_vectors(self.vectors("roof.zon", "face_normal"), [left, right])
        self.zon("normals", "roof.zon", "-o", "points.zon")
        self.assert_vectors(self.vectors("points.zon", "point_normal"), [left, left, (0, 1, 0), (0, 1, 0), right, right])
        kind, properties, _ = self.objects("points.zon")[0]
        self.assertEqual(kind, "mesh")
        self.assertEqual(properties["face_normal"][2:], (2, "face_component"))
        self.assertEqual(properties["point_normal"][2:], (6, "point_component"))

    def test_weights(self):
        # A corner of a box: one face 1 x 1, one 1 x 4, one of two triangles that share the corner's right angle.
        self.write("corner.off", "OFF 7 4 0\n0 0 0\n1 0 0\n0 4 0\n0 0 1\n1 4 0\n1 0 1\n0 4 1\n"
                                 "4 0 2 4 1\n4 0 1 5 3\n3 0 3 6\n3 0 6 2\n")
        self.zon("import", "corner.off", "corner.zon")
        # Weights at point 0 of the faces -z, -y, -x: number, area, angle (right angles), area times angle.
        split = math.atan2(4, 1), math.atan2(1, 4)
        for flags, weights in (([], (1, 1, 2)), (["--area"], (4, 1, 4)), (["--angle"], (1, 1, 1)),
                               (["--area", "--angle"], (4 * math.pi / 2, math.pi / 2, 2 * sum(split)))):
            length = math.hypot(*weights)
            self.zon("normals", "corner.zon", *flags)
            expected = tuple(-w / length for w in reversed(weights))
            self.assert_vectors(self.vectors("corner.zon", "point_normal")[:1], [expected])

    def test_creases_part_corners(self):
        for arguments, count in ((["--crease", "89.9"], 4 + 4), (["--crease", "90.1"], 6), (["--face-vertex"], 8)):
            self.zon("normals", "roof.zon", *arguments, "-o", "split.zon")
            indices = [int(i) for i in self.dumped("split.zon", "face_vertex_normal_index", "indices").split(",")]
            normals = self.vectors("split.zon", "face_vertex_normal")
            self.assertEqual((len(normals), len(indices), max(indices)), (count, 8, count - 1), arguments)
            # Corners 2 and 3 of the first face lie on the ridge, as corners 1 and 0 of the second.
            self.assertEqual([indices[2] == indices[5], indices[3] == indices[4]], [count == 6] * 2)
            ridge = (0, 1, 0) if count == 6 else (-math.sqrt(0.5), math.sqrt(0.5), 0)
            self.assert_vectors([normals[indices[2]]], [ridge])
        kind, properties, _ = self.objects("split.zon")[0]
        self.assertEqual(properties["face_vertex_normal"][3], "face_vertex_normal_index")
        self.zon("export", "split.zon", "split.obj")
        self.zon("import", "split.obj", "again.zon")
        self.zon("diff", "split.zon", "again.zon", "--tolerance", "0")

    def test_wrong_use_and_what_is_no_mesh(self):
        before = (self.folder / "roof.zon").read_bytes()
        for arguments in (["--point", "--face"], ["--face", "--angle"], ["--face", "--crease", "3"],
                          ["--point", "--crease", "3"], ["--crease", "181"], ["--crease", "-1"], ["--crease", "nan"]):
            self.zon("normals", "roof.zon", *arguments, code=2)
        self.import_cloud()
        result = self.zon("normals", "cloud.zon", "-o", "none.zon", code=1)
        self.assertIn("object 0: is no mesh", result.stderr)
        self.assertEqual((self.folder / "roof.zon").read_bytes(), before)
        self.assertEqual(self.names(), ["cloud.off", "cloud.zon", "roof.off", "roof.zon"])
        self.assertEqual(self.json("normals", "roof.zon", "--face-vertex"), {
            "file": "roof.zon",
            "stored": [{"object": 0, "property": "face_vertex_normal", "normals": 8, "elements": 8}]})


class Diagnose(tool.ToolTest):
    def findings(self, name, code):
        one, = self.json("diagnose", name, code=code)["objects"]
        return one, {kind: (found["count"], found["first"]) for kind, found in one["findings"].items() if found["count"]}

    def test_counts_and_invariants(self):
        self.zon("make", "plane", "plane.zon", "--subdivisions", "3")
        one, found = self.findings("plane.zon", 0)
        self.assertEqual([one[key] for key in ("points", "faces", "face_vertices", "edges", "boundary_edges",
                                               "euler_characteristic", "components", "betti_numbers")],
                         [16, 9, 36, 24, 12, 1, 1, [1, 0, 0]])
        self.assertEqual(found, {})

    def test_faults_are_listed_and_end_with_code_1(self):
        # Twelve pairs of quads over one grid of points, the second of each pair turned against the first.
        points = "".join(f"{x} {y} 0\n" for y in range(12) for x in range(4))
        faces = "".join(f"4 {4 * y} {4 * y + 1} {4 * y + 5} {4 * y + 4}\n4 {4 * y + 1} {4 * y + 5} {4 * y + 6} {4 * y + 2}\n"
                        for y in range(11))
        self.write("turned.off", f"OFF 48 22 0\n{points}{faces}")
        self.zon("import", "turned.off", "turned.zon")
        one, found = self.findings("turned.zon", 1)
        self.assertEqual(found, {"isolated_points": (12, [3 + 4 * i for i in range(10)]),
                                 "inconsistent_faces": (22, list(range(10)))})
        self.assertIn("22 faces turned against neighbours: 0, 1, 2, 3, 4, 5, 6, 7, 8, 9, ...",
                      self.zon("diagnose", "turned.zon", code=1).stdout)
        self.write("flat.off", "OFF 3 2 0\n0 0 0\n1 1 1\n2 2 2\n3 0 1 2\n3 0 0 1\n")
        self.zon("import", "flat.off", "flat.zon")
        self.assertEqual(self.findings("flat.zon", 1)[1], {"zero_area_faces": (1, [0]), "degenerate_faces": (1, [1])})

    def test_what_is_no_mesh_has_no_faults(self):
        self.import_cloud()
        self.assertEqual(self.json("diagnose", "cloud.zon")["objects"], [{"is_mesh": False}])
        self.assertEqual(self.zon("diagnose", "cloud.zon").stdout, "object 0: no mesh\n")

    def test_a_mesh_that_cannot_be_measured_is_not_called_clean(self):
        square = [(0, 0, 0), (1, 0, 0), (1, 1, 0), (0, 1, 0)]
        for counts in ((5, 4, 1), (4, 4, 2)):
            broken = zon_files.mesh(square, [0, 1, 2, 3], [0, 4], counts=counts)
            whole = zon_files.mesh(square, [0, 1, 2, 3], [0, 4])
            self.write("broken.zon", zon_files.stream([broken, whole]))
            first, second = self.json("diagnose", "broken.zon", code=1)["objects"]
            self.assertEqual(first, {"is_mesh": True, "is_broken": True})
            self.assertEqual((second["is_broken"], second["edges"]), (False, 4))
            self.assertIn("broken: arrays are too short", self.zon("diagnose", "broken.zon", code=1).stdout)
            self.assertIn("object 0: positions or topology are broken", self.zon("normals", "broken.zon").stderr)


class Strands(tool.ToolTest):
    def test_lengths_and_totals(self):
        self.zon("make", "cube", "cube.zon")
        self.zon("make", "strands", "cube.zon", "hair.zon", "--length", "3", "--points", "4")
        one, = self.json("strands", "hair.zon", "--max", "2")["objects"]
        self.assertEqual((one["strands"], one["points"], len(one["lengths"])), (8, 32, 2))
        self.assertAlmostEqual(one["total"], 24, places=4)
        for length in (*one["lengths"], one["shortest"], one["mean"], one["longest"]):
            self.assertAlmostEqual(length, 3, places=5)
        # The strands stand on the corners and leave along the diagonals: their ends form a cube around the first.
        for end in self.vectors("hair.zon", "point_position")[3::4]:
            for number in end:
                self.assertAlmostEqual(abs(number), 0.5 + math.sqrt(3), places=4)

    def test_single_points_and_what_is_no_strands(self):
        self.zon("make", "cube", "cube.zon")
        self.zon("make", "strands", "cube.zon", "dots.zon", "--points", "1")
        one, = self.json("strands", "dots.zon")["objects"]
        self.assertEqual((one["total"], one["lengths"]), (0, [0] * 8))
        self.assertEqual(self.zon("strands", "cube.zon").stdout, "object 0: no strands\n")
        self.zon("make", "strands", "dots.zon", "none.zon", "--points", "0", code=2)
        self.import_cloud()
        broken = {"point_component": zon_files.component(3), "strand_component": zon_files.component(1),
                  "point_position": zon_files.points([(0, 0, 0)] * 2),
                  "strand_offset": zon_files.indices([0, 3], "strand_component")}
        self.write("broken.zon", zon_files.stream([broken]))
        self.assertEqual(self.json("strands", "broken.zon", code=1)["objects"], [{"is_strands": True, "is_broken": True}])
        self.assertIn("no points with normals", self.zon("make", "strands", "cloud.zon", "none.zon", code=2).stderr)


if __name__ == "__main__":
    tool.main()
