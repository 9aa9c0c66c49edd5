#!/usr/bin/env python3
"""Asks a real zorvacimd for everything, as everybody, by every way in, and compares with the table of docs/security.md.

  tests/access_table.py BUILD    BUILD: the folder with bin/zorvacimd; exits 1 and prints each difference
"""
import base64
import http.client
import json
import os
import pathlib
import re
import socket
import ssl
import subprocess
import sys
import tempfile
import time

ROOT = pathlib.Path(__file__).resolve().parent.parent
TABLE = ROOT / "docs" / "security.md"
PASSWORDS = {"reader": "reader secret", "operator": "operator secret", "local": "local secret"}
WRONG = "no such secret"
NETWORK = "192.0.2.1"  # an address of this host that is not loopback
GROUP = "daemon"  # a group of every Debian, with the user of the same name as its member

TREE = {"system_name": "host1", "nodes": [{"type": "System", "name": "system", "description": "Computer", "children": [
    {"type": "Port", "name": "eth0", "description": "", "children": [
        {"type": "NetworkIPConfig", "name": "ip", "description": "", "properties": {
            "name": "eth0", "host_name": "host1", "domain_name": "example.org", "dns_suffixes": ["example.org"],
            "dns_server_addresses": ["192.0.2.53"], "protocol_if_type": 4097, "enabled_state": 1}}]}]}]}

ENDPOINT = ('<INSTANCENAME CLASSNAME="ZORVA_DNSProtocolEndPoint"><KEYBINDING NAME="Name"><KEYVALUE>eth0</KEYVALUE>'
            "</KEYBINDING></INSTANCENAME>")
CHANGED = ('<VALUE.NAMEDINSTANCE>' + ENDPOINT + '<INSTANCE CLASSNAME="ZORVA_DNSProtocolEndPoint"><PROPERTY NAME="DomainName" '
           'TYPE="string"><VALUE>example.net</VALUE></PROPERTY></INSTANCE></VALUE.NAMEDINSTANCE>')
NEW = '<INSTANCE CLASSNAME="ZORVA_DNSProtocolEndPoint"></INSTANCE>'


def parameter(name, content):
    return f'<IPARAMVALUE NAME="{name}">{content}</IPARAMVALUE>'


def text(name, value):
    return parameter(name, f"<VALUE>{value}</VALUE>")


CLASS = parameter("ClassName", '<CLASSNAME NAME="ZORVA_DNSProtocolEndPoint"/>')
INSTANCE = parameter("InstanceName", ENDPOINT)
OBJECT = parameter("ObjectName", ENDPOINT)
READS = {
    "GetInstance": INSTANCE, "EnumerateInstances": CLASS, "EnumerateInstanceNames": CLASS,
    "GetProperty": INSTANCE + text("PropertyName", "Name"),
    "Associators": OBJECT, "AssociatorNames": OBJECT, "References": OBJECT, "ReferenceNames": OBJECT,
    "GetClass": CLASS, "EnumerateClasses": "", "EnumerateClassNames": "",
    "GetQualifier": text("QualifierName", "Key"), "EnumerateQualifiers": "",
    "OpenEnumerateInstances": CLASS, "OpenEnumerateInstancePaths": CLASS,
    "OpenAssociatorInstances": INSTANCE, "OpenAssociatorInstancePaths": INSTANCE,
    "OpenReferenceInstances": INSTANCE, "OpenReferenceInstancePaths": INSTANCE,
    "PullInstancesWithPath": text("EnumerationContext", "x") + text("MaxObjectCount", "1"),
    "PullInstancePaths": text("EnumerationContext", "x") + text("MaxObjectCount", "1"),
    "CloseEnumeration": text("EnumerationContext", "x"),
    "EnumerationCount": text("EnumerationContext", "x"),
}
CHANGES = {
    "ModifyInstance": parameter("ModifiedInstance", CHANGED), "SetProperty": INSTANCE + text("PropertyName", "DomainName"),
    "CreateInstance": parameter("NewInstance", NEW), "DeleteInstance": INSTANCE,
}
METHODS = {"SetDNSDomain": '<PARAMVALUE NAME="DNSDomain" PARAMTYPE="string"><VALUE>example.org</VALUE></PARAMVALUE>'}


