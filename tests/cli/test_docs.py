"""The examples of the pages on the tool and on the tag language do what they show."""
import os
import pathlib
import re
import subprocess

import tool

DOCS = pathlib.Path(__file__).resolve().parents[2] / "docs"

EXACT = tuple(f"zon {name} " for name in ("tag", "normals", "diagnose", "validate", "strands", "volume bounds"))


def words(text):
    """The words of a text without its numbers: sizes may change with the compressor."""
    return re.sub(r"[0-9.]+( [KM]iB)?", "0", text).split()


class Examples(tool.ToolTest):
    def check(self, page):
        blocks = re.findall(r"^```\n(\$.*?)^```$", (DOCS / page).read_text(), re.DOTALL | re.MULTILINE)
        commands = [line.partition("\n")[::2] for block in blocks for line in re.split(r"^\$ ", block, flags=re.M)[1:]]
        self.assertGreater(len(commands), 10)
        environment = {**os.environ, "PATH": os.path.dirname(tool.ZON) + ":" + os.environ["PATH"], "LC_ALL": "C"}
        for command, shown in commands:
            if command.startswith("cat "):
                self.write(command[4:], shown)
            result = subprocess.run(command, shell=True, cwd=self.folder, env=environment, encoding="utf-8",
                                    capture_output=True)
            if "built without OpenVDB" in result.stderr:
                self.skipTest(result.stderr)
            # What is computed is the same everywhere, to the last index and blank.
            compared = str if command.startswith(EXACT) else words
            self.assertEqual(compared(result.stderr + result.stdout), compared(shown), command)

    def test_every_command_prints_what_the_page_of_the_tool_shows(self):
        self.check("tool.md")

    def test_every_command_prints_what_the_page_of_the_tag_language_shows(self):
        self.check("tag-language.md")
