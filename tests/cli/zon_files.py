"""Writes zon files of objects that no honest program makes: version 5, which has no checksums, uncompressed."""
import itertools
import struct

import msgpack

# What an array of numbers is, by its form in struct: the type, and how many numbers make an element.
ARRAYS = {"I": (122, 1), "f": (128, 1), "3i": (149, 3), "3f": (151, 3), "?": (130, 1)}
NO_NAMES = [131, [1, []]]


def pack(item):
    return msgpack.packb(item, use_single_float=True)


def obj(properties):
    """An object's payload: name to value, which is [type, payload]."""
    return [item for pair in properties.items() for item in pair]


def part(payload):
    return [362, payload]


def text(value):
    return [11, value]


def array(form, values):
    """An array of numbers as one chunk."""
    code, width = ARRAYS[form]
    memory = struct.pack(f"<{len(values)}{form[-1]}", *values)
    return [code, [0, [len(values) // width, [memory] if memory else []]]]


def component(count):
    return part(obj({"count": [2, count]}))


def data(values, target, default, **more):
    return part(obj({"data": values, "target": text(target), "depends_on": NO_NAMES, "default": default,
                     "interpolation_mode": [360, 1], **more}))


def indices(values, target):
    return data(array("I", values), target, [2, 0xFFFFFFFF])


def points(values, target="point_component"):
    return data(array("3f", [x for each in values for x in each]), target, [31, [1, [bytes(12)]]])


def mesh(positions, corners, offsets, counts=None, **more):
    point_count, corner_count, face_count = counts or (len(positions), len(corners), len(offsets) - 1)
    return {"point_component": component(point_count), "face_vertex_component": component(corner_count),
            "face_component": component(face_count), "point_position": points(positions),
            "face_vertex": indices(corners, "face_vertex_component"),
            "face_offset": indices(offsets, "face_component"), **more}


def strands(point_count, positions, offsets):
    return {"point_component": component(point_count), "strand_component": component(len(offsets) - 1),
            "point_position": points(positions), "strand_offset": indices(offsets, "strand_component")}


def stream(top, shared=()):
    """A file of objects, each a dict of name to value. Value [362, i] refers to object i, those on top counted first."""
    head = pack(obj({"file_identifier": [2, 6611198], "file_version": [2, 5], "compression_level": [6, 0],
                     "serialize_handles": [10, False]}))
    items = [pack(part(obj(each))) for each in (*shared, *top)]
    *starts, end = itertools.accumulate(map(len, items), initial=len(head) + 9)
    entries = [(start, 1) for start in starts[len(shared):]] + [(start, 0) for start in starts[:len(shared)]]
    table = b"".join(pack(number) for entry in entries for number in entry)
    return head + struct.pack(">BQ", 0xCF, end) + b"".join(items) + table


def volume(origin=(0, 0, 0), voxel_size=1.0, **channels):
    """One small inner tile without leaf tiles; each channel has a form and the values of its eight cells."""
    sizes = {"voxelTileWidth": [2, 2], "voxelTileDataWidth": [2, 4], "voxelOffsetType": [2, 0], "voxelInnerLevels": [2, 1]}
    none = array("I", ())
    tiles = {"count": [2, 8], "vld_component": text("voxel_topology"), "name": text("voxel_component"), **sizes,
             "leaf_origins": array("3i", ()), "leaf_parents": none, "inner_origins": array("3i", origin),
             "inner_children": array("I", [0xFFFFFFFF] * 8)}
    tree = {"indices": none, "target": text("voxel_component"), "depends_on": NO_NAMES, "vld_component": text("container"),
            "name": text("voxel_tile_tree"), "topology": text("voxel_component"), "voxelSize": [8, voxel_size]}
    geometry = {"voxel_component": part(obj(tiles)), "voxel_tile_tree": part(obj(tree))}
    for name, (form, values) in channels.items():
        default = [10, False] if form == "?" else [8, 0.0]
        geometry[name] = data(array(form, values), "voxel_tile_tree", default, vld_component=text("channel"),
                              name=text(name), container=text("voxel_tile_tree"), **sizes)
    return geometry
