#!/usr/bin/env python3
"""Compares every #include line under src/, tools/ and examples/ with the table of who may include whom.

The libraries are layers: a folder knows what lies below it and nothing beside or above it. TABLE says so, one row per
folder; docs/architecture.md shows the same for readers. Two more rules hold everywhere:
- an installed header includes installed headers only, or it would not compile where the library is installed;
- an internal/ header, and nexil/parallel, is seen by our two libraries alone, internal/ only by its own one.

Usage: include_table.py ROOT    (the project's root; exit code 1 when a line breaks a rule, each is printed)
"""
import fnmatch
import os
import re
import sys

PLATFORM = "VeldrinPlatform"
GEOMETRY = "VeldrinGeometry"


class Row:
    """What the files of one folder may include besides their own folder and the C++ standard library.

    library: the library the folder belongs to.
    below:   folders or header patterns it may include.
    systems: headers from outside the project, as patterns.
    """

    def __init__(self, library, below=(), systems=()):
        self.library, self.below, self.systems = library, list(below), list(systems)


# What geometry stands on. Of the volume library it knows the channel patterns, which name tags, and no tiles.
GEOMETRY_BASE = ["nexil", "veldrin/math", "veldrin/object", "vld/ChannelParser.h"]
# From the volume bridge up, the whole volume library is in sight.
VOLUME_BASE = GEOMETRY_BASE + ["veldrin/geometry", "vld"]

TABLE = {
    # Values and services stand on the standard library alone, but for type names in messages and for large arrays.
    "nexil": Row(PLATFORM, [], ["cxxabi.h", "sys/mman.h"]),
    # The one folder that names the task runtime, so that it can be exchanged in one place.
    "nexil/parallel": Row(PLATFORM, ["nexil"], ["tbb/*", "oneapi/tbb/*"]),
    # Numbers and objects do not know each other: a host may bring its own of either.
    "veldrin/math": Row(PLATFORM, ["nexil"]),
    "veldrin/object": Row(PLATFORM, ["nexil"]),
    "lattix": Row(PLATFORM, ["nexil"]),
    # Tiles have positions and boxes, but no geometry objects: the bridge is veldrin/volume.
    "vld": Row(PLATFORM, ["nexil", "veldrin/math"]),
    "veldrin/geometry": Row(GEOMETRY, GEOMETRY_BASE),
    "veldrin/algorithms": Row(GEOMETRY, GEOMETRY_BASE + ["veldrin/geometry", "lattix"]),
    # Tags are turned from points to faces and back by the conversions among the algorithms.
    "veldrin/tags": Row(GEOMETRY, GEOMETRY_BASE + ["veldrin/geometry", "lattix", "veldrin/algorithms"]),
    "veldrin/volume": Row(GEOMETRY, VOLUME_BASE),
    # Validators and the stream know volumes as geometry objects, through the bridge.
    "veldrin/validation": Row(GEOMETRY, VOLUME_BASE + ["veldrin/volume"]),
    "veldrin/io": Row(GEOMETRY, VOLUME_BASE + ["veldrin/volume"], ["msgpack.hpp", "blosc.h", "xxhash.h", "xxh_x86dispatch.h"]),
    # The header that includes every installed one.
    "veldrin": Row(GEOMETRY, ["nexil", "lattix", "vld", "veldrin/*"]),
}

# Folders every row may use inside the libraries, though nothing of it is installed.
SHARED_PRIVATE = "nexil/parallel"
# What the libraries are built with is nothing that programs on top of them may lean on.
OUR_OWN_SYSTEMS = ["tbb/*", "oneapi/tbb/*", "msgpack.hpp", "blosc.h", "xxhash.h", "xxh_x86dispatch.h"]

INCLUDE = re.compile(r'^\s*#\s*include\s*([<"])([^>"]+)[>"]')
SOURCES = (".h", ".cpp")


def files_below(root, folder):
    for path, folders, names in os.walk(os.path.join(root, folder)):
        folders.sort()
        for name in sorted(names):
            if name.endswith(SOURCES):
                yield os.path.relpath(os.path.join(path, name), root).replace(os.sep, "/")


