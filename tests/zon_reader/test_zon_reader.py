"""The second reader against the kept streams: good ones give what stands beside them, bad ones their message."""
import json
import pathlib
import re
import unittest

from items import ZonError
from zon_description import describe
from zon_reader import Stream, value_size

ROOT = pathlib.Path(__file__).resolve().parents[2]
STREAMS = ROOT / "tests/corpus/streams"
PAGE = (ROOT / "docs/zon-format.md").read_text()


def valid(name):
    return (STREAMS / "valid" / f"{name}.zon").read_bytes()


class ZonReader(unittest.TestCase):
    def test_good_streams_give_the_description_beside_them(self):
        files = sorted((STREAMS / "valid").glob("*.zon"))
        self.assertGreater(len(files), 30)
        for file in files:
            with self.subTest(file.name):
                kept = json.loads(file.with_suffix(".json").read_text())
                # As text, in which 1 is not true.
                self.assertEqual(json.dumps(describe(Stream(file.read_bytes()))), json.dumps(kept))

    def test_bad_streams_are_refused_with_their_message(self):
        rows = [line.split("\t") for line in (STREAMS / "bad/expected.tsv").read_text().splitlines()]
        self.assertEqual({name for name, _ in rows}, {file.name for file in (STREAMS / "bad").glob("*.zon")})
        for name, message in rows:
            with self.subTest(name), self.assertRaises(ZonError) as caught:
                Stream((STREAMS / "bad" / name).read_bytes())
            self.assertEqual(str(caught.exception), message, name)

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
