"""Volumes from and to VDB files, what is told of them, and level sets of meshes and points."""
import math
import pathlib
import unittest

import tool
import zon_files

try:
    import pyopenvdb as vdb
except ImportError:
    vdb = None

needs_vdb = unittest.skipUnless(vdb, "python3-openvdb is not there")
STREAMS = pathlib.Path(__file__).resolve().parents[1] / "corpus/streams/valid"
CHANNELS = STREAMS / "v6_volume_channels.zon"


class Volumes(tool.ToolTest):
    def setUp(self):
        super().setUp()
        if "built without OpenVDB" in self.zon("import", "none.vdb", "none.zon", code=2).stderr:
            self.skipTest("the program was built without OpenVDB")

    def write_grids(self, name, *grids):
        vdb.write(str(self.folder / name), grids=list(grids))

    @needs_vdb
    def test_classes_become_the_channels_of_their_kind(self):
        sphere = vdb.createLevelSetSphere(radius=10, center=(2, 0, 0), voxelSize=0.5)
        sphere.name = "ball"
        fog = vdb.FloatGrid()
        fog.fill((0, 0, 0), (4, 9, 19), 0.5)
        fog.name, fog.gridClass = "smoke", "fog volume"
        self.write_grids("a.vdb", sphere, fog)
        self.zon("import", "a.vdb", "a.zon")
        kinds = [(kind, set(properties)) for kind, properties, _ in self.objects("a.zon")]
        # No channel of states: they follow from the values.
        self.assertEqual(kinds, [
            ("level set", {"voxel_tile_tree", "voxel_signed_distance", "name", "vdb_transform"}),
            ("fog volume", {"voxel_tile_tree", "voxel_fog_density", "name", "vdb_transform"})])
        ball, smoke = self.json("volume", "bounds", "a.zon")["objects"]
        for low, high, centre in zip(ball["min"], ball["max"], (2, 0, 0)):
            self.assertLess(abs(low - centre + 10), 1.01)
            self.assertLess(abs(high - centre - 10), 1.01)
        self.assertEqual(smoke, {"min": [0, 0, 0], "max": [5, 10, 20]})
        self.assertEqual(self.zon("validate", "a.zon").stdout.count("valid"), 2)

    @needs_vdb
    def test_what_a_volume_does_not_hold_is_refused_by_name(self):
        good, stretched, huge = vdb.FloatGrid(), vdb.FloatGrid(), vdb.FloatGrid()
        good.fill((0, 0, 0), (0, 0, 0), 1.0)
        good.name, stretched.name, huge.name = "good", "stretched", "huge"
        stretched.transform = vdb.createLinearTransform([[1, 0, 0, 0], [0, 2, 0, 0], [0, 0, 1, 0], [0, 0, 0, 1]])
        huge.fill((0, 0, 0), (8191, 8191, 8191), 1.0)
        self.write_grids("a.vdb", good, stretched, huge)
        said = self.zon("import", "a.vdb", "a.zon").stderr
        self.assertIn("grid 'stretched': its transform is not one positive scale and a translation", said)
        self.assertIn("grid 'huge': its regions of one value cover 1073741824 blocks of 8 x 8 x 8 voxels, and more than "
                      "2097152 are not taken", said)
        self.assertEqual(len(self.objects("a.zon")), 1)
        self.write_grids("b.vdb", stretched)
        self.assertIn("there is no grid in it that a zon file holds", self.zon("import", "b.vdb", "b.zon", code=2).stderr)
        self.write("cut.vdb", (self.folder / "a.vdb").read_bytes()[:500])
        self.assertIn("cut.vdb", self.zon("import", "cut.vdb", "cut.zon", code=2).stderr)
        self.assertNotIn("cut.zon", self.names())

    def test_channels_of_all_types_and_both_configurations_are_written(self):
        said = self.zon("export", CHANNELS, "a.vdb").stderr
        for loss in ("object 0: pairs: array<Math::float2>", "object 1: points: points", "object 1: other"):
            self.assertIn(loss, said)
        self.zon("import", "a.vdb", "b.zon")
        expected = [i % 7 for i in range(192) if i % 7]  # the values of the channels of this file
        for number, name in ((1, "voxel_ints"), (2, "voxel_doubles")):
            values = [v for v in self.dumped("b.zon", name, "data").split(", ") if v not in ("0", "0.0")]
            # Cells without a leaf tile stand for 64 voxels each.
            self.assertGreaterEqual(len(values), len(expected), name)
        # What was written once is written the same again.
        self.zon("export", "b.zon", "b.vdb")
        self.zon("import", "b.vdb", "c.zon")
        self.assertEqual(self.zon("diff", "b.zon", "c.zon").stdout.strip(), "equal")

    def test_meshes_become_consistent_level_sets_and_open_ones_are_warned_about(self):
        self.zon("make", "cube", "cube.zon")
        self.zon("volume", "from-mesh", "cube.zon", "solid.zon", "--voxel-size", "0.125")
        self.assertEqual(self.objects("solid.zon")[0][0], "level set")
        (volume,) = self.json("volume", "info", "solid.zon")["objects"]
        self.assertTrue(volume["containers"][0]["consistent"])
        self.assertIn("object 0: no voxel lies inside",
                      self.zon("volume", "from-mesh", "cube.zon", "none.zon", "--voxel-size=100").stderr)
        self.zon("make", "plane", "plane.zon")
        said = self.zon("volume", "from-mesh", "plane.zon", "open.zon", "--voxel-size", "0.1").stderr
        self.assertIn("object 0: its surface is not closed: 4 boundary edges", said)
        for source, size in (("solid.zon", "0.1"), *(("cube.zon", size) for size in ("0", "-1", "nan", "inf", "x"))):
            self.zon("volume", "from-mesh", source, "x.zon", f"--voxel-size={size}", code=2)
        for options, wanted in ((("--voxel-size=1e-4", "--band=1e6"), "more than the memory of this machine holds"),
                                (("--voxel-size=2e-5",), "with voxels that small its level set has some 9e+10 voxels"),
                                (("--voxel-size=1e-5",), "OpenVDB takes no voxels of size 1e-05"),
                                (("--voxel-size=0.1", "--band=0.9"), "at least 1")):
            self.assertIn(wanted, self.zon("volume", "from-mesh", "cube.zon", "x.zon", *options, code=2).stderr)
        self.assertNotIn("x.zon", self.names())

    def test_what_no_grid_holds_is_left_out_by_name(self):
        end = (1 << 31) - 4096  # of what OpenVDB fills in a time that ends
        heat = ("f", range(8))
        low, high = (zon_files.volume((0, z, 0), heat=heat) for z in (end - 8, end))
        tiny = zon_files.volume(voxel_size=1e-5, heat=heat)
        named = {"name": zon_files.text("smoke"), **zon_files.volume(heat=heat, soot=heat)}
        self.write("a.zon", zon_files.stream([high, low, tiny, named]))
        said = self.zon("export", "a.zon", "a.vdb").stderr
        for expected in (f"object 0: heat: it has values beyond coordinate {end}",
                         "object 2: heat: OpenVDB takes no voxels of size 1e-05", "object 3: name\n"):
            self.assertIn(expected, said)
        self.zon("import", "a.vdb", "b.zon")
        self.assertEqual(len(self.objects("b.zon")), 3)
        self.write("high.zon", zon_files.stream([high]))
        self.assertIn("beyond", self.zon("export", "high.zon", "high.vdb", code=2).stderr)
        self.assertNotIn("high.vdb", self.names())

    def test_only_states_go_into_the_grid_of_another_channel(self):
        values = tuple(range(1, 9))
        self.write("a.zon", zon_files.stream([zon_files.volume(
            heat=("f", values), heat_active=("?", [True] * 7 + [False]), wind=("f", values),
            wind_active=("f", values), lone_active=("?", [True] * 8))]))
        self.zon("export", "a.zon", "a.vdb")
        self.zon("import", "a.vdb", "b.zon")
        self.assertEqual([set(properties) - {"name", "voxel_tile_tree"} for _, properties, _ in self.objects("b.zon")],
                         [{"voxel_heat", "voxel_heat_active"}, {"voxel_lone_active"}, {"voxel_wind"},
                          {"voxel_wind_active"}])


