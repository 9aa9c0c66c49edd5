#!/usr/bin/env python3
"""Puts zorvacimd under load and compares each figure with its target.

  bench/server/load.py --build build/bench [NAME...]

Throughput is a ratio: requests per second of the server over those of a ceiling, the same bytes served from memory by
the same HTTP library in the same threading mode: event threads that hand each request to another thread and get it
back. A second ratio is to a ceiling whose event threads answer by themselves. A server of providers cannot do that: a
hanging provider would block all connections of its thread. wrk measures all of them in turns, and the best turn of each
counts, because other work on the machine only lowers a figure. Each request asks for all properties.

"cpu" is the processor time of one request for 3 and for 1,000 endpoints, how it grows from one connection to eight, and how
many times that of the ceiling it is. With --before BUILD it is compared with that of another build, measured in turns with
this one.

"stream" is how soon the first byte of 10,000 instances arrives, and the memory that they take.

"hostile" is how long a client waits while others send requests of 3.9 MB of one element, repeated.

"tls" compares requests over HTTPS with plain HTTP, and those with a login with those without, on connections that stay
open. "intruders" is how long a client that has logged in waits while others try passwords, or begin TLS handshakes and do
not go on. The others run at the lowest priority, because they would have machines of their own.

NAME picks the figures: few, many, cpu, stream, start, memory, endpoints, tls, hostile, intruders. Exits 1 if a figure misses its target.
"""

import argparse
import contextlib
import dataclasses
import http.client
import json
import os
import re
import socket
import statistics
import subprocess
import sys
import tempfile
import time

import hostile as sending
import intruders

HERE = os.path.dirname(os.path.abspath(__file__))
THREADS = 2
TURNS = 8
SECONDS = 1
# Of the processor time of a request for so many endpoints, to that of the ceiling's.
CPU_LIMITS = {3: 6, 1000: 14}


@dataclasses.dataclass
class Figure:
    name: str
    value: float
    limit: float
    at_least: bool
    measured: str

    def verdict(self):
        if self.limit is None:
            return ""
        return "ok" if (self.value >= self.limit) == self.at_least or self.value == self.limit else "SHORT"


def free_tree(directory, interfaces):
    """A configuration of the agent over a tree of that many interfaces; over this host where interfaces is None."""
    config = '[agent]\ndata_dir = "data/"\n[log]\ntarget = "off"\n'
    if interfaces is not None:
        ports = [{"type": "Port", "name": f"eth{i}", "description": "", "children": [
            {"type": "NetworkIPConfig", "name": "ip", "description": "", "properties": {
                "name": f"eth{i}", "host_name": "host1", "domain_name": "example.org",
                "dns_suffixes": ["example.org"], "dns_server_addresses": ["192.0.2.53", "192.0.2.54"],
                "protocol_if_type": 4097, "enabled_state": 1}}]} for i in range(interfaces)]
        tree = {"system_name": "host1", "nodes": [
            {"type": "System", "name": "system", "description": "Computer", "children": ports}]}
        with open(os.path.join(directory, "tree.json"), "w", encoding="utf-8") as file:
            json.dump(tree, file)
        config += '[tree]\nsource = "file"\nfile = "tree.json"\n'
    path = os.path.join(directory, "agent.toml")
    with open(path, "w", encoding="utf-8") as file:
        file.write(config)
    return path


@contextlib.contextmanager
def server(build, program, interfaces=None):
    """Runs a server on a free port; gives its process and port."""
    with tempfile.TemporaryDirectory() as directory:
        config = os.path.join(directory, "zorvacimd.toml")
        with open(config, "w", encoding="utf-8") as file:
            file.write(f"[http]\nthreads = {THREADS}\n")
        process = subprocess.Popen(
            [os.path.join(build, "bin", program), "--config", config, "--listen", "127.0.0.1", "--port", "0",
             "--agent-config", free_tree(directory, interfaces)], stdout=subprocess.PIPE, text=True)
        try:
            yield process, int(process.stdout.readline().rsplit(":", 1)[1])
        finally:
            process.terminate()
            process.wait(timeout=30)


