#!/usr/bin/env python3
"""Watches three hosts with a real Prometheus, and changes them with a real Ansible.

    fleet.py BUILD PROMETHEUS     BUILD: the folder with bin/; PROMETHEUS: one with prometheus and promtool
                                  exits 1 and prints what is wrong; prints what it measured

The hosts are namespaces as those of tests/tutorial.py; a fourth one has Prometheus and is connected to each of them. Ansible reaches them
by "local" connections, whose Python enters the namespace. It needs root, and is skipped without.
"""
import json
import os
import pathlib
import re
import shutil
import subprocess
import sys
import tempfile
import time

import tutorial

ROOT = pathlib.Path(__file__).resolve().parent.parent
COLLECTION = ROOT / "packaging" / "ansible"
PROMETHEUS_FILES = ROOT / "packaging" / "prometheus"
NAMES = ["host1", "host2", "host3"]
PASSWORD = "correct horse battery"
LONGEST = 60
# Those of ansible-test that need nothing from the network.
SANITY = ["action-plugin-docs", "compile", "empty-init", "future-import-boilerplate", "line-endings", "metaclass-boilerplate", "no-assert",
          "no-get-exception", "no-illegal-filenames", "no-main-display", "no-smart-quotes", "no-unicode-literals", "replace-urlopen",
          "shebang", "symlinks", "use-argspec-type-path", "use-compat-six"]


class Failure(Exception):
    pass


def require(condition, what, more=""):
    if not condition:
        raise Failure(f"{what}\n{more}".rstrip())


def run(words, **more):
    done = subprocess.run([str(word) for word in words], capture_output=True, text=True, check=False, timeout=300, **more)
    require(done.returncode == 0, f"{words[0]} failed with status {done.returncode}: {' '.join(map(str, words))}", done.stdout + done.stderr)
    return done.stdout


def eventually(what, function):
    """The first result that counts as true."""
    end = time.monotonic() + LONGEST
    while time.monotonic() < end:
        result = function()
        if result:
            return result
        time.sleep(0.1)
    raise Failure(f"{what}: not within {LONGEST} s")


class Fleet:
    """Three hosts, each with its server, and the one that Prometheus runs on."""

    def __init__(self, build, folder):
        self.build, self.folder = build, folder
        self.hosts = {name: tutorial.Host(name, folder / name, build) for name in ["monitor", *NAMES]}
        self.processes = []
        for number, name in enumerate(NAMES):
            self.connect(number, name)
            self.serve(number, name)

    def connect(self, number, name):
        monitor, host = self.hosts["monitor"], self.hosts[name]
        pair = f"ip link add to{number} type veth peer name eth0 netns {host.inside}"
        run(["nsenter", "--target", monitor.inside, "--net", *pair.split()])
        for end, place, address in [(monitor, f"to{number}", f"192.0.2.{4 * number + 1}/30"), (host, "eth0", f"{self.address(number)}/30")]:
            end.run("ip", "address", "add", address, "dev", place)
            end.run("ip", "link", "set", place, "up")

    @staticmethod
    def address(number):
        return f"192.0.2.{4 * number + 2}"

    def start(self, host, words, log):
        with open(self.folder / log, "w", encoding="utf-8") as out:
            self.processes.append(subprocess.Popen(
                [*tutorial.DIES_ALONG, "nsenter", "--target", str(self.hosts[host].inside), "--all", *self.hosts[host].environment, *words],
                stdin=subprocess.DEVNULL, stdout=out, stderr=subprocess.STDOUT))

    def serve(self, number, name):
        host = self.hosts[name]
        host.write("/etc/zorvagent/zorvacimd.toml", f'[listen]\nsocket = "/run/cim.sock"\n'
                   f'[tls]\ncertificate = "/etc/zorvagent/tls/server.crt"\nkey = "/etc/zorvagent/tls/server.key"\n'
                   f'addresses = ["{self.address(number)}"]\n[metrics]\ncheck_interval = 1\n')
        host.run("mkdir", "-p", "/var/lib/zorvagent", "/etc/zorvagent/tls")
        self.zorvacimd = ["zorvacimd", "--config", "/etc/zorvagent/zorvacimd.toml"]
        host.run(*host.environment, *self.zorvacimd, "--make-certificate")
        host.run(*host.environment, "zorvactl", "user", "add", "prometheus", "--role", "read", "--file", "/etc/zorvagent/users",
                 input=PASSWORD + "\n")
        config = host.run("cat", "/etc/zorvagent/zorvacimd.toml").stdout
        host.write("/etc/zorvagent/zorvacimd.toml", config + '[access]\nusers = "/etc/zorvagent/users"\n')
        self.start(name, self.zorvacimd, f"zorvacimd-{name}.log")
        eventually(f"zorvacimd on {name}", lambda: self.scrape(name, status=True))

    def scrape(self, name, status=False):
        """What the server says on its socket, without a login."""
        words = ["curl", "-sS", "--unix-socket", "/run/cim.sock", "http://localhost/metrics"]
        done = subprocess.run(["nsenter", "--target", str(self.hosts[name].inside), "--all", *words], capture_output=True, text=True, check=False)
        return done.returncode == 0 if status else done.stdout

    def close(self):
        for process in self.processes:
            process.kill()
            process.wait()
        for host in self.hosts.values():
            host.close()


