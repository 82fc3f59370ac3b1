"""Made the hand-made streams of tests/corpus/streams, byte by byte, without the reader beside it.

    make_streams.py FOLDER      writes valid/*.zon, bad/*.zon and bad/expected.tsv

The files are kept as bytes: no test runs this. Run it to add a stream, into an empty folder, and copy
over what is new; what was made before stays as it is, also when the compressor's output changes.
"""
import pathlib
import struct
import sys
from math import inf, nan

import blosc
import msgpack
import xxhash

NIL = b"\xc0"
SCALARS = "BHIQbhiqfd?"
MATRIX_SCALARS = "HIQhiqfd"
GEO_U32, GEO_F32 = 122, 128


def pack(plain):
    return msgpack.packb(plain)


def seq(*items):
    """A MessagePack array of items that are packed already."""
    return msgpack.Packer().pack_array_header(len(items)) + b"".join(items)


def frame(code, payload):
    return seq(pack(code), payload)


def obj(*properties, **more):
    flat = []
    for name, value in [*properties, *more.items()]:
        flat += [pack(name), value]
    return seq(*flat)


def u32(number):
    return frame(2, pack(number))


def i32(number):
    return frame(6, pack(number))


def string(text):
    return frame(11, pack(text))


def compressed(memory, size, level=9):
    return blosc.compress(memory, typesize=size, clevel=level, shuffle=blosc.SHUFFLE, cname="lz4")


