#!/usr/bin/env python3
"""Compares every #include line under src/, tools/ and examples/ with the table of who may include whom.

The libraries are layers: a folder knows what lies below it and nothing beside or above it. TABLE says so, one row per
folder; docs/architecture.md shows the same for readers. Two more rules hold everywhere:
- an installed header includes installed headers only, or it would not compile where the library is installed;
- an internal/ header, and nexil/parallel, is seen by our two libraries alone, internal/ only by its own one.

Usage: include_table.py ROOT    (the project's root; exit code 1 when a line breaks a rule, each is printed)
"""
import fnmatch
import pathlib
import posixpath
import re
import sys

PLATFORM = "VeldrinPlatform"
GEOMETRY = "VeldrinGeometry"

# What geometry stands on. Of the volume library it knows the channel patterns, which name tags, and no tiles.
GEOMETRY_BASE = ["nexil", "veldrin/math", "veldrin/object", "vld/ChannelParser.h"]
# From the volume bridge up, the whole volume library is in sight.
VOLUME_BASE = GEOMETRY_BASE + ["veldrin/geometry", "vld"]

# A folder's library; the folders or header patterns it may include; patterns of headers from outside the project.
TABLE = {
    # Values and services stand on the standard library alone, but for type names in messages and for large arrays.
    "nexil": (PLATFORM, [], ["cxxabi.h", "sys/mman.h", "unistd.h"]),
    # The one folder that names the task runtime, so that it can be exchanged in one place.
    "nexil/parallel": (PLATFORM, ["nexil"], ["tbb/*", "oneapi/tbb/*"]),
    # Numbers and objects do not know each other: a host may bring its own of either.
    "veldrin/math": (PLATFORM, ["nexil"], []),
    "veldrin/object": (PLATFORM, ["nexil"], []),
    "lattix": (PLATFORM, ["nexil"], []),
    # Tiles have positions and boxes, but no geometry objects: the bridge is veldrin/volume.
    "vld": (PLATFORM, ["nexil", "veldrin/math"], []),
    "veldrin/geometry": (GEOMETRY, GEOMETRY_BASE, []),
    "veldrin/algorithms": (GEOMETRY, GEOMETRY_BASE + ["veldrin/geometry", "lattix"], []),
    # Tags are turned from points to faces and back by the conversions among the algorithms.
    "veldrin/tags": (GEOMETRY, GEOMETRY_BASE + ["veldrin/geometry", "lattix", "veldrin/algorithms"], []),
    "veldrin/volume": (GEOMETRY, VOLUME_BASE, []),
    # Validators and the stream know volumes as geometry objects, through the bridge.
    "veldrin/validation": (GEOMETRY, VOLUME_BASE + ["veldrin/volume"], []),
    "veldrin/io": (GEOMETRY, VOLUME_BASE + ["veldrin/volume"], ["msgpack.hpp", "blosc.h", "xxhash.h", "xxh_x86dispatch.h"]),
    # The header that includes every installed one.
    "veldrin": (GEOMETRY, ["nexil", "lattix", "vld", "veldrin/*"], []),
}

# What the libraries are built with is nothing that programs on top of them may lean on.
INSIDES = ["tbb/*", "oneapi/tbb/*", "msgpack.hpp", "blosc.h", "xxhash.h", "xxh_x86dispatch.h"]
INCLUDE = re.compile(r'^\s*#\s*include\s*([<"])([^>"]+)[>"]')


def row_of(header):
    """The longest folder of TABLE that holds `header`, a path below src/."""
    folder = posixpath.dirname(header)
    while folder and folder not in TABLE:
        folder = posixpath.dirname(folder)
    return folder


def matches(header, patterns):
    return any(row_of(header) == pattern or fnmatch.fnmatchcase(header, pattern) for pattern in patterns)


def is_installed(header):
    """Whether a header of ours is, as its folder tells; the tests of packages compile all of those that are."""
    return not {"internal", "parallel"} & set(header.split("/"))


def complaint(root, file, line):
    """Why this line of a file below the root may not be there, or None."""
    match = INCLUDE.match(line)
    if not match:
        return None
    quote, header = match.groups()
    ours = header if (root / "src" / header).exists() else None
    beside = posixpath.normpath(f"{posixpath.dirname(file)}/{header}")
    if quote == '"' and (root / beside).exists():
        ours = beside[len("src/"):] if beside.startswith("src/") else None
    if not file.startswith("src/"):
        if ours and not is_installed(ours):
            return f"<{header}> is not installed"
        return f"<{header}> belongs to the libraries' insides" if not ours and matches(header, INSIDES) else None

    own = file[len("src/"):]
    folder = row_of(own)
    if not folder:
        return "its folder has no row in the table"
    library, below, systems = TABLE[folder]
    if not ours:
        # The C++ standard library alone has headers without an ending.
        is_standard = "/" not in header and "." not in header
        return None if is_standard or matches(header, systems) else f"{folder} may not include <{header}>"
    target = row_of(ours)
    if not target:
        return f"<{header}> lies in a folder without a row in the table"
    if own.endswith(".h") and is_installed(own) and not is_installed(ours):
        return f"an installed header includes <{header}>, which is not installed"
    if "internal" in ours.split("/") and TABLE[target][0] != library:
        return f"<{header}> is internal to {TABLE[target][0]}"
    # Every folder of the libraries may use the parallel loops, though they are not installed.
    if target in (folder, "nexil/parallel") or matches(ours, below):
        return None
    return f"{folder} may not include {target}"


def main():
    if len(sys.argv) != 2:
        sys.exit(__doc__)
    root = pathlib.Path(sys.argv[1])
    complaints, seen = [], 0
    for path in sorted(path for top in ("src", "tools", "examples") for path in (root / top).rglob("*")):
        if path.suffix in (".h", ".cpp"):
            file = path.relative_to(root).as_posix()
            for number, line in enumerate(path.read_text().splitlines(), 1):
                seen += INCLUDE.match(line) is not None
                wrong = complaint(root, file, line)
                complaints += [f"{file}:{number}: {wrong}"] if wrong else []
    print("\n".join(complaints + [f"{seen} include lines, {len(complaints)} against the table"]))
    sys.exit(1 if complaints or seen == 0 else 0)


if __name__ == "__main__":
    main()