def check_rules(promtool):
    run([promtool, "check", "rules", PROMETHEUS_FILES / "zorva-alerts.yml"])
    run([promtool, "test", "rules", PROMETHEUS_FILES / "zorva-alerts.test.yml"])
    print("promtool: the alerts do what their tests say")


def check_metrics(fleet, promtool):
    text = fleet.scrape("host1")
    run([promtool, "check", "metrics"], input=text)
    require('zorva_dns_server_info{system="host",interface="eth0",order="1",address="192.0.2.53",owner="/etc/resolv.conf"} 1\n' in text,
            "the server of eth0 is not there", text)
    print("promtool: nothing to say about the metrics")


def value_of(text, metric):
    found = re.search(rf"^{metric} (\S+)$", text, re.MULTILINE)
    require(found, f"{metric} is missing", text)
    return float(found[1])


def measure_scrapes(fleet):
    count = 300
    socket = ["--unix-socket", "/run/cim.sock"]
    before = value_of(fleet.scrape("host1"), "process_cpu_seconds_total")
    begin = time.monotonic()
    fleet.hosts["host1"].run("curl", "-sS", "-o", "/dev/null", *socket, f"http://localhost/metrics?[1-{count}]")
    seconds = (time.monotonic() - begin) / count
    text = fleet.scrape("host1")
    cpu = (value_of(text, "process_cpu_seconds_total") - before) / count
    memory = value_of(text, "process_resident_memory_bytes") / 2**20
    print(f"a scrape: {len(text.encode())} bytes, {len([1 for line in text.splitlines() if not line.startswith('#')])} series, "
          f"{seconds * 1000:.2f} ms, {cpu * 1000:.2f} ms of processor time; the server has {memory:.1f} MiB")


