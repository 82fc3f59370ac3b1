#!/usr/bin/env python3
"""Compares what a built library exports with the reviewed list of it.

Compared are the demangled names of the dynamic symbol table: each of ours must be in the list, and each of the list
must be there. Two kinds are left out, for both are emitted into every program that uses a type, exported for the
type's identity across libraries, and promised by nobody:
- instances of the standard library's templates: weak symbols outside our namespaces;
- weak type information, virtual tables, thunks and guards. A class whose virtual table has one home in the library
  has strong ones, which are in the list.
A weak symbol of ours that is neither is an explicit template instance, and in the list like any function.
Whatever its kind, no symbol may name a type that an internal header declares.

Usage: export_list.py LIST LIBRARY SOURCE_ROOT [--update]
  --update writes the list anew from the library; review the difference before it is committed.
"""
import pathlib
import re
import subprocess
import sys

OUR_NAMESPACES = ("Nexil", "Lattix", "VLD", "Veldrin")
# Emitted wherever a type is used, for the type's own sake.
OF_A_TYPE = re.compile(r"^(typeinfo for|typeinfo name for|vtable for|VTT for|construction vtable for|guard variable for|"
                       r"(non-virtual|virtual|covariant return) thunk to) ")
DECLARED_TYPE = re.compile(r"^\s*(?:class|struct|union|enum(?:\s+class)?)\s+(?:\[\[\w+\]\]\s+)?(?:[A-Z][A-Z0-9_]*_API\s+)?"
                           r"([A-Z]\w*)\b[^;(]*(?:\{|$)", re.MULTILINE)
HEADING = """# Everything {library} exports on purpose. tests/checks/export_list.py compares this list with the
# built library; after a deliberate change, run it with --update and review the difference.
"""


def dynamic_symbols(library):
    """[(kind letter, demangled name)] of the library's defined dynamic symbols."""
    out = subprocess.run(["nm", "-DC", "--defined-only", library], check=True, capture_output=True, text=True).stdout
    return re.findall(r"^[0-9a-f]*\s+(\S)\s+(.*)$", out, re.MULTILINE)


def is_ours(name):
    """Whether the symbol itself, not an argument of it, lies in one of our namespaces."""
    # Template instances are printed with their return type first: cut argument lists, then take the last word.
    plain = name
    while (shorter := re.sub(r"<[^<>]*>|\([^()]*\)", "", plain)) != plain:
        plain = shorter
    words = re.split(r"operator", plain, maxsplit=1)[0].replace(" const", "").split()
    return bool(words) and words[-1].split("::")[0].strip("*&") in OUR_NAMESPACES


def exported_names(symbols):
    """The names that have to agree with the list."""
    return {name for kind, name in symbols
            if kind not in "WVu" or (not OF_A_TYPE.match(name) and is_ours(name))}


def types_declared_in(root, hidden):
    """Classes and enumerations of the headers that are hidden, or of those that are not."""
    return {name for path in pathlib.Path(root, "src").rglob("*.h")
            if hidden == bool({"internal", "parallel"} & set(path.parts))
            for name in DECLARED_TYPE.findall(path.read_text())}


def leaks(symbols, internal_types):
    pattern = re.compile(r"::(" + "|".join(sorted(internal_types)) + r")\b") if internal_types else None
    return sorted({name for _, name in symbols if pattern and pattern.search(name)})


def compare(symbols, listed, internal_types):
    """Complaints about what the library exports."""
    exported = exported_names(symbols)
    complaints = [f"exported, but not in the list: {name}" for name in sorted(exported - listed)]
    complaints += [f"in the list, but not exported: {name}" for name in sorted(listed - exported)]
    complaints += [f"names a type of an internal header: {name}" for name in leaks(symbols, internal_types)]
    return complaints


def main():
    arguments = [argument for argument in sys.argv[1:] if argument != "--update"]
    if len(arguments) != 3:
        sys.exit(__doc__)
    listing, library, root = arguments
    symbols = dynamic_symbols(library)
    if "--update" in sys.argv:
        path = pathlib.Path(listing)
        path.write_text(HEADING.format(library=path.stem) + "".join(f"{name}\n" for name in sorted(exported_names(symbols))))
        return
    listed = {line for line in pathlib.Path(listing).read_text().splitlines() if line and not line.startswith("#")}
    internal_types = types_declared_in(root, True) - types_declared_in(root, False)
    complaints = compare(symbols, listed, internal_types)
    print("\n".join(complaints + [f"{len(symbols)} symbols, {len(complaints)} complaints"]))
    sys.exit(1 if complaints else 0)


if __name__ == "__main__":
    main()
