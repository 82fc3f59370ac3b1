"""Runs the program zon in a folder of its own, for the tests beside this file."""
import json
import os
import pathlib
import subprocess
import tempfile
import unittest

ZON = os.environ["VELDRIN_TEST_PROGRAM"]


class ToolTest(unittest.TestCase):
    def setUp(self):
        folder = tempfile.TemporaryDirectory()
        self.addCleanup(folder.cleanup)
        self.folder = pathlib.Path(folder.name)

    def zon(self, *arguments, code=0, **options):
        """Runs the program; fails when it ends with another code, or none of several. stdout and stderr are text."""
        environment = {**os.environ, "LC_ALL": "C", **options.pop("env", {})}
        result = subprocess.run([ZON, *map(str, arguments)], cwd=self.folder, env=environment, encoding="utf-8",
                                errors="replace", stdin=subprocess.DEVNULL, capture_output=True, timeout=300, **options)
        self.assertIn(result.returncode, code if isinstance(code, tuple) else (code,),
                      f"zon {arguments}\n{result.stdout}{result.stderr}")
        return result

    def json(self, *arguments, code=0):
        """The report of a subcommand; whatever else it says must not be on stdout."""
        return json.loads(self.zon(*arguments, "--json", code=code).stdout)

    def write(self, name, content):
        data = content if isinstance(content, bytes) else content.encode()
        (self.folder / name).write_bytes(data)
        return name

    def names(self):
        return sorted(path.name for path in self.folder.iterdir())

    def objects(self, name):
        """What a zon file holds, from the report of its properties: one dict per object, name to (type, elements)."""
        return [(each["kind"], {line["name"]: (line["role"], line["type"], line["elements"], line["target"])
                                for line in each["properties"]}, {c["name"]: c["count"] for c in each["components"]})
                for each in self.json("info", name)["objects"]]

    def dumped(self, name, prop, key):
        """The elements of one array as the dump prints them, numbers as text."""
        lines = self.zon("dump", name, "--max", "1000000").stdout.splitlines()
        start = lines.index(f"    {prop}:") if f"    {prop}:" in lines else lines.index(f"    {prop}: ")
        line = next(line for line in lines[start:] if line.startswith(f"        {key}: ["))
        return line[line.index("[") + 1:line.rindex("]")].strip()

    def vectors(self, name, prop):
        """The vectors of one data property, as tuples of numbers."""
        return [tuple(float(number.rstrip("f")) for number in vector.strip("{} ").split(","))
                for vector in self.dumped(name, prop, "data").split("},")]

    def import_text(self, name, content):
        """Imports a mesh file into a zon file of the same name; gives what was warned about."""
        return self.zon("import", self.write(name, content), name.partition(".")[0] + ".zon").stderr

    def import_cloud(self):
        """A file of one point without a normal."""
        self.import_text("cloud.off", "OFF 1 0 0\n0 0 0\n")
