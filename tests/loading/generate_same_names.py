#!/usr/bin/env python3
"""Writes the assembly of a library that defines every global symbol of an archive: a call of any of them aborts.

usage: generate_same_names.py NM ARCHIVE OUTPUT
"""
import subprocess
import sys

nm, archive, output = sys.argv[1:]
listing = subprocess.run([nm, "-g", "--defined-only", archive], check=True, capture_output=True, text=True).stdout
names = {}
for line in listing.splitlines():
    parts = line.split()
    # Symbols of the sanitizers are left out.
    if len(parts) == 3 and "asan" not in parts[2] and "tsan" not in parts[2] and not parts[2].startswith("DW.ref"):
        names.setdefault(parts[2], parts[1])
with open(output, "w", encoding="ascii") as out:
    out.write('.section .note.GNU-stack,"",%progbits\n.text\n')
    for name, kind in sorted(names.items()):
        if kind in "TW":
            out.write(f'.globl "{name}"\n.type "{name}",%function\n"{name}":\n')
    out.write("call abort@PLT\n.data\n")
    for name, kind in sorted(names.items()):
        if kind not in "TW":
            out.write(f'.globl "{name}"\n.type "{name}",%object\n"{name}":\n')
    out.write(".zero 256\n")
    out.write(f".globl zorvaSameNames\n.type zorvaSameNames,%object\nzorvaSameNames: .long {len(names)}\n")
if len(names) < 100:
    sys.exit(f"{archive}: only {len(names)} names")
