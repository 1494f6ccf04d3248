#!/usr/bin/env python3
"""Starts PROGRAM (Yes to the update, No to the game) and kills it (SIGKILL) once the archives in WORK hold a seeded
share of TOTAL bytes and this start has added to them, KILLS times at growing shares; then lets one run end and
passes on its exit code.

  kill_during_download.py PROGRAM WORK TOTAL KILLS SEED
"""
import random
import subprocess
import sys
import time
from pathlib import Path

program, work, total, kills, seed = sys.argv[1], Path(sys.argv[2]), int(sys.argv[3]), int(sys.argv[4]), int(sys.argv[5])


def arrived():
    size = 0
    for archive in work.glob("*.lzma"):
        try:
            size += archive.stat().st_size
        except FileNotFoundError:
            pass
    return size


def start():
    process = subprocess.Popen([program, "-latestVersion", "2"], stdin=subprocess.PIPE, stdout=subprocess.DEVNULL,
                               stderr=subprocess.DEVNULL)
    process.stdin.write(b"y\nn\n")
    process.stdin.close()
    return process


rng = random.Random(seed)
for share in sorted(rng.uniform(0.02, 0.98) for _ in range(kills)):
    before = arrived()
    process = start()
    while process.poll() is None and not (arrived() > before and arrived() >= share * total):
        time.sleep(0.001)
    process.kill()
    process.wait()
    print(f"  killed with {arrived() / 2**20:.1f} of {total / 2**20:.1f} MiB there", flush=True)
sys.exit(start().wait())
