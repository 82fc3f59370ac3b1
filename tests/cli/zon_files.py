"""Writes zon files of objects that no honest program makes: version 5, which has no checksums, uncompressed."""
import itertools
import struct

# What an array of numbers is, by its form in struct: the type, and how many numbers make an element.
ARRAYS = {"I": (122, 1), "f": (128, 1), "3i": (149, 3), "3f": (151, 3), "?": (130, 1)}
NULL = b"\xc0"


def pack(value):
    """A MessagePack item of a truth value, a natural number, a text or a list. Bytes are taken as packed already."""
    if isinstance(value, bytes):
        return value
    if isinstance(value, bool):
        return b"\xc3" if value else b"\xc2"
    if isinstance(value, int):
        return b"\xcf" + struct.pack(">Q", value)
    if isinstance(value, str):
        return b"\xdb" + struct.pack(">I", len(value.encode())) + value.encode()
    return b"\xdd" + struct.pack(">I", len(value)) + b"".join(map(pack, value))


def frame(code, payload):
    return pack([code, payload])


def obj(properties):
    """An object's payload: name to frame."""
    return pack([item for pair in properties.items() for item in pair])


def part(payload):
    return frame(362, payload)


def text(value):
    return frame(11, value)


def single(value):
    return frame(8, b"\xca" + struct.pack(">f", value))


def blob(memory):
    return b"\xc6" + struct.pack(">I", len(memory)) + memory


def array(form, values):
    """An array of numbers as one chunk."""
    code, width = ARRAYS[form]
    memory = struct.pack(f"<{len(values)}{form[-1]}", *values)
    return frame(code, [0, [len(values) // width, [blob(memory)] if memory else []]])


def component(count):
    return part(obj({"count": frame(2, count)}))


def data(values, target, default):
    return part(obj({"data": values, "target": text(target), "depends_on": frame(131, [1, []]), "default": default,
                     "interpolation_mode": frame(360, 1)}))


def indices(values, target):
    return data(array("I", values), target, frame(2, 0xFFFFFFFF))


def points(values, target="point_component"):
    return data(array("3f", [x for each in values for x in each]), target, frame(31, [1, [blob(bytes(12))]]))


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
    """A file of objects, each a dict of name to frame. Frame (362, i) refers to object i, those on top counted first."""
    head = obj({"file_identifier": frame(2, 6611198), "file_version": frame(2, 5),
                "compression_level": frame(6, 0), "serialize_handles": frame(10, False)})
    items = [part(obj(each)) for each in (*shared, *top)]
    *starts, end = itertools.accumulate(map(len, items), initial=len(head) + 9)
    entries = [(start, 1) for start in starts[len(shared):]] + [(start, 0) for start in starts[:len(shared)]]
    return head + pack(end) + b"".join(items) + b"".join(pack(number) for entry in entries for number in entry)


def volume(at=(0, 0, 0), **channels):
    """One small inner tile without leaf tiles; each channel has a form and the values of its eight cells."""
    sizes = dict(zip(("voxelTileWidth", "voxelTileDataWidth", "voxelOffsetType", "voxelInnerLevels"),
                     (frame(2, each) for each in (2, 4, 0, 1))))
    none = array("I", ())
    tiles = {"count": frame(2, 8), "vld_component": text("voxel_topology"), "name": text("voxel_component"), **sizes,
             "leaf_origins": array("3i", ()), "leaf_parents": none, "inner_origins": array("3i", at),
             "inner_children": array("I", [0xFFFFFFFF] * 8)}
    tree = {"indices": none, "target": text("voxel_component"), "depends_on": frame(131, [1, []]),
            "vld_component": text("container"), "name": text("voxel_tile_tree"), "topology": text("voxel_component"),
            "voxelSize": single(1)}
    geometry = {"voxel_component": part(obj(tiles)), "voxel_tile_tree": part(obj(tree))}
    for name, (form, values) in channels.items():
        default = frame(10, False) if form == "?" else single(0)
        channel = {"data": array(form, values), "target": text("voxel_tile_tree"), "depends_on": frame(131, [1, []]),
                   "default": default, "interpolation_mode": frame(360, 1), "vld_component": text("channel"),
                   "name": text(name), **sizes, "container": text("voxel_tile_tree")}
        geometry[name] = part(obj(channel))
    return geometry