@contextlib.contextmanager
def ceiling(build, body, way="handover"):
    """Serves the bytes from memory, with a hand-over between threads or directly; gives its process and port."""
    with tempfile.NamedTemporaryFile() as file:
        file.write(body)
        file.flush()
        process = subprocess.Popen([os.path.join(build, "bin", "server_ceiling"), file.name, str(THREADS), way],
                                   stdin=subprocess.PIPE, stdout=subprocess.PIPE, text=True)
        try:
            yield process, int(process.stdout.readline())
        finally:
            process.stdin.close()
            process.wait(timeout=30)


def request(class_name):
    return (f'<?xml version="1.0" encoding="utf-8"?>\n<CIM CIMVERSION="2.0" DTDVERSION="2.0">'
            f'<MESSAGE ID="1" PROTOCOLVERSION="1.0"><SIMPLEREQ><IMETHODCALL NAME="EnumerateInstances">'
            f'<LOCALNAMESPACEPATH><NAMESPACE NAME="root"/><NAMESPACE NAME="cimv2"/></LOCALNAMESPACEPATH>'
            f'<IPARAMVALUE NAME="ClassName"><CLASSNAME NAME="{class_name}"/></IPARAMVALUE>'
            f'<IPARAMVALUE NAME="LocalOnly"><VALUE>FALSE</VALUE></IPARAMVALUE>'
            f'</IMETHODCALL></SIMPLEREQ></MESSAGE></CIM>')


def ask(port, class_name):
    connection = http.client.HTTPConnection("127.0.0.1", port, timeout=30)
    connection.request("POST", "/cimom", request(class_name), {
        "Content-Type": 'application/xml; charset="utf-8"', "CIMOperation": "MethodCall",
        "CIMMethod": "EnumerateInstances", "CIMObject": "root/cimv2"})
    response = connection.getresponse()
    body = response.read()
    connection.close()
    if response.status != 200 or b"<ERROR" in body:
        raise RuntimeError(f"{class_name}: status {response.status}: {body[:300]!r}")
    return body


def load(port, class_name, connections, seconds=SECONDS, scheme="http", login=None):
    """Requests per second, and the latencies in microseconds at which 50 and 99 of 100 requests are done."""
    output = subprocess.run(
        ["wrk", "-t1", f"-c{connections}", f"-d{seconds}s", "--latency", "-s", os.path.join(HERE, "post.lua"),
         f"{scheme}://127.0.0.1:{port}", class_name, *([login] if login else [])], check=True, stdout=subprocess.PIPE, text=True).stdout
    wrong = re.search(r"Non-2xx.*|Socket errors.*", output)
    if wrong:
        raise RuntimeError(f"{class_name}: {wrong.group(0)}")
    rate, half, most = re.search(r"FIGURES (\S+) (\S+) (\S+)", output).groups()
    return float(rate), float(half), float(most)


def throughput(build, class_name, limit, tail_limit):
    figures = []
    with contextlib.ExitStack() as stack:
        _, port = stack.enter_context(server(build, "server_bench"))
        body = ask(port, class_name)
        _, best = stack.enter_context(ceiling(build, body))
        _, direct = stack.enter_context(ceiling(build, body, "direct"))
        count = {"Bench_Few": "4 instances", "Bench_Many": "1,000 instances"}[class_name]
        for connections in (1, 8):
            runs, best_runs, direct_runs = [], [], []
            for _ in range(TURNS):
                best_runs.append(load(best, class_name, connections)[0])
                runs.append(load(port, class_name, connections))
                direct_runs.append(load(direct, class_name, connections)[0])
            rate = max(run[0] for run in runs)
            top = max(best_runs)
            direct_top = max(direct_runs)
            name = f"{count}, {connections} connection{'s' if connections > 1 else ''}"
            figures.append(Figure(f"{name}: requests/s, to the ceiling's", rate / top, limit, True,
                                  f"{rate:.0f} / {top:.0f} a second"))
            figures.append(Figure(f"{name}: the same, to a ceiling without hand-over", rate / direct_top, None, True,
                                  f"{rate:.0f} / {direct_top:.0f} a second"))
            if connections == 1:
                _, half, most = min(runs, key=lambda run: run[2] / run[1])
                figures.append(Figure(f"{name}: p99, to p50", most / half, tail_limit, False,
                                      f"{most:.0f} / {half:.0f} us"))
    return figures


