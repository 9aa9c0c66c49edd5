#!/usr/bin/env python3
"""A Redfish service (DSP0266) for the tests, on a port of 127.0.0.1, with TLS, sessions and ETags.

  service.py CERTIFICATE KEY [--schemas FOLDER] [--mockup FOLDER]

It begins with the resources of world.json and prints its port. With a mockup, those of the mockup are in their place: each
index.json is the answer of /redfish/v1/ plus its path. Each line of standard input is a JSON object of switches
(see SWITCHES), or of a command, and is answered with one line:
  {"patch": 204}                         sets switches
  {"set": {"PATH": {"FQDN": null}}}      changes a resource; null removes a property
  {"log": true}                          the requests since the last time
  {"get": "PATH"}                        a resource as it is
  {"invalid": true}                      how many answers were checked by DMTF's schemas, where their folder is given, and
                                         which of them they refuse
It ends with its standard input.
"""
import argparse
import collections
import copy
import http.server
import json
import pathlib
import ssl
import sys
import threading
import time
import warnings

USER, PASSWORD = "operator", "correct horse"
ROOT = "/redfish/v1"
SESSIONS = f"{ROOT}/SessionService/Sessions"
INTERFACES = f"{ROOT}/Managers/1/EthernetInterfaces"
SWITCHES = {
    "etag": "strong",    # "strong", "weak", "body" (@odata.etag alone) or "absent"
    "compares_strongly": False,  # a weak ETag in If-Match never matches, as RFC 9110 has it
    "expand": True,      # $expand is offered
    "patch": 204,        # 200, 202, 204; 400 with ExtendedInfo; 503 or 412 once; 429
    "repeats": False,    # 412 and 503 come every time
    "late": 0,           # seconds until a change is in use
    "restart": 0,        # seconds after a change in which nothing is answered
    "task": "Completed", # the end of a task after a 202; "Exception" fails
    "login": 201,        # 401 refuses everybody
    "account": [USER, PASSWORD],  # the one that may log in; others' sessions end when it changes
    "requests_of_session": 0,  # after that many the session has expired; 0: never
    "close": False,      # each connection ends after its first answer
    "uses_both": False,  # servers set by hand are used beside those of DHCP
    "wrong": "",         # "html", "deep", "huge", "values", "trickle", "silent", "redirect", "far", "loop", "cycle", "many",
                         # "head", "outside", "list", "busy"
}


def first_world(mockup):
    """The resources of world.json, each with its path. They have what service processors answer, most of which is not read.
    Those of the mockup come before them."""
    world = json.loads(pathlib.Path(__file__).with_name("world.json").read_text(encoding="utf-8"))
    for file in pathlib.Path(mockup).rglob("index.json") if mockup else []:
        folder = file.parent.relative_to(mockup).as_posix()
        world[f"{ROOT}/" + ("" if folder == "." else folder)] = json.loads(file.read_text(encoding="utf-8"))
    return {path: {"@odata.id": path, **body} for path, body in world.items()}


class Schemas:
    """Says which answers DMTF's schemas refuse. Without the folder or the package jsonschema it says nothing."""

    def __init__(self, folder):
        self.folder = pathlib.Path(folder) if folder else None
        self.invalid = []
        self.checked = 0
        warnings.filterwarnings("ignore", category=DeprecationWarning)
        try:
            import jsonschema
            self.jsonschema = jsonschema if self.folder and self.folder.is_dir() else None
        except ImportError:
            self.jsonschema = None

    def load(self, uri):
        """A schema by its name; where the folder has another version only, that one; else one that allows everything."""
        name = uri.split("#")[0].rsplit("/", 1)[-1]
        files = [self.folder / name, *sorted(self.folder.glob(name.split(".")[0] + ".v*.json"), reverse=True)]
        file = next((each for each in files if each.is_file()), None)
        return json.loads(file.read_text(encoding="utf-8")) if file else {"definitions": collections.defaultdict(dict)}

    def check(self, path, body):
        if self.jsonschema is None:
            return
        if "error" in body:
            schema = self.load("redfish-error.v1_0_2.json")
        else:
            name = ".".join(body["@odata.type"].lstrip("#").split(".")[:-1])
            schema = self.load(f"{name}.json")
            if not (self.folder / f"{name}.json").is_file():
                self.invalid.append(f"{path}: there is no schema {name}")
        resolver = self.jsonschema.RefResolver(schema.get("$id", ""), schema, handlers={"http": self.load, "https": self.load})
        validator = self.jsonschema.Draft7Validator(schema, resolver=resolver)
        self.invalid += [f"{path}: {error.json_path}: {error.message}" for error in validator.iter_errors(body)]
        self.checked += 1


