"""Writes zon files of objects that no honest program makes: version 5, which has no checksums, uncompressed."""
import struct


def pack(value):
    """A MessagePack item. Bytes are taken as packed already."""
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


def array(form, values):
    """An array of numbers by its form in struct, as one chunk."""
    memory = struct.pack(f"<{len(values)}{form}", *values)
    width = 3 if form == "f" else 1
    chunk = b"\xc6" + struct.pack(">I", len(memory)) + memory
    return frame({"I": 122, "f": 151}[form], [0, [len(values) // width, [chunk] if memory else []]])


def part(payload):
    return frame(362, payload)


def text(value):
    return frame(11, value)


NO_NAMES = frame(131, [1, []])


def component(count):
    return part(obj({"count": frame(2, count)}))


def data(values, target, default):
    return part(obj({"data": values, "target": text(target), "depends_on": NO_NAMES, "default": default,
                     "interpolation_mode": frame(360, 1)}))


def indices(values, target):
    return data(array("I", values), target, frame(2, 0xFFFFFFFF))


def shapes(payloads):
    return data(frame(363, [1, payloads]), "point_component", part(b"\xc0"))


def points(values, target="point_component"):
    """float3 values."""
    zero = b"\xc6" + struct.pack(">I", 12) + bytes(12)
    return data(array("f", [x for each in values for x in each]), target, frame(31, [1, [zero]]))


def mesh(positions, corners, offsets, counts=None, **more):
    point_count, corner_count, face_count = counts or (len(positions), len(corners), len(offsets) - 1)
    return {"point_component": component(point_count), "face_vertex_component": component(corner_count),
            "face_component": component(face_count), "point_position": points(positions),
            "face_vertex": indices(corners, "face_vertex_component"),
            "face_offset": indices(offsets, "face_component"), **more}


def stream(payloads):
    head = obj({"file_identifier": frame(2, 6611198), "file_version": frame(2, 5),
                "compression_level": frame(6, 0), "serialize_handles": frame(10, False)})
    items, table, position = b"", b"", len(head) + 9
    for payload in payloads:
        item = part(payload)
        table += pack(position + len(items)) + pack(1)
        items += item
    return head + pack(position + len(items)) + items + table
