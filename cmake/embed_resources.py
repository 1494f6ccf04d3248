#!/usr/bin/env python3
"""Writes a C++ file holding resources as byte arrays, for the POSIX build.

usage: embed_resources.py OUTPUT.cpp NAME TYPE FILE [NAME TYPE FILE ...]
"""
import sys


def main(argv):
    out_path, rest = argv[1], argv[2:]
    if len(rest) % 3:
        sys.exit("embed_resources.py: arguments come in NAME TYPE FILE triples")
    lines = ['#include "text/embedded_resources.h"', "", "namespace {"]
    entries = []
    for index in range(0, len(rest), 3):
        name, kind, path = rest[index:index + 3]
        with open(path, "rb") as handle:
            data = handle.read()
        body = ",".join(str(b) for b in data) or "0"
        lines.append(f"const uint8_t kData{index // 3}[] = {{{body}}};")
        entries.append(f'    {{"{name}", "{kind}", kData{index // 3}, {len(data)}}},')
    lines += ["}  // namespace", "", "const EmbeddedResource kEmbeddedResources[] = {"]
    lines += entries or ['    {"", "", nullptr, 0},']
    lines += ["};", f"const size_t kEmbeddedResourceCount = {len(entries)};", ""]
    with open(out_path, "w") as handle:
        handle.write("\n".join(lines))


if __name__ == "__main__":
    main(sys.argv)
