#!/usr/bin/env python3
"""Checks the JSON of every command of zorvactl with docs/zorvactl.schema.json, and that docs/json.md names each of them.

  tests/json_documents.py BUILD    BUILD: the folder with bin/zorvactl and bin/zorvacimd; exits 1 and prints each problem

The schema allows further members, as the promise of docs/json.md does. Here none are: what is written must be described.
"""
import copy
import json
import os
import pathlib
import re
import subprocess
import sys
import tempfile

try:
    import jsonschema
except ImportError:  # another Python may come first in PATH; Debian's package is for its own
    if sys.executable == "/usr/bin/python3":
        raise
    os.execv("/usr/bin/python3", ["/usr/bin/python3", *sys.argv])

ROOT = pathlib.Path(__file__).resolve().parent.parent
SCHEMA = json.loads((ROOT / "docs" / "zorvactl.schema.json").read_text())

PORT = {"type": "Port", "name": "eth0", "description": "", "children": [
    {"type": "NetworkIPConfig", "name": "ip", "description": "", "properties": {
        "name": "eth0", "host_name": "host1", "domain_name": "example.org", "dns_suffixes": ["example.org"],
        "dns_server_addresses": ["127.0.0.9"], "protocol_if_type": 4097, "enabled_state": 1, "dns_owner": "NetworkManager",
        "addresses": [{"address": "192.0.2.10", "prefix_length": 24, "origin": "static"}]}}]}
TREE = {"system_name": "host1", "nodes": [{"type": "System", "name": "system", "description": "Computer", "children": [PORT]}]}
ENDPOINT = 'ZORVA_DNSProtocolEndPoint.Name="eth0"'
SETTING = 'ZORVA_DNSSettingData.InstanceID="Computer%eth0"'

# Each command with words that make it succeed, in an order in which they do. A third element: its exit status.
CALLS = [
    ("show", []), ("show", ["eth0"]), ("tree", []), ("classes", []), ("graph", []),
    ("check", ["eth0"], 1), ("watch", ["--count", "1"]),
    ("enumerate", ["CIM_ManagedElement"]), ("associators", [ENDPOINT]), ("references", [ENDPOINT]),
    ("names", ["CIM_ManagedElement"]), ("associator-names", [ENDPOINT]), ("reference-names", [ENDPOINT]),
    ("enumerate", ["ZORVA_SPComputerSystem"]), ("get", [ENDPOINT]), ("get", [SETTING, "--property", "DomainName"]),
    ("ifcfg init", ["eth0"]), ("ifcfg show", ["eth0"]), ("ifcfg list", []),
    ("show", []),
    ("modify", [SETTING, "DomainName=lab.example.org"]), ("domain", ["eth0", "lab2.example.org"]),
    ("modify", [ENDPOINT, "DomainName=node.example.org"]), ("overlay show", []), ("overlay clear", []),
    ("dns show", ["eth0"]), ("dns set", ["eth0", "127.0.0.8"]), ("dns add", ["eth0", "192.0.2.2"]),
    ("dns remove", ["eth0", "192.0.2.2"]),
    ("suffixes set", ["a.example"]), ("suffixes add", ["b.example"]), ("suffixes remove", ["b.example"]), ("suffixes show", []),
    ("invoke", [ENDPOINT, "SetDNSDomain", "DNSDomain=x.example.org"], 1),
    ("invoke --dry-run", [ENDPOINT, "SetDNSDomain", "DNSDomain=x.example.org"]),
    ("ifcfg adopt", ["gone0", "eth1"]), ("ifcfg remove", ["eth0"]),
    ("apply", ["--dry-run", "nonesuch0"], 1), ("revert", ["--dry-run", "nonesuch0"], 1),
    ("user add", ["alice", "--no-password", "--subject", "CN=alice", "--namespace", "interop=none"]),
    ("user passwd", ["alice"]), ("user role", ["alice", "operate"]), ("user certificate", ["alice", "--none"]),
    ("user list", []), ("user remove", ["alice"]),
]


def strict(schema):
    """The same schema, without members that it does not describe."""
    if isinstance(schema, list):
        return [strict(each) for each in schema]
    if not isinstance(schema, dict):
        return schema
    out = {key: strict(value) for key, value in schema.items()}
    if isinstance(schema.get("properties"), dict) and schema.get("type") == "object":
        out.setdefault("additionalProperties", False)
    return out


def validator(name):
    schema = strict(copy.deepcopy(SCHEMA))
    schema["$ref"] = "#/$defs/" + name
    return jsonschema.Draft202012Validator(schema)


def definitions():
    """The definition of each command, from the table of docs/json.md."""
    rows = re.findall(r"^\| (.+?) \| `([a-z-]+)` \|$", (ROOT / "docs" / "json.md").read_text(), re.M)
    return {command: name for commands, name in rows for command in re.findall(r"`([^`]+)`", commands)}