def message(content):
    return ('<?xml version="1.0" encoding="utf-8"?><CIM CIMVERSION="2.0" DTDVERSION="2.0">'
            f'<MESSAGE ID="1" PROTOCOLVERSION="1.0">{content}</MESSAGE></CIM>')


def intrinsic(name, parameters):
    return (f'<SIMPLEREQ><IMETHODCALL NAME="{name}"><LOCALNAMESPACEPATH><NAMESPACE NAME="root"/><NAMESPACE NAME="cimv2"/>'
            f"</LOCALNAMESPACEPATH>{parameters}</IMETHODCALL></SIMPLEREQ>")


def extrinsic(name, parameters):
    return (f'<SIMPLEREQ><METHODCALL NAME="{name}"><LOCALINSTANCEPATH><LOCALNAMESPACEPATH><NAMESPACE NAME="root"/>'
            f'<NAMESPACE NAME="cimv2"/></LOCALNAMESPACEPATH>{ENDPOINT}</LOCALINSTANCEPATH>{parameters}</METHODCALL></SIMPLEREQ>')


def requests():
    """Every operation: its kind, its name, its body and its header fields."""
    for kind, calls in (("read", READS), ("change", CHANGES)):
        for name, parameters in calls.items():
            yield kind, name, message(intrinsic(name, parameters)), {"CIMMethod": name, "CIMObject": "root/cimv2"}
    for name, parameters in METHODS.items():
        fields = {"CIMMethod": name, "CIMObject": 'root/cimv2:ZORVA_DNSProtocolEndPoint.Name="eth0"'}
        yield "change", name, message(extrinsic(name, parameters)), fields
    both = f'<MULTIREQ>{intrinsic("SetProperty", CHANGES["SetProperty"])}{intrinsic("DeleteInstance", CHANGES["DeleteInstance"])}</MULTIREQ>'
    yield "change", "a multiple request", message(both), {"CIMBatch": "CIMBatch"}


class UnixConnection(http.client.HTTPConnection):
    def __init__(self, path):
        super().__init__("localhost", timeout=60)
        self.path = path

    def connect(self):
        self.sock = socket.socket(socket.AF_UNIX)
        self.sock.settimeout(self.timeout)
        self.sock.connect(self.path)


def ask(connection, body, fields):
    """What became of a request: "yes", "no" (CIM_ERR_ACCESS_DENIED), or the HTTP status."""
    headers = {"Content-Type": 'application/xml; charset="utf-8"', "CIMOperation": "MethodCall", **fields}
    try:
        connection.request("POST", "/cimom", body, headers)
        response = connection.getresponse()
        answer = response.read().decode()
    except (ssl.SSLError, ConnectionError, http.client.HTTPException) as error:
        return f"no connection ({type(error).__name__})"
    finally:
        connection.close()
    if response.status != 200:
        return str(response.status)
    return "no" if '<ERROR CODE="2"' in answer else "yes"


class Certificates:
    """An authority, a server, and clients: one that is good, one that has expired, one of another authority."""

    def __init__(self, folder):
        self.folder = folder
        for name in ("ca", "other"):
            self.run("req", "-x509", "-newkey", "ec", "-pkeyopt", "ec_paramgen_curve:P-256", "-nodes", "-days", "2", "-subj",
                     f"/CN=authority {name}", "-keyout", self / f"{name}.key", "-out", self / f"{name}.crt")
        self.make("server", "ca", f"subjectAltName=DNS:localhost,IP:127.0.0.1,IP:{NETWORK}\n", "2")
        self.make("client", "ca", "extendedKeyUsage=clientAuth\n", "2")
        self.make("stranger", "ca", "extendedKeyUsage=clientAuth\n", "2")
        self.make("foreign", "other", "extendedKeyUsage=clientAuth\n", "2")
        self.make("expired", "ca", "extendedKeyUsage=clientAuth\n", "-1")

    def __truediv__(self, name):
        return str(self.folder / name)

    def run(self, *arguments):
        subprocess.run(["openssl", *arguments], check=True, capture_output=True)

    def make(self, name, authority, extensions, days):
        (self.folder / f"{name}.ext").write_text(extensions)
        self.run("req", "-newkey", "ec", "-pkeyopt", "ec_paramgen_curve:P-256", "-nodes", "-subj", f"/CN={name}", "-keyout",
                 self / f"{name}.key", "-out", self / f"{name}.csr")
        period = ["-days", days]
        self.run("x509", "-req", "-in", self / f"{name}.csr", "-CA", self / f"{authority}.crt", "-CAkey",
                 self / f"{authority}.key", "-CAcreateserial", *period, "-extfile", self / f"{name}.ext", "-out",
                 self / f"{name}.crt")


