#!/usr/bin/env python3
"""Writes down every slot of the broker's and its objects' function tables for Tables_test.cpp.

usage: generate_slot_test.py cmpi-abi.json OUTPUT

Each function pointer of each table becomes one line SLOT(table, slot, "parameter", ...), so that the test cannot pass over
one; a slot that takes any number of arguments becomes VARIADIC_SLOT(table, slot).
"""

import json
import pathlib
import sys

facts = json.loads(pathlib.Path(sys.argv[1]).read_text())
lines = []
for record in facts["records"]:
    name = record["name"]
    # The tables of providers (...MIFT) are theirs, not the broker's.
    if not name.endswith("FT") or name.endswith("MIFT"):
        continue
    for field in record["fields"]:
        if "returns" not in field:
            continue
        if "..." in field["param_types"]:
            lines.append(f"VARIADIC_SLOT({name}, {field['name']})")
            continue
        names = field["param_names"] or [None] * len(field["param_types"])
        parameters = "".join(f', "{parameter or ""}"' for parameter in names)
        lines.append(f"SLOT({name}, {field['name']}{parameters})")
pathlib.Path(sys.argv[2]).write_text("\n".join(lines) + "\n")
