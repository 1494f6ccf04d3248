#!/usr/bin/env python3
"""Prints hyperfine medians as throughputs and ours against the peer's.

  throughput.py SIZE_MIB TITLE NATIVE_JSON PEER=LABEL OURS=LABEL WINE_JSON WINE=LABEL [TARGET]

NAME=LABEL pairs a hyperfine command name with the label printed for it.
WINE_JSON may be empty (the Windows build was not there); TARGET, when
given, is printed beside the native ratio.
"""
import json
import sys

size_mib, title, native_json, peer, ours, wine_json, wine = sys.argv[1:8]
target = sys.argv[8] if len(sys.argv) > 8 else ""


def medians(path):
    return {r["command"]: r["median"] for r in json.load(open(path))["results"]}


def split(pair):
    name, label = pair.split("=", 1)
    return name, label


(peer_name, peer_label), (ours_name, ours_label), (wine_name, wine_label) = map(split, (peer, ours, wine))
width = max(map(len, (peer_label, ours_label, wine_label)))


def line(label, seconds):
    print(f"{label:<{width}}  median {seconds:7.3f} s  {int(size_mib) / seconds:8.1f} MiB/s")


native = medians(native_json)
print(title)
line(peer_label, native[peer_name])
line(ours_label, native[ours_name])
suffix = f" (target >= {target})" if target else ""
print(f"ratio {ours_label} / {peer_label} throughput: {native[peer_name] / native[ours_name]:.2f}x{suffix}")
if wine_json:
    seconds = medians(wine_json)[wine_name]
    line(wine_label, seconds)
    print(f"ratio {wine_label} / {peer_label} throughput: {native[peer_name] / seconds:.2f}x")
else:
    print(f"{wine_label}: not measured (build the windows preset first)")