class Server:
    def __init__(self, build, folder, anonymous):
        self.folder = folder
        self.certificates = Certificates(folder)
        self.users = folder / "users"
        self.control = str(pathlib.Path(build) / "bin" / "zorvactl")
        self.add_users()
        (folder / "data").mkdir()
        (folder / "tree.json").write_text(json.dumps(TREE))
        (folder / "agent.toml").write_text('[agent]\ndata_dir = "data/"\n[tree]\nsource = "file"\nfile = "tree.json"\n')
        self.config = folder / "zorvacimd.toml"
        self.config.write_text(f"""
[listen]
addresses = ["127.0.0.1"]
port = 0
socket = "{folder}/cim.sock"
[tls]
certificate = "{folder}/server.crt"
key = "{folder}/server.key"
client_ca = "{folder}/ca.crt"
addresses = ["127.0.0.1", "{NETWORK}"]
port = 0
[access]
users = "{self.users}"
anonymous = "{anonymous}"
group = "{GROUP}"
[agent]
config = "{folder}/agent.toml"
[log]
target = "{folder}/log"
[audit]
file = "{folder}/audit"
""")
        self.process = subprocess.Popen([str(pathlib.Path(build) / "bin" / "zorvacimd"), "--config", str(self.config), "--greet"],
                                        stdout=subprocess.PIPE, text=True)
        line = self.process.stdout.readline()
        self.plain = int(re.search(r"http://127\.0\.0\.1:(\d+)", line)[1])
        self.tls = int(re.search(r"https://127\.0\.0\.1:(\d+)", line)[1])

    def add_users(self):
        for name, password in PASSWORDS.items():
            role = {"reader": "read", "operator": "operate", "local": "read"}[name]
            more = ["--namespace", "root/cimv2=none"] if name == "local" else []
            subprocess.run([self.control, "user", "add", name, "--role", role, *more, "--password-stdin", "--file", str(self.users)],
                           input=password + "\n", text=True, check=True, capture_output=True)
        subprocess.run([self.control, "user", "add", "robot", "--role", "operate", "--no-password", "--subject", "CN=client", "--file", str(self.users)],
                       check=True, capture_output=True)

    def end(self):
        self.process.terminate()
        return self.process.wait(60)

    def over_tls(self, certificate=None, address="localhost", source=None):
        context = ssl.create_default_context(cafile=self.certificates / "ca.crt")
        if certificate:
            context.load_cert_chain(self.certificates / f"{certificate}.crt", self.certificates / f"{certificate}.key")
        return http.client.HTTPSConnection(address, self.tls, context=context, timeout=60,
                                           source_address=(source, 0) if source else None)


def basic(user, password):
    return {"Authorization": "Basic " + base64.b64encode(f"{user}:{password}".encode()).decode()}


