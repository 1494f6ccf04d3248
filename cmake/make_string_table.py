#!/usr/bin/env python3
"""Turns the translators' string table (UTF-8, TAB-separated, one row per
key) into the resource bytes the program reads: UTF-16 LE with a byte-order
mark, CR LF line ends, TAB cells.

usage: make_string_table.py INPUT.tsv OUTPUT.csv
"""
import sys


def main(argv):
    source, target = argv[1], argv[2]
    with open(source, encoding="utf-8") as handle:
        rows = [line.rstrip("\r\n") for line in handle]
    rows = [row for row in rows if row and not row.startswith("#")]
    header = rows[0].split("\t")
    for number, row in enumerate(rows[1:], start=2):
        if len(row.split("\t")) < len(header):
            sys.exit(f"{source}: row {number} has fewer cells than the header")
    text = "\ufeff" + "".join(row + "\r\n" for row in rows)
    with open(target, "wb") as handle:
        handle.write(text.encode("utf-16-le"))


if __name__ == "__main__":
    main(sys.argv)