class Host:
    """A host in a directory, with the server for it."""

    def __init__(self, build, directory):
        self.bin = pathlib.Path(build) / "bin"
        self.directory = pathlib.Path(directory)
        (self.directory / "data").mkdir()
        tree = copy.deepcopy(TREE)
        other = json.loads(json.dumps(PORT).replace("eth0", "eth1"))
        tree["nodes"][0]["children"].append(other)
        (self.directory / "tree.json").write_text(json.dumps(tree))
        (self.directory / "data" / "ifcfg-gone0").write_text("DOMAINNAME=example.org\n")
        (self.directory / "agent.toml").write_text(
            '[agent]\ndata_dir = "data"\n[tree]\nsource = "file"\nfile = "tree.json"\n[log]\ntarget = "off"\n')
        # With settings of interfaces that exist this would change nothing either: it is only ever a dry run.
        (self.directory / "live.toml").write_text('[agent]\ndata_dir = "data"\n[log]\ntarget = "off"\n')
        (self.directory / "server.toml").write_text('[access]\nanonymous = "operate"\n')

    def run(self, words):
        config = "live.toml" if words[0] in ("apply", "revert") else "agent.toml"
        done = subprocess.run([self.bin / "zorvactl", *words, "-o", "json"], capture_output=True, text=True, timeout=60,
                              input="correct horse battery\n", check=False,
                              env={**os.environ, "ZORVAGENT_CONFIG": str(self.directory / config)})
        return done.returncode, done.stdout, done.stderr

    def watch(self, words):
        """The same for a command that waits for a change, which is made once it watches."""
        env = {**os.environ, "ZORVAGENT_CONFIG": str(self.directory / "agent.toml")}
        watching = subprocess.Popen([self.bin / "zorvactl", "watch", *words, "-o", "json"], stdout=subprocess.PIPE,
                                    stderr=subprocess.PIPE, text=True, env=env)
        begun = watching.stderr.readline()
        subprocess.run([self.bin / "zorvactl", "modify", ENDPOINT, "DomainName=watched.example.org"], check=True, env=env,
                       stdout=subprocess.DEVNULL, timeout=60)
        out, err = watching.communicate(timeout=60)
        return watching.returncode, out, begun + err

    def serve(self):
        server = subprocess.Popen([self.bin / "zorvacimd", "--port", "0", "--config", self.directory / "server.toml",
                                   "--agent-config", self.directory / "agent.toml"], stdout=subprocess.PIPE,
                                  stderr=subprocess.DEVNULL, text=True)
        for line in server.stdout:
            if found := re.search(r"http://127\.0\.0\.1:\d+", line):
                return server, found.group()
        raise SystemExit("zorvacimd did not start")


def problems_of(name, text):
    document = json.loads(text)
    found = [f"{'/'.join(map(str, error.absolute_path)) or '.'}: {error.message}" for error in validator(name).iter_errors(document)]
    if next(iter(document)) != "version":
        found.append("the version is not first")
    return found


def commands_with_json(host):
    """Every command whose help says that it writes JSON."""
    def below(words):
        text = subprocess.run([host.bin / "zorvactl", *words, "--help"], capture_output=True, text=True, check=True).stdout
        listed = re.search(r"^Subcommands:\n((?:  .+\n)+)", text, re.M)
        if not listed:
            return [" ".join(words)] if "json" in text.split("It writes ")[-1].split(" (--output)")[0] and "It writes" in text else []
        names = re.findall(r"^  ([a-z][a-z-]*)", listed.group(1), re.M)
        return [each for name in names for each in below([*words, name])]
    return below([])


def main():
    jsonschema.Draft202012Validator.check_schema(SCHEMA)
    table = definitions()
    problems = []
    with tempfile.TemporaryDirectory() as directory:
        host = Host(sys.argv[1], directory)
        tried = set()
        for command, words, *status in CALLS:
            tried.add(command)
            extra = ["--file", str(host.directory / "users")] if command.startswith("user ") else []
            run = host.watch if command == "watch" else host.run
            code, out, err = run([*([] if command == "watch" else command.split()), *words, *extra])
            if code != (status[0] if status else 0):
                problems.append(f"{command}: exit status {code}: {err}")
            if command not in table:
                problems.append(f"docs/json.md has no definition of {command}")
                continue
            try:
                problems += [f"{command}: {each}" for each in problems_of(table[command], out)]
            except json.JSONDecodeError as error:
                problems.append(f"{command}: no JSON: {error}: {out[:200]} {err}")
        problems += [f"{each} writes JSON and is not tried" for each in commands_with_json(host) if each not in tried]
        problems += [f"docs/json.md names {each}, which is not tried" for each in table
                     if each not in tried and each not in ("--hosts", "--url")]
        server, url = host.serve()
        try:
            for command, words in [("show", []), ("enumerate", ["ZORVA_DNSProtocolEndPoint"]), ("names", ["CIM_SettingData"])]:
                code, out, err = host.run([command, *words, "--url", url, "--url", url.replace("127.0.0.1", "localhost")])
                problems += [f"{command} of hosts: {each}" for each in (problems_of("hosts", out) if code == 0 else [err])]
        finally:
            server.terminate()
            server.wait()
    print("\n".join(problems) or f"{len(CALLS)} documents are as described")
    sys.exit(1 if problems else 0)


main()
