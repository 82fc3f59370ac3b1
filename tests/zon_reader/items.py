"""The MessagePack items of a zon stream, with the limits that docs/zon-format.md names.

The usual decoders do not serve: they hide whether a float had 32 or 64 bits, and do not count nesting.
"""

MALFORMED = "Unknown msgpack error occurred"


class ZonError(Exception):
    """The read failed; the text is the exact message, empty where there is none."""


def check(condition, message=MALFORMED):
    if not condition:
        raise ZonError(message)


# The kinds of items: None, bool, int, bytes (bin), list, and what Python has no own type for.
Str, Float32, Float64 = (type(name, (bytes,), {}) for name in ("Str", "Float32", "Float64"))
Map = type("Map", (list,), {})  # of pairs
CONSTANTS = {0xC0: None, 0xC2: False, 0xC3: True}
SIZED = {0xC4: (bytes, 1), 0xC5: (bytes, 2), 0xC6: (bytes, 4), 0xD9: (Str, 1), 0xDA: (Str, 2), 0xDB: (Str, 4),
         0xDC: (list, 2), 0xDD: (list, 4), 0xDE: (Map, 2), 0xDF: (Map, 4)}


def decode(data, pos, end, depth=1):
    """The item at pos, which must end at or before end, and the position behind it."""
    def take(count):
        nonlocal pos
        check(count <= end - pos)
        pos += count
        return data[pos - count:pos]

    def number(count, signed=False):
        return int.from_bytes(take(count), "big", signed=signed)

    lead = number(1)
    if lead < 0x80 or lead >= 0xE0:
        return (lead if lead < 0x80 else lead - 256), pos
    if lead in CONSTANTS:
        return CONSTANTS[lead], pos
    if 0xCA <= lead <= 0xCB:
        return (Float32(take(4)[::-1]) if lead == 0xCA else Float64(take(8)[::-1])), pos
    if 0xCC <= lead <= 0xD3:
        return number(1 << (lead & 3), signed=lead >= 0xD0), pos
    if lead < 0xC0:
        kind, count = (Map, lead & 15) if lead < 0x90 else (list, lead & 15) if lead < 0xA0 else (Str, lead & 31)
    else:
        check(lead in SIZED)
        kind, width = SIZED[lead]
        count = number(width)
    if kind in (bytes, Str):
        return kind(take(count)), pos
    count *= 2 if kind is Map else 1
    check(count <= end - pos and depth <= 256)
    flat = []
    for _ in range(count):
        item, pos = decode(data, pos, end, depth + 1)
        flat.append(item)
    return (Map(zip(flat[::2], flat[1::2])) if kind is Map else flat), pos


def is_uint(item):
    return type(item) is int and item >= 0


def is_list(item, length):
    return type(item) is list and len(item) == length
