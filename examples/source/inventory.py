#!/usr/bin/env python3
"""An agent source of one's own: keeps the tree's document from a list of interfaces.

  inventory.py LIST TREE     LIST has a line "INTERFACE DOMAIN SERVER..." for each; TREE is what agent.toml names:

      [tree]
      source = "file"
      file = "tree.json"

Run it whenever the list changes, from cron or a path unit: the agent watches the document.
"""
import json
import os
import pathlib
import sys


def port(line):
    name, domain, *servers = line.split()
    return {"type": "Port", "name": name, "children": [{"type": "NetworkIPConfig", "name": "ip", "properties": {
        "name": name, "domain_name": domain, "dns_suffixes": [domain], "dns_server_addresses": servers,
        "enabled_state": 1, "protocol_if_type": 4096}}]}


def tree(lines):
    ports = [port(line) for line in lines if line.strip() and not line.startswith("#")]
    return {"version": 1, "system_name": os.uname().nodename,
            "nodes": [{"type": "System", "name": "system", "description": "Computer", "children": ports}]}


def replace(path, text):
    """No reader ever sees half of it."""
    new = path.with_name(path.name + ".new")
    new.write_text(text, encoding="utf-8")
    new.replace(path)


if len(sys.argv) != 3:
    sys.exit(__doc__)
replace(pathlib.Path(sys.argv[2]), json.dumps(tree(pathlib.Path(sys.argv[1]).read_text(encoding="utf-8").splitlines())))
