"""Shows include_table.py single lines that would be right or wrong in the project's files. Argument: its folder."""
import pathlib
import sys

import include_table

# (file, include line, part of the complaint or None when the line is fine)
LINES = [
    ("src/nexil/Ptr.h", "#include <vector>", None),
    ("src/nexil/Ptr.h", "#include <veldrin/math/Vector.h>", "nexil may not include veldrin/math"),
    ("src/nexil/Ptr.cpp", "#include <tbb/parallel_for.h>", "nexil may not include <tbb/parallel_for.h>"),
    ("src/nexil/Ptr.cpp", "#  include <oneapi/tbb.h>", "nexil may not include <oneapi/tbb.h>"),
    ("src/nexil/Ptr.cpp", "// #include <tbb/parallel_for.h>", None),
    ("src/nexil/parallel/Loop.h", "#include <tbb/parallel_for.h>", None),
    ("src/nexil/Ptr.h", "#include <nexil/parallel/Parallel.h>", "not installed"),
    ("src/veldrin/object/Object.h", "#include <veldrin/object/internal/ObjectAccess.h>", "not installed"),
    ("src/veldrin/object/Object.cpp", "#include <veldrin/object/internal/ObjectAccess.h>", None),
    ("src/veldrin/object/Object.cpp", '#include "internal/ObjectAccess.h"', None),
    ("src/veldrin/object/Object.h", "#include <veldrin/math/Vector.h>", "may not include veldrin/math"),
    ("src/vld/Traits.h", "#include <veldrin/math/Vector.h>", None),
    ("src/vld/Traits.h", "#include <veldrin/object/Object.h>", "may not include veldrin/object"),
    ("src/veldrin/geometry/Names.h", "#include <vld/ChannelParser.h>", None),
    ("src/veldrin/geometry/Names.h", "#include <vld/Traits.h>", "may not include vld"),
    ("src/veldrin/geometry/Names.cpp", "#include <nexil/parallel/Parallel.h>", None),
    ("src/veldrin/geometry/Names.cpp", "#include <veldrin/object/internal/ObjectAccess.h>", "internal to VeldrinPlatform"),
    ("src/veldrin/geometry/Names.cpp", '#include "../algorithms/MeshNormals.h"', "may not include veldrin/algorithms"),
    ("src/veldrin/geometry/Names.cpp", "#include <blosc.h>", "may not include <blosc.h>"),
    ("src/veldrin/io/Stream.cpp", "#include <msgpack.hpp>", None),
    ("src/veldrin/io/Stream.cpp", '#include "StreamKeys.h"', None),
    ("src/veldrin/io/Stream.cpp", "#include <StreamKeys.h>", "may not include <StreamKeys.h>"),
    ("src/veldrin/io/Stream.cpp", '#include "missing/None.h"', "may not include <missing/None.h>"),
    ("src/veldrin/io/Stream.cpp", "#include <veldrin/geometry/internal/ValueTypes.h>", None),
    ("src/veldrin/io/Stream.cpp", "#include <veldrin/algorithms/MeshNormals.h>", "may not include veldrin/algorithms"),
    ("src/stray/X.cpp", "#include <vector>", "no row"),
    ("tools/zon/main.cpp", "#include <veldrin/io/ObjectStream.h>", None),
    ("tools/zon/main.cpp", "#include <fmt/core.h>", None),
    ("tools/zon/main.cpp", "#include <veldrin/io/internal/Hash.h>", "not installed"),
    ("tools/zon/main.cpp", "#include <blosc.h>", "insides"),
    ("examples/cube.cpp", "#include <nexil/parallel/Parallel.h>", "not installed"),
]

root = pathlib.Path(sys.argv[1])
installed = include_table.installed_headers(root)
for file, line, expected in LINES:
    found = include_table.complaint(root, installed, file, line)
    if found != expected and (not found or not expected or expected not in found):
        sys.exit(f"{file}: {line}: {found} instead of {expected}")
