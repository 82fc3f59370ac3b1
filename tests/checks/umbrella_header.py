"""veldrin.h includes every installed header once, in order. Argument: the project's folder."""
import pathlib
import re
import sys

source = pathlib.Path(sys.argv[1]) / "src"
hidden = {"internal", "parallel"}
installed = sorted(str(header.relative_to(source)) for header in source.rglob("*.h")
                   if not hidden & set(header.parts) and header.name != "veldrin.h")
included = re.findall(r"#include <(.+)>", (source / "veldrin/veldrin.h").read_text())
if included != installed:
    missing, extra = set(installed) - set(included), set(included) - set(installed)
    sys.exit(f"veldrin.h: missing {sorted(missing)}, too many {sorted(extra)}, or not in order")
