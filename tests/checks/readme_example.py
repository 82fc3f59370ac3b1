"""The README shows the example program that is compiled and run. Argument: the project's folder."""
import pathlib
import re
import sys

project = pathlib.Path(sys.argv[1])
shown = re.findall(r"```cpp\n(.*?)```", (project / "README.md").read_text(), re.DOTALL)
if shown != [(project / "examples/ReadmeExample.cpp").read_text()]:
    sys.exit("README.md and examples/ReadmeExample.cpp differ")