def endpoints(build):
    """The real class, beside what it costs without HTTP and XML; no target."""
    figures = []
    class_name = "ZORVA_DNSProtocolEndPoint"
    for interfaces, what in ((None, "this host"), (1000, "1,000 interfaces")):
        with server(build, "zorvacimd", interfaces) as (process, port), ceiling(build, ask(port, class_name)) as (_, best):
            before = threads_time(process.pid)
            rate, half, most = load(port, class_name, 1, 3)
            after = threads_time(process.pid)
            top = load(best, class_name, 1)[0]
            spent = {name: after.get(name, 0) - before.get(name, 0) for name in after}
            whole = sum(spent.values()) or 1
            where = ", ".join(f"{name} {100 * time_ / whole:.0f} %" for name, time_ in sorted(spent.items()) if time_)
            figures.append(Figure(f"endpoints of {what}, 1 connection: requests/s, to the ceiling's", rate / top, None,
                                  True, f"{rate:.0f} / {top:.0f} a second, p50 {half:.0f} us, p99 {most:.0f} us; "
                                  f"CPU: {where}"))
    return figures


def processor_time(process):
    """Seconds of processor time of a process, its ended threads included."""
    with open(f"/proc/{process}/stat", encoding="utf-8") as file:
        fields = file.read().rsplit(")", 1)[1].split()
    return (int(fields[11]) + int(fields[12])) / os.sysconf("SC_CLK_TCK")


def cpu_of_requests(build, before, interfaces):
    """Processor time per request of real endpoints, at one connection and at eight, beside that of a server which sends
    the same bytes from memory, and beside that of the build before."""
    builds = [build] + ([before] if before else [])
    class_name = "ZORVA_DNSProtocolEndPoint"
    times = {}
    tails = []
    with contextlib.ExitStack() as stack:
        servers = {each: stack.enter_context(server(each, "zorvacimd", interfaces)) for each in builds}
        body = ask(servers[build][1], class_name)
        servers["ceiling"] = stack.enter_context(ceiling(build, body))
        for _ in range(TURNS):
            for each, (process, port) in servers.items():
                for connections in (1, 8):
                    start = processor_time(process.pid)
                    rate, half, most = load(port, class_name, connections, 2)
                    times.setdefault((each, connections), []).append((processor_time(process.pid) - start) / (rate * 2))
                    if each == build and connections == 1:
                        tails.append(most / half)
    least = {key: min(values) * 1e6 for key, values in times.items()}
    name = f"{interfaces:,} endpoints"
    figures = [Figure(f"{name}: CPU per request, 8 connections to 1", least[build, 8] / least[build, 1], 1.15, False,
                      f"{least[build, 8]:.0f} / {least[build, 1]:.0f} us"),
               Figure(f"{name}: p99, to p50", min(tails), 3, False, f"{statistics.median(tails):.1f} in the median turn")]
    for other, what, limit in (("ceiling", "the ceiling's", CPU_LIMITS[interfaces]), (before, "that of the build before", 1)):
        if other is None:
            continue
        figures += [Figure(f"{name}, {connections} connection{'s' if connections > 1 else ''}: CPU per request, to {what}",
                           least[build, connections] / least[other, connections], limit, False,
                           f"{least[build, connections]:.0f} / {least[other, connections]:.0f} us")
                    for connections in (1, 8)]
    return figures


