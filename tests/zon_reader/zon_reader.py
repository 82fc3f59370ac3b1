"""A second reader of the zon object stream, written from docs/zon-format.md alone."""
import dataclasses
import math
import struct

import blosc
import xxhash

from items import Float32, Float64, Map, Str, ZonError, check, decode, is_list, is_uint
from volumes import mark_components

OBJECT, CURVE, GEO_LOCATION, STRINGS, ADDRESSES = 362, 365, 367, 131, 123
POINTERS = {*range(120, 360), 361, OBJECT, 363, 364, 366, 368, 369}
SCALAR_SIZES = (1, 2, 4, 8, 1, 2, 4, 8, 4, 8, 1)
ELEMENTS = {361: 360, 363: OBJECT, 364: 363, 366: CURVE, 368: GEO_LOCATION}


def value_size(code):
    if code < 45:
        return SCALAR_SIZES[code] if code < 11 else SCALAR_SIZES[(code - 12) % 11] * ((code - 12) // 11 + 2)
    if code < 117:
        shape, scalar = divmod(code - 45, 8)
        return (2, 4, 8, 2, 4, 8, 4, 8)[scalar] * (shape // 3 + 2) * (shape % 3 + 2)
    return (16, 32, 24)[code - 117]


def declared_size(chunk):
    """The size that a compressed chunk promises, if its header can be believed."""
    size, block, length = (int.from_bytes(chunk[at:at + 4], "little") for at in (4, 8, 12))
    good = len(chunk) >= 16 and chunk[0] == 2 and chunk[3] and length == len(chunk)
    good = good and (chunk[2] & 2 or chunk[2] >> 5 == 1) and 1 <= size <= 255 * length
    good = good and 1 <= block <= min(size, 1 << 22) and not (chunk[2] & 2 and size != length - 16)
    check(good, "Decompression error")
    return size


def decompress(chunk):
    try:
        memory = blosc.decompress(chunk)
    except blosc.blosc_extension.error:
        memory = b""
    check(len(memory) == declared_size(chunk), "Decompression error")
    return memory


def curve(tree):
    """A curve's data tree as [pre, post, keys], all numbers of the keys but the mode as Float64."""
    def fits(item):
        if type(item) is Map:
            return all(type(name) is Str and fits(part) for name, part in item)
        return all(map(fits, item)) if type(item) is list else \
            item is None or type(item) is Float64 or is_uint(item) and item < 1 << 32

    def need(item, kind, length=None):
        check(type(item) is kind and length in (None, len(item)), "unpack error")
        return dict(item) if kind is Map else item

    def mode(item, last):
        check(is_uint(item) and item <= last, "unpack error")
        return item

    def number(item):
        return need(Float64(struct.pack("<d", item)) if is_uint(item) else item, Float64)

    def key(item):
        get = need(item, Map).get
        tangents = [[number(part) for part in need(get(name), list, 2)] for name in (b"in_tangent", b"out_tangent")]
        return [number(get(b"time")), number(get(b"value")), *tangents, mode(get(b"interpolation"), 2)]

    check(fits(tree), "unpack error")
    get = need(tree, Map).get
    keys = [key(item) for item in need(get(b"keys"), list)]
    times = [-math.inf, *(struct.unpack("<d", item[0])[0] for item in keys), math.inf]
    check(all(before < after for before, after in zip(times, times[1:])), "unpack error")
    return [mode(get(b"pre_extrapolation"), 4), mode(get(b"post_extrapolation"), 4), keys]


class Object:
    def __init__(self):
        self.properties = {}    # name: (code, value), (None, None) for an empty value
        self.is_proxy = False   # a sound component of the volume that its holder is


@dataclasses.dataclass(eq=False)
class Array:
    count: int
    memory: bytes = None        # of a trivial type
    elements: list = None       # of any other


class Values:
    """Makes values of decoded items, by the rules of one version."""

    def __init__(self, version, compressed, resolve=None):
        self.version, self.compressed, self.resolve = version, compressed, resolve

    def frame(self, item, unknown="any type not supported"):
        if item is None and self.version > 1:
            return None, None
        check(is_list(item, 2) and is_uint(item[0]))
        check(item[0] <= 369, unknown)
        return item[0], self.value(*item)

    def value(self, code, item):
        if code < 8 or code == 360:
            check(type(item) is int)
            limit = 3 if code == 360 else 1 << 8 * SCALAR_SIZES[code]
            low = limit // 2 if 4 <= code < 8 else 0
            check(-low <= item < limit - low, "Integral type overflow")
            return item
        if code < 12:
            check(type(item) is (Float32, Float64, bool, Str)[code - 8])
            return item
        if code < 120:
            check(is_list(item, 2) and is_uint(item[0]))
            check(item[0] == 1, "Error reading array chunks")
            return self.chunk_list(item, code, framed=False).memory
        if code == GEO_LOCATION:
            check(is_list(item, 12), "Invalid geo location array. Data is corrupt.")
            return [self.value(kind, part) for kind, part in zip([2] * 6 + [8] * 4 + [122, 128], item)]
        if item is None and self.version > 1:
            return None
        if code == CURVE:
            return curve(item)
        if is_uint(item) and self.resolve:
            return self.resolve(code, item)
        return self.object(item) if code == OBJECT else self.array(code, item)

    def object(self, item):
        check(type(item) is list and len(item) % 2 == 0)
        made = Object()
        for name, value in zip(item[::2], item[1::2]):
            check(type(name) is Str)
            value = self.frame(value, "Unknown property: " + name.decode("latin-1"))
            if name:
                made.properties[name] = value
        if self.version > 4:
            mark_components(made)
        return made

    def array(self, code, item):
        trivial = code < 240 and code != STRINGS
        if self.version > 2:
            check(is_list(item, 2) and is_uint(item[0]) and item[0] < 2)
            kind, item = item
            check(kind == 0 or not trivial, "Deserializing trivial type as non-trivial type")
            check(kind == 1 or trivial, "Deserializing non-trivial type as binary blob")
        if trivial:
            return self.chunk_list(item, code - 120, framed=self.version > 2)
        check(type(item) is list, "Corrupted array")
        read = self.frame if code == 369 else lambda part: self.value(ELEMENTS.get(code, code - 120), part)
        return Array(len(item), elements=[read(part) for part in item])

    def chunk_list(self, item, code, framed):
        check(is_list(item, 2) and is_uint(item[0]) and type(item[1]) is list)
        count, chunks = item
        check(all(type(chunk) is bytes for chunk in chunks))
        plain = "Decompression error" if self.compressed else "Error reading array chunks"
        expected, total = count * value_size(code), 0
        for chunk in chunks:
            total += declared_size(chunk) if self.compressed else len(chunk)
            check(total <= expected, "Corrupt array" if framed else plain)
        check(total == expected or not (framed or self.compressed), "Corrupt array deserialized" if framed else plain)
        memory = b"".join(map(decompress, chunks) if self.compressed else chunks).ljust(expected, b"\0")
        is_bool = code == 10 or 12 <= code < 45 and (code - 12) % 11 == 10
        return Array(count, memory=bytes(map(bool, memory)) if is_bool else memory)


class Stream:
    """A stream, read whole: version, level, handles, addresses (or None), and objects, one per slot."""

    def __init__(self, data):
        self.data, self.objects, self.addresses = data, [], None
        item, self.pos = decode(data, 0, len(data))
        check(type(item) is list, "bad header")
        header = Values(3, compressed=True).object(item).properties
        check(self.integer(header, b"file_identifier", 0) == 6611198, "Incorrect zon stream identifier")
        self.version = self.integer(header, b"file_version", 0)
        check(self.version, "")
        self.level = self.integer(header, b"compression_level", 1 << 31)
        self.handles = header.get(b"serialize_handles") == (10, True) and self.version > 3
        self.values = Values(self.version, self.version < 5 or self.level > 0)
        if self.version < 5:
            self.read_bare()
            return
        roles = self.read_table()
        self.read_items()
        check(all(role or index in self.used for index, role in enumerate(roles)), "Corrupt handles")
        self.objects = [self.cache[index] for index, role in enumerate(roles) if role == 1]
        if self.handles:
            owner = header if self.version == 5 else self.cache[len(roles) - 1].properties
            code, found = owner.get(b"serialize_handle_addresses", (None, None))
            check(code == ADDRESSES and found and found.count == len(self.objects), "Corrupt handles")
            memory = found.memory
            self.addresses = [int.from_bytes(memory[at:at + 8], "little") for at in range(0, len(memory), 8)]

    @staticmethod
    def integer(header, name, low):
        code, number = header.get(name, (None, 0))
        return number if code is not None and code < 8 and -low <= number < (1 << 32) - low else 0

    def read_bare(self):
        def earlier(code, index):
            check(code == OBJECT)
            check(index < len(self.objects), "object index out of range")
            check(self.objects[index] is not None, "ptr not found in map")
            return self.objects[index]

        self.values.resolve = earlier if self.handles else None
        while self.pos < len(self.data):
            item, self.pos = decode(self.data, self.pos, len(self.data))
            self.objects.append(self.values.value(OBJECT, item))

    def read_table(self):
        """Fills the records (position, mark) and where each item ends; returns the roles."""
        lead, first = self.data[self.pos:self.pos + 1], self.pos + 9
        end = int.from_bytes(self.data[self.pos + 1:first], "big")
        check(lead == b"\xcf" and first <= end <= len(self.data), "Corrupt stream header")
        numbers, pos = [], end
        try:
            while pos < len(self.data):
                number, pos = decode(self.data, pos, len(self.data))
                numbers.append(number)
        except ZonError:
            numbers = [None]
        check(len(numbers) % 2 == 0 and all(map(is_uint, numbers)), "Corrupt handles")
        self.records = list(zip(numbers[::2], numbers[1::2]))
        roles = [mark & 3 for _, mark in self.records]
        addresses = [2] if self.handles and self.version > 5 else []
        check(roles == [1] * roles.count(1) + [0] * roles.count(0) + addresses, "Corrupt handles")
        starts = sorted({position for position, _ in self.records} | {end})
        check(starts[0] == first and starts[-1] == end and end not in dict(self.records), "Corrupt handles")
        self.ends = dict(zip(starts, starts[1:]))
        self.sharers = {position: [] for position in starts}
        for index, (position, mark) in enumerate(self.records):
            sharers = self.sharers[position]
            twin = not sharers or roles[index] == 1 and (self.version == 5 or mark == self.records[sharers[0]][1])
            check(twin, "Corrupt handles")
            sharers.append(index)
        return roles

    def read_items(self):
        self.codes, self.cache, self.used, self.values.resolve = {}, {}, set(), self.entry
        for position, end in self.ends.items():
            mark = self.records[self.sharers[position][0]][1]
            if self.version > 5:
                seed = 8 * len(self.records) + 4 * (self.level > 0) + (mark & 3)
                check(xxhash.xxh3_64_intdigest(self.data[position:end], seed) >> 2 == mark >> 2, "Checksum mismatch")
            item, stop = decode(self.data, position, end)
            check(stop == end, "Corrupt handles")
            check(is_list(item, 2) and is_uint(item[0]))
            check(item[0] <= 369, "any type not supported")
            check(item[0] == OBJECT or mark & 3 == 0 and item[0] in POINTERS, "not a managed type")
            check(not is_uint(item[1]), "Corrupt handles")
            check(item[1] is not None or mark & 3 == 1, "Setting invalid object in read cache")
            value = self.values.value(*item)
            for index in self.sharers[position]:
                self.codes[index], self.cache[index] = item[0], value

    def entry(self, code, index):
        check(index < len(self.records), "object index out of range")
        check(self.cache.get(index) is not None, "ptr not found in map")
        check(self.codes[index] == code, "target error")
        self.used.add(index)
        return self.cache[index]