class Service:
    def __init__(self, schemas, mockup):
        self.lock = threading.Lock()
        self.switches = dict(SWITCHES)
        self.world = first_world(mockup)
        self.versions = {}
        self.log = []
        self.sessions = {}  # token: (path, requests)
        self.made = 0
        self.task_polls = 0
        self.once = None
        self.away_until = 0
        self.schemas = schemas
        self.dhcp_servers = ["198.51.100.1"]

    def command(self, line):
        with self.lock:
            if "log" in line:
                log, self.log = self.log, []
                return log
            if "get" in line:
                return self.world.get(line["get"])
            if "invalid" in line:
                return {"checked": self.schemas.checked, "invalid": self.schemas.invalid}
            for path, changes in line.pop("set", {}).items():
                self.versions[path] = self.versions.get(path, 1) + 1
                if changes is None:
                    self.world.pop(path)
                    continue
                body = self.world.setdefault(path, {"@odata.id": path})
                for name, value in changes.items():
                    if value is None:
                        body.pop(name, None)
                    else:
                        body[name] = value
            if "account" in line:
                self.sessions.clear()
            self.switches.update(line)
            self.once = self.switches["patch"]
            return "ok"

    def etag(self, path):
        if self.switches["etag"] == "absent":
            return None
        text = f'"v{self.versions.get(path, 1)}"'
        return "W/" + text if self.switches["etag"] == "weak" else text

    def matches(self, path, given):
        """Whether a change with this field If-Match, or none, may be made."""
        refuses = self.switches["compares_strongly"] and (given or "").startswith("W/")
        return not refuses and given in (None, self.etag(path))

    def etag_field(self, path):
        return None if self.switches["etag"] == "body" else self.etag(path)

    def get(self, path, query):
        body = copy.deepcopy(self.world.get(path) or self.world.get(path.rstrip("/")))
        if body is None:
            return None
        if self.switches["etag"] == "body":
            body["@odata.etag"] = self.etag(path)
        if path == f"{ROOT}/":
            features = body.setdefault("ProtocolFeaturesSupported", {})
            features.setdefault("ExpandQuery", {})["NoLinks"] = self.switches["expand"]
        elif query.startswith("$expand") and "Members" in body:
            body["Members"] = [self.get(each["@odata.id"], "") or each for each in body["Members"]]
        return body

    def change(self, path, body):
        """What a service does with a PATCH: what is in use follows. The settings object of an interface is applied at once."""
        if path.endswith("/SD"):
            self.change(path.removesuffix("/SD"), body)
        now = self.world[path]
        for name, value in body.items():
            if isinstance(value, dict):
                now.setdefault(name, {}).update(value)
            else:
                now[name] = value
        slots = [each for each in now.get("StaticNameServers", []) if each]
        dhcp = now.get("DHCPv4", {})
        learned = self.dhcp_servers if dhcp.get("DHCPEnabled") and dhcp.get("UseDNSServers") else []
        if "StaticNameServers" in now:
            now["NameServers"] = learned + slots if self.switches["uses_both"] or not slots else slots
        self.versions[path] = self.versions.get(path, 1) + 1

    def change_later(self, path, body):
        with self.lock:
            self.change(path, body)

    def take(self, path, body):
        """Makes a change at once, or as the switches say. The lock is held."""
        self.away_until = time.monotonic() + self.switches["restart"]
        if self.switches["late"]:
            threading.Timer(self.switches["late"], self.change_later, [path, body]).start()
        else:
            self.change(path, body)


def error(message, resolution="None."):
    return {"error": {"code": "Base.1.8.GeneralError", "message": "A general error has occurred.",
                      "@Message.ExtendedInfo": [{
                          "@odata.type": "#Message.v1_1_1.Message", "MessageId": "Base.1.8.PropertyValueFormatError",
                          "Message": message, "Severity": "Warning", "Resolution": resolution}]}}


