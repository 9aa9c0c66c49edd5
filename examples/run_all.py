#!/usr/bin/env python3
"""Runs every example against a real zorvacimd, and compares what it writes.

  examples/run_all.py BUILD    BUILD: the folder with bin/
"""
import os
import pathlib
import re
import subprocess
import sys
import tempfile

HERE = pathlib.Path(__file__).resolve().parent
BIN = pathlib.Path(sys.argv[1]).resolve() / "bin"
problems = []


def run(*words, **environment):
    done = subprocess.run([str(word) for word in words], capture_output=True, text=True, timeout=60, check=False,
                          env={**os.environ, **environment})
    return done.stdout if done.returncode == 0 else f"exit status {done.returncode}: {done.stderr}"


def expect(what, written, expected):
    if written != expected:
        problems.append(f"{what} wrote\n{written}and not\n{expected}")


def prepare(directory):
    """A host whose tree is written by an example."""
    (directory / "data").mkdir()
    (directory / "agent.toml").write_text('[agent]\ndata_dir = "data"\n[tree]\nsource = "file"\nfile = "tree.json"\n[log]\ntarget = "off"\n')
    (directory / "server.toml").write_text('[access]\nanonymous = "operate"\n')
    (directory / "list").write_text("# ours\neth0 example.org 192.0.2.53 2001:db8::53\neth1 example.net 192.0.2.54\n")
    return {"ZORVAGENT_CONFIG": str(directory / "agent.toml"), "ZORVACTL": str(BIN / "zorvactl")}


def try_all(directory, url, environment):
    list_of_servers = [HERE / "python" / "dns_servers.py", url]
    expect("dns_servers.py", run(*list_of_servers),
           "Computer%eth0 192.0.2.53 2001:db8::53\nComputer%eth1 192.0.2.54\n")
    run(BIN / "zorvactl", "ifcfg", "init", "eth1", **environment)
    expect("dns_servers.py", run(*list_of_servers, "eth1", "192.0.2.1", "192.0.2.2"),
           "Computer%eth0 192.0.2.53 2001:db8::53\nComputer%eth1 192.0.2.1 192.0.2.2\n")
    failed = run(*list_of_servers, "eth7", "192.0.2.1")
    expect("dns_servers.py of no interface", re.sub(r"dns_servers.py: 6: .*", "6", failed), "exit status 1: 6\n")
    expect("endpoints.sh", run(HERE / "shell" / "endpoints.sh", url), "eth0\neth1\n")
    for where in ([], ["--url", url]):
        expect("report.sh " + " ".join(where), run(HERE / "shell" / "report.sh", *where, **environment),
               "eth0\tEnabled\thost\t192.0.2.53 2001:db8::53\neth1\tEnabled\tifcfg-eth1\t192.0.2.1 192.0.2.2\n")
    # The server shows what a source writes with the next request.
    (directory / "list").write_text("eth5 example.org 192.0.2.5\n")
    run(HERE / "source" / "inventory.py", directory / "list", directory / "tree.json")
    expect("inventory.py", run(*list_of_servers), "Computer%eth5 192.0.2.5\n")
    expect("inventory_source", run(BIN / "inventory_source", "eth0=192.0.2.1", "eth1=192.0.2.2"), "192.0.2.1\n192.0.2.2\n")


def main():
    with tempfile.TemporaryDirectory() as name:
        directory = pathlib.Path(name)
        environment = prepare(directory)
        run(HERE / "source" / "inventory.py", directory / "list", directory / "tree.json")
        with subprocess.Popen([BIN / "zorvacimd", "--port", "0", "--config", directory / "server.toml", "--agent-config",
                               directory / "agent.toml"], stdout=subprocess.PIPE, stderr=subprocess.PIPE, text=True) as server:
            try:
                found = next((line for line in server.stdout if "http://127.0.0.1:" in line), "")
                url = re.search(r"http://127\.0\.0\.1:\d+", found)
                if url is None:
                    sys.exit("zorvacimd did not start: " + server.stderr.read())
                try_all(directory, url.group(), environment)
            finally:
                server.terminate()
    print("\n".join(problems) or "all examples do what they say")
    sys.exit(1 if problems else 0)


main()
