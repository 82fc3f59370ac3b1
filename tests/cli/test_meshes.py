"""zon normals, zon diagnose and zon strands: what they compute, store and report beyond the examples of their page."""
import math

import tool
import zon_files

# Two quads that meet in a ridge along z at 90 degrees, as a roof.
ROOF = "OFF 6 2 0\n-1 0 0\n-1 0 1\n0 1 0\n0 1 1\n1 0 0\n1 0 1\n4 0 1 3 2\n4 2 3 5 4\n"
SQUARE = [(0, 0, 0), (1, 0, 0), (1, 1, 0), (0, 1, 0)]


class Meshes(tool.ToolTest):
    def setUp(self):
        super().setUp()
        self.import_text("roof.off", ROOF)

    def test_creases_part_corners(self):
        for arguments, count in ((["--crease", "89.9"], 8), (["--crease", "90.1"], 6), (["--face-vertex"], 8)):
            self.zon("normals", "roof.zon", *arguments, "-o", "split.zon")
            indices = [int(i) for i in self.dumped("split.zon", "face_vertex_normal_index", "indices").split(",")]
            normals = self.vectors("split.zon", "face_vertex_normal")
            self.assertEqual((len(normals), len(indices), max(indices)), (count, 8, count - 1), arguments)
            # Corner 2 of the first face lies on the ridge, as corner 1 of the second.
            self.assertEqual(indices[2] == indices[5], count == 6)
            self.assertLess(math.dist(normals[indices[0]], (-math.sqrt(0.5), math.sqrt(0.5), 0)), 1e-5)
        self.zon("export", "split.zon", "split.obj")
        self.zon("import", "split.obj", "again.zon")
        self.zon("diff", "split.zon", "again.zon", "--tolerance", "0")

    def test_wrong_use_and_what_is_neither_mesh_nor_strands(self):
        before = (self.folder / "roof.zon").read_bytes()
        for arguments in (["--point", "--face"], ["--face", "--angle"], ["--face", "--crease", "3"],
                          ["--point", "--crease", "3"], ["--crease", "181"], ["--crease", "nan"]):
            self.zon("normals", "roof.zon", *arguments, code=2)
        self.assertEqual((self.folder / "roof.zon").read_bytes(), before)
        self.import_cloud()
        self.assertIn("object 0: is no mesh", self.zon("normals", "cloud.zon", "-o", "none.zon", code=1).stderr)
        self.assertEqual(self.json("diagnose", "cloud.zon")["objects"], [{"is_mesh": False}])
        self.assertEqual(self.zon("strands", "cloud.zon").stdout, "object 0: no strands\n")
        self.zon("make", "strands", "roof.zon", "none.zon", "--points", "0", code=2)
        self.assertIn("no points with normals", self.zon("make", "strands", "cloud.zon", "none.zon", code=2).stderr)
        self.assertNotIn("none.zon", self.names())
        self.assertEqual(self.json("normals", "roof.zon", "--face"), {
            "file": "roof.zon", "stored": [{"object": 0, "property": "face_normal", "normals": 2, "elements": 2}]})

    def test_faults_are_counted_and_their_first_elements_listed(self):
        # Twelve pairs of quads over one grid of points, the second of each pair turned against the first.
        points = "".join(f"{x} {y} 0\n" for y in range(12) for x in range(4))
        faces = "".join(f"4 {4 * y} {4 * y + 1} {4 * y + 5} {4 * y + 4}\n4 {4 * y + 1} {4 * y + 5} {4 * y + 6} {4 * y + 2}\n"
                        for y in range(11))
        self.import_text("turned.off", f"OFF 48 22 0\n{points}{faces}")
        one, = self.json("diagnose", "turned.zon", code=1)["objects"]
        self.assertEqual({kind: (found["count"], found["first"]) for kind, found in one["findings"].items() if found["count"]},
                         {"isolated_points": (12, [3 + 4 * i for i in range(10)]),
                          "inconsistent_faces": (22, list(range(10)))})

    def test_what_cannot_be_measured_is_told_beside_what_can(self):
        square = zon_files.mesh(SQUARE, [0, 1, 2, 3], [0, 4])
        for counts in ((5, 4, 1), (4, 4, 2)):
            broken = zon_files.mesh(SQUARE, [0, 1, 2, 3], [0, 4], counts=counts)
            self.write("broken.zon", zon_files.stream([broken, square]))
            first, second = self.json("diagnose", "broken.zon", code=1)["objects"]
            self.assertEqual(first, {"is_mesh": True, "is_broken": True})
            self.assertEqual([second[key] for key in ("is_broken", "points", "faces", "face_vertices", "edges",
                                                      "boundary_edges", "euler_characteristic", "betti_numbers")],
                             [False, 4, 1, 4, 4, 4, 1, [1, 0, 0]])
            self.assertIn("object 0: positions or topology are broken", self.zon("normals", "broken.zon").stderr)
        strands = zon_files.strands(3, SQUARE[:2], [0, 3])
        self.write("broken.zon", zon_files.stream([strands, zon_files.strands(2, SQUARE[:2], [0, 2])]))
        first, second = self.json("strands", "broken.zon", code=1)["objects"]
        self.assertEqual(first, {"is_strands": True, "is_broken": True})
        self.assertEqual([second[key] for key in ("strands", "points", "total", "shortest", "mean", "longest", "lengths")],
                         [1, 2, 1, 1, 1, 1, [1]])