def first_byte(build, program, class_name, limits, interfaces=None):
    """Milliseconds from a request for 10,000 instances to the first byte of its response, and the memory that it takes."""
    body = request(class_name).encode()
    head = (f"POST /cimom HTTP/1.1\r\nHost: 127.0.0.1\r\nContent-Type: application/xml\r\nContent-Length: {len(body)}\r\n"
            f"CIMOperation: MethodCall\r\nCIMMethod: EnumerateInstances\r\nCIMObject: root/cimv2\r\n"
            f"Connection: close\r\n\r\n").encode()
    times = []
    with server(build, program, interfaces) as (process, port):
        for _ in range(7):
            with socket.create_connection(("127.0.0.1", port)) as client:
                begin = time.perf_counter()
                client.sendall(head + body)
                client.recv(1)
                times.append((time.perf_counter() - begin) * 1000)
                while client.recv(1 << 20):
                    pass
        with open(f"/proc/{process.pid}/status", encoding="utf-8") as file:
            peak = int(re.search(r"VmHWM:\s+(\d+) kB", file.read()).group(1)) / 1024
    return [Figure(f"10,000 of {class_name}: ms to the first byte", min(times), limits[0], False,
                   f"{statistics.median(times):.1f} ms in the median"),
            Figure(f"10,000 of {class_name}: resident memory at most, MB", peak, limits[1], False, f"{peak:.1f} MB")]


def threads_time(process):
    """Ticks of processor time by the name of the threads: workers do providers and XML, MHD-worker does HTTP."""
    times = {}
    for task in os.listdir(f"/proc/{process}/task"):
        with contextlib.suppress(OSError), open(f"/proc/{process}/task/{task}/stat", encoding="utf-8") as file:
            name, rest = re.match(r"\d+ \((.*)\) (.*)", file.read()).groups()
            fields = rest.split()
            times[name] = times.get(name, 0) + int(fields[11]) + int(fields[12])
    return times


@contextlib.contextmanager
def secure_server(build):
    """Runs zorvacimd with a certificate and a user; gives its process, its ports of HTTP and of HTTPS, and the user's
    login."""
    with tempfile.TemporaryDirectory() as directory:
        config = os.path.join(directory, "zorvacimd.toml")
        with open(config, "w", encoding="utf-8") as file:
            file.write(f'[listen]\naddresses = ["127.0.0.1"]\nport = 0\n[tls]\ncertificate = "server.crt"\nkey = "server.key"\n'
                       f'addresses = ["127.0.0.1"]\nport = 0\n[access]\nusers = "users"\n[http]\nthreads = {THREADS}\n')
        program = os.path.join(build, "bin", "zorvacimd")
        subprocess.run([program, "--config", config, "--make-certificate"], check=True, stdout=subprocess.DEVNULL)
        subprocess.run([os.path.join(build, "bin", "zorvactl"), "user", "add", "bench", "--password-stdin", "--file",
                        os.path.join(directory, "users")], input="bench secret\n", text=True, check=True,
                       stdout=subprocess.DEVNULL)
        process = subprocess.Popen([program, "--config", config, "--greet", "--agent-config", free_tree(directory, 4)],
                                   stdout=subprocess.PIPE, text=True)
        try:
            line = process.stdout.readline()
            ports = {scheme: int(port) for scheme, port in re.findall(r"(https?)://127\.0\.0\.1:(\d+)", line)}
            yield process, ports["http"], ports["https"], intruders.basic("bench", "bench secret")
        finally:
            process.terminate()
            process.wait(timeout=30)


