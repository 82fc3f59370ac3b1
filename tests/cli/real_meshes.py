"""Takes every real mesh through the tool.

Usage: real_meshes.py ZON MOST, with the folder of the meshes in VELDRIN_MESHES; files of more than MOST bytes are left
out unless it is 0. Each file is imported twice, verified, compared, exported and imported again. What comes back must be
equal but for what the tool itself said is lost; the points and faces of OFF files must be those that a second, slow
reader finds.
"""
import json
import os
import pathlib
import re
import struct
import subprocess
import sys
import tempfile

FORMATS = (".off", ".ply", ".stl", ".obj")
EXPECTED_COUNT = 154


def zon(*arguments, codes=(0,)):
    result = subprocess.run([sys.argv[1], *arguments], capture_output=True, encoding="utf-8", timeout=300)
    if result.returncode not in codes:
        raise AssertionError(f"zon {' '.join(map(str, arguments))} ended with {result.returncode}\n{result.stdout}{result.stderr}")
    return result


def float32(text):
    return struct.unpack("f", struct.pack("f", float(text)))[0]


def content_of_off(path):
    """Points and faces of an OFF file, one point and one face a line."""
    lines = [line.split("#")[0].split() for line in path.read_text(errors="replace").splitlines()]
    first, *rest = [line for line in lines if line]
    head, body = (first[1:], rest) if first[1:] else (rest[0], rest[1:])
    points, faces = int(head[0]), int(head[1])
    return ([tuple(map(float32, line[:3])) for line in body[:points]],
            [tuple(map(int, line[1:int(line[0]) + 1])) for line in body[points:points + faces]])


def content_of_obj(path):
    points, faces = [], []
    for line in path.read_text().splitlines():
        words = line.split()
        if words[0] == "v":
            points.append(tuple(map(float32, words[1:])))
        elif words[0] == "f":
            faces.append(tuple(int(word.split("/")[0]) - 1 for word in words[1:]))
    return points, faces


def check(path, folder):
    """Takes one file round. Gives the message when the tool refuses the file."""
    first, second, text = folder / "first.zon", folder / "second.zon", folder / "back.obj"
    result = zon("import", path, first, codes=(0, 2))
    if result.returncode == 2:
        message = result.stderr.strip()
        if f"{path}:" not in message or "\n" in message:
            raise AssertionError(f"the error does not name the file and one fault: {message}")
        return message
    zon("verify", first)
    zon("import", path, second)
    zon("diff", first, second)
    losses = json.loads(zon("export", first, text, "--json").stdout)["not_kept"]
    zon("import", text, second)
    differences = json.loads(zon("diff", first, second, "--json", codes=(0, 1)).stdout)["differences"]
    found = {"/".join(each["path"][1:]) for each in differences}
    told = {re.sub(r"^object 0: (\S+) .*", r"\1", loss) for loss in losses}
    if found != told:
        raise AssertionError(f"{path}: lost {found}, but said {told}")
    if path.suffix == ".off" and content_of_obj(text) != content_of_off(path):
        raise AssertionError(f"{path}: other points or faces than the file has")
    return None


def main():
    source = os.environ.get("VELDRIN_MESHES")
    if not source or not os.path.isdir(source):
        print("SKIPPED: VELDRIN_MESHES names no folder of meshes; scripts/fetch-meshes gets them")
        return 77
    most = int(sys.argv[2])
    files = sorted(path for path in pathlib.Path(source).rglob("*") if path.suffix in FORMATS)
    if len(files) < EXPECTED_COUNT:
        print(f"{source} holds {len(files)} meshes of {EXPECTED_COUNT}")
        return 1
    failures, refused, taken = [], [], 0
    with tempfile.TemporaryDirectory() as folder:
        for path in files:
            if most and path.stat().st_size > most:
                continue
            taken += 1
            try:
                message = check(path, pathlib.Path(folder))
                if message:
                    refused.append(message)
            except (AssertionError, subprocess.TimeoutExpired) as failure:
                failures.append(f"{path.name}: {failure}")
    print(f"{taken} of {len(files)} meshes: {taken - len(refused) - len(failures)} went round, {len(refused)} refused")
    print("\n".join(refused + failures))
    return 1 if failures or refused or not taken else 0


if __name__ == "__main__":
    sys.exit(main())