class Handler(http.server.BaseHTTPRequestHandler):
    protocol_version = "HTTP/1.1"
    service = None

    def log_message(self, *_):
        pass

    def answer(self, status, body=None, **fields):
        text = b""
        if body is not None:
            if isinstance(body, dict):
                self.service.schemas.check(self.path, body)
                text = json.dumps(body).encode()
            else:
                text = body
            fields.setdefault("Content_Type", "application/json")
        self.send_response(status)
        for name, value in fields.items():
            if value is not None:
                self.send_header(name.replace("_", "-"), value)
        if status != 304:
            self.send_header("Content-Length", str(len(text)))
        if self.service.switches["close"]:
            self.send_header("Connection", "close")  # the base class then closes it
        self.end_headers()
        self.wfile.write(text)

    def record(self, body=None):
        entry = {"method": self.command, "path": self.path}
        for name in ("If-Match", "If-None-Match"):
            if self.headers.get(name):
                entry[name] = self.headers[name]
        if body is not None and "Sessions" not in self.path:
            entry["body"] = body
        self.service.log.append(entry)

    def is_known(self):
        """Whether the request is of a session that has not expired."""
        token = self.headers.get("X-Auth-Token")
        session = self.service.sessions.get(token)
        if session is None:
            self.answer(401, error("The session has expired."))
            return False
        session[1] += 1
        most = self.service.switches["requests_of_session"]
        if most and session[1] > most:
            del self.service.sessions[token]
            self.answer(401, error("The session has expired."))
            return False
        return True

    def goes_wrong(self):
        """Answers as no service should, and says whether it did."""
        wrong = self.service.switches["wrong"]
        is_interface = "/EthernetInterfaces" in self.path
        if not wrong or not is_interface:
            return False
        if wrong == "html":
            self.answer(200, b"<html>Sign in</html>", Content_Type="text/html")
        elif wrong == "deep":
            self.answer(200, b'{"a":' + b"[" * 100000 + b"]" * 100000 + b"}")
        elif wrong == "values":
            self.answer(200, b'{"a":[' + b"0," * 300000 + b"0]}")
        elif wrong == "huge":
            self.answer(200, b'{"a":"' + b"x" * (5 << 20) + b'"}')
        elif wrong == "list":
            self.answer(200, b"[]")
        elif wrong == "trickle":
            self.send_response(200)
            self.send_header("Content-Length", "100000")
            self.end_headers()
            for _ in range(100):
                self.wfile.write(b" ")
                time.sleep(0.1)
        elif wrong == "silent":
            time.sleep(10)
        elif wrong == "head":
            self.answer(200, b"{}", **{f"X_Field{i}": "x" * 1000 for i in range(90)})
        elif wrong == "busy":
            self.answer(503, error("The service is busy."), Retry_After="1")
        elif wrong == "redirect":
            if "/Elsewhere/" in self.path:
                return False
            self.answer(307, None, Location=self.path.replace("/EthernetInterfaces", "/Elsewhere/EthernetInterfaces"))
        elif wrong == "far":
            self.answer(302, None, Location="https://192.0.2.99/redfish/v1/Managers")
        elif wrong == "loop":
            self.answer(302, None, Location=self.path)
        elif wrong == "outside":
            body = self.service.get(self.path.split("?")[0], "")
            if "Members" in body:
                body["Members"] = [{"@odata.id": "https://192.0.2.99/redfish/v1/Managers/2"}]
            self.answer(200, json.dumps(body).encode())
        elif wrong in ("cycle", "many"):
            page = int(self.path.rsplit("skip=", 1)[-1]) if "skip=" in self.path else 0
            body = self.service.get(INTERFACES, "")
            if wrong == "cycle":
                body["Members"] *= 3
                body["Members@odata.nextLink"] = f"{INTERFACES}?skip=1"
            else:
                body["Members"] = [{"@odata.id": f"{INTERFACES}/x{page}-{i}", "Id": "same"} for i in range(3000)]
                body["Members@odata.nextLink"] = f"{INTERFACES}?skip={page + 1}"
            self.answer(200, json.dumps(body).encode())
        else:
            return False
        return True

    def do_GET(self):
        with self.service.lock:
            self.record()
        path, _, query = self.path.partition("?")
        service = self.service
        if time.monotonic() < service.away_until:
            self.close_connection = True
            return None
        if path.rstrip("/") != ROOT:
            with service.lock:
                known = self.is_known()
            if not known or self.goes_wrong():
                return None
        if path.startswith(f"{ROOT}/TaskService/"):
            return self.answer_task()
        with service.lock:
            body = service.get(path, query)
            etag = service.etag_field(path)
        if body is None:
            return self.answer(404, error("The resource was not found."))
        if etag and not query and self.headers.get("If-None-Match") == etag:
            return self.answer(304, None, ETag=etag)
        return self.answer(200, body, ETag=None if query else etag)

    def answer_task(self):
        service = self.service
        service.task_polls += 1
        if service.task_polls < 3:
            return self.answer(202, None)
        state = service.switches["task"]
        if state == "Completed":
            return self.answer(204)
        return self.answer(200, {
            "@odata.type": "#Task.v1_7_4.Task", "@odata.id": f"{ROOT}/TaskService/Tasks/1", "Id": "1", "Name": "Task",
            "TaskState": state, "TaskStatus": "Critical",
            "Messages": [{"MessageId": "Base.1.8.InternalError", "Message": "The settings could not be stored."}]})

    def body(self):
        return json.loads(self.rfile.read(int(self.headers.get("Content-Length") or 0)) or b"null")

    def do_POST(self):
        body = self.body()
        service = self.service
        with service.lock:
            self.record(body)
            if service.switches["login"] != 201 or [body["UserName"], body["Password"]] != service.switches["account"]:
                return self.answer(401, error("The login is wrong."))
            service.made += 1
            token = f"token-{service.made}"
            path = f"{SESSIONS}/{service.made}"
            service.sessions[token] = [path, 0]
            session = {**service.world[f"{SESSIONS}/0"], "@odata.id": path, "Id": str(service.made),
                       "UserName": body["UserName"]}
        self.answer(201, session, X_Auth_Token=token, Location=path)

    def do_DELETE(self):
        with self.service.lock:
            self.record()
            if not self.is_known():
                return
            self.service.sessions = {t: s for t, s in self.service.sessions.items() if s[0] != self.path}
        self.answer(204)

    def do_PATCH(self):
        body = self.body()
        service = self.service
        with service.lock:
            self.record(body)
            if not self.is_known():
                return
            mode, status = service.once, service.switches["patch"]
            if mode in (412, 503):
                service.once = mode if service.switches["repeats"] else 204
                status = mode
            elif status in (412, 503):
                status = 204
            if self.path not in service.world:
                return self.answer(404, error("The resource was not found."))
            if status == 412:
                service.versions[self.path] = service.versions.get(self.path, 1) + 1
            if status == 412 or not service.matches(self.path, self.headers.get("If-Match")):
                return self.answer(412, error("The resource has been changed."))
            if status == 503:
                return self.answer(503, error("The service is busy."), Retry_After="1")
            if status >= 400:
                return self.answer(status, error("The value 192.0.2.1 of StaticNameServers is refused.\n",
                                                 "Send another value."))
            service.task_polls = 0
            if status != 202 or service.switches["task"] == "Completed":
                service.take(self.path, body)
            now = service.get(self.path, "")
        if status == 202:
            return self.answer(202, None, Location=f"{ROOT}/TaskService/TaskMonitors/1")
        return self.answer(status, now if status == 200 else None, ETag=service.etag_field(self.path))


class Server(http.server.ThreadingHTTPServer):
    daemon_threads = True

    def handle_error(self, *_):
        pass  # clients that do not trust the certificate, or give up


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("certificate")
    parser.add_argument("key")
    parser.add_argument("--schemas")
    parser.add_argument("--mockup")
    options = parser.parse_args()
    context = ssl.SSLContext(ssl.PROTOCOL_TLS_SERVER)
    context.load_cert_chain(options.certificate, options.key)
    service = Service(Schemas(options.schemas), options.mockup)
    Handler.service = service
    server = Server(("127.0.0.1", 0), Handler)
    server.socket = context.wrap_socket(server.socket, server_side=True, do_handshake_on_connect=False)
    threading.Thread(target=server.serve_forever, daemon=True).start()
    print(server.server_address[1], flush=True)
    for text in sys.stdin:
        line = json.loads(text)
        if "certificate" in line:
            context.load_cert_chain(line["certificate"], line["key"])
            answer = "ok"
        else:
            answer = service.command(line)
        print(json.dumps(answer), flush=True)


if __name__ == "__main__":
    main()
