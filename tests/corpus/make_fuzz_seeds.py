"""Made the inputs that the fuzz drivers of geometry and of array chunks start from.

    make_fuzz_seeds.py FOLDER      writes geometry/* and chunks/*

The files are kept: no test runs this. Run it again when a driver reads its input in another way.
"""
import pathlib
import struct
import sys

KEEP = 0  # a target, a role or a count as it should be


def array(values):
    return bytes([len(values)]) + bytes(values)


def positions(points):
    """Coordinates in quarters from -30 on."""
    return bytes([len(points)]) + bytes(int(120 + 4 * x) for point in points for x in point)


def geometry(points, corners, face_offsets, strand_offsets=(0,), counts=(KEEP,) * 4, indices=(), values=(),
             masks=((),) * 4, tail=b"a + f(b)"):
    head = b"g" + positions(points) + array(corners) + array(face_offsets) + array(strand_offsets) + bytes(counts)
    properties = bytes([KEEP, KEEP]) * 4
    corner = array(indices) + bytes([KEEP]) + bytes([len(values)]) + bytes(values) + bytes([KEEP, KEEP])
    tags = b"".join(array(mask) + bytes([KEEP, KEEP]) for mask in masks)
    return head + properties + corner + tags + array(range(4)) + bytes([140]) + array([1, 0, 1, 1]) + tail


CUBE = [(x, y, z) for y in (-1, 1) for z in (-1, 1) for x in (-1, 1)]
QUADS = [0, 1, 3, 2, 4, 6, 7, 5, 2, 3, 7, 6, 0, 4, 5, 1, 4, 0, 2, 6, 1, 5, 7, 3]
GRID = [(x, 0, y) for y in range(6) for x in range(6)]
CELLS = [i for y in range(5) for x in range(5) for i in (6 * y + x, 6 * y + x + 1, 6 * y + x + 7, 6 * y + x + 6)]


def tiles(channel_is_whole):
    """A leaf tile in an inner one, twice: the driver reads small tiles first, then wide ones."""
    def one(leaf_voxels, cells):
        origin = bytes([1]) + bytes([0, 0] * 3)
        children = array([0] + [224] * (cells - 1))
        values = array([100 + i % 50 for i in range(leaf_voxels + cells if channel_is_whole else 3)])
        return origin + array([0]) + origin + children + bytes([KEEP, 124]) + values
    return b"v" + one(64, 8) + one(125, 125)


SEEDS = {
    "cube": geometry(CUBE, QUADS, range(0, 25, 4), indices=[i // 4 for i in range(24)], values=[100] * 6,
                     masks=([1, 0] * 4, [1] * 6, [0, 1] * 12, [])),
    "grid": geometry(GRID, CELLS, range(0, 101, 4), masks=([1] * 36, [1, 0] * 12 + [1], [1] * 100, [])),
    "strands": geometry([(i % 5, i, 0) for i in range(20)], [], [0], [0, 1, 1, 5, 12, 20], masks=([1] * 20, [], [], [1] * 5)),
    "bowtie": geometry([(i, i % 2, 0) for i in range(5)], [0, 1, 2, 2, 3, 4, 0, 0, 1], [0, 3, 6, 9]),
    "wrong_indices": geometry(CUBE, [0, 1, 200, 255, 239, 224, 3, 2, 1], [0, 3, 6, 9]),
    "falling_offsets": geometry(CUBE, QUADS, [0, 8, 4, 12, 3, 24, 250]),
    "large_counts": geometry(CUBE, QUADS, range(0, 25, 4), counts=(250, 245, 240, 236)),
    "fan": geometry([(i % 16, i // 16, 1) for i in range(100)], [c for i in range(1, 80) for c in (0, i, i + 1)],
                    range(0, 240, 3)),
    "tiles": tiles(True),
    "tiles_short_channel": tiles(False),
}


def chunk(code, version, packing, count, data):
    return struct.pack("<HBBI", code, version - 1, packing, count) + data


CHUNKS = {
    "stored_u32": chunk(122, 5, 0, 4, struct.pack("<4I", 1, 2, 3, 4)),
    "stored_float3_version_1": chunk(151, 1, 0, 2, struct.pack("<6f", 1, 2, 3, 4, 5, 6)),
    "two_chunks": chunk(120, 5, 0 | 2 | 32 << 2, 16, bytes(range(16))),
    "math_value": chunk(31, 5, 0, 1, struct.pack("<3f", 1, 2, 3)),
    "packed_but_not": chunk(122, 5, 1, 4, bytes([2, 1, 2 | 32, 4]) + struct.pack("<III", 16, 16, 32) + bytes(16)),
}

if __name__ == "__main__":
    for folder, seeds in (("geometry", SEEDS), ("chunks", CHUNKS)):
        target = pathlib.Path(sys.argv[1], folder)
        target.mkdir(exist_ok=True)
        for name, data in seeds.items():
            (target / name).write_bytes(data)
