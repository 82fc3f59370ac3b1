"""zon tags and zon tag: what they select, store, refuse and warn about."""
import tool
from zon_files import array, component, obj, part, stream, text

# Four quads of a 2 x 2 square in the plane y = 0, and points by row.
PLANE = ["make", "plane", "plane.zon", "--size", "2", "--subdivisions", "2"]


class Tags(tool.ToolTest):
    def setUp(self):
        super().setUp()
        self.zon(*PLANE)

    def ask(self, *arguments, code=0):
        """(component, ranges, stored name) of the one object of the file."""
        one, = self.json("tag", "plane.zon", "--indices", *arguments, code=code)["objects"]
        return one["component"], one["ranges"], one["stored"]

    def test_rules_over_positions(self):
        points = self.vectors("plane.zon", "point_position")
        self.assertEqual(len(points), 9)
        for rule, holds in (("x>=0", lambda x, y, z: x >= 0), (" z<0\t", lambda x, y, z: z < 0),
                            ("x == 1e0 & z <= 0", lambda x, y, z: x == 1 and z <= 0),
                            ("x != 0 & z != 0.0", lambda x, y, z: x != 0 and z != 0),
                            ("x<1&z>-1&y==0", lambda x, y, z: x < 1 and z > -1)):
            selected = [i for first, last in self.ask("--where", rule)[1] for i in range(first, last + 1)]
            self.assertEqual(selected, [i for i, p in enumerate(points) if holds(*p)], rule)
        # A number means the nearest float, which the file holds too; also one that is next to nothing.
        self.import_text("plane.off", "OFF 2 0 0\n0.1 0 0\n0.2 0 0\n")
        self.assertEqual(self.ask("--where", "x == 0.1")[1], [[0, 0]])
        self.assertEqual(self.ask("--where", "x > 1e-60 & y <= 1e-45 & x < +0.2")[1], [[0, 0]])

    def test_wrong_rules_and_expressions_show_where(self):
        for arguments, column, message in (
                (["--where", "w > 0"], 0, "expecting x, y or z"), (["--where", "x > 0 & "], 8, "expecting x, y or z"),
                (["--where", "x = 0"], 2, "expecting <, <=, >, >=, == or !="), (["--where", "x > a"], 4, "expecting a number"),
                (["--where", "x > 1e99"], 4, "within the range"), (["--where", "x > 0 | y > 0"], 6, "expecting '&'"),
                ([""], 0, "Expression Invalid"), (["(a"], 2, "Expecting a ')'"), (["(é"], 1, "Expecting:  ("),
                (["a é é"], 2, "Expression Invalid"), (["a\n+"], 3, "Expecting:  (")):
            lines = self.zon("tag", "plane.zon", *arguments, code=2).stderr.splitlines()
            self.assertIn(message, lines[0])
            self.assertEqual(lines[1:], ["    " + arguments[-1].replace("\n", "?"), "    " + " " * column + "^"])
        # A complement looks like an option.
        self.assertIn("stands behind '--'", self.zon("tag", "plane.zon", "-*", code=2).stderr)
        self.assertIn("0 of 9 selected", self.zon("tag", "plane.zon", "--", "-*").stdout)

    def test_a_stored_selection_is_a_tag_and_replaces_one_of_its_name(self):
        self.zon("make", "plane", "plane.zon", *PLANE[3:], "--level", "0")
        self.assertEqual(self.ask("--where", "x > 0", "--store", "right"), ("point_component", [[2, 2], [5, 5], [8, 8]],
                                                                           "point_right_tag"))
        self.assertEqual(self.ask("*", "--store", "right")[1], [[0, 8]])
        self.assertEqual(self.json("tags", "plane.zon")["objects"], [{"tags": [
            {"name": "point_right_tag", "component": "point_component", "selected": 9, "elements": 9}]}])
        # The level of the file stays, and so does everything else in it.
        report = self.json("info", "plane.zon")
        self.assertEqual((report["level"], len(report["objects"][0]["properties"])), (0, 4))
        # Each object answers for itself.
        self.import_text("two.obj", "v 0 0 0\nv 1 0 0\nv 1 1 0\nv 0 1 0\no a\nf 1 2 3\no b\nf 1 2 3 4\n")
        self.assertEqual(self.zon("tag", "two.zon", "--where", "x == 0 & y == 1", "--indices").stdout,
                         "object 0: point_component: 0 of 3 selected, 0.0 %\n    none\n"
                         "object 1: point_component: 1 of 4 selected, 25.0 %\n    3\n")

    def test_tags_that_expressions_cannot_use_are_listed_and_not_recommended(self):
        tags = [("good", "point_component", b"\1\0\1"), ("two words", "point_component", b"\1"),
                ("ünï*", "point_component", b""), ("own", "own_component", b"\1\1\0"), ("loose", "", b"\0")]
        self.write("odd.zon", stream([{"point_component": component(3),
                                       **{name: part(obj({"data": array("?", flags), "target": text(target)}))
                                          for name, target, flags in tags}}]))
        self.assertEqual([(t["name"], t["component"], t["selected"], t["elements"])
                          for t in self.json("tags", "odd.zon")["objects"][0]["tags"]],
                         [(name, target, sum(flags), len(flags)) for name, target, flags in tags])
        for expression, warning in (("two", "'two' is no tag; nearest: good"), ("own*", "no tag matches 'own*'; nearest: good"),
                                    ("good ^ g(good)", "'g' is no function and changes nothing; functions are v, f, fv and s"),
                                    ("own", "'own' is a tag of 'own_component', a component that expressions do not know"),
                                    ("loose - good", "'loose' is a tag of no component")):
            for options, code in (([], 0), (["--strict"], 1)):
                said = self.zon("tag", "odd.zon", expression, *options, code=code).stderr
                self.assertEqual(said, f"zon: warning: object 0: {warning}\n")
        warnings = self.json("tag", "odd.zon", " + ".join(f"n{i}" for i in range(50)))["objects"][0]["warnings"]
        self.assertEqual((len(warnings), warnings[-1]), (21, "30 names more that resolve to nothing"))

    def test_what_cannot_be_stored_is_not(self):
        before = (self.folder / "plane.zon").read_bytes()
        for arguments in (["missing"], ["* + missing", "--strict"], ["s(*)"]):
            self.assertEqual(self.ask(*arguments, "--store", "a", code=1)[2], None)
        for arguments, words in ((["*", "--store", "a b"], "a tag's name holds"), (["*", "--store", ""], "a tag's name holds"),
                                 (["*", "-o", "x.zon"], "--store"), (["*", "--where", "x > 0"], "--where"),
                                 ([], "one of the two")):
            self.assertIn(words, self.zon("tag", "plane.zon", *arguments, code=2).stderr)
        self.assertEqual((self.folder / "plane.zon").read_bytes(), before)
        self.assertEqual(self.names(), ["plane.zon"])
