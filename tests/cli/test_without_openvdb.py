"""A program that was built without OpenVDB says so wherever it is needed, and leaves no file behind."""

import tool


class WithoutOpenVdb(tool.ToolTest):
    def test_what_needs_it_is_refused_with_what_to_install(self):
        self.zon("make", "cube", "cube.zon")
        self.write("smoke.vdb", "")
        for command in (("import", "smoke.vdb", "out.zon"), ("export", "cube.zon", "out.vdb"),
                        ("volume", "from-mesh", "cube.zon", "out.zon", "--voxel-size", "0.1")):
            said = self.zon(*command, code=2)
            self.assertEqual(said.stdout, "")
            self.assertIn("this program was built without OpenVDB: install it (Debian: libopenvdb-dev) and build again",
                          said.stderr)
        self.assertEqual(self.names(), ["cube.zon", "smoke.vdb"])