def check_prometheus(fleet, folder):
    """A real Prometheus scrapes all of them over HTTPS with a login, and evaluates the alerts."""
    monitor = fleet.hosts["monitor"]
    targets = ", ".join(f'"{fleet.address(number)}:5989"' for number in range(len(NAMES)))
    rules = (PROMETHEUS_FILES / "zorva-alerts.yml").read_text(encoding="utf-8")
    monitor.write("alerts.yml", re.sub(r"for: \d+m", "for: 1s", rules))
    monitor.write("password", PASSWORD)
    monitor.write("prometheus.yml", f"""
global: {{scrape_interval: 1s, evaluation_interval: 1s}}
rule_files: [alerts.yml]
scrape_configs:
  - job_name: zorva
    scheme: https
    basic_auth: {{username: prometheus, password_file: password}}
    tls_config: {{insecure_skip_verify: true}}
    static_configs: [{{targets: [{targets}]}}]
""")
    home = str(monitor.home)
    fleet.start("monitor", [str(folder / "prometheus"), f"--config.file={home}/prometheus.yml", f"--storage.tsdb.path={home}/tsdb",
                            "--web.listen-address=127.0.0.1:9090"], "prometheus.log")

    def ask(path):
        words = ["curl", "-sS", "-g", f"http://127.0.0.1:9090/api/v1/{path}"]
        done = subprocess.run(["nsenter", "--target", str(monitor.inside), "--all", *words], capture_output=True, text=True, check=False)
        return json.loads(done.stdout)["data"] if done.returncode == 0 and done.stdout.startswith("{") else None

    def query(text):
        answer = ask("query?query=" + text)
        return answer["result"] if answer else []

    def firing():
        answer = ask("alerts")
        return {alert["labels"]["alertname"] for alert in answer["alerts"] if alert["state"] == "firing"} if answer else set()

    eventually("Prometheus scrapes all three", lambda: len(query("up==1")) == len(NAMES))
    eventually("the servers' order is in Prometheus", lambda: len(query('zorva_dns_server_info{order="1",address="192.0.2.53"}')) == len(NAMES))
    eventually("nobody answers at these addresses, and Prometheus says so", lambda: "ZorvaNoDnsServerAnswers" in firing())
    # Another order on one host, and settings that it does not have.
    host = fleet.hosts["host3"]
    host.run("sh", "-c", "printf 'nameserver 192.0.2.54\nnameserver 192.0.2.53\nsearch example.org\n' >/etc/resolv.conf")
    host.write("/var/lib/zorvagent/ifcfg-eth0", "DNSSERVERS=192.0.2.53\n")
    eventually("the other order fires", lambda: "ZorvaDnsSearchOrderDiffers" in firing())
    eventually("the drift fires", lambda: "ZorvaDnsSettingsDrift" in firing())
    host.run("rm", "/var/lib/zorvagent/ifcfg-eth0")
    host.run("sh", "-c", "printf 'nameserver 192.0.2.53\nsearch example.org\n' >/etc/resolv.conf")
    eventually("they end", lambda: not firing() & {"ZorvaDnsSearchOrderDiffers", "ZorvaDnsSettingsDrift"})
    print(f"Prometheus: scrapes {len(NAMES)} hosts over HTTPS with a login; all three alerts fire when they should")


PLAYBOOK = """
- hosts: all
  gather_facts: false
  tasks:
    - name: Facts
      zorva.dns.zorva_dns_facts:
    - name: The facts are those of the host
      ansible.builtin.assert:
        that: ansible_facts.zorva_dns.system == inventory_hostname
    - name: Settings
      zorva.dns.zorva_dns: "{{ settings }}"
      register: result
"""


# Writes the results of the last task, by host. ansible-core has no such callback.
CALLBACK = """
import json
from ansible.plugins.callback import CallbackBase

class CallbackModule(CallbackBase):
    CALLBACK_VERSION, CALLBACK_TYPE, CALLBACK_NAME = 2.0, "stdout", "results"
    hosts = {}

    def v2_playbook_on_task_start(self, task, is_conditional):
        self.name = task.get_name()

    def take(self, result, **more):
        self.hosts[result._host.get_name()] = dict(result._result, task=self.name)

    v2_runner_on_ok = v2_runner_on_failed = v2_runner_on_unreachable = take

    def v2_playbook_on_stats(self, stats):
        print("RESULTS " + json.dumps(self.hosts, default=str))
"""


