#!/usr/bin/env python3
"""Plants single include lines into a small tree and looks at what include_table.py says of each."""
import os
import tempfile
import unittest

import include_table

# What lies below src/ in the small tree: (folder, installed headers, other headers).
TREE = [
    ("nexil", ["Ptr.h"], ["internal/Slot.h", "parallel/Loop.h"]),
    ("vld", ["Tiles.h", "ChannelParser.h"], []),
    ("veldrin/math", ["float3.h"], []),
    ("veldrin/object", ["Object.h"], []),
    ("veldrin/geometry", ["Names.h"], ["internal/Build.h"]),
    ("veldrin/algorithms", ["Normals.h"], []),
    ("veldrin/io", ["Stream.h"], ["internal/Chunk.h"]),
]

# (file, include line, part of the complaint or None when the line is fine)
LINES = [
    ("src/nexil/Ptr.h", "#include <vector>", None),
    ("src/nexil/Ptr.h", "#include <veldrin/math/float3.h>", "nexil may not include veldrin/math"),
    ("src/nexil/Ptr.cpp", "#include <tbb/parallel_for.h>", "nexil may not include <tbb/parallel_for.h>"),
    ("src/nexil/Ptr.cpp", "#  include <oneapi/tbb.h>", "nexil may not include <oneapi/tbb.h>"),
    ("src/nexil/Ptr.cpp", "// #include <tbb/parallel_for.h>", None),
    ("src/nexil/parallel/Loop.h", "#include <tbb/parallel_for.h>", None),
    ("src/nexil/Ptr.h", "#include <nexil/internal/Slot.h>", "not installed"),
    ("src/nexil/Ptr.h", "#include <nexil/parallel/Loop.h>", "not installed"),
    ("src/nexil/Ptr.cpp", "#include <nexil/internal/Slot.h>", None),
    ("src/nexil/Ptr.cpp", '#include "internal/Slot.h"', None),
    ("src/veldrin/object/Object.h", "#include <veldrin/math/float3.h>", "may not include veldrin/math"),
    ("src/vld/Tiles.h", "#include <veldrin/math/float3.h>", None),
    ("src/vld/Tiles.h", "#include <veldrin/object/Object.h>", "may not include veldrin/object"),
    ("src/veldrin/geometry/Names.h", "#include <vld/ChannelParser.h>", None),
    ("src/veldrin/geometry/Names.h", "#include <vld/Tiles.h>", "may not include vld"),
    ("src/veldrin/geometry/Names.cpp", "#include <nexil/parallel/Loop.h>", None),
    ("src/veldrin/geometry/Names.cpp", "#include <nexil/internal/Slot.h>", "internal to VeldrinPlatform"),
    ("src/veldrin/geometry/Names.cpp", '#include "../algorithms/Normals.h"', "may not include veldrin/algorithms"),
    ("src/veldrin/algorithms/Normals.cpp", "#include <veldrin/io/Stream.h>", "may not include veldrin/io"),
    ("src/veldrin/io/Stream.cpp", "#include <msgpack.hpp>", None),
    ("src/veldrin/io/Stream.cpp", "#include <veldrin/geometry/internal/Build.h>", None),
    ("src/veldrin/io/Stream.cpp", "#include <veldrin/algorithms/Normals.h>", "may not include veldrin/algorithms"),
    ("src/veldrin/geometry/Names.cpp", "#include <blosc.h>", "may not include <blosc.h>"),
    ("src/stray/X.cpp", "#include <vector>", "no row"),
    ("tools/zon/main.cpp", "#include <veldrin/io/Stream.h>", None),
    ("tools/zon/main.cpp", "#include <fmt/core.h>", None),
    ("tools/zon/main.cpp", "#include <veldrin/io/internal/Chunk.h>", "not installed"),
    ("tools/zon/main.cpp", "#include <blosc.h>", "insides"),
    ("examples/cube.cpp", "#include <nexil/parallel/Loop.h>", "not installed"),
]


def write(root, path, text):
    path = os.path.join(root, path)
    os.makedirs(os.path.dirname(path), exist_ok=True)
    with open(path, "w", encoding="utf-8") as file:
        file.write(text)


class IncludeTable(unittest.TestCase):
    def test_each_line_is_judged_by_its_row(self):
        for file, line, complaint in LINES:
            with self.subTest(file=file, line=line), tempfile.TemporaryDirectory() as root:
                for folder, installed, other in TREE:
                    for header in installed + other:
                        write(root, f"src/{folder}/{header}", "")
                    write(root, f"src/{folder}/CMakeLists.txt",
                          f"veldrin_sources(X\n  HEADERS {' '.join(installed)}\n  INTERNAL {' '.join(other)})\n")
                write(root, file, line + "\n")
                _, complaints = include_table.check(root)
                if complaint is None:
                    self.assertEqual(complaints, [])
                else:
                    self.assertEqual(len(complaints), 1)
                    self.assertIn(complaint, complaints[0])
                    self.assertTrue(complaints[0].startswith(f"{file}:1: "))

    def test_a_listed_header_that_is_missing_is_a_complaint(self):
        with tempfile.TemporaryDirectory() as root:
            write(root, "src/nexil/CMakeLists.txt", "veldrin_sources(X HEADERS Gone.h)")
            self.assertEqual(len(include_table.check(root)[1]), 1)


if __name__ == "__main__":
    unittest.main()
