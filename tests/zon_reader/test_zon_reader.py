"""The second reader against the kept streams: good ones give what stands beside them, bad ones their message.

A program reads streams by the library and writes them again: what it makes of them tells the second reader what the library
has read.
"""
import itertools
import json
import os
import pathlib
import re
import subprocess
import tempfile
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
    def check_descriptions(self, folder, *parts):
        files = sorted((STREAMS / "valid").glob("*.zon"))
        self.assertGreater(len(files), 30)
        for file in files:
            kept = json.loads(file.with_suffix(".json").read_text())
            found = describe(Stream((folder / file.name).read_bytes()))
            for part in parts:
                # As text, in which 1 is not true.
                self.assertEqual(json.dumps(found[part]), json.dumps(kept[part]), file.name)

    def test_good_streams_give_the_description_beside_them(self):
        self.check_descriptions(STREAMS / "valid", "version", "level", "handles", "objects")

    def test_good_streams_give_it_again_when_the_library_has_read_and_written_them(self):
        for level, limit in itertools.product("019", ("1", "1000", "99999999999999999999")):
            with self.subTest(level=level, limit=limit), tempfile.TemporaryDirectory() as folder:
                subprocess.run([os.environ["VELDRIN_TEST_PROGRAM"], STREAMS / "valid", folder, level], check=True,
                               env={**os.environ, "VELDRIN_MAX_SERIALIZATION_ARRAY_SIZE": limit})
                self.check_descriptions(pathlib.Path(folder), "objects")

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
