"""How the tool treats files, terminals and wrong usage."""
import os
import random
import resource
import signal
import stat
import subprocess
import time

import tool


def terminal_output(command, folder, **environment):
    """What `zon command` prints, stdout and stderr being one terminal."""
    return subprocess.run(["script", "-qec", f"'{tool.ZON}' {command}", "/dev/null"], cwd=folder, stdin=subprocess.DEVNULL,
                          env={**{k: v for k, v in os.environ.items() if k != "NO_COLOR"}, "TERM": "xterm", **environment},
                          capture_output=True, check=True, timeout=60).stdout


class Files(tool.ToolTest):
    def test_wrong_usage_and_unreadable_files_are_failures_that_say_why(self):
        self.write("text.zon", "no zon at all")
        self.write("mesh.xyz", "0 0 0")
        before = self.names()
        for command, words in (([], ""), (["nonsense"], "no subcommand 'nonsense'"),
                               (["make", "donut", "x"], "'donut'"), (["diff", "only-one.zon"], ""),
                               (["make", "cube", "x.zon", "--level", "10"], "level"),
                               (["make", "cube", "x.zon", "--size", "nan"], "size"),
                               (["make", "plane", "x.zon", "--subdivisions", "0"], "subdivisions"),
                               (["make", "sphere", "x.zon", "--size", "1"], "--size"),
                               (["diff", "a", "b", "--tolerance", "-1"], "tolerance"),
                               (["make", "cube", "."], "Is a directory"), (["make", "cube", "none/x.zon"], "No such file"),
                               (["make", "cube", ""], "no name"),
                               (["make", "cube", "/dev/full"], "/dev/full: cannot be written: No space left"),
                               (["info", "none.zon"], "none.zon: cannot be read: No such file"),
                               (["dump", "."], ".: cannot be read: Is a directory"),
                               (["diff", "text.zon", "text.zon"], "text.zon: bad header"),
                               (["verify", "text.zon"], "text.zon: no zon file"),
                               (["import", "mesh.xyz", "x.zon"], "mesh.xyz: meshes are read from"),
                               (["export", "text.zon", "x.stl"], "x.stl: meshes are written to .obj")):
            result = self.zon(*command, code=2)
            self.assertEqual(result.stdout, "", command)
            self.assertIn(words, result.stderr or "nothing")
        self.assertEqual(self.names(), before)
        self.assertIn("--help", self.zon("make", "cube", "--help").stdout)
        self.assertRegex(self.zon("--version").stdout, r"^zon \d+\.\d+\.\d+\n$")

    def test_a_report_that_cannot_be_printed_is_a_failure(self):
        self.zon("make", "cube", "cube.zon")
        with open("/dev/full", "w") as full:
            result = subprocess.run([tool.ZON, "dump", "cube.zon"], cwd=self.folder, stdout=full,
                                    stderr=subprocess.PIPE, encoding="utf-8")
        self.assertEqual((result.returncode, "No space left" in result.stderr), (2, True))

    def test_unusual_paths(self):
        os.mkdir(self.folder / "dir +ö")
        for path in ("./-dash", "dir +ö/Ü-測試", "x" * 251):
            self.zon("make", "cube", path + ".zon")
            self.zon("export", path + ".zon", path + ".obj")
            self.zon("import", path + ".obj", "./back.zon")
            self.zon("diff", path + ".zon", "back.zon")

    def test_a_file_that_cannot_be_written_leaves_the_old_one_and_nothing_else(self):
        large = ["--subdivisions", "300", "--level", "0"]
        self.zon("make", "plane", "big.zon", *large)
        self.write("old.zon", "old")
        self.write("old.obj", "old")
        before = self.names()

        def limit():
            resource.setrlimit(resource.RLIMIT_FSIZE, (4096, 4096))
            signal.signal(signal.SIGXFSZ, signal.SIG_IGN)
        for target, command in (("old.zon", ["make", "plane", "old.zon", *large]),
                                ("new.zon", ["make", "plane", "new.zon", *large]),
                                ("old.obj", ["export", "big.zon", "old.obj"])):
            result = self.zon(*command, code=2, preexec_fn=limit, restore_signals=False)
            self.assertIn(f"{target}: cannot be written: File too large", result.stderr)
        self.assertEqual(self.names(), before)
        self.assertEqual((self.folder / "old.zon").read_text() + (self.folder / "old.obj").read_text(), "oldold")

    def test_a_killed_import_leaves_the_old_file_or_the_new_one(self):
        for name, subdivisions in (("old", 100), ("new", 120)):
            self.zon("make", "plane", f"{name}.zon", "--subdivisions", str(subdivisions))
            self.zon("export", f"{name}.zon", f"{name}.obj")
        wholes = []
        start = time.monotonic()
        for name in ("old", "new"):
            self.zon("import", f"{name}.obj", "target.zon", "--level", "0")
            wholes.append((self.folder / "target.zon").read_bytes())
        duration = (time.monotonic() - start) / 2
        moments = random.Random(6)
        killed = 0
        for kill in range(200):
            program = subprocess.Popen([tool.ZON, "import", ["old", "new"][kill % 2] + ".obj", "target.zon",
                                        "--level", "0"], cwd=self.folder,
                                       stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
            # The end, where the file is put in its place, is the place to hit.
            time.sleep(duration * (moments.random() if kill % 4 else moments.uniform(0.8, 1.05)))
            # Now and then one comes to its end, so that what the next leaves is told from what was there.
            if kill % 20 > 1:
                program.kill()
            killed += program.wait() == -signal.SIGKILL
            self.assertIn((self.folder / "target.zon").read_bytes(), wholes)
            self.assertLessEqual(sum(name.endswith(".tmp") for name in self.names()), 1)
        self.assertGreater(killed, 0)
        # What the last one may have left goes with the next.
        self.write(".zon-1-0.tmp", "left by a killed program")
        self.zon("import", "new.obj", "target.zon")
        self.assertEqual(self.names(), ["new.obj", "new.zon", "old.obj", "old.zon", "target.zon"])

    def test_a_full_disk_leaves_the_old_file(self):
        disk = self.folder / "disk"
        disk.mkdir()
        if subprocess.run(["mount", "-t", "tmpfs", "-o", "size=64k", "none", disk], capture_output=True).returncode:
            self.skipTest("no file system may be mounted here")
        self.addCleanup(subprocess.run, ["umount", disk], check=True)
        (disk / "old.zon").write_text("old")
        error = self.zon("make", "plane", "disk/old.zon", "--subdivisions", "300", "--level", "0", code=2).stderr
        self.assertIn("disk/old.zon: cannot be written: No space left", error)
        self.assertEqual(([path.name for path in disk.iterdir()], (disk / "old.zon").read_text()), (["old.zon"], "old"))

    def test_links_and_modes_stay(self):
        self.zon("make", "cube", "real.zon")
        os.chmod(self.folder / "real.zon", 0o640)
        os.symlink("real.zon", self.folder / "link.zon")
        self.write(".zon-1-0.tmp", "left by a killed program")
        self.zon("make", "sphere", "link.zon")
        self.assertTrue((self.folder / "link.zon").is_symlink())
        self.assertEqual(stat.S_IMODE(os.stat(self.folder / "real.zon").st_mode), 0o640)
        self.assertEqual(self.objects("real.zon")[0][2]["point_component"], 22)
        self.assertEqual(self.names(), ["link.zon", "real.zon"])
        self.zon("make", "cube", "new.zon", umask=0o027)
        self.assertEqual(stat.S_IMODE(os.stat(self.folder / "new.zon").st_mode), 0o640)

    def test_json_stands_alone_on_stdout(self):
        self.write("a.off", "COFF 3 1 0\n0 0 0 1 1 1\n1 0 0 1 1 1\n0 1 0 1 1 1\n3 0 1 2\n")
        report = self.json("import", "a.off", "a.zon", "--level", "4")
        self.assertEqual(report, {
            "input": "a.off", "output": "a.zon", "level": 4, "bytes": (self.folder / "a.zon").stat().st_size,
            "objects": [{"kind": "mesh", "name": None, "points": 3, "faces": 1, "corners": 3}], "not_kept": ["colours"]})

    def test_colours_and_progress_only_on_a_terminal_and_not_against_the_user_s_will(self):
        self.write("a.off", "OFF 5000 0 0\n" + "0.125 0.25 0.5\n" * 5000)
        self.assertIn(b"99%", terminal_output("import a.off a.zon", self.folder))
        self.assertEqual(self.zon("import", "a.off", "a.zon").stderr, "")
        self.assertIn(b"\033[32mok", terminal_output("verify a.zon", self.folder))
        self.assertNotIn(b"\033", terminal_output("verify a.zon", self.folder, NO_COLOR="1"))
        self.assertNotIn("\033", self.zon("verify", "a.zon").stdout)
