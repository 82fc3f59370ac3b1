"""Pages show the example programs that are compiled and run. Argument: the project's folder."""
import pathlib
import re
import sys

project = pathlib.Path(sys.argv[1])
for page, example in (("README.md", "ReadmeExample.cpp"), ("docs/tag-language.md", "TagExample.cpp")):
    shown = re.findall(r"```cpp\n(.*?)```", (project / page).read_text(), re.DOTALL)
    if shown != [(project / "examples" / example).read_text()]:
        sys.exit(f"{page} and examples/{example} differ")