class VolumesOfPoints(tool.ToolTest):
    def test_points_become_spheres(self):
        self.import_text("two.obj", "v 0 0 0\nv 5 0 0\n")
        self.zon("volume", "from-points", "two.zon", "balls.zon", "--radius", "1", "--voxel-size", "0.1")
        (box,) = self.json("volume", "bounds", "balls.zon")["objects"]
        for found, wanted in zip(box["min"] + box["max"], (-1, -1, -1, 6, 1, 1)):
            self.assertTrue(math.isclose(found, wanted, abs_tol=0.1001), box)
        self.assertEqual(self.json("volume", "bounds", "two.zon")["objects"], [{"min": [0, 0, 0], "max": [5, 0, 0]}])
        # How large voxels are is no property of the geometry, but of the file.
        self.zon("volume", "from-points", "two.zon", "fine.zon", "--radius", "1", "--voxel-size", "0.1000001")
        self.assertIn("voxelSize: value: 0.1 | 0.1000001", self.zon("diff", "balls.zon", "fine.zon", "--tolerance=0",
                                                                    "--max=99999", code=1).stdout)
        self.assertEqual(self.dumped("balls.zon", "voxel_tile_tree", "indices"), "", "they only count up")
        self.assertEqual(self.zon("volume", "info", "two.zon").stdout, "object 0: no volume\n")
        self.zon("volume", "from-points", "two.zon", "x.zon", "--radius", "1e9", "--voxel-size", "1e-9", code=2)

    def test_the_report_tells_of_parts_without_a_container(self):
        described = self.json("volume", "info", CHANNELS)["objects"][1]["points"]
        self.assertEqual([(each["points"], each["channels"][0]["elements"]) for each in described], [(3, 3)])
        described = self.json("volume", "info", STREAMS / "v6_volume_shared.zon")["objects"][1]
        self.assertTrue(described["is_volume"])
        self.assertEqual([each["name"] for each in described["topologies"]], ["voxel_component", "again"])

    def test_the_dump_shows_tiles_however_deep_a_volume_lies(self):
        deep = zon_files.volume(heat=("f", range(8)))
        for name in ("inner", "outer"):
            deep = {name: zon_files.part(zon_files.obj(deep))}
        self.write("deep.zon", zon_files.stream([deep]))
        self.assertIn("indices: [  ] 0 elements", self.zon("dump", "deep.zon").stdout)
