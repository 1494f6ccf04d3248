#!/usr/bin/env python3
"""Fails when a file includes a header of a folder its library does not link.

The rules are the CMake calls themselves: ironvale_folder_library(FOLDER
LINKED...) and ironvale_folder_program(NAME FOLDER LINKED...). A file may
include headers of its own folder and of every folder its folder links,
directly or through them. A test folder tests/X may also include what X
may, plus the shared test helpers and the publisher's library (fixture
makers). End-to-end and fuzz tests are exempt.

  scripts/check_includes.py [ROOT]      prints each violation, exits 1 if any
"""
import re
import subprocess
import sys
from pathlib import Path

CALL = re.compile(r"^\s*ironvale_folder_(library|program)\(([^)]*)\)", re.M)
INCLUDE = re.compile(r'^\s*#\s*include\s+"([^"]+)"', re.M)
TEST_EXTRAS = ("tests/support", "tools/publisher")
EXEMPT = ("tests/e2e/", "tests/fuzz/")


def read_rules(root):
    links = {}
    for cmake in sorted(root.rglob("CMakeLists.txt")):
        if "build" in cmake.relative_to(root).parts:
            continue
        for kind, args in CALL.findall(cmake.read_text()):
            words = args.split()
            if kind == "program":
                words = words[1:]
            if words and not words[0].startswith("$"):
                links[words[0]] = words[1:]
    return links


def closure(links, folder, seen=()):
    if folder in seen:
        sys.exit(f"check_includes: the folders link in a circle: {' -> '.join(seen + (folder,))}")
    reached = set()
    for linked in links.get(folder, []):
        if linked not in links:
            sys.exit(f"check_includes: {folder} links {linked}, which is no folder library")
        reached |= {linked} | closure(links, linked, seen + (folder,))
    return reached


def owner(path, folders):
    """The ruled folder a path lies in (the longest match), or None."""
    best = None
    for folder in folders:
        if path.startswith(folder + "/") and (best is None or len(folder) > len(best)):
            best = folder
    return best


def main():
    root = Path(sys.argv[1] if len(sys.argv) > 1 else Path(__file__).resolve().parent.parent)
    links = read_rules(root)
    allowed = {folder: {folder} | closure(links, folder) for folder in links}
    for folder in list(links):
        if not folder.startswith("tests/"):
            allowed["tests/" + folder] = {"tests/" + folder, *TEST_EXTRAS} | allowed[folder]
    files = subprocess.run(["git", "ls-files", "--cached", "--others", "--exclude-standard"],
                           cwd=root, capture_output=True, text=True, check=True).stdout.split()
    known = set(allowed) | {"tests/" + name for name in ("support", "e2e", "fuzz")}
    violations = []
    checked = 0
    for name in files:
        if not name.endswith((".c", ".cpp", ".h")) or name.startswith(EXEMPT):
            continue
        folder = owner(name, allowed)
        if folder is None:
            continue
        checked += 1
        text = (root / name).read_text(errors="replace")
        for header in INCLUDE.findall(text):
            target = owner(header, known)
            if target is not None and target not in allowed[folder]:
                violations.append(f"{name}: includes {header}, but {folder} does not link {target}")
    for line in violations:
        print(line)
    if violations:
        print(f"check_includes: {len(violations)} include(s) climb out of their layer")
        return 1
    print(f"check_includes: {checked} files in {len(links)} folder libraries, no include climbs")
    return 0


if __name__ == "__main__":
    sys.exit(main())