def chunks(memory, size, level, limit=1 << 30, count=None):
    """A chunk list; count overrides the true one."""
    cut = [memory[at:at + limit] for at in range(0, len(memory), limit)]
    cut = [compressed(part, size, level) for part in cut] if level > 0 else cut
    return seq(pack(len(memory) // size if count is None else count), seq(*map(pack, cut)))


def blob(*args, **options):
    return seq(pack(0), chunks(*args, **options))


def elements(*payloads):
    return seq(pack(1), seq(*payloads))


def u32s(numbers, level=0, **options):
    return blob(struct.pack(f"<{len(numbers)}I", *numbers), 4, level, **options)


def header(version=6, level=0, handles=False, addresses=None, identifier=6611198):
    properties = [("file_identifier", u32(identifier)), ("file_version", u32(version)),
                  ("compression_level", i32(level))]
    if version > 3:
        properties.append(("serialize_handles", frame(10, pack(handles))))
    if addresses is not None and version == 5:
        properties.append(("serialize_handle_addresses", frame(123, addresses_of(addresses, 9))))
    return obj(*properties)


def addresses_of(addresses, level):
    return blob(struct.pack(f"<{len(addresses)}Q", *addresses), 8, level)


def addresses_item(addresses, level=0):
    return frame(362, obj(serialize_handle_addresses=frame(123, addresses_of(addresses, level))))


def mark(item, role, entries=1, compressed=False):
    return xxhash.xxh3_64_intdigest(item, 8 * entries + 4 * compressed + role) & ~3 | role


def stream(items, entries=None, table=None, offset=None, head=None, **options):
    """A stream of version 5 or 6 of items in the order of the file; entries are (number of the item, role).

    head, table and offset override what follows from these.
    """
    head = header(**options) if head is None else head
    hashed = options.get("version", 6) > 5
    compressed = options.get("level", 0) > 0
    entries = [(number, 1) for number in range(len(items))] if entries is None else entries
    position, positions = len(head) + 9, []
    for item in items:
        positions.append(position)
        position += len(item)
    if table is None:
        marks = [mark(items[number], role, len(entries), compressed) if hashed else role for number, role in entries]
        table = b"".join(pack(positions[number]) + pack(mark) for (number, _), mark in zip(entries, marks))
    offset = b"\xcf" + struct.pack(">Q", position) if offset is None else offset
    return head + offset + b"".join(items) + table


def one(payload_frame, **options):
    """A stream of one object whose property "p" is the frame."""
    return stream([frame(362, obj(p=payload_frame))], **options)


def old(version, *objects, **options):
    return header(version, **options) + b"".join(objects)


# ---------------------------------------------------------------------------------------- every type


def memory_of(code, start=1):
    """Memory of one value of a fixed-size type, each component another number."""
    if code < 11:
        form = SCALARS[code]
    elif code < 45:
        form = SCALARS[(code - 12) % 11] * ((code - 12) // 11 + 2)
    elif code < 117:
        shape, scalar = divmod(code - 45, 8)
        form = MATRIX_SCALARS[scalar] * ((shape // 3 + 2) * (shape % 3 + 2))
    else:
        form = {117: "ffff", 118: "dddd", 119: "ffffff"}[code]
    numbers = [start + i for i in range(len(form))]
    values = [{"f": n + 0.5, "d": -n - 0.25, "?": n % 2 == 0}.get(c, -n if c in "bhiq" else n)
              for n, c in zip(numbers, form)]
    return struct.pack("<" + form, *values)


SCALAR_PAYLOADS = [pack(255), pack(65535), pack(0xFFFFFFFF), pack(0xFFFFFFFFFFFFFFFF), pack(-128), pack(-32768),
                   pack(-2147483648), pack(-0x8000000000000000), msgpack.packb(1.5, use_single_float=True),
                   pack(-0.1), pack(True), pack("h\u00e9llo \"zon\"\n")]


def curve(*keys, pre=0, post=1):
    return pack({"pre_extrapolation": pre, "post_extrapolation": post, "keys": [
        {"time": t, "value": v, "in_tangent": [-0.5, di], "out_tangent": [0.5, do], "interpolation": mode}
        for t, v, di, do, mode in keys]})


def single(number):
    return msgpack.packb(number, use_single_float=True)


def geo_location(indices, weights, ids=(1, 2, 3, 4, 5, 0xFFFFFFFF), params=(0.25, 0.5, 0.75, -1.0)):
    return seq(*map(pack, ids), *map(single, params), indices, weights)


def f32s(numbers, level=0):
    return blob(struct.pack(f"<{len(numbers)}f", *numbers), 4, level)


def array_payload(code, level, count=2):
    """An array of a value type (code below 120)."""
    if code == 11:
        return elements(*(pack(text) for text in ["", "zon", "\u00fc"][:count]))
    memory = b"".join(memory_of(code, 1 + i) for i in range(count))
    return blob(memory, len(memory_of(code)), level)


def payload(code, level):
    if code < 12:
        return SCALAR_PAYLOADS[code]
    if code < 120:
        return chunks(memory_of(code), len(memory_of(code)), level)
    if code < 240:
        return array_payload(code - 120, level)
    if code < 360:
        return elements(array_payload(code - 240, level, 1), NIL, array_payload(code - 240, level, 0))
    small = frame(2, pack(7))
    geo = geo_location(u32s([4, 5], level), f32s([0.5], level))
    return {
        360: pack(2),
        361: elements(pack(0), pack(1), pack(2)),
        362: obj(inner=small, none=NIL),
        363: elements(obj(), NIL, obj(inner=small)),
        364: elements(elements(obj()), NIL, elements()),
        365: curve((0.0, 1.0, 0.0, 0.25, 2), (1.0, -3.5, 0.125, 0.0, 0)),
        366: elements(curve(), NIL, curve((2.0, 2.0, 0.0, 0.0, 1), pre=2, post=3)),
        367: geo,
        368: elements(geo, geo_location(NIL, f32s([], level))),
        369: elements(small, NIL, frame(11, pack("any")), frame(362, NIL), frame(14, chunks(memory_of(14), 8, level)),
                      frame(369, elements(NIL))),
    }[code]


def every_type(level):
    properties = [(f"code_{code}", frame(code, payload(code, level))) for code in range(370)]
    return stream([frame(362, obj(*properties))], level=level)


# ------------------------------------------------------------------------------------- valid streams


def nested(depth, bottom):
    inner = obj(bottom=bottom)
    for _ in range(depth):
        inner = obj(child=frame(362, inner))
    return inner


def old_object(version):
    """What an old version can hold, with its own array forms."""
    def arr(count_and_chunks):
        return seq(pack(0), count_and_chunks) if version > 2 else count_and_chunks

    def listed(*items):
        return elements(*items) if version > 2 else seq(*items)

    memory = struct.pack("<40I", *range(40))
    properties = dict(
        number=i32(-5), name=string("old"), point=frame(31, chunks(memory_of(31), 12, 9)),
        small=frame(122, arr(chunks(struct.pack("<3I", 7, 8, 9), 4, 9))),
        large=frame(122, arr(chunks(memory, 4, 9))),
        pieces=frame(122, arr(chunks(memory, 4, 9, limit=50))),
        empty=frame(128, arr(chunks(b"", 4, 9))),
        names=frame(131, listed(pack("a"), pack("b"))),
        nested=frame(362, obj(flag=frame(10, pack(True)))),
        objects=frame(363, listed(obj(), obj(n=u32(1)))),
        arrays=frame(248, listed(arr(chunks(struct.pack("<2f", 1, 2), 4, 9)))),
        any=frame(369, listed(u32(3))),
        curve=frame(365, curve((0.0, 1.0, 0.0, 0.0, 1))))
    if version > 1:
        properties.update(null_object=frame(362, NIL), null_array=frame(122, NIL), null_curve=frame(365, NIL),
                          nothing=NIL, holes=frame(363, listed(NIL, obj())))
    return obj(**properties)


def valid():
    shared = u32s([1, 2, 3])
    large = struct.pack("<300I", *(i * i for i in range(300)))
    reference = frame(122, pack(1))
    yield "v6_empty", stream([])
    yield "v6_empty_level9", stream([], level=9)
    yield "v6_walk", stream([frame(122, shared), frame(362, obj(("a", reference), ("b", reference)))],
                            [(1, 1), (0, 0)])
    yield "v6_slots", stream([frame(362, obj(n=u32(1))), frame(362, NIL), frame(362, obj()), frame(362, NIL)],
                             [(0, 1), (1, 1), (0, 1), (2, 1), (3, 1), (0, 1)])
    yield "v6_slot_in_slot", stream(
        [frame(362, obj(name=string("inner"))), frame(362, obj(child=frame(362, pack(0)), again=frame(362, pack(0))))],
        [(0, 1), (1, 1)])
    yield "v6_shared_everywhere", stream(
        [frame(122, u32s([4, 5])), frame(128, f32s([0.5, 1.5])), frame(131, elements(pack("s"))),
         frame(362, obj(data=frame(122, pack(1)))), frame(363, elements(pack(4), NIL, pack(4))),
         frame(362, obj(
             object=frame(362, pack(4)), objects=frame(363, pack(5)), lists=frame(364, elements(pack(5), pack(5))),
             geo=frame(367, geo_location(pack(1), pack(2))),
             geos=frame(368, elements(geo_location(pack(1), pack(2)), geo_location(NIL, NIL))),
             arrays=frame(242, elements(pack(1), u32s([4, 5]), NIL)), strings=frame(131, pack(3)),
             text=frame(251, elements(pack(3))), any=frame(369, elements(frame(122, pack(1)), NIL))))],
        [(5, 1), (0, 0), (1, 0), (2, 0), (3, 0), (4, 0)])
    yield "v6_deep_chain", stream(
        [frame(362, nested(32, u32(0))), frame(362, obj(child=frame(362, pack(1))))], [(1, 1), (0, 0)])
    # The frame and the object, 2 for each child, 4 for the array at the bottom: 256 arrays in one another.
    yield "v6_nesting_256", stream([frame(362, nested(125, frame(122, shared)))])
    yield "v6_many_entries", stream(
        [frame(122, u32s([i])) for i in range(200)]
        + [frame(362, obj(lists=frame(242, elements(*(pack(1 + i // 2) for i in range(400))))))],
        [(200, 1)] + [(i, 0) for i in range(200)])
    yield "v6_handles", stream(
        [frame(362, obj(n=u32(1))), frame(362, NIL), addresses_item([0x7FFFFFFFF000, 16, 0x7FFFFFFFF000])],
        [(0, 1), (1, 1), (0, 1), (2, 2)], handles=True)
    yield "v6_handles_level9", stream([frame(362, obj()), addresses_item([48], 9)], [(0, 1), (1, 2)], level=9,
                                      handles=True)
    yield "v6_handles_empty", stream([addresses_item([])], [(0, 2)], handles=True)
    yield "v6_names", stream([frame(362, obj(
        ("", u32(1)), ("twice", u32(2)), ("b\0c", u32(3)), ("twice", string("last")), ("\u00e9\"\\", u32(4))))])
    # A str of bytes that are no UTF-8, and a bool array with bytes other than 0 and 1.
    yield "v6_odd_bytes", stream([frame(362, obj(
        text=frame(11, b"\xa3\xff\x00\x80"), flags=frame(130, blob(b"\0\1\2\xff", 1, 0)),
        pair=frame(22, chunks(b"\x02\0", 2, 0)), short=frame(14, chunks(b"\1\0\0\0", 8, 0, count=1))))])
    loose = (b"\x84\xa4note" + pack([None, {"x": 1.5}]) + pack("keys") + pack(
        [{"interpolation": 2, "out_tangent": [1, 0.5], "in_tangent": [0, 0], "value": 7, "time": 3}])
        + pack("post_extrapolation") + pack(4) + pack("pre_extrapolation") + pack(3))
    yield "v6_curve_loose", one(frame(365, loose))
    # Integers and lengths in longer forms than needed.
    yield "v6_wide_forms", one(frame(362, obj(
        small=frame(2, b"\xcf" + struct.pack(">Q", 5)), negative=frame(4, b"\xd3" + struct.pack(">q", -5)),
        signed_form=frame(0, b"\xd1\x00\xc8"), wide_code=b"\x92\xcd\x00\x02\x07",
        wide_array=frame(122, b"\xdc\x00\x02\x00" + chunks(b"", 4, 0)))))
    for name, limit in [("bytes", 1), ("1000", 1000)]:
        for level in (0, 9):
            memory = large[:40] if limit == 1 else large * 4
            yield f"v6_chunks_{name}_level{level}", one(frame(122, blob(memory, 4, level, limit=limit)), level=level)
    yield "v6_level1", one(frame(122, blob(large, 4, 1)), level=1)
    yield "v6_level_negative", one(frame(122, shared), level=-3)
    yield "v6_every_type_level0", every_type(0)
    yield "v6_every_type_level9", every_type(9)
    yield "v6_header_types", stream([], head=obj(
        ("extra", string("ignored")), ("file_version", frame(3, pack(6))), ("compression_level", frame(4, pack(0))),
        ("file_identifier", frame(6, pack(6611198)))))
    yield "v7_read_as_6", stream([frame(362, obj(n=u32(1)))], version=7)
    for version in (1, 2, 3, 4):
        extra = [NIL] if version > 1 else []
        yield f"v{version}", old(version, old_object(version), obj(), *extra, level=9)
    yield "v3_level0_compresses", old(3, obj(p=frame(122, u32s([1, 2, 3], 9))), level=0)
    yield "v3_empty", old(3, level=9)
    yield "v4_handles", old(
        4, obj(n=u32(1)), NIL, obj(child=frame(362, pack(0)), list=frame(363, elements(pack(0), NIL, pack(0)))),
        pack(2), obj(), level=9, handles=True)
    yield "v5", stream(
        [frame(122, shared), frame(362, obj(("a", frame(122, pack(3))), ("b", frame(122, pack(3))))), frame(362, NIL)],
        [(1, 1), (2, 1), (1, 1), (0, 0)], version=5)
    yield "v5_handles", stream([frame(362, obj(n=u32(1))), frame(362, obj())], [(0, 1), (1, 1), (0, 1)],
                               version=5, handles=True, addresses=[4096, 8192, 4096])
    yield "v5_level9", one(frame(122, blob(large, 4, 9)), version=5, level=9)


# --------------------------------------------------------------------------------------------- volumes

INT3S, UINTS, STRINGS = 149, 122, 131


def int3s(*triples, level=0):
    return frame(INT3S, blob(struct.pack(f"<{3 * len(triples)}i", *(v for t in triples for v in t)), 12, level))


def uints(*numbers, level=0):
    return frame(UINTS, u32s(numbers, level))


def configured(kind, name, tile_width, data_width):
    return [("vld_component", string(kind)), ("name", string(name)), ("voxelTileWidth", u32(tile_width)),
            ("voxelTileDataWidth", u32(data_width)), ("voxelOffsetType", u32(0)), ("voxelInnerLevels", u32(1))]


def tiles(name, count, widths, leaves, parents, inners, children):
    return obj(("count", u32(count)), *configured("voxel_topology", name, *widths), ("leaf_origins", leaves),
               ("leaf_parents", parents), ("inner_origins", inners), ("inner_children", children))


def points(name, widths, leaves, offsets):
    return frame(362, obj(*configured("point_topology", name, *widths), ("leaf_origins", leaves), ("offsets", offsets)))


def container(name, topology, size, level=0):
    return frame(362, obj(
        ("indices", uints(level=level)), ("target", string(topology)), ("depends_on", frame(STRINGS, elements())),
        ("vld_component", string("container")), ("name", string(name)), ("topology", string(topology)),
        ("voxelSize", frame(8, single(size)))))


def channel(name, target, widths, code, data, default, mode=1):
    return frame(362, obj(
        ("data", frame(code + 120, data)), ("target", string(target)), ("depends_on", frame(STRINGS, elements())),
        ("default", frame(code, default)), ("interpolation_mode", frame(360, pack(mode))),
        *configured("channel", name, *widths), ("container", string(target))))


NONE = 0xFFFFFFFF
SMALL, WIDE = (2, 4), (5, 5)


def small_levels(level=0, parents=(0, 0, 1)):
    """Three leaf tiles in two inner ones, at the origin and at the lower limit."""
    far, children = -2147483600, [NONE] * 16
    children[1], children[7], children[8] = 0, 1, 2
    return [int3s((far, -8, 4), (far + 4, -4, 4), (0, 0, 0), level=level), uints(*parents, level=level),
            int3s((far, -8, 0), (0, 0, 0), level=level), uints(*children, level=level)]


def small_volume(level=0, **options):
    component = frame(362, tiles("voxel_component", 208, SMALL, *small_levels(level, **options)))
    distances = blob(struct.pack("<208f", *(i / 4 - 3 for i in range(208))), 4, level)
    return dict(voxel_component=component,
                voxel_tile_tree=container("voxel_tile_tree", "voxel_component", 0.5, level),
                voxel_signed_distance=channel("voxel_signed_distance", "voxel_tile_tree", SMALL, 8, distances,
                                              single(1.5)))


def full_volume(level):
    children = [NONE] * 125
    children[31] = 0
    flags = blob(bytes(i % 3 == 0 for i in range(250)), 1, level)
    wide = tiles("t", 250, WIDE, int3s((5, 5, 5), level=level), uints(0, level=level), int3s((0, 0, 0), level=level),
                 uints(*children, level=level))
    return obj(
        # A channel may stand in front of what it targets.
        ("flags", channel("flags", "c", WIDE, 10, flags, pack(True), 0)), *small_volume(level).items(),
        ("t", frame(362, wide)), ("c", container("c", "t", 2.0, level)),
        ("points", points("points", WIDE, int3s((-5, 0, 0), (0, 0, 0), (0, 5, 0), level=level),
                          uints(0, 2, 2, 3, level=level))),
        ("sizes", channel("sizes", "points", WIDE, 8, f32s([0.5, 1, 2], level), single(0.0), 2)),
        ("other", frame(362, obj(n=u32(1)))))


def valid_volumes():
    for level in (0, 9):
        yield f"v6_volume_level{level}", stream([frame(362, full_volume(level))], level=level)
    # One topology in two geometries; in the second one, its tiles under another name as well.
    levels = [frame(code, pack(entry)) for code, entry in ((INT3S, 3), (UINTS, 4), (INT3S, 5), (UINTS, 6))]
    first, again = (frame(362, tiles(name, 208, SMALL, *levels)) for name in ("voxel_component", "again"))
    reference = frame(362, pack(2))
    yield "v6_volume_shared", stream(
        [*small_levels(), first, frame(362, obj(**{**small_volume(), "voxel_component": reference})),
         frame(362, obj(voxel_component=reference, again=again))],
        [(5, 1), (6, 1), (4, 0), (0, 0), (1, 0), (2, 0), (3, 0)])
    # What targets a damaged component is kept plain, too; others are not.
    yield "v6_volume_damaged", stream(
        [frame(362, obj(
            **small_volume(parents=(0, 1, 1)),
            points=points("points", SMALL, int3s((0, 0, 0), (0, 4, 0)), uints(0, 2, 3)),
            sizes=channel("sizes", "points", SMALL, 8, f32s([0.5, 1]), single(0.0)),
            odd=points("odd", SMALL, int3s((0, 0, 1)), uints(0, 2)))),
         frame(362, obj(vld_component=small_volume()["voxel_component"]))])


# --------------------------------------------------------------------------------------- bad streams


def patched(data, at, *new):
    return data[:at] + bytes(new) + data[at + len(new):]


def fake_chunk(declared, length=16, fmt=2, flags=0x21, block=None, said=None):
    """A compressed chunk with a header of our own and zeros behind it."""
    head = struct.pack("<BBBBIII", fmt, 1, flags, 4, declared, declared if block is None else block,
                       length if said is None else said)
    return (head + bytes(max(0, length - 16)))[:length]


def zeros_in_one_block(size):
    """A compressed chunk of zeros in a single block, which the compressor itself would cut."""
    # LZ4: a zero, a match with it that is as long as it takes, five zeros for the end.
    more = size - 1 - 19 - 5
    block = b"\x1f\0\1\0" + b"\xff" * (more // 255) + bytes([more % 255]) + b"\x50" + bytes(5)
    body = struct.pack("<II", 20, len(block)) + block
    return struct.pack("<BBBBIII", 2, 1, 0x31, 4, size, size, 16 + len(body)) + body


def with_chunk(chunk, count=4, version=6):
    inner = seq(pack(count), seq(pack(chunk)))
    inner = inner if version < 3 else seq(pack(0), inner)
    return one(frame(122, inner), level=9) if version > 4 else old(version, obj(p=frame(122, inner)))


MALFORMED = "Unknown msgpack error occurred"
IDENTIFIER = "Incorrect zon stream identifier"
HEADER = "Corrupt stream header"
HANDLES = "Corrupt handles"
RANGE = "object index out of range"
MAP = "ptr not found in map"
TARGET = "target error"
MANAGED = "not a managed type"
SUM = "Checksum mismatch"
OVERFLOW = "Integral type overflow"
BLOB = "Deserializing non-trivial type as binary blob"
LISTED = "Deserializing trivial type as non-trivial type"
PLAIN = "Error reading array chunks"
DECOMPRESS = "Decompression error"
OVER = "Corrupt array"
TOTAL = "Corrupt array deserialized"
GEO = "Invalid geo location array. Data is corrupt."
CURVE = "unpack error"


def bad():
    yield from bad_headers()
    yield from bad_tables()
    yield from bad_references()
    yield from bad_values()
    yield from bad_arrays()
    yield from bad_old_versions()


def bad_headers():
    good = stream([frame(362, obj(n=u32(1)))])
    head = len(header())
    yield "header_nothing", b"", MALFORMED
    yield "header_cut", good[:40], MALFORMED
    yield "header_map", pack({"file_version": 6}), "bad header"
    yield "header_number", pack(6), "bad header"
    yield "header_empty", obj(), IDENTIFIER
    yield "header_odd", seq(pack("file_version")), MALFORMED
    yield "header_name_is_number", seq(pack(1), u32(1)), MALFORMED
    yield "header_identifier_other", stream([], identifier=6611199), IDENTIFIER
    yield "header_identifier_missing", obj(file_version=u32(6)), IDENTIFIER
    yield "header_identifier_float", obj(file_identifier=frame(9, pack(6611198.0)), file_version=u32(6)), IDENTIFIER
    yield "header_identifier_wide", stream([], head=obj(
        file_identifier=frame(3, pack(6611198 + (1 << 32))), file_version=u32(6))), IDENTIFIER
    yield "header_version_0", stream([], version=0), ""
    yield "header_version_missing", obj(file_identifier=u32(6611198)), ""
    yield "header_version_negative", obj(file_identifier=u32(6611198), file_version=i32(-6)), ""
    yield "header_version_wide", obj(file_identifier=u32(6611198), file_version=frame(3, pack((1 << 32) + 6))), ""
    yield "header_unknown_property", obj(odd=frame(370, NIL)), "Unknown property: odd"
    yield "header_reference", header()[:-21] + pack("other") + frame(362, pack(0)), MALFORMED
    yield "offset_missing", good[:head], HEADER
    yield "offset_cut", good[:head + 8], HEADER
    yield "offset_short_form", stream([], offset=pack(head + 1)), HEADER
    yield "offset_nil", patched(good, head, 0xC0), HEADER
    yield "offset_into_itself", patched(good, head + 8, head + 8), HEADER
    yield "offset_beyond_end", patched(good, head + 8, len(good) + 1), HEADER
    yield "offset_huge", patched(good, head + 1, *[0xFF] * 8), HEADER


def bad_tables():
    item, other, array = frame(362, obj(n=u32(1))), frame(362, obj(n=u32(2))), frame(122, u32s([1]))
    first = len(header()) + 9
    record = pack(first) + pack(mark(item, 1))
    good = stream([item])
    yield "table_empty_with_item", stream([item], []), HANDLES
    yield "table_record_half", stream([item], table=pack(first)), HANDLES
    yield "table_record_cut", good[:-1], HANDLES
    yield "table_trailing_byte", good + b"\0", HANDLES
    yield "table_position_negative", stream([item], table=b"\xff" + pack(mark(item, 1))), HANDLES
    yield "table_mark_text", stream([item], table=pack(first) + pack("mark")), HANDLES
    yield "table_position_low", stream([item], table=pack(first - 1) + pack(mark(item, 1))), HANDLES
    yield "table_position_late", stream([item], table=pack(first + 1) + pack(mark(item, 1))), HANDLES
    yield "table_position_at_table", stream([item], table=record + pack(first + len(item)) + pack(1)), HANDLES
    yield "table_item_not_named", stream([item, other], [(0, 1)], version=5), HANDLES
    yield "table_item_not_named_v6", stream([item, other], table=pack(first) + pack(mark(item + other, 1))), HANDLES
    yield "table_item_split", stream([item], table=record + pack(first + 3) + pack(mark(item[3:], 1))), SUM
    yield "table_item_split_v5", stream([item], version=5, table=pack(first) + b"\1" + pack(first + 3) + b"\1"), \
        MALFORMED
    yield "table_role_3", stream([item], [(0, 3)]), HANDLES
    yield "table_roles_unordered", stream([array, item], [(0, 0), (1, 1)]), HANDLES
    yield "table_shared_unused", stream([array, item], [(1, 1), (0, 0)]), HANDLES
    yield "table_no_slot", stream([item], [(0, 0)]), HANDLES
    yield "table_shared_twice", stream(
        [array, frame(362, obj(a=frame(122, pack(1)), b=frame(122, pack(2))))], [(1, 1), (0, 0), (0, 0)]), HANDLES
    yield "table_twin_mark_differs", stream([item], table=record + pack(first) + pack(mark(other, 1))), HANDLES
    yield "checksum_item_flipped", patched(good, first + 5, good[first + 5] ^ 1), SUM
    slots = stream([item], [(0, 1), (0, 1)])
    yield "checksum_last_record_cut", slots[:-10], SUM
    sharing = stream([item, frame(362, obj(held=frame(362, pack(1))))], [(1, 1), (0, 0)])
    yield "checksum_role_changed", patched(sharing, len(sharing) - 1, sharing[-1] | 1), SUM
    yield "checksum_level_changed", patched(good, 60, 0x01), SUM
    yield "checksum_mark_flipped", patched(good, len(good) - 1, good[-1] ^ 4), SUM
    packed = one(frame(122, u32s(range(400), 9)), level=9)
    yield "checksum_chunk_flipped", patched(packed, 250, packed[250] ^ 1), SUM
    yield "item_is_reference", stream([item, frame(362, pack(0))], [(0, 1), (1, 1)]), HANDLES
    yield "item_code_unknown", stream([frame(370, NIL)]), "any type not supported"
    yield "item_not_a_frame", stream([pack(1)]), MALFORMED
    yield "item_nil", stream([NIL]), MALFORMED
    yield "item_slot_array", stream([array]), MANAGED
    yield "item_slot_number", stream([u32(1)]), MANAGED
    yield "item_shared_number", stream([u32(1), item], [(1, 1), (0, 0)]), MANAGED
    yield "item_shared_curve", stream([frame(365, NIL), item], [(1, 1), (0, 0)]), MANAGED
    yield "item_shared_null", stream([frame(362, NIL), frame(362, obj(p=frame(362, pack(1))))], [(1, 1), (0, 0)]), \
        "Setting invalid object in read cache"
    for version in (5, 6):
        late = dict(version=version, handles=True)
        yield f"handles_missing_v{version}", stream([item], **late), HANDLES
    yield "handles_not_announced", stream([item, addresses_item([1])], [(0, 1), (1, 2)]), HANDLES
    yield "handles_twice", stream([item, addresses_item([1]), addresses_item([1])], [(0, 1), (1, 2), (2, 2)],
                                  handles=True), HANDLES
    yield "handles_not_last", stream([addresses_item([1]), item], [(0, 2), (1, 1)], handles=True), HANDLES
    yield "handles_too_few", stream([item, addresses_item([])], [(0, 1), (1, 2)], handles=True), HANDLES
    yield "handles_too_few_v5", stream([item], version=5, handles=True, addresses=[]), HANDLES
    yield "handles_role_in_v5", stream([item, addresses_item([1])], [(0, 1), (1, 2)], version=5, handles=True,
                                       addresses=[1]), HANDLES
    yield "handles_other_type", stream(
        [item, frame(362, obj(serialize_handle_addresses=frame(122, u32s([1]))))], [(0, 1), (1, 2)], handles=True), \
        HANDLES
    yield "handles_null", stream(
        [item, frame(362, obj(serialize_handle_addresses=frame(123, NIL)))], [(0, 1), (1, 2)], handles=True), HANDLES
    yield "handles_no_object", stream([item, frame(123, u32s([1]))], [(0, 1), (1, 2)], handles=True), MANAGED
    yield "handles_null_item", stream([item, frame(362, NIL)], [(0, 1), (1, 2)], handles=True), \
        "Setting invalid object in read cache"


def bad_references():
    def refer(index, code=122, *before):
        return stream([*before, frame(362, obj(p=frame(code, pack(index))))],
                      [(len(before), 1)] + [(number, 0) for number in range(len(before))])

    array = frame(122, u32s([1]))
    yield "reference_out_of_range", refer(1), RANGE
    yield "reference_huge", refer((1 << 64) - 1), RANGE
    yield "reference_negative", refer(-1), MALFORMED
    yield "reference_itself", refer(0, 362), MAP
    yield "reference_forward", stream([frame(362, obj(p=frame(362, pack(1)))), frame(362, obj())]), MAP
    yield "reference_null_slot", stream([frame(362, NIL), frame(362, obj(p=frame(362, pack(0))))]), MAP
    yield "reference_cycle", stream([frame(362, obj(p=frame(362, pack(1)))), frame(362, obj(p=frame(362, pack(0))))]), \
        MAP
    yield "reference_other_array", refer(1, 128, array), TARGET
    yield "reference_array_as_object", refer(1, 362, array), TARGET
    yield "reference_element_other", stream([array, frame(362, obj(p=frame(248, elements(pack(1)))))],
                                            [(1, 1), (0, 0)]), TARGET
    yield "reference_geo_other", stream([array, frame(362, obj(p=frame(367, geo_location(NIL, pack(1)))))],
                                        [(1, 1), (0, 0)]), TARGET
    yield "reference_for_curve", refer(1, 365, array), CURVE


def bad_values():
    for name, code, number in [("u8", 0, 256), ("u8_negative", 0, -1), ("u16", 1, 65536), ("u32", 2, 1 << 32),
                               ("u64_negative", 3, -1), ("i8", 4, 128), ("i8_low", 4, -129), ("i16", 5, -32769),
                               ("i32", 6, 1 << 31), ("i64", 7, 1 << 63), ("enum", 360, 3), ("enum_negative", 360, -1)]:
        yield f"overflow_{name}", one(frame(code, pack(number))), OVERFLOW
    yield "overflow_enum_element", one(frame(361, elements(pack(0), pack(3)))), OVERFLOW
    yield "overflow_geo", one(frame(367, geo_location(NIL, NIL, ids=(0, 0, 0, 0, 0, 1 << 32)))), OVERFLOW
    for name, code, item in [
            ("integer_float", 2, pack(1.0)), ("integer_bool", 2, pack(True)), ("integer_nil", 2, NIL),
            ("float_double", 8, pack(1.0)), ("float_integer", 8, pack(1)), ("double_float", 9, single(1.0)),
            ("bool_integer", 10, pack(1)), ("string_bin", 11, pack(b"a")), ("string_nil", 11, NIL),
            ("math_nil", 14, NIL), ("object_string", 362, pack("a")), ("object_map", 362, pack({})),
            ("object_odd", 362, seq(pack("a"))), ("object_name_bin", 362, seq(pack(b"a"), u32(1))),
            ("ext", 362, msgpack.packb(msgpack.ExtType(1, b"x"))), ("byte_c1", 2, b"\xc1")]:
        yield f"kind_{name}", one(frame(code, item)), MALFORMED
    yield "frame_three", one(seq(pack(2), pack(1), pack(1))), MALFORMED
    yield "frame_number", one(pack(2)), MALFORMED
    yield "frame_code_negative", one(frame(-1, pack(1))), MALFORMED
    yield "unknown_property", one(frame(370, pack(1))), "Unknown property: p"
    yield "unknown_property_huge", one(frame((1 << 64) - 1, pack(1))), "Unknown property: p"
    yield "unknown_element", one(frame(369, elements(frame(370, pack(1))))), "any type not supported"
    tree = msgpack.unpackb(curve((0.0, 1.0, 0.0, 0.0, 1)))
    inner, empty = tree["keys"][0], dict(tree, keys=[])
    wrong = [("number", 1), ("list", []), ("no_keys", {"pre_extrapolation": 0, "post_extrapolation": 0}),
             ("no_mode", {"keys": []}), ("extrapolation_5", dict(empty, pre_extrapolation=5)),
             ("extrapolation_negative", dict(empty, post_extrapolation=-1)),
             ("extrapolation_double", dict(empty, post_extrapolation=1.0)),
             ("interpolation_3", dict(tree, keys=[dict(inner, interpolation=3)])),
             ("time_text", dict(tree, keys=[dict(inner, time="0")])), ("key_list", dict(tree, keys=[[]])),
             ("tangent_short", dict(tree, keys=[dict(inner, in_tangent=[0.0])])),
             ("tangent_nil", dict(tree, keys=[dict(inner, out_tangent=[0.0, None])])),
             ("time_repeated", dict(tree, keys=[inner, inner])), ("time_nan", dict(tree, keys=[dict(inner, time=nan)])),
             ("time_infinite", dict(tree, keys=[dict(inner, time=-inf)])), ("name_number", empty | {1: 1}),
             ("unknown_member_text", dict(empty, note="x")), ("unknown_member_wide", dict(empty, note=1 << 32))]
    for name, tree in wrong:
        yield f"curve_{name}", one(frame(365, pack(tree))), CURVE
    yield "curve_float32", one(frame(365, msgpack.packb(dict(empty, keys=[inner]), use_single_float=True))), CURVE
    yield "curve_element", one(frame(366, elements(NIL, pack("x")))), CURVE
    yield "geo_11_items", one(frame(367, seq(*[pack(0)] * 11))), GEO
    yield "geo_number", one(frame(367, pack(0))), GEO
    yield "geo_element_nil", one(frame(368, elements(NIL))), GEO
    yield "geo_double", one(frame(367, seq(*[pack(0)] * 6, *[pack(0.5)] * 4, NIL, NIL))), MALFORMED
    yield "geo_wrong_kind", one(frame(367, geo_location(elements(), NIL))), LISTED
    # One array too deep, a count that no byte backs, lengths beyond the end.
    yield "bomb_depth_257", stream([frame(362, nested(127, u32(0)))]), MALFORMED
    yield "bomb_depth_3000", stream([b"\x91" * 3000 + NIL]), MALFORMED
    yield "bomb_header_depth", b"\x91" * 3000 + NIL, MALFORMED
    yield "bomb_header_count", b"\xdd\xff\xff\xff\xff", MALFORMED
    for name, item in [("array32", b"\xdd\xff\xff\xff\xff"), ("array16", b"\xdc\xff\xff"),
                       ("map32", b"\xdf\xff\xff\xff\xff"), ("map_half", b"\x82\x01\x01\x01"),
                       ("str32", b"\xdb\xff\xff\xff\xff"), ("bin32", b"\xc6\xff\xff\xff\xff"),
                       ("number_cut", b"\xcf\0\0")]:
        yield f"bomb_{name}", one(frame(362, item)), MALFORMED


def bad_arrays():
    pair = struct.pack("<2I", 1, 2)
    good = compressed(struct.pack("<400I", *range(400)), 4)

    def floored(count, *stored, **options):
        return one(frame(122, seq(pack(0), seq(pack(count), seq(*map(pack, stored))))), **options)

    for name, item in [("bare", chunks(pair, 4, 0)), ("three", seq(pack(0), chunks(pair, 4, 0), NIL)),
                       ("kind_2", seq(pack(2), chunks(pair, 4, 0))), ("kind_nil", seq(NIL, chunks(pair, 4, 0))),
                       ("map", pack({})), ("blob_number", seq(pack(0), pack(1))),
                       ("blob_one", seq(pack(0), seq(pack(1)))), ("chunks_nil", seq(pack(0), seq(pack(0), NIL))),
                       ("chunk_str", seq(pack(0), seq(pack(1), seq(pack("abcd"))))),
                       ("count_negative", seq(pack(0), seq(pack(-1), seq())))]:
        yield f"array_{name}", one(frame(122, item)), MALFORMED
    yield "array_trivial_as_list", one(frame(122, elements(pack(1)))), LISTED
    yield "array_strings_as_blob", one(frame(131, u32s([1]))), BLOB
    yield "array_objects_as_blob", one(frame(363, u32s([]))), BLOB
    yield "array_inner_as_list", one(frame(242, elements(elements()))), LISTED
    yield "array_list_number", one(frame(131, seq(pack(1), pack(1)))), "Corrupted array"
    yield "array_list_nil", one(frame(369, seq(pack(1), NIL))), "Corrupted array"
    yield "stored_over", floored(1, pair), OVER
    yield "stored_over_second", floored(2, pair, b"\0"), OVER
    yield "stored_short", floored(3, pair), TOTAL
    yield "stored_none", floored(1), TOTAL
    yield "stored_count_huge", floored((1 << 64) - 1, pair), TOTAL
    yield "stored_count_wraps", floored((1 << 62) + 2, pair), TOTAL
    for name, count, memory in [("over", 1, bytes(13)), ("count_0", 0, b""), ("count_2", 2, bytes(24))]:
        yield f"math_{name}", one(frame(31, chunks(memory, 12, 0, count=count))), PLAIN
    yield "math_short_compressed", one(frame(20, chunks(bytes(4), 8, 9, count=1)), level=9), DECOMPRESS
    yield "math_over_compressed", one(frame(20, chunks(bytes(13), 8, 9, count=1)), level=9), DECOMPRESS
    yield "packed_over", with_chunk(good, 399), OVER
    yield "packed_short", with_chunk(good, 401), TOTAL
    yield "packed_count_huge", with_chunk(good, (1 << 64) - 1), TOTAL
    yield "packed_count_wraps", with_chunk(good, (1 << 62) + 400), TOTAL
    for name, chunk in [
            ("15_bytes", fake_chunk(16, length=15)), ("no_bytes", b""), ("format_1", fake_chunk(16, 32, fmt=1)),
            ("length_less", fake_chunk(16, 32, said=31)), ("length_more", fake_chunk(16, 32, said=33)),
            ("codec_unknown", fake_chunk(16, 32, flags=0xE1)),
            ("declared_0", fake_chunk(0, 16)), ("block_0", fake_chunk(16, 32, block=0)),
            ("block_over", patched(good, 8, *struct.pack("<I", 1601))), ("stored_other_size", fake_chunk(16, 31, flags=0x22)),
            ("ratio_256", fake_chunk(256 * 32, 32)), ("declared_2_gib", fake_chunk((1 << 31) - 1, 64)),
            ("declared_4_gib", fake_chunk((1 << 32) - 1, 64)), ("payload_zero", fake_chunk(16, 64)),
            ("payload_cut", patched(good[:-8], 12, *struct.pack("<I", len(good) - 8)))]:
        declared = struct.unpack("<I", chunk[4:8])[0] if len(chunk) > 8 else 16
        yield f"packed_{name}", with_chunk(chunk, declared // 4 or 1), DECOMPRESS
    # Sound but for its one large block, for which the decompressor takes three times the memory of what it holds.
    yield "bomb_block", with_chunk(zeros_in_one_block((4 << 20) + 4), (1 << 20) + 1), DECOMPRESS
    # Sound chunks of other codecs: the decompressor would take them.
    for codec in blosc.compressor_list():
        if not codec.startswith("lz4"):
            chunk = blosc.compress(bytes(1600), typesize=4, clevel=9, shuffle=blosc.SHUFFLE, cname=codec)
            yield f"packed_codec_{codec}", with_chunk(chunk, 400), DECOMPRESS
    yield "packed_plain_bytes", floored(2, pair, level=9), DECOMPRESS
    yield "stored_compressed_bytes", floored(400, good, level=0), TOTAL


def bad_old_versions():
    good = compressed(struct.pack("<400I", *range(400)), 4)
    for version in (1, 2, 3, 4):
        over, short = (DECOMPRESS, DECOMPRESS) if version < 3 else (OVER, TOTAL)
        yield f"v{version}_over", with_chunk(good, 399, version), over
        yield f"v{version}_short", with_chunk(good, 401, version), short
        yield f"v{version}_cut", old(version, obj(n=u32(1)))[:-1], MALFORMED
        yield f"v{version}_top_number", old(version, pack(0)), MALFORMED
        yield f"v{version}_reference", old(version, obj(), obj(p=frame(362, pack(0)))), MALFORMED
        yield f"v{version}_array_reference", \
            old(version, obj(), obj(p=frame(122, pack(0))), **(dict(handles=True) if version > 3 else {})), MALFORMED
    # Level 0 in the header of an old stream: its chunks are compressed all the same.
    yield "v3_stored_chunk", old(3, obj(p=frame(122, u32s([1, 2], 0))), level=0), DECOMPRESS
    yield "v1_nil_pointer", old(1, obj(p=frame(362, NIL))), MALFORMED
    yield "v1_nil_curve", old(1, obj(p=frame(365, NIL))), CURVE
    yield "v1_nil_value", old(1, obj(p=NIL)), MALFORMED
    yield "v1_nil_object", old(1, NIL), MALFORMED
    yield "v1_list_number", old(1, obj(p=frame(131, pack(1)))), "Corrupted array"
    yield "v2_list_number", old(2, obj(p=frame(131, pack(1)))), "Corrupted array"
    yield "v2_kind_trivial", old(2, obj(p=frame(122, u32s([1], 9)))), MALFORMED
    yield "v2_kind_strings", old(2, obj(p=frame(131, elements(pack("a"))))), MALFORMED
    yield "v3_bare_trivial", old(3, obj(p=frame(122, chunks(bytes(8), 4, 9)))), MALFORMED
    child = obj(p=frame(362, pack(1)))
    yield "v4_reference_itself", old(4, obj(), child, handles=True), RANGE
    yield "v4_reference_later", old(4, child, obj(), handles=True), RANGE
    yield "v4_reference_null", old(4, obj(), NIL, child, handles=True), MAP
    yield "v5_out_of_range", one(frame(122, pack(1)), version=5), RANGE
    yield "v5_over", one(frame(122, u32s(range(2), 0, count=1)), version=5), OVER


def main(folder):
    root = pathlib.Path(folder)
    for kind in ("valid", "bad"):
        (root / kind).mkdir(parents=True, exist_ok=True)
    for name, data in (*valid(), *valid_volumes()):
        (root / "valid" / f"{name}.zon").write_bytes(data)
    expected = []
    for name, data, message in bad():
        (root / "bad" / f"{name}.zon").write_bytes(data)
        expected.append(f"{name}.zon\t{message}\n")
    (root / "bad" / "expected.tsv").write_text("".join(expected))


if __name__ == "__main__":
    main(sys.argv[1])
