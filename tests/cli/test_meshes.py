"""zon normals, zon diagnose and zon strands: what they compute, store and report beyond the examples of their page."""
import math

import tool
import zon_files

# Two quads that meet in a ridge along z at 90 degrees, as a roof.
ROOF = "OFF 6 2 0\n-1 0 0\n-1 0 1\n0 1 0\n0 1 1\n1 0 0\n1 0 1\n4 0 1 3 2\n4 2 3 5 4\n"
SQUARE = [(0, 0, 0), (1, 0, 0), (1, 1, 0), (0, 1, 0)]


class Normals(tool.ToolTest):
    def setUp(self):
        super().setUp()
        self.import_text("roof.off", ROOF)

    def assert_vectors(self, found, expected):
        self.assertEqual(len(found), len(expected))
        for vector, right in zip(found, expected):
            self.assertLess(math.dist(vector, right), 1e-5)

    def test_each_kind_is_stored_under_its_name(self):
        left, right = (-math.sqrt(0.5), math.sqrt(0.5), 0), (math.sqrt(0.5), math.sqrt(0.5), 0)
        self.zon("normals", "roof.zon", "--face")
        self.assert_vectors(self.vectors("roof.zon", "face_normal"), [left, right])
        self.zon("normals", "roof.zon", "-o", "points.zon")
        self.assert_vectors(self.vectors("points.zon", "point_normal"), [left, left, (0, 1, 0), (0, 1, 0), right, right])
        properties = self.objects("points.zon")[0][1]
        self.assertEqual(properties["face_normal"][2:], (2, "face_component"))
        self.assertEqual(properties["point_normal"][2:], (6, "point_component"))

    def test_weights(self):
        # A corner of a box: one face 1 x 1, one 1 x 4, one of two triangles that share the corner's right angle.
        self.import_text("corner.off", "OFF 7 4 0\n0 0 0\n1 0 0\n0 4 0\n0 0 1\n1 4 0\n1 0 1\n0 4 1\n"
                                       "4 0 2 4 1\n4 0 1 5 3\n3 0 3 6\n3 0 6 2\n")
        # Weights at point 0 of the faces -z, -y, -x: number, area, angle (right angles), area times angle.
        split = math.atan2(4, 1), math.atan2(1, 4)
        for flags, weights in (([], (1, 1, 2)), (["--area"], (4, 1, 4)), (["--angle"], (1, 1, 1)),
                               (["--area", "--angle"], (4 * math.pi / 2, math.pi / 2, 2 * sum(split)))):
            self.zon("normals", "corner.zon", *flags)
            expected = tuple(-weight / math.hypot(*weights) for weight in reversed(weights))
            self.assert_vectors(self.vectors("corner.zon", "point_normal")[:1], [expected])

    def test_creases_part_corners(self):
        for arguments, count in ((["--crease", "89.9"], 8), (["--crease", "90.1"], 6), (["--face-vertex"], 8)):
            self.zon("normals", "roof.zon", *arguments, "-o", "split.zon")
            indices = [int(i) for i in self.dumped("split.zon", "face_vertex_normal_index", "indices").split(",")]
            normals = self.vectors("split.zon", "face_vertex_normal")
            self.assertEqual((len(normals), len(indices), max(indices)), (count, 8, count - 1), arguments)
            # Corner 2 of the first face lies on the ridge, as corner 1 of the second.
            self.assertEqual(indices[2] == indices[5], count == 6)
        self.zon("export", "split.zon", "split.obj")
        self.zon("import", "split.obj", "again.zon")
        self.zon("diff", "split.zon", "again.zon", "--tolerance", "0")

    def test_wrong_use_and_what_is_no_mesh(self):
        before = (self.folder / "roof.zon").read_bytes()
        for arguments in (["--point", "--face"], ["--face", "--angle"], ["--face", "--crease", "3"],
                          ["--point", "--crease", "3"], ["--crease", "181"], ["--crease", "nan"]):
            self.zon("normals", "roof.zon", *arguments, code=2)
        self.import_cloud()
        result = self.zon("normals", "cloud.zon", "-o", "none.zon", code=1)
        self.assertIn("object 0: is no mesh", result.stderr)
        self.assertEqual((self.folder / "roof.zon").read_bytes(), before)
        self.assertNotIn("none.zon", self.names())
        self.assertEqual(self.json("normals", "roof.zon", "--face-vertex"), {
            "file": "roof.zon",
            "stored": [{"object": 0, "property": "face_vertex_normal", "normals": 8, "elements": 8}]})