def tls(build):
    figures = []
    class_name = "ZORVA_DNSProtocolEndPoint"
    with secure_server(build) as (process, http_port, https_port, login):
        ways = {"plain": (http_port, "http", None), "tls": (https_port, "https", None), "login": (https_port, "https", login)}
        for connections in (1, 8):
            # What comes first in a turn changes, and each ratio is of neighbours in time: the machine is not equally fast all the time.
            turns = []
            spent = {way: [] for way in ways}
            for turn in range(2 * TURNS):
                turns.append({})
                for way in ways if turn % 2 == 0 else reversed(ways):
                    port, scheme, who = ways[way]
                    start = processor_time(process.pid)
                    turns[-1][way] = load(port, class_name, connections, scheme=scheme, login=who)[0]
                    spent[way].append((processor_time(process.pid) - start) / (turns[-1][way] * SECONDS) * 1e6)
            name = f"{connections} connection{'s' if connections > 1 else ''}"
            for what, way, other, limit in ((f"HTTPS, {name}: requests/s, to those of plain HTTP", "tls", "plain", 0.8),
                                            (f"with a login, {name}: requests/s, to those without", "login", "tls", 0.95)):
                ratio = statistics.median(turn[way] / turn[other] for turn in turns)
                best = [max(turn[each] for turn in turns) for each in (way, other)]
                least = [min(spent[each]) for each in (way, other)]
                figures.append(Figure(what, ratio, limit, True, f"at best {best[0]:.0f} / {best[1]:.0f} a second; "
                                      f"CPU of the server {least[0]:.0f} / {least[1]:.0f} us a request"))
    return figures


def waits_beside_intruders(build):
    figures = []
    class_name = "ZORVA_DNSProtocolEndPoint"
    for name, attack in (("wrong logins on 20 connections", intruders.wrong_logins),
                         ("300 half handshakes", intruders.half_handshakes)):
        with secure_server(build) as (_, _, port, login):
            def wait():
                return statistics.median(load(port, class_name, 1, 2, "https", login)[2] for _ in range(5))

            quiet = wait()
            with intruders.running(attack, port) as done:
                while not done.value:
                    time.sleep(0.01)
                beside = wait()
                count = done.value
            figures.append(Figure(f"beside {name}: p99, to that without", beside / quiet, 3, False,
                                  f"{beside:.0f} / {quiet:.0f} us, {count} of them so far"))
    return figures


def read_answer(port, class_name):
    """The bytes of an answer, by a bare socket: http.client takes longer to read 3 MB than the server to write them."""
    body = request(class_name)
    with socket.create_connection(("127.0.0.1", port), timeout=30) as connection:
        connection.sendall((f"POST /cimom HTTP/1.1\r\nHost: 127.0.0.1:{port}\r\nConnection: close\r\n"
                            f"Content-Type: application/xml; charset=\"utf-8\"\r\nContent-Length: {len(body)}\r\n"
                            "CIMOperation: MethodCall\r\nCIMMethod: EnumerateInstances\r\nCIMObject: root/cimv2\r\n\r\n"
                            + body).encode())
        parts = []
        while part := connection.recv(1 << 20):
            parts.append(part)
    return b"".join(parts)


def start_time(build, interfaces, limit):
    """From the start of the process to the end of the first answer, in milliseconds; the median."""
    times = []
    with tempfile.TemporaryDirectory() as directory:
        agent = free_tree(directory, interfaces)
        config = os.path.join(directory, "zorvacimd.toml")
        open(config, "w", encoding="utf-8").close()
        for _ in range(11):
            with socket.socket() as probe:
                probe.bind(("127.0.0.1", 0))
                port = probe.getsockname()[1]
            begin = time.perf_counter()
            process = subprocess.Popen([os.path.join(build, "bin", "zorvacimd"), "--config", config, "--listen",
                                        "127.0.0.1", "--port", str(port), "--agent-config", agent])
            while True:
                with contextlib.suppress(ConnectionRefusedError):
                    answer = read_answer(port, "ZORVA_DNSProtocolEndPoint")
                    break
                time.sleep(0.0002)
            times.append((time.perf_counter() - begin) * 1000)
            if not answer.startswith(b"HTTP/1.1 200 ") or answer.count(b"<VALUE.NAMEDINSTANCE>") != interfaces:
                raise RuntimeError(f"not the {interfaces} instances: {answer[:300]!r}")
            process.terminate()
            process.wait(timeout=30)
    value = statistics.median(times)
    return [Figure(f"start to the first answer with {interfaces:,} interfaces, ms", value, limit, False,
                   f"{min(times):.1f} to {max(times):.1f} ms")]


