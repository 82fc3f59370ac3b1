#!/usr/bin/env python3
"""Uses the library the way others do, from outside the project, and runs what comes out: the README's example.

Usage: packaging.py WAY BUILD SOURCE CMAKE COMPILER, where WAY is one of
  find_package   install into an empty prefix, move the prefix, build consumer/ by find_package, run it and zon
  pkg_config     the same prefix, the example compiled with the flags of pkg-config
  subdirectory   the example in a project that adds the source tree as a subfolder
"""
import os
import re
import shutil
import subprocess
import sys
import tempfile


def run(*command, **options):
    print("$", " ".join(command), flush=True)
    subprocess.run(command, check=True, **options)


def fail(text):
    sys.exit(f"packaging: {text}")


def installed_and_moved(work, build, cmake):
    """Path of an installed prefix that no longer lies where it was installed to."""
    first, moved = os.path.join(work, "first"), os.path.join(work, "moved")
    run(cmake, "--install", build, "--prefix", first, stdout=subprocess.DEVNULL)
    os.rename(first, moved)
    return moved


def check_names_no_other_place(prefix, places):
    """No text file names a folder of the build, and programs find their libraries from where they lie."""
    for path, _, names in os.walk(prefix):
        for name in names:
            file = os.path.join(path, name)
            with open(file, "rb") as content:
                data = content.read()
            if data[:4] == b"\x7fELF":
                dynamic = subprocess.run(["readelf", "-d", file], check=True, capture_output=True, text=True).stdout
                for folders in re.findall(r"R(?:UN)?PATH\).*\[(.*)\]", dynamic):
                    if not all(folder.startswith("$ORIGIN") for folder in folders.split(":")):
                        fail(f"{file} searches libraries in {folders}")
            else:
                for place in places:
                    if place.encode() in data:
                        fail(f"{file} names {place}")


def build_consumer(work, source, cmake, compiler, *definitions):
    build = os.path.join(work, "build")
    run(cmake, "-S", source, "-B", build, "-G", "Ninja", f"-DCMAKE_CXX_COMPILER={compiler}", *definitions)
    run(cmake, "--build", build)
    return os.path.join(build, "consumer")


def settings_of(build, *names):
    """-D options that repeat settings of a build, so that the compiler cache has seen the same commands."""
    with open(os.path.join(build, "CMakeCache.txt"), encoding="utf-8") as cache:
        entries = dict(re.findall(r"^(\w+):\w+=(.*)$", cache.read(), re.MULTILINE))
    return [f"-D{name}={entries[name]}" for name in names if entries.get(name)]


def main():
    if len(sys.argv) != 6 or sys.argv[1] not in ("find_package", "pkg_config", "subdirectory"):
        sys.exit(__doc__)
    way, build, source, cmake, compiler = sys.argv[1:]
    here = os.path.join(source, "tests", "packaging")
    example = os.path.join(source, "examples", "ReadmeExample.cpp")
    environment = dict(os.environ)
    with tempfile.TemporaryDirectory() as work:
        if way == "subdirectory":
            launcher = shutil.which("ccache")
            consumer = build_consumer(work, os.path.join(here, way), cmake, compiler, f"-DEXAMPLE={example}",
                                      f"-DVELDRIN_SOURCE={source}",
                                      *settings_of(build, "CMAKE_BUILD_TYPE", "VELDRIN_WARNINGS_AS_ERRORS"),
                                      *([f"-DCMAKE_CXX_COMPILER_LAUNCHER={launcher}"] if launcher else []))
        else:
            prefix = installed_and_moved(work, build, cmake)
            check_names_no_other_place(prefix, [build, source, os.path.join(work, "first")])
            if way == "find_package":
                # A consumer may need nothing of what the libraries themselves are built with.
                consumer = build_consumer(work, os.path.join(here, "consumer"), cmake, compiler, f"-DEXAMPLE={example}",
                                          f"-DCMAKE_PREFIX_PATH={prefix}", "-DCMAKE_DISABLE_FIND_PACKAGE_TBB=ON")
                run(os.path.join(prefix, "bin", "zon"), "--help", stdout=subprocess.DEVNULL)
            else:
                folder, = [path for path, _, names in os.walk(prefix) if "veldrin-geometry.pc" in names]
                flags = subprocess.run(["pkg-config", "--cflags", "--libs", "veldrin-geometry"], check=True, text=True,
                                       capture_output=True, env=environment | {"PKG_CONFIG_PATH": folder}).stdout.split()
                consumer = os.path.join(work, "consumer")
                run(compiler, "-std=c++20", example, "-o", consumer, *flags)
                environment["LD_LIBRARY_PATH"] = os.path.dirname(folder)
        run(consumer, cwd=work, env=environment)


if __name__ == "__main__":
    main()
