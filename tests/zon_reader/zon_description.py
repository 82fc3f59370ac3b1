"""Describes a zon stream as JSON, so that two readers can be compared.

    zon_description.py FILE     prints the description of a stream; a failed read prints its message and exits 1

    {"version":V,"level":L,"handles":B,"objects":[OBJECT,...]}      the header's numbers, B is true or false

    OBJECT    {"id":N,"properties":[[NAME,CODE,VALUE],...]}; an empty property is [NAME,null,null];
              a sound component of a volume has "proxy":true, too
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
STRING and NAME hold one character per byte.
"""
import json
import sys

import xxhash

from items import Str, ZonError
from zon_reader import CURVE, ELEMENTS, GEO_LOCATION, OBJECT, Stream


def describe(stream):
    ids = {}

    def framed(code, held):
        return [code, None if code is None else value(code, held)]

    def value(code, held):
        if held is None or type(held) in (bool, int):
            return held
        if isinstance(held, bytes):
            return held.decode("latin-1") if type(held) is Str else held.hex()
        if code == CURVE:
            keys = [[[value(0, t) for t in part] if type(part) is list else value(0, part) for part in key]
                    for key in held[2]]
            return {"pre": held[0], "post": held[1], "keys": keys}
        if code == GEO_LOCATION:
            return list(map(value, [2] * 6 + [8] * 4 + [122, 128], held))
        if held in ids:
            return {"ref": ids[held]}
        ids[held] = len(ids)
        made = {"id": ids[held]}
        if code == OBJECT:
            if held.is_proxy:
                made["proxy"] = True
            made["properties"] = [[name.decode("latin-1"), *framed(*frame)] for name, frame in held.properties.items()]
            return made
        made["count"] = held.count
        if code == 369:
            made["elements"] = [None if frame[0] is None else framed(*frame) for frame in held.elements]
        elif held.elements is not None:
            made["elements"] = [value(ELEMENTS.get(code, code - 120), part) for part in held.elements]
        elif len(held.memory) <= 64:
            made["bytes"] = held.memory.hex()
        else:
            made["xxh3"] = xxhash.xxh3_64_hexdigest(held.memory)
        return made

    return {"version": stream.version, "level": stream.level, "handles": stream.handles,
            "objects": [value(OBJECT, held) for held in stream.objects]}


if __name__ == "__main__":
    try:
        with open(sys.argv[1], "rb") as file:
            print(json.dumps(describe(Stream(file.read()))))
    except ZonError as error:
        sys.exit(f"{sys.argv[1]}: {error}")
