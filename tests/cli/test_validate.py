"""zon validate: what it judges, how it reports, how it ends."""
import tool
import zon_files
from zon_files import component, data, indices, mesh, obj, part, points, text

TRIANGLE = [(0, 0, 0), (1, 0, 0), (0, 1, 0)]


class Validate(tool.ToolTest):
    def judged(self, *arguments, code=0):
        """Path, kind and messages of each object."""
        report = self.json("validate", *arguments, code=code)
        objects = [each for file in report["files"] for each in file["objects"]]
        self.assertEqual(report["valid"], all(each["valid"] for each in objects))
        return [(each["path"], each["kind"], [failure["message"] for failure in each["failures"]]) for each in objects]

    def test_the_first_failure_or_all_of_them(self):
        self.write("bad.zon", zon_files.stream([mesh(
            TRIANGLE[:2], [0, 1, 3], [0, 4], counts=(3, 3, 1), point_mass=indices([1], "nowhere"),
            face_mass=indices([5], "face_component"))]))
        messages = ["point_position has an invalid number of elements",
                    "face_vertex contains an invalid index into point_component",
                    "face_offset contains an invalid index into face_component",
                    "point_mass has no target"]
        self.assertEqual(self.judged("bad.zon", "--all", code=1), [("0", "mesh", messages)])
        one, = self.json("validate", "bad.zon", code=1)["files"][0]["objects"][0]["failures"]
        self.assertEqual(one, {"code": 4, "name": "InvalidElementCount", "property": "point_position",
                               "message": messages[0]})
        self.assertIn("object 0: mesh: invalid\n    4 InvalidElementCount: " + messages[0],
                      self.zon("validate", "bad.zon", code=1).stdout)

    def test_objects_are_judged_by_what_they_were_meant_to_be_and_wherever_they_are(self):
        broken = mesh(TRIANGLE, [0, 1, 2], [0, 3])
        broken["face_offset"] = points(TRIANGLE, "face_component")
        instances = {"point_component": component(2),
                     "instance_shape": data([363, [1, [obj(mesh(TRIANGLE, [0, 1, 2], [0, 3])), obj(broken)]]],
                                            "point_component", part(None))}
        self.write("mixed.zon", zon_files.stream([
            {"note": text("no geometry")}, instances, zon_files.strands(2, TRIANGLE[:2], [0, 3]),
            {"point_position": component(1)}, {"lost": indices([], "")}, {"voxel_tile_tree": component(1)}]))
        self.assertEqual(self.judged("mixed.zon", code=1), [
            ("0", "object", []),
            ("1", "instances", []),
            ("2", "strands", ["strand_offset contains an invalid index into strand_component"]),
            ("3", "point cloud", ["Object is not a valid point cloud"]),
            ("4", "object", ["lost has no target"]),
            ("5", "volume", ["Object is not a valid volume"]),
            ("1/instance_shape/data[0]", "mesh", []),
            ("1/instance_shape/data[1]", "mesh", ["Object is not a valid mesh"])])

    def test_notes_count_only_when_asked_to_and_unreadable_files_end_with_code_2(self):
        self.write("notes.zon", zon_files.stream([mesh(TRIANGLE + [(9, 9, 9)], [0, 1, 2, 0, 1, 1], [0, 3, 6])]))
        one = self.json("validate", "notes.zon")["files"][0]["objects"][0]
        self.assertEqual([(note["finding"], note["count"], note["first"]) for note in one["notes"]],
                         [("isolated_points", 1, [3]), ("degenerate_faces", 1, [1])])
        self.assertTrue(self.json("validate", "notes.zon", "--strict", code=1)["valid"])
        for name in ("cut.zon", "missing.zon"):
            self.write("cut.zon", (self.folder / "notes.zon").read_bytes()[:-9])
            result = self.zon("validate", "notes.zon", name, "--json", code=2)
            self.assertIn(name, result.stderr)
            self.assertEqual(result.stdout, "")
