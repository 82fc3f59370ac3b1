"""The examples of docs/tool.md do what the page shows."""
import os
import pathlib
import re
import subprocess

import tool

PAGE = pathlib.Path(__file__).resolve().parents[2] / "docs/tool.md"


def words(text):
    """The words of a text without its numbers: sizes may change with the compressor."""
    return re.sub(r"[0-9.]+( [KM]iB)?", "0", text).split()


class Examples(tool.ToolTest):
    def test_every_command_prints_what_the_page_shows(self):
        blocks = re.findall(r"^```\n(\$.*?)^```$", PAGE.read_text(), re.DOTALL | re.MULTILINE)
        commands = [line.partition("\n")[::2] for block in blocks for line in re.split(r"^\$ ", block, flags=re.M)[1:]]
        self.assertGreater(len(commands), 10)
        environment = {**os.environ, "PATH": os.path.dirname(tool.ZON) + ":" + os.environ["PATH"], "LC_ALL": "C"}
        for command, shown in commands:
            if command.startswith("cat "):
                self.write(command[4:], shown)
            result = subprocess.run(command, shell=True, cwd=self.folder, env=environment, encoding="utf-8",
                                    capture_output=True)
            self.assertEqual(words(result.stderr + result.stdout), words(shown), command)


if __name__ == "__main__":
    tool.main()
