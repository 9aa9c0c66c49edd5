"""A zorvacimd on a host that is described by a tree, with users and a certificate."""
import json
import os
import pathlib
import re
import socket
import subprocess
import threading

from webdriver import free_port

THIS_HOST = "this host"  # and no tree: what the network namespace has
PASSWORDS = {"reader": "reader secret", "operator": "operator secret"}


def interface(name, **properties):
    return {"type": "Port", "name": name, "description": "", "children": [
        {"type": "NetworkIPConfig", "name": "ip", "description": "", "properties": {"name": name, **properties}}]}


def host(*interfaces, **properties):
    system = {"type": "System", "name": "system", "description": "Computer", "children": list(interfaces)}
    if properties:
        system["properties"] = properties
    return {"system_name": "host1", "nodes": [system]}


USUAL = {"host_name": "host1", "domain_name": "example.org", "dns_suffixes": ["example.org", "lab.example.org"],
         "protocol_if_type": 4097, "enabled_state": 1}


def usual_host():
    return host(
        interface("eth0", **USUAL, dns_server_addresses=["192.0.2.53", "2001:db8::53"], dns_owner="NetworkManager", dns_profile="lan",
                  dns_origin="learned", addresses=[{"address": "192.0.2.10", "prefix_length": 24, "origin": "dhcp"}]),
        interface("eth1", **{**USUAL, "enabled_state": 12, "domain_name": "storage.example.org"},
                  dns_server_addresses=["198.51.100.1"], dns_owner="systemd-networkd",
                  dns_profile="/etc/systemd/network/20-storage.network", dns_origin="static"),
        interface("wlan0", host_name="host1", enabled_state=16, protocol_if_type=4096),
        interface("vpn0", **USUAL, dns_server_addresses=["2001:db8:0:7::53", "2001:DB8:0:7:0::53"], dns_owner="systemd-resolved"),
        resolver_servers=["192.0.2.53", "2001:db8::53", "198.51.100.1"], resolver_servers_not_asked=["198.51.100.2"],
        resolver_search=["example.org"])


def large_host(count):
    return host(*(interface(f"veth{i}", **USUAL, dns_server_addresses=[f"10.{i >> 16 & 255}.{i >> 8 & 255}.{i & 255}", "192.0.2.53"],
                            dns_owner="systemd-networkd") for i in range(count)))


class DnsServer:
    """Answers every question with this code. 0: without an error, 3: no such name."""

    def __init__(self, code=0):
        self.code = code
        self.socket = socket.socket(socket.AF_INET, socket.SOCK_DGRAM)
        self.socket.bind(("127.0.0.1", 0))
        self.address = f"127.0.0.1:{self.socket.getsockname()[1]}"
        threading.Thread(target=self.serve, daemon=True).start()

    def serve(self):
        while True:
            query, client = self.socket.recvfrom(4096)
            end = query.index(b"\0", 12) + 5  # of the question: its name, type and class
            self.socket.sendto(query[:2] + bytes([0x81, 0x80 | self.code, 0, 1, 0, 0, 0, 0, 0, 0]) + query[12:end], client)


class Server:
    def __init__(self, build, folder, tree, anonymous="read", environment=None):
        self.build, self.folder = pathlib.Path(build), folder
        self.environment = {**os.environ, **(environment or {}), "ZORVAGENT_CONFIG": str(folder / "agent.toml")}
        self.port, self.tls_port = free_port(), free_port()
        (folder / "data").mkdir(parents=True)
        self.write_tree(tree)
        source = 'source = "host"' if tree is THIS_HOST else 'source = "file"\nfile = "tree.json"'
        (folder / "agent.toml").write_text(f'[agent]\ndata_dir = "data/"\n[tree]\n{source}\n')
        self.make_certificate()
        for name, password in PASSWORDS.items():
            role = {"reader": "read", "operator": "operate"}[name]
            self.control("user", "add", name, "--role", role, "--password-stdin", "--file", str(folder / "users"), input=password + "\n")
        (folder / "zorvacimd.toml").write_text(f"""
[listen]
addresses = ["127.0.0.1"]
port = {self.port}
socket = ""
[tls]
certificate = "server.crt"
key = "server.key"
addresses = ["127.0.0.1"]
port = {self.tls_port}
[access]
users = "users"
anonymous = "{anonymous}"
[agent]
config = "agent.toml"
[log]
target = "log"
""")
        self.process = None
        self.start()

    def make_certificate(self):
        subprocess.run(["openssl", "req", "-x509", "-newkey", "ec", "-pkeyopt", "ec_paramgen_curve:P-256", "-nodes", "-days", "2", "-subj",
                        "/CN=localhost", "-addext", "subjectAltName=DNS:localhost", "-keyout", str(self.folder / "server.key"), "-out",
                        str(self.folder / "server.crt")], check=True, capture_output=True)

    def write_tree(self, tree):
        (self.folder / "tree.json").write_text(json.dumps(tree))

    def control(self, *words, **more):
        return subprocess.run([str(self.build / "bin" / "zorvactl"), *words],
                              **{"check": True, "capture_output": True, "text": True, "env": self.environment, **more}).stdout

    def servers_of(self, name):
        """What the host says, in another way than by the console."""
        document = json.loads(self.control("show", name, "--output", "json"))
        return next(each for each in document["interfaces"] if each["name"] == name)["servers"]

    def start(self):
        self.process = subprocess.Popen([str(self.build / "bin" / "zorvacimd"), "--config", str(self.folder / "zorvacimd.toml"), "--greet"],
                                        stdout=subprocess.PIPE, text=True, env=self.environment)
        line = self.process.stdout.readline()
        if not re.search(r"listens on", line):
            raise RuntimeError(f"zorvacimd did not start: {line}{(self.folder / 'log').read_text() if (self.folder / 'log').exists() else ''}")

    def stop(self):
        if self.process is not None:
            self.process.terminate()
            self.process.wait(30)
            self.process.stdout.close()
            self.process = None

    @property
    def plain(self):
        return f"http://localhost:{self.port}/"

    @property
    def secure(self):
        return f"https://localhost:{self.tls_port}/"