def resident_mb(process):
    with open(f"/proc/{process}/status", encoding="utf-8") as file:
        return int(re.search(r"VmRSS:\s+(\d+) kB", file.read()).group(1)) / 1024


def memory(build):
    with server(build, "zorvacimd") as (process, port):
        ask(port, "ZORVA_DNSProtocolEndPoint")
        time.sleep(1.5)
        idle = resident_mb(process.pid)
    with server(build, "server_bench") as (process, port):
        load(port, "Bench_TenThousand", 8, 3)
        peak = resident_mb(process.pid)
        time.sleep(2)
        after = resident_mb(process.pid)
    return [Figure("resident memory idle, MB", idle, 15, False, f"{idle:.1f} MB"),
            Figure("resident memory after 10,000 instances, MB", after, 30, False,
                   f"{after:.1f} MB, {peak:.1f} at most")]


def hostile(build):
    """What a client waits while others send large requests, of each kind alone and of all kinds together."""
    figures = []
    kinds = sending.bodies()
    with server(build, "zorvacimd") as (_, port):
        cases = [("no such client", [], 0)] + [(f"1 of {name}", [body], 1) for name, body in kinds.items()]
        for name, some, attackers in cases + [("4 of all kinds", list(kinds.values()), 4)]:
            times, count = sending.latencies_beside(port, some, attackers, 3)
            figures.append(Figure(f"beside {name}: p99, ms", times[int(len(times) * 0.99)],
                                  50 if attackers else None, False,
                                  f"p50 {statistics.median(times):.1f} ms, {len(times)} requests beside {count}"))
    return figures


def main():
    parser = argparse.ArgumentParser(description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument("--build", default="build/bench", help="the build folder (default: %(default)s)")
    parser.add_argument("--before", help="another build folder, to compare processor times with")
    parser.add_argument("names", nargs="*", metavar="NAME", help="only: few, many, cpu, stream, endpoints, start, memory, tls, hostile, intruders")
    arguments = parser.parse_args()
    build = os.path.abspath(arguments.build)
    before = os.path.abspath(arguments.before) if arguments.before else None
    parts = {
        "few": lambda: throughput(build, "Bench_Few", 0.35, 5),
        "many": lambda: throughput(build, "Bench_Many", 0.13, 5),
        "cpu": lambda: cpu_of_requests(build, before, 3) + cpu_of_requests(build, before, 1000),
        # The library makes all instances before it returns the first one.
        "stream": lambda: (first_byte(build, "server_bench", "Bench_TenThousand", (10, 30))
                           + first_byte(build, "zorvacimd", "ZORVA_DNSProtocolEndPoint", (None, None), 10000)),
        "start": lambda: start_time(build, 3, 10) + start_time(build, 1000, 25),
        "memory": lambda: memory(build),
        "endpoints": lambda: endpoints(build),
        "tls": lambda: tls(build),
        "hostile": lambda: hostile(build),
        "intruders": lambda: waits_beside_intruders(build),
    }
    wanted = [name for name in arguments.names if name != "server"] or list(parts)
    if not set(wanted) <= set(parts):
        parser.error(f"no figure has such a name; there are {', '.join(parts)}")
    figures = []
    for name in wanted:
        print(f"measuring {name} ...", file=sys.stderr)
        figures += parts[name]()

    width = max(len(figure.name) for figure in figures)
    print(f"{'FIGURE':{width}}  VALUE  TARGET         MEASURED")
    for figure in figures:
        target = "" if figure.limit is None else f"{'>=' if figure.at_least else '<='} {figure.limit:g}"
        print(f"{figure.name:{width}}  {figure.value:5.2f}  {target:7}  {figure.verdict():5}  {figure.measured}")
    short = sum(figure.verdict() == "SHORT" for figure in figures)
    if short:
        print(f"{short} of {len(figures)} figures fall short", file=sys.stderr)
    return 1 if short else 0


if __name__ == "__main__":
    try:
        sys.exit(main())
    except (OSError, RuntimeError, subprocess.CalledProcessError) as error:
        print(f"load.py: {error}", file=sys.stderr)
        sys.exit(1)
