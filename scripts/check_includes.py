#!/usr/bin/env python3
"""Holds the folders to the links their CMake calls declare.

The rules are the calls themselves: ironvale_folder_library(FOLDER LINKED...)
and ironvale_folder_program(NAME FOLDER LINKED...). It fails when

- a file includes a header of a folder its folder does not name (its own
  folder is always allowed; what a named folder names in turn is not),
- a folder names a folder that none of its files includes,
- a folder names a folder that is not below it in the layers,
- a file whose name does not end in _win or _posix includes a platform
  header (or such a file of ours): OS code stays in the thin OS files.

A test folder tests/X may include what X reaches through its links, X
itself, the shared test helpers and the publisher's library (fixture
makers); tests/tools tests the publisher's library, and the helper programs
and fuzz targets stand in for the whole program. The fuzz targets are built
natively only, so they are free of the platform rule.

  scripts/check_includes.py [ROOT]      prints each violation, exits 1 if any
"""
import re
import subprocess
import sys
from pathlib import Path

CALL = re.compile(r"^\s*ironvale_folder_(library|program)\(([^)]*)\)", re.M)
INCLUDE = re.compile(r'^\s*#\s*include\s+(["<])([^">]+)[">]', re.M)

# Lowest first; a folder may name only folders of an earlier row.
LAYERS = [["base"], ["text"], ["patch", "net"], ["state"], ["ui"], ["uninstall"], ["app"]]
# The publisher's tools stand beside the product and use its engine only.
TOOLS_MAY_NAME = {"base", "patch", "net", "tools/publisher"}
TEST_EXTRAS = {"tests/support", "tools/publisher"}
# Test folders that do not mirror a folder of the same name: what they test.
TESTED = {"tests/tools": "tools/publisher", "tests/support/programs": "app", "tests/fuzz": "app"}
EXEMPT_FROM_PLATFORM = ("tests/fuzz/",)

# Headers only one of the two builds has: the OS's own and the libraries that
# stand in for it on the other side.
PLATFORM_HEADERS = re.compile(
    r"^(win[a-z0-9_]*\.h|ws2[a-z0-9_]*\.h|mswsock\.h|iphlpapi\.h|bcrypt\.h|ncrypt\.h|shlobj\.h|shellapi\.h"
    r"|shlwapi\.h|knownfolders\.h|objidl\.h|objbase\.h|ole2\.h|oleauto\.h|combaseapi\.h|gdiplus\.h|commctrl\.h"
    r"|commdlg\.h|tlhelp32\.h|psapi\.h|sddl\.h|aclapi\.h|userenv\.h|versionhelpers\.h|dbghelp\.h|tchar\.h"
    r"|io\.h|direct\.h|process\.h|conio\.h"
    r"|unistd\.h|fcntl\.h|sys/.*|pthread\.h|dirent\.h|spawn\.h|poll\.h|termios\.h|pty\.h|dlfcn\.h|pwd\.h"
    r"|grp\.h|netdb\.h|netinet/.*|arpa/.*|net/.*|semaphore\.h|sched\.h|syslog\.h|libgen\.h|glob\.h|fnmatch\.h"
    r"|ftw\.h|utime\.h|linux/.*|curl/.*|openssl/.*)$")
OS_FILE = re.compile(r"_(win|posix)\.[a-z]+$")


def read_rules(root):
    """{folder: (CMake file, kind, [named folders])}."""
    rules = {}
    for cmake in sorted(root.rglob("CMakeLists.txt")):
        relative = cmake.relative_to(root)
        if "build" in relative.parts:
            continue
        for kind, args in CALL.findall(cmake.read_text()):
            words = args.split()
            if kind == "program":
                words = words[1:]
            if words and not words[0].startswith("$"):
                rules[words[0]] = (str(relative), kind, words[1:])
    return rules


def may_name(folder, named):
    rank = {name: row for row, names in enumerate(LAYERS) for name in names}
    if folder in rank:
        return named in rank and rank[named] < rank[folder]
    if folder.startswith("tools/"):
        return named in TOOLS_MAY_NAME and named != folder
    return folder.startswith("tests/") and not named.startswith("tests/")


def closure(rules, folder, seen=()):
    if folder in seen:
        sys.exit(f"check_includes: the folders link in a circle: {' -> '.join(seen + (folder,))}")
    reached = set()
    for named in rules[folder][2]:
        reached |= {named} | closure(rules, named, seen + (folder,))
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
    rules = read_rules(root)
    violations = []
    for folder, (cmake, _, named) in rules.items():
        for linked in named:
            if rules.get(linked, (None, None))[1] != "library":
                sys.exit(f"check_includes: {cmake}: {folder} links {linked}, which is no folder library")
            if not may_name(folder, linked):
                order = " -> ".join(", ".join(row) for row in LAYERS)
                violations.append(f"{cmake}: {folder} links {linked}, which is not below it ({order}; "
                                  f"tools/ use {', '.join(sorted(TOOLS_MAY_NAME))})")
    allowed = {folder: {folder, *rules[folder][2]} for folder in rules}
    tests = {"tests/" + folder: folder for folder in rules if not folder.startswith(("tests/", "tools/"))}
    tests.update(TESTED)
    for test_folder, tested in tests.items():
        allowed[test_folder] = {test_folder, tested, *TEST_EXTRAS} | closure(rules, tested)
    known = set(allowed) | {"tests/e2e"}

    files = subprocess.run(["git", "ls-files", "--cached", "--others", "--exclude-standard"],
                           cwd=root, capture_output=True, text=True, check=True).stdout.split()
    used = {folder: set() for folder in rules}
    checked = 0
    for name in files:
        if not name.endswith((".c", ".cpp", ".h")) or not (root / name).is_file():
            continue
        checked += 1
        folder = owner(name, allowed)
        os_file = OS_FILE.search(name) is not None or name.startswith(EXEMPT_FROM_PLATFORM)
        for bracket, header in INCLUDE.findall((root / name).read_text(errors="replace")):
            platform = PLATFORM_HEADERS.match(header) if bracket == "<" else OS_FILE.search(header)
            if platform and not os_file:
                violations.append(f"{name}: includes {header}, a platform header, but is no _win or _posix file")
            target = owner(header, known) if bracket == '"' else None
            if folder is None or target is None:
                continue
            if folder in used:
                used[folder].add(target)
            if target in allowed[folder]:
                continue
            if folder in rules:
                violations.append(f"{name}: includes {header}, but {folder} does not name {target}")
            else:
                violations.append(f"{name}: includes {header}, but {folder} reaches only what {tests[folder]} "
                                  f"reaches, {tests[folder]} and the test helpers")
    for folder, (cmake, _, named) in rules.items():
        for linked in named:
            if linked not in used[folder]:
                violations.append(f"{cmake}: {folder} links {linked}, but none of its files includes a header of it")

    for line in violations:
        print(line)
    if violations:
        print(f"check_includes: {len(violations)} violation(s)")
        return 1
    print(f"check_includes: {checked} files, {len(rules)} folder libraries and programs, every link as declared")
    return 0


if __name__ == "__main__":
    sys.exit(main())