class Ansible:
    def __init__(self, fleet, folder):
        self.folder = folder
        place = folder / "collections" / "ansible_collections" / "zorva" / "dns"
        shutil.copytree(COLLECTION, place)
        self.collection = place
        self.broken = folder / "broken"
        inventory = ["[all]"]
        for name in NAMES:
            python = folder / f"python-{name}"
            host = fleet.hosts[name]
            python.write_text(f'#!/bin/sh\ncase "$*" in *zorva_dns_confirm*) [ ! -e {self.broken} ] || exit 1 ;; esac\n'
                              f"exec nsenter --target {host.inside} --all {' '.join(host.environment)} /usr/bin/python3 \"$@\"\n", encoding="utf-8")
            python.chmod(0o755)
            inventory.append(f"{name} ansible_connection=local ansible_python_interpreter={python}")
        (folder / "inventory").write_text("\n".join(inventory) + "\n", encoding="utf-8")
        (folder / "ansible.cfg").touch()
        (folder / "callbacks").mkdir()
        (folder / "callbacks" / "results.py").write_text(CALLBACK, encoding="utf-8")
        (folder / "playbook.yml").write_text(PLAYBOOK, encoding="utf-8")
        self.environment = {**os.environ, "ANSIBLE_COLLECTIONS_PATH": str(folder / "collections"), "ANSIBLE_NOCOLOR": "1", "ANSIBLE_FORKS": "3",
                            "ANSIBLE_LOCAL_TEMP": str(folder / "local"), "ANSIBLE_REMOTE_TEMP": str(folder / "remote"), "LC_ALL": "C.UTF-8",
                            "ANSIBLE_STDOUT_CALLBACK": "results", "ANSIBLE_CALLBACK_PLUGINS": str(folder / "callbacks"), "ANSIBLE_CONFIG": str(folder / "ansible.cfg"), "ANSIBLE_RETRY_FILES_ENABLED": "0"}

    def play(self, settings, *options, fails=False):
        """What became of the last task on each host."""
        done = subprocess.run(["ansible-playbook", "-i", str(self.folder / "inventory"), "-e", json.dumps({"settings": settings}), *options,
                               str(self.folder / "playbook.yml")], capture_output=True, text=True, check=False, timeout=300, env=self.environment)
        require((done.returncode != 0) == fails, f"ansible-playbook ended with {done.returncode}", done.stdout + done.stderr)
        require("RESULTS " in done.stdout, "ansible-playbook has no results", done.stdout + done.stderr)
        return json.loads(done.stdout.split("RESULTS ")[1])

    def changed(self, settings, *options):
        return {name for name, result in self.play(settings, *options).items() if result["changed"]}


def resolv_conf(fleet, name):
    return fleet.hosts[name].run("cat", "/etc/resolv.conf").stdout


