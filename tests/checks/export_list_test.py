#!/usr/bin/env python3
"""Feeds made-up symbol tables to export_list.py."""
import unittest

import export_list

LISTED = "Nexil::setJobCancelHook(bool (*)())"

# (kind letter, demangled name, part of the complaint or None when the symbol is fine)
SYMBOLS = [
    ("T", "Veldrin::stray()", "not in the list"),
    ("B", "Nexil::counter", "not in the list"),
    ("D", "vtable for Veldrin::Object", "not in the list"),
    ("T", "std::stray()", "not in the list"),
    ("T", "strayC", "not in the list"),
    ("V", "vtable for Veldrin::Object", None),
    ("V", "typeinfo name for Nexil::RuntimeServices", None),
    ("W", "std::vector<Nexil::Any, std::allocator<Nexil::Any> >::~vector()", None),
    ("W", "void std::sort<Nexil::Key*>(Nexil::Key*, Nexil::Key*)", None),
    ("W", "Nexil::Array<std::vector<int> >::resize(unsigned long)", "not in the list"),
    ("W", "void Veldrin::Geometry::createDataGeoProperty<float>(float const&, Veldrin::Object&)", "not in the list"),
    ("W", "Nexil::operator<(Nexil::Name const&, Nexil::Name const&)", "not in the list"),
    ("V", "typeinfo for Veldrin::IO::ChunkWriter", "internal header"),
    ("W", "std::vector<Veldrin::IO::ChunkWriter>::push_back(Veldrin::IO::ChunkWriter&&)", "internal header"),
    ("W", "std::vector<Veldrin::IO::ChunkWriterOptions>::clear()", None),
]


class ExportList(unittest.TestCase):
    def test_each_symbol_is_judged_by_its_kind_and_namespace(self):
        for kind, name, complaint in SYMBOLS:
            with self.subTest(kind=kind, name=name):
                found = export_list.compare([("T", LISTED), (kind, name)], {LISTED}, {"ChunkWriter"})
                if complaint is None:
                    self.assertEqual(found, [])
                else:
                    self.assertEqual(len(found), 1)
                    self.assertIn(complaint, found[0])

    def test_a_listed_symbol_that_is_gone_is_a_complaint(self):
        self.assertEqual(export_list.compare([], {LISTED}, set()), [f"in the list, but not exported: {LISTED}"])


if __name__ == "__main__":
    unittest.main()
