#!/usr/bin/env python3
"""Adds up the results of one test.sh run.

GoogleTest programs count their test cases (from their XML reports); every
other CTest test and every fuzz target counts once. A program whose CTest
run failed although its report shows no failed case (a crash, a sanitizer
report at exit) counts one extra failure. Prints failures, then
"PASSED FAILED" as the last line.
"""
import glob
import os
import sys
import xml.etree.ElementTree as ET


def main(results, build):
    passed = failed = 0
    notes = []
    for junit in sorted(glob.glob(os.path.join(results, "ctest-*.xml"))):
        preset = os.path.basename(junit)[len("ctest-"):-len(".xml")]
        report_dir = os.path.join(build, preset, "test-results")
        for case in ET.parse(junit).getroot().iter("testcase"):
            name = case.get("name")
            ok = case.get("status") == "run" and case.find("failure") is None
            report = os.path.join(report_dir, name + ".xml")
            if os.path.exists(report):
                root = ET.parse(report).getroot()
                total = int(root.get("tests", 0)) - int(root.get("disabled", 0))
                bad = int(root.get("failures", 0)) + int(root.get("errors", 0))
                skipped = sum(1 for c in root.iter("testcase") if c.find("skipped") is not None)
                total -= skipped
                for c in root.iter("testcase"):
                    if c.find("failure") is not None:
                        notes.append(f"FAILED [{preset}] {c.get('classname')}.{c.get('name')}")
                if not ok and bad == 0:
                    bad = 1
                    total += 1
                    notes.append(f"FAILED [{preset}] {name} (the program failed outside its test cases)")
                passed += total - bad
                failed += bad
            else:
                if ok:
                    passed += 1
                else:
                    failed += 1
                    notes.append(f"FAILED [{preset}] {name}")
    for kind in ("fuzz", "checks"):  # one line per fuzz target or extra check: "PASS name" or "FAIL name"
        listing = os.path.join(results, kind + ".txt")
        if not os.path.exists(listing):
            continue
        for line in open(listing):
            status, name = line.split()
            if status == "PASS":
                passed += 1
            else:
                failed += 1
                notes.append(f"FAILED [{kind}] {name}")
    for note in notes:
        print(note)
    print(passed, failed)


if __name__ == "__main__":
    main(sys.argv[1], sys.argv[2])