def check_ansible(fleet, ansible):
    before = {name: resolv_conf(fleet, name) for name in NAMES}
    settings = {"interface": "eth0", "servers": ["192.0.2.54", "192.0.2.53"], "domain": "lab.example.org",
                "suffixes": ["lab.example.org", "example.org"], "confirm": 20}
    task = ansible.play(settings, "--check", "--diff")
    require(all(result["changed"] for result in task.values()), "a check finds no change", json.dumps(task))
    require(task["host1"]["diff"] == {"before": {"servers": ["192.0.2.53"], "domain": "example.org", "suffixes": ["example.org"]},
                                               "after": {key: settings[key] for key in ("servers", "domain", "suffixes")}},
            "the diff is another one", json.dumps(task["host1"]))
    require({name: resolv_conf(fleet, name) for name in NAMES} == before, "a check has changed a host")

    begin = time.monotonic()
    require(ansible.changed(settings) == set(NAMES), "not every host was changed")
    print(f"ansible-playbook: a change of {len(NAMES)} hosts at once took {time.monotonic() - begin:.1f} s")
    for name in NAMES:
        require("nameserver 192.0.2.54\nnameserver 192.0.2.53" in resolv_conf(fleet, name), f"{name} has other servers", resolv_conf(fleet, name))
    begin = time.monotonic()
    require(ansible.changed(settings) == set(), "a second run changes something")
    print(f"ansible-playbook: a run that changes nothing took {time.monotonic() - begin:.1f} s")

    # A host that has drifted is brought back, and it alone.
    fleet.hosts["host2"].run("sh", "-c", "printf 'nameserver 192.0.2.99\n' >/etc/resolv.conf")
    require(ansible.changed(settings, "--check") == {"host2"}, "a check does not see the drift")
    require(ansible.changed(settings) == {"host2"}, "the drift is not mended")
    require("192.0.2.99" not in resolv_conf(fleet, "host2"), "the drift is still there")

    # Nobody confirms: the host takes the change back.
    ansible.broken.touch()
    task = ansible.play({**settings, "servers": ["192.0.2.98"], "confirm": 3}, "--limit", "host3", fails=True)
    require("not confirmed" in task["host3"].get("msg", ""), "it does not say that nobody confirmed", json.dumps(task))
    ansible.broken.unlink()
    eventually("host3 takes back what nobody confirmed", lambda: "192.0.2.98" not in resolv_conf(fleet, "host3"))
    require(ansible.changed(settings) == {"host3"}, "the stored settings are not mended after that")

    task = ansible.play({**settings, "servers": ["nonsense"]}, "--limit", "host1", fails=True)
    require("nonsense" in task["host1"]["msg"], "the refusal does not say what is wrong", json.dumps(task))
    require("confirm is a number" in ansible.play({**settings, "confirm": -1}, "--limit", "host1", fails=True)["host1"]["msg"],
            "a negative time is taken")

    require(ansible.changed({"interface": "eth0", "state": "absent"}) == set(NAMES), "the settings are not taken away")
    require({name: resolv_conf(fleet, name) for name in NAMES} == before, "the hosts do not have back what they had",
            json.dumps([before, {name: resolv_conf(fleet, name) for name in NAMES}]))
    require(ansible.changed({"interface": "eth0", "state": "absent"}) == set(), "taking them away twice changes something")
    print("ansible-playbook: check, change, no change, drift, trial without confirmation, refusal, removal on three hosts")


def check_collection(ansible):
    for test in SANITY:
        run(["ansible-test", "sanity", "--python", f"3.{sys.version_info.minor}", "--test", test], cwd=ansible.collection, env=ansible.environment)
    modules = sorted(path.stem for path in (ansible.collection / "plugins" / "modules").glob("*.py"))
    described = json.loads(run(["ansible-doc", "--json", *(f"zorva.dns.{module}" for module in modules)], env=ansible.environment))
    for module in modules:
        source = (ansible.collection / "plugins" / "modules" / f"{module}.py").read_text(encoding="utf-8")
        options = set(described[f"zorva.dns.{module}"]["doc"]["options"])
        taken = {"executable", *re.findall(r'^            (\w+)={"type"', source, re.MULTILINE)}
        require(options == taken, f"{module}: the page has other options than the module", f"{options} {taken}")
    print(f"ansible-test sanity: {len(SANITY)} tests; ansible-doc: {len(modules)} modules")


def main(build, prometheus):
    if os.geteuid() != 0:
        print("skipped: hosts of their own need root")
        return tutorial.SKIPPED
    build, prometheus = (pathlib.Path(each).resolve() for each in (build, prometheus))
    with tempfile.TemporaryDirectory() as directory:
        folder = pathlib.Path(directory)
        fleet = None
        try:
            check_rules(prometheus / "promtool")
            fleet = Fleet(build, folder)
            check_metrics(fleet, prometheus / "promtool")
            measure_scrapes(fleet)
            ansible = Ansible(fleet, folder)
            check_collection(ansible)
            check_ansible(fleet, ansible)
            check_prometheus(fleet, prometheus)
        except Failure as failure:
            print(failure)
            for log in sorted(folder.glob("*.log")):
                print(f"-- the end of {log.name}\n" + "\n".join(log.read_text(encoding="utf-8").splitlines()[-15:]))
            return 1
        finally:
            if fleet:
                fleet.close()
    return 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
