"""The second reader against the kept streams: good ones give what stands beside them, bad ones their message."""
import pathlib
import re
import struct
import unittest

from items import ZonError
from zon_description import describe
from zon_reader import Stream, value_size

ROOT = pathlib.Path(__file__).resolve().parents[2]
STREAMS = ROOT / "tests/corpus/streams"
PAGE = (ROOT / "docs/zon-format.md").read_text()


def valid(name):
    return (STREAMS / "valid" / f"{name}.zon").read_bytes()


def content(data):
    """The described objects, without the line of header numbers."""
    return describe(Stream(data)).partition("\n")[2]


class ZonReader(unittest.TestCase):
    def refusal(self, data):
        with self.assertRaises(ZonError) as caught:
            Stream(data)
        return str(caught.exception)

    def test_good_streams_give_the_description_beside_them(self):
        files = sorted((STREAMS / "valid").glob("*.zon"))
        self.assertGreater(len(files), 30)
        for file in files:
            with self.subTest(file.name):
                self.assertEqual(describe(Stream(file.read_bytes())), file.with_suffix(".json").read_text())

    def test_bad_streams_are_refused_with_their_message(self):
        rows = [line.split("\t") for line in (STREAMS / "bad/expected.tsv").read_text().splitlines()]
        self.assertEqual({name for name, _ in rows}, {file.name for file in (STREAMS / "bad").glob("*.zon")})
        for name, message in rows:
            with self.subTest(name):
                self.assertEqual(self.refusal((STREAMS / "bad" / name).read_bytes()), message)

    def test_every_type_has_its_values(self):
        properties = Stream(valid("v6_every_type_level0")).objects[0].properties
        self.assertEqual([code for code, _ in properties.values()], list(range(370)))
        for name, code, values in [("code_31", "3f", [1.5, 2.5, 3.5]), ("code_18", "2i", [-1, -2]),
                                   ("code_75", "6f", [1.5, 2.5, 3.5, 4.5, 5.5, 6.5]), ("code_44", "4?", [0, 1, 0, 1]),
                                   ("code_118", "4d", [-1.25, -2.25, -3.25, -4.25])]:
            self.assertEqual(properties[name.encode()][1], struct.pack("<" + code, *values), name)
        self.assertEqual(content(valid("v6_every_type_level0")), content(valid("v6_every_type_level9")))

    def test_a_flipped_bit_in_an_item_is_a_checksum_mismatch(self):
        for name in ("v6_walk", "v6_handles", "v6_level1"):
            data = valid(name)
            table = struct.unpack(">Q", data[83:91])[0]
            for at in range(91, table):
                for bit in range(8):
                    flipped = data[:at] + bytes([data[at] ^ 1 << bit]) + data[at + 1:]
                    self.assertEqual(self.refusal(flipped), "Checksum mismatch", f"{name}: {at}, bit {bit}")

    def test_no_beginning_of_a_stream_is_a_stream(self):
        for name in ("v6_walk", "v6_handles", "v6_shared_everywhere", "v5"):
            data = valid(name)
            for size in range(len(data)):
                with self.subTest(name, size=size):
                    self.refusal(data[:size])

    def test_addresses_are_read_from_the_item_and_from_the_old_header(self):
        self.assertEqual(Stream(valid("v6_handles")).addresses, [0x7FFFFFFFF000, 16, 0x7FFFFFFFF000])
        self.assertEqual(Stream(valid("v6_handles_level9")).addresses, [48])
        self.assertEqual(Stream(valid("v5_handles")).addresses, [4096, 8192, 4096])

    def test_the_page_walks_through_the_file_and_lists_every_size(self):
        walk = re.findall(r"^\| ([0-9A-F]{2}) \| `([0-9A-F ]+)` \|", PAGE, re.MULTILINE)
        data = b""
        for position, digits in walk:
            self.assertEqual(len(data), int(position, 16))
            data += bytes.fromhex(digits)
        self.assertEqual(data, valid("v6_walk"))
        rows = re.findall(r"^\| (\d+) \| (?:Math::)?[a-z][\w:<>, ]* \| (\d+|-) \|$", PAGE, re.MULTILINE)
        self.assertEqual(rows, [(str(code), "-" if code == 11 else str(value_size(code))) for code in range(120)])


if __name__ == "__main__":
    unittest.main()
