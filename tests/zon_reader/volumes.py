"""Which objects of a stream are components of volumes, by the rules of docs/zon-format.md."""
import math
import struct

OBJECT, STRING, UINT, FLOAT, MODE, UINTS, INT3S = 362, 11, 2, 8, 360, 122, 149
LIMIT, NO_TILE = 2147483600, 0xFFFFFFFF
KINDS = b"voxel_topology", b"point_topology", b"container", b"channel"


def get(description, name, code):
    """A property of that type, or None."""
    kind, value = description.properties.get(name, (None, None))
    return value if kind == code else None


def name_of(description):
    return get(description, b"name", STRING)


def configuration(description):
    numbers = [get(description, name, UINT) for name in (
        b"voxelTileWidth", b"voxelTileDataWidth", b"voxelOffsetType", b"voxelInnerLevels")]
    return tuple(numbers) if numbers in ([2, 4, 0, 1], [5, 5, 0, 1]) else None


def unpacked(array, form):
    return [part if len(part) > 1 else part[0] for part in struct.iter_unpack("<" + form, array.memory)]


def are_origins(origins, width):
    return all(-LIMIT <= v < LIMIT and v % width == 0 for origin in origins for v in origin) and \
        all(before < after for before, after in zip(origins, origins[1:]))


def cell_of(leaf, inner, w, d):
    x, y, z = ((at - start) // d for at, start in zip(leaf, inner))
    return (x * w + y) * w + z if all(0 <= v < w for v in (x, y, z)) else None


class Volume:
    """Finds the sound components of one geometry: `elements` has, by property, (kind, configuration, element count)."""

    def __init__(self, geometry):
        self.elements = {}
        parts = {key: value for key, (code, value) in geometry.properties.items()
                 if code == OBJECT and value and b"vld_component" in value.properties}
        for kind, make in zip(KINDS, (self.voxel_topology, self.point_topology, self.container, self.channel)):
            for key, part in parts.items():
                if get(part, b"vld_component", STRING) == kind and name_of(part):
                    found = make(part)
                    if found:
                        self.elements[key] = (kind, *found)
        self.sound = [parts[key] for key in self.elements]

    def target(self, part, *kinds):
        found = self.elements.get(get(part, b"target", STRING), (None, None, 0))
        return found[1:] if found[0] in kinds else (None, 0)

    @staticmethod
    def arrays(part, *names_and_codes):
        """The arrays of tiles, unless one is missing. How often arrays are looked at is not counted here."""
        arrays = tuple(get(part, *name_and_code) for name_and_code in names_and_codes)
        return None if None in arrays else arrays

    def voxel_topology(self, part):
        traits = configuration(part)
        arrays = traits and self.arrays(part, (b"leaf_origins", INT3S), (b"leaf_parents", UINTS),
                                        (b"inner_origins", INT3S), (b"inner_children", UINTS))
        if not arrays:
            return None
        w, d = traits[:2]
        leaves, parents, inners, children = (unpacked(a, f) for a, f in zip(arrays, ("3i", "I", "3i", "I")))
        count = len(leaves) * d ** 3 + len(inners) * w ** 3
        if len(parents) != len(leaves) or len(children) != len(inners) * w ** 3 or \
                not are_origins(leaves, d) or not are_origins(inners, w * d):
            return None
        if any(parent >= len(inners) for parent in parents):
            return None
        cells = {}
        for number, (leaf, parent) in enumerate(zip(leaves, parents)):
            cell = cell_of(leaf, inners[parent], w, d)
            if cell is None:
                return None
            cells[parent * w ** 3 + cell] = number
        agrees = len(cells) == len(leaves) and all(
            cells.get(place, NO_TILE) == child for place, child in enumerate(children))
        return (traits, count) if agrees and get(part, b"count", UINT) == count < NO_TILE else None

    def point_topology(self, part):
        traits = configuration(part)
        arrays = traits and self.arrays(part, (b"leaf_origins", INT3S), (b"offsets", UINTS))
        if not arrays:
            return None
        leaves, offsets = unpacked(arrays[0], "3i"), unpacked(arrays[1], "I")
        rises = offsets[:1] == [0] and all(before <= after for before, after in zip(offsets, offsets[1:]))
        good = rises and len(offsets) == len(leaves) + 1 and are_origins(leaves, traits[1])
        return (traits, offsets[-1]) if good else None

    def container(self, part):
        traits, count = self.target(part, b"voxel_topology")
        size = get(part, b"voxelSize", FLOAT)
        size = struct.unpack("<f", bytes(size))[0] if size else math.nan
        return (traits, count) if traits and 0 < size < math.inf and get(part, b"topology", STRING) is not None \
            else None

    def channel(self, part):
        traits, count = self.target(part, b"container", b"point_topology")
        code, data = part.properties.get(b"data", (None, None))
        has_values = code is not None and 120 <= code < 240 and code != 120 + STRING and data and data.count == count
        has_default = has_values and get(part, b"default", code - 120) is not None
        named = get(part, b"container", STRING) is not None and get(part, b"interpolation_mode", MODE) is not None
        return (traits, count) if traits and traits == configuration(part) and has_default and named else None


def mark_components(geometry):
    """Notes at each object that the geometry holds whether a reader rebuilds it as a view of a component."""
    for part in Volume(geometry).sound:
        part.is_proxy = True