def ways(server):
    """Who asks, by which way: a connection, and further header fields."""
    plain = lambda: http.client.HTTPConnection("127.0.0.1", server.plain, timeout=60)
    unix = lambda: UnixConnection(str(server.folder / "cim.sock"))
    tls = server.over_tls
    yield "nobody, plain HTTP on loopback", plain, {}
    yield "nobody, HTTPS on loopback", tls, {}
    yield "`reader`, HTTPS", tls, basic("reader", PASSWORDS["reader"])
    yield "`operator`, HTTPS", tls, basic("operator", PASSWORDS["operator"])
    network = lambda: tls(address=NETWORK)
    yield "nobody, HTTPS on another address", network, {}
    yield "`reader`, HTTPS on another address", network, basic("reader", PASSWORDS["reader"])
    yield "`operator`, HTTPS on another address", network, basic("operator", PASSWORDS["operator"])
    yield "a user without a role in this namespace, HTTPS", tls, basic("local", PASSWORDS["local"])
    yield "`operator` with a wrong password, HTTPS", lambda: tls(source="127.0.0.2"), basic("operator", WRONG)
    yield "an unknown user, HTTPS", lambda: tls(source="127.0.0.3"), basic("nobody", WRONG)
    yield "`operator`, plain HTTP", plain, basic("operator", PASSWORDS["operator"])
    yield "a client certificate of a user, HTTPS", lambda: tls("client"), {}
    yield "a client certificate of no user, HTTPS", lambda: tls("stranger"), {}
    yield "an expired client certificate, HTTPS", lambda: tls("expired"), {}
    yield "a client certificate of another authority, HTTPS", lambda: tls("foreign"), {}
    yield "root, Unix socket", unix, {}
    yield "a member of the group, Unix socket", unix, {"as": "daemon"}
    yield "another user, Unix socket", unix, {"as": "nobody"}
    yield "a web page (`Origin`), plain HTTP on loopback", plain, {"Origin": "http://www.example.org"}
    yield "a web page by another name (`Host`), plain HTTP on loopback", plain, {"Host": "www.example.org"}


def as_user(name, work):
    """Runs work() in a process of that user, and returns its text."""
    reading, writing = os.pipe()
    child = os.fork()
    if child == 0:
        import pwd
        entry = pwd.getpwnam(name)
        os.setgroups([])
        os.setgid(entry.pw_gid)
        os.setuid(entry.pw_uid)
        os.write(writing, work().encode())
        os._exit(0)
    os.close(writing)
    with os.fdopen(reading) as pipe:
        result = pipe.read()
    os.waitpid(child, 0)
    return result


def outcome(server, connect, fields, kind):
    """The one outcome of all operations of a kind; each differing one is named."""
    seen = {}
    for each, name, body, more in requests():
        if each != kind:
            continue
        own = {k: v for k, v in fields.items() if k != "as"}
        work = lambda: ask(connect(), body, {**more, **own})
        result = as_user(fields["as"], work) if "as" in fields else work()
        seen.setdefault(result, []).append(name)
        # A refused login is answered before the operation is known, and each further one more slowly.
        if result == "401" and "Authorization" in fields:
            break
    if len(seen) == 1:
        return next(iter(seen))
    return "; ".join(f"{result}: {', '.join(names)}" for result, names in sorted(seen.items()))


def expected():
    """The rows of the table: who, read, change."""
    rows = {}
    for line in TABLE.read_text().splitlines():
        cells = [cell.strip() for cell in line.strip("|").split("|")]
        if len(cells) == 3 and set(cells[1:]) <= {"yes", "no", "401", "403"}:
            rows[cells[0]] = cells[1:]
    return rows


def main():
    build = sys.argv[1]
    if os.geteuid() != 0:
        print("this needs root: it asks as several users", file=sys.stderr)
        return 1
    if "--in-own-network" not in sys.argv:
        os.execvp("unshare", ["unshare", "--net", sys.executable, *sys.argv, "--in-own-network"])
    for command in ("link set lo up", f"address add {NETWORK}/32 dev lo"):
        subprocess.run(["ip", *command.split()], check=True)
    wrong = 0
    rows = expected()
    with tempfile.TemporaryDirectory() as name:
        folder = pathlib.Path(name)
        folder.chmod(0o755)
        server = Server(build, folder, "read")
        try:
            for who, connect, fields in ways(server):
                found = [outcome(server, connect, fields, kind) for kind in ("read", "change")]
                print(f"| {who} | {found[0]} | {found[1]} |")
                if rows.pop(who, None) != found:
                    print(f"  docs/security.md says otherwise: {expected().get(who)}")
                    wrong += 1
        finally:
            status = server.end()
        for who in rows:
            print(f"docs/security.md has a row that nobody tries: {who}")
            wrong += 1
        secrets = [word for word in (*PASSWORDS.values(), WRONG) for file in ("log", "audit")
                   if word in (folder / file).read_text()]
        if secrets or status != 0:
            print(f"secrets in the logs: {secrets}; the server ended with {status}")
            wrong += 1
    return 1 if wrong else 0


if __name__ == "__main__":
    sys.exit(main())