class Diagnose(tool.ToolTest):
    def findings(self, name):
        one, = self.json("diagnose", name, code=1)["objects"]
        return {kind: (found["count"], found["first"]) for kind, found in one["findings"].items() if found["count"]}

    def test_faults_are_listed_and_end_with_code_1(self):
        # Twelve pairs of quads over one grid of points, the second of each pair turned against the first.
        points = "".join(f"{x} {y} 0\n" for y in range(12) for x in range(4))
        faces = "".join(f"4 {4 * y} {4 * y + 1} {4 * y + 5} {4 * y + 4}\n4 {4 * y + 1} {4 * y + 5} {4 * y + 6} {4 * y + 2}\n"
                        for y in range(11))
        self.import_text("turned.off", f"OFF 48 22 0\n{points}{faces}")
        self.assertEqual(self.findings("turned.zon"), {"isolated_points": (12, [3 + 4 * i for i in range(10)]),
                                                       "inconsistent_faces": (22, list(range(10)))})
        self.assertIn("22 faces turned against neighbours: 0, 1, 2, 3, 4, 5, 6, 7, 8, 9, ...",
                      self.zon("diagnose", "turned.zon", code=1).stdout)
        self.import_text("flat.off", "OFF 3 2 0\n0 0 0\n1 1 1\n2 2 2\n3 0 1 2\n3 0 0 1\n")
        self.assertEqual(self.findings("flat.zon"), {"zero_area_faces": (1, [0]), "degenerate_faces": (1, [1])})

    def test_a_mesh_that_cannot_be_measured_is_not_called_clean_and_what_is_no_mesh_has_no_faults(self):
        self.import_cloud()
        self.assertEqual(self.json("diagnose", "cloud.zon")["objects"], [{"is_mesh": False}])
        self.assertEqual(self.zon("diagnose", "cloud.zon").stdout, "object 0: no mesh\n")
        for counts in ((5, 4, 1), (4, 4, 2)):
            broken = zon_files.mesh(SQUARE, [0, 1, 2, 3], [0, 4], counts=counts)
            self.write("broken.zon", zon_files.stream([broken, zon_files.mesh(SQUARE, [0, 1, 2, 3], [0, 4])]))
            first, second = self.json("diagnose", "broken.zon", code=1)["objects"]
            self.assertEqual(first, {"is_mesh": True, "is_broken": True})
            self.assertEqual([second[key] for key in ("is_broken", "points", "faces", "face_vertices", "edges",
                                                      "boundary_edges", "euler_characteristic", "betti_numbers")],
                             [False, 4, 1, 4, 4, 4, 1, [1, 0, 0]])
            self.assertIn("broken: arrays are too short", self.zon("diagnose", "broken.zon", code=1).stdout)
            self.assertIn("object 0: positions or topology are broken", self.zon("normals", "broken.zon").stderr)


class Strands(tool.ToolTest):
    def test_strands_stand_on_points_and_broken_ones_are_told(self):
        self.zon("make", "cube", "cube.zon")
        self.zon("make", "strands", "cube.zon", "hair.zon", "--length", "3", "--points", "4")
        # The strands leave along the diagonals: their ends form a cube around the first.
        for end in self.vectors("hair.zon", "point_position")[3::4]:
            for number in end:
                self.assertAlmostEqual(abs(number), 0.5 + math.sqrt(3), places=4)
        self.zon("make", "strands", "cube.zon", "dots.zon", "--points", "1")
        one, = self.json("strands", "dots.zon")["objects"]
        self.assertEqual([one[key] for key in ("strands", "points", "total", "shortest", "mean", "longest", "lengths")],
                         [8, 8, 0, 0, 0, 0, [0] * 8])
        self.assertEqual(self.zon("strands", "cube.zon").stdout, "object 0: no strands\n")
        self.zon("make", "strands", "dots.zon", "none.zon", "--points", "0", code=2)
        self.import_cloud()
        self.assertIn("no points with normals", self.zon("make", "strands", "cloud.zon", "none.zon", code=2).stderr)
        broken = {"point_component": zon_files.component(3), "strand_component": zon_files.component(1),
                  "point_position": zon_files.points([(0, 0, 0)] * 2),
                  "strand_offset": zon_files.indices([0, 3], "strand_component")}
        self.write("broken.zon", zon_files.stream([broken]))
        self.assertEqual(self.json("strands", "broken.zon", code=1)["objects"], [{"is_strands": True, "is_broken": True}])


if __name__ == "__main__":
    tool.main()
