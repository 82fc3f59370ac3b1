"""Describes a zon stream in one canonical text, so that two readers can be compared.

    zon_description.py FILE     prints the description of a stream; a failed read prints its message and exits 1

The description is JSON on several lines, ASCII, no blanks but inside strings:

    {"version":V,"level":L,"handles":B,"objects":[      the header's numbers, B is true or false
    OBJECT,                                             one line per top-level slot
    OBJECT
    ]}

With no slots the second line is "]}". Every line ends with a line feed.

    OBJECT    {"id":N,"properties":[[NAME,CODE,VALUE],...]}; an empty property is [NAME,null,null];
              a sound component of a volume has "proxy":true, in front of "properties"
    ARRAY     {"id":N,"count":C,"bytes":HEX} for trivial types up to 64 bytes, longer ones have
              "xxh3":HEX instead, the XXH3 64-bit hash of the bytes (16 digits, most significant first);
              {"id":N,"count":C,"elements":[VALUE,...]} for the others; elements of code 369 are
              [CODE,VALUE], or null when empty
    POINTER   OBJECT or ARRAY where it is met first, {"ref":N} where it is met again, null
    VALUE     integers, enums: number; bool: true, false; string: STRING; float, double and math
              values: HEX of the memory; POINTER; curve: null or
              {"pre":U,"post":U,"keys":[[TIME,VALUE,[DT,DV],[DT,DV],U],...]}, each double as HEX;
              geo location: [U,U,U,U,U,U,HEX,HEX,HEX,HEX,POINTER,POINTER]

N counts objects and arrays (not curves) from 0 in the order in which they are met, depth first,
a holder before what it holds. HEX is a string of lower-case digits, bytes in the order of memory.
STRING and NAME hold one character per byte: 0x20 to 0x7e as they are, but for '"' and '\\', which
like all other bytes are written \\u00xx with lower-case digits.
"""
import sys

import xxhash

from items import Str, ZonError
from zon_reader import CURVE, ELEMENTS, GEO_LOCATION, OBJECT, Stream


def text(data):
    return '"' + "".join(chr(c) if 32 <= c < 127 and c not in b'"\\' else f"\\u{c:04x}" for c in data) + '"'


def describe(stream):
    ids = {}

    def listed(parts):
        return "[" + ",".join(parts) + "]"

    def framed(frame):
        return "null" if frame[0] is None else f"[{frame[0]},{value(*frame)}]"

    def value(code, held):
        if held is None or type(held) in (bool, int):
            return {None: "null", False: "false", True: "true"}[held] if type(held) is not int else str(held)
        if type(held) is Str:
            return text(held)
        if isinstance(held, bytes):
            return f'"{held.hex()}"'
        if code == CURVE:
            keys = (listed(value(0, part) if type(part) is not list else listed(value(0, t) for t in part)
                           for part in key) for key in held[2])
            return f'{{"pre":{held[0]},"post":{held[1]},"keys":{listed(keys)}}}'
        if code == GEO_LOCATION:
            return listed(map(value, [2] * 6 + [8] * 4 + [122, 128], held))
        if held in ids:
            return f'{{"ref":{ids[held]}}}'
        ids[held] = number = len(ids)
        if code == OBJECT:
            proxy = '"proxy":true,' if held.is_proxy else ""
            return f'{{"id":{number},{proxy}"properties":' + listed(
                f"[{text(name)}," + ("null,null]" if kind is None else f"{kind},{value(kind, part)}]")
                for name, (kind, part) in held.properties.items()) + "}"
        if held.elements is not None:
            inner = ELEMENTS.get(code, code - 120)
            parts = map(framed, held.elements) if code == 369 else (value(inner, part) for part in held.elements)
            content = f'"elements":{listed(parts)}'
        elif len(held.memory) <= 64:
            content = f'"bytes":"{held.memory.hex()}"'
        else:
            content = f'"xxh3":"{xxhash.xxh3_64_hexdigest(held.memory)}"'
        return f'{{"id":{number},"count":{held.count},{content}}}'

    head = f'{{"version":{stream.version},"level":{stream.level},"handles":{"true" if stream.handles else "false"}'
    objects = [value(OBJECT, held) for held in stream.objects]
    return head + ',"objects":[\n' + ",\n".join(objects) + ("\n" if objects else "") + "]}\n"


if __name__ == "__main__":
    try:
        with open(sys.argv[1], "rb") as file:
            sys.stdout.write(describe(Stream(file.read())))
    except ZonError as error:
        sys.exit(f"{sys.argv[1]}: {error}")
