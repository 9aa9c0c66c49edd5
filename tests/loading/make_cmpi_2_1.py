#!/usr/bin/env python3
"""Writes a folder of CMPI headers as of version 2.1: the project's own with what the facts say that 2.1 changes.

usage: make_cmpi_2_1.py CMPI-DIR NEW-DIR

Slots are only appended to the tables. The facts have no types for them, and the library does not call them, so each
takes no arguments here.
"""

import json
import pathlib
import re
import shutil
import sys


def append_slots(text, record, slots):
    table = re.compile(r"(^struct _" + record + r" \{\n.*?)(^\};)", re.S | re.M)
    added = "".join(f"  CMPIStatus (*{slot})(void);\n" for slot in slots)
    text, count = table.subn(lambda found: found[1] + added + found[2], text)
    if count != 1:
        sys.exit(f"{record}: found {count} times in the headers")
    return text


def main(source, target):
    shutil.rmtree(target, ignore_errors=True)
    shutil.copytree(source, target)
    delta = json.loads((source / "cmpi-abi.json").read_text())["delta_2_1"]
    tables = {entry["record"]: entry["slots"] for entry in delta["slots_appended"]}
    header = target / "cmpift.h"
    text = header.read_text()
    for record, slots in tables.items():
        text = append_slots(text, record, slots)
    header.write_text(text)
    print(f"{sum(map(len, tables.values()))} slots appended to {len(tables)} tables")


main(pathlib.Path(sys.argv[1]), pathlib.Path(sys.argv[2]))
