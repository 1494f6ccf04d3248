#!/usr/bin/env python3
"""Line coverage of the native tests, per product folder (GCC + gcov).

  scripts/coverage.py [FOLDER ...]     default: base text patch net state

Builds the native tests with --coverage into build/coverage, runs them, and
prints for each folder the lines run at least once against the lines gcov
counts as code, then the total over the folders asked for.
"""
import json
import os
import subprocess
import sys
from collections import defaultdict
from pathlib import Path

root = Path(__file__).resolve().parent.parent
build = root / "build" / "coverage"
folders = sys.argv[1:] or ["base", "text", "patch", "net", "state"]


def run(*command, **options):
    subprocess.run(command, check=True, **options)


run("cmake", "-S", str(root), "-B", str(build), "-G", "Ninja", "-DCMAKE_BUILD_TYPE=Debug",
    "-DCMAKE_C_COMPILER=gcc", "-DCMAKE_CXX_COMPILER=g++", "-DIRONVALE_TESTS=ON",
    "-DCMAKE_C_FLAGS=--coverage -O0", "-DCMAKE_CXX_FLAGS=--coverage -O0",
    "-DCMAKE_EXE_LINKER_FLAGS=--coverage", stdout=subprocess.DEVNULL)
run("cmake", "--build", str(build), "-j", str(os.cpu_count() or 2), stdout=subprocess.DEVNULL)
for stale in build.rglob("*.gcda"):
    stale.unlink()
subprocess.run(["ctest", "--test-dir", str(build), "-j", str(os.cpu_count() or 2)], stdout=subprocess.DEVNULL)

# A line is covered when any translation unit ran it (headers are compiled
# into many).
lines = defaultdict(dict)
for data in build.rglob("*.gcda"):
    out = subprocess.run(["gcov", "--json-format", "--stdout", str(data)], cwd=data.parent,
                         capture_output=True, text=True).stdout
    for document in out.splitlines():
        if not document.startswith("{"):
            continue
        for record in json.loads(document).get("files", []):
            source = Path(record["file"])
            if not source.is_absolute():
                source = (data.parent / source).resolve()
            try:
                relative = source.relative_to(root).as_posix()
            except ValueError:
                continue
            for line in record["lines"]:
                number = line["line_number"]
                lines[relative][number] = lines[relative].get(number, 0) or line["count"]

total_run = total_code = 0
for folder in folders:
    run_lines = code_lines = 0
    for name, counts in lines.items():
        if name.startswith(folder + "/"):
            code_lines += len(counts)
            run_lines += sum(1 for count in counts.values() if count)
    total_run += run_lines
    total_code += code_lines
    share = 100.0 * run_lines / code_lines if code_lines else 0.0
    print(f"{folder:10} {run_lines:6} / {code_lines:6} lines  {share:5.1f} %")
share = 100.0 * total_run / total_code if total_code else 0.0
print(f"{'all':10} {total_run:6} / {total_code:6} lines  {share:5.1f} %")