def includes(root, file):
    with open(os.path.join(root, file), encoding="utf-8") as text:
        for number, line in enumerate(text, 1):
            match = INCLUDE.match(line)
            if match:
                yield number, match.group(1) == '"', match.group(2)


def row_of(header):
    """The longest folder of TABLE that holds `header`, a path below src/."""
    folder = os.path.dirname(header)
    while folder and folder not in TABLE:
        folder = os.path.dirname(folder)
    return folder


def matches(header, patterns):
    return any(row_of(header) == pattern or fnmatch.fnmatchcase(header, pattern) for pattern in patterns)


def is_standard(header):
    """The C++ standard library alone has headers without an ending."""
    return "/" not in header and "." not in header


def is_internal(header):
    return "internal" in header.split("/")[:-1]


def installed_headers(root):
    """What the HEADERS lists of all veldrin_sources() calls name, as paths below src/."""
    found = set()
    for path, _, names in os.walk(os.path.join(root, "src")):
        if "CMakeLists.txt" not in names:
            continue
        with open(os.path.join(path, "CMakeLists.txt"), encoding="utf-8") as file:
            text = re.sub(r"#.*", "", file.read())
        folder = os.path.relpath(path, os.path.join(root, "src"))
        for call in re.findall(r"veldrin_sources\(([^)]*)\)", text):
            keyword = None
            for word in call.split():
                if word in ("SOURCES", "HEADERS", "INTERNAL"):
                    keyword = word
                elif keyword == "HEADERS":
                    found.add(os.path.normpath(os.path.join(folder, word)).replace(os.sep, "/"))
    return found


def resolve(root, file, header, quoted):
    """The included file as a path below src/, or None when it is none of ours."""
    if quoted:
        beside = os.path.normpath(os.path.join(os.path.dirname(file), header)).replace(os.sep, "/")
        if os.path.exists(os.path.join(root, beside)):
            return beside[len("src/"):] if beside.startswith("src/") else None
    return header if os.path.exists(os.path.join(root, "src", header)) else None


def check_library_line(file, header, ours, installed):
    """Why this include line in a library's file is wrong, or None."""
    own = file[len("src/"):]
    folder = row_of(own)
    if not folder:
        return "its folder has no row in the table"
    row = TABLE[folder]
    if ours is None:
        if is_standard(header) or matches(header, row.systems):
            return None
        return f"{folder} may not include <{header}>"
    target = row_of(ours)
    if not target:
        return f"<{header}> lies in a folder without a row in the table"
    if own in installed and ours not in installed:
        return f"an installed header includes <{header}>, which is not installed"
    if is_internal(ours) and TABLE[target].library != row.library:
        return f"<{header}> is internal to {TABLE[target].library}"
    if target == folder or target == SHARED_PRIVATE or matches(ours, row.below):
        return None
    return f"{folder} may not include {target}"


def check_program_line(header, ours, installed):
    """Why this include line in a program on top of the libraries is wrong, or None."""
    if ours is not None and ours not in installed:
        return f"<{header}> is not installed"
    if ours is None and any(fnmatch.fnmatchcase(header, pattern) for pattern in OUR_OWN_SYSTEMS):
        return f"<{header}> belongs to the libraries' insides"
    return None


def check(root):
    """(number of include lines seen, list of complaints)"""
    installed = installed_headers(root)
    seen, complaints = 0, []
    for top in ("src", "tools", "examples"):
        for file in files_below(root, top):
            for number, quoted, header in includes(root, file):
                seen += 1
                ours = resolve(root, file, header, quoted)
                if top == "src":
                    wrong = check_library_line(file, header, ours, installed)
                else:
                    wrong = check_program_line(header, ours, installed)
                if wrong:
                    complaints.append(f"{file}:{number}: {wrong}")
    for header in sorted(installed):
        if not os.path.exists(os.path.join(root, "src", header)):
            complaints.append(f"src/{header}: listed as installed, but there is no such file")
    return seen, complaints


def main():
    if len(sys.argv) != 2:
        sys.exit(__doc__)
    seen, complaints = check(sys.argv[1])
    print("\n".join(complaints + [f"{seen} include lines, {len(complaints)} against the table"]))
    sys.exit(1 if complaints or seen == 0 else 0)


if __name__ == "__main__":
    main()
