#!/usr/bin/python
from __future__ import absolute_import, division, print_function

__metaclass__ = type

DOCUMENTATION = r"""
---
module: zorva_dns
short_description: DNS servers, domain and suffixes of an interface
description:
  - Stores the DNS settings of an interface on the managed host and applies them through the owner of the interface's settings, which is
    NetworkManager, systemd-resolved, systemd-networkd or the file C(/etc/resolv.conf).
  - What is applied is on trial at first. A second call from the controller confirms it. If that does not reach the host in time, the host
    takes the change back.
options:
  interface:
    description: The name of the interface.
    type: str
    required: true
  servers:
    description: The addresses of the DNS servers in search order. An empty list is none at all. Without this option they stay.
    type: list
    elements: str
  domain:
    description: The DNS domain of the interface; the empty text is none. Without this option it stays.
    type: str
  suffixes:
    description:
      - The DNS suffixes of the host, which are kept with its first interface. So this is for that interface only.
      - Without this option they stay.
    type: list
    elements: str
  state:
    description:
      - With V(present) the interface has these settings.
      - With V(absent) the stored settings are removed, and the owner has again what it had before the first change.
    type: str
    choices: [present, absent]
    default: present
  apply:
    description: Whether the settings are brought to the host, and not only stored.
    type: bool
    default: true
  confirm:
    description: How many seconds the settings are on trial. V(0) applies them for good at once.
    type: int
    default: 60
extends_documentation_fragment: zorva.dns.zorvactl
attributes:
  check_mode:
    description: Says what would change.
    support: full
  diff_mode:
    description: Shows the settings before and after.
    support: full
"""

EXAMPLES = r"""
- name: DNS servers of this site
  zorva.dns.zorva_dns:
    interface: eth0
    servers: [192.0.2.53, 2001:db8::53]
    domain: example.org
    suffixes: [example.org, example.net]

- name: What the network says
  zorva.dns.zorva_dns:
    interface: eth0
    state: absent
"""

RETURN = r"""
applied:
  description: What was changed on the host, property by property, as C(zorvactl apply --output json) says it.
  returned: success
  type: list
  elements: dict
  sample: [{"property": "dns_server_addresses", "before": ["192.0.2.1"], "after": ["192.0.2.53"]}]
owner:
  description: Who has the settings of the interface.
  returned: if something was applied
  type: str
  sample: NetworkManager
trial:
  description: Whether the settings are on trial and must be confirmed.
  returned: success
  type: bool
"""

import subprocess
import tempfile
import time

from ansible.module_utils.basic import AnsibleModule
from ansible.module_utils.common.text.converters import to_text
from ansible_collections.zorva.dns.plugins.module_utils.zorvactl import ARGUMENTS, Zorvactl, document_of

LONGEST_APPLY = 90  # seconds: owners take ten each, a service processor 75
OPTIONS = {"servers": "DNSSERVERS", "domain": "DOMAINNAME", "suffixes": "DNSSUFFIXES"}


def is_list(option):
    return option != "domain"


def value_of(option, settings):
    text = settings.get(OPTIONS[option], "")
    return text.split() if is_list(option) else text.strip()


class Task(object):
    def __init__(self, module):
        self.module, self.params = module, module.params
        self.zorvactl = Zorvactl(module)
        self.interface = module.params["interface"]
        self.wanted = dict((option, module.params[option]) for option in OPTIONS if module.params[option] is not None)
        self.result = {"changed": False, "applied": [], "trial": False}

    def row(self, document):
        for row in document["interfaces"]:
            if row["name"] == self.interface and row["system"] == document["system"]:
                return row
        self.module.fail_json(msg="this host has no interface " + self.interface)

    def present(self):
        shown = self.zorvactl.json("show", "--all")
        row = self.row(shown)
        if "suffixes" in self.wanted and shown["host"]["interface"] != self.interface:
            self.module.fail_json(msg="the suffixes of the host are kept with the interface {0}, and not with {1}".format(
                shown["host"]["interface"] or "-", self.interface))
        settings = self.zorvactl.settings(self.interface)
        if settings is None:
            before = {"servers": row["servers"], "domain": row["domain_name"], "suffixes": shown["host"]["suffixes"]}
        else:
            before = dict((option, value_of(option, settings)) for option in OPTIONS)
        before = dict((option, before[option]) for option in self.wanted)
        differing = [option for option in self.wanted if before[option] != self.wanted[option]]
        self.note(before, self.wanted, settings is None or bool(differing))
        if self.module.check_mode:
            if not self.result["changed"] and self.params["apply"]:
                self.take_applied(self.apply("--dry-run"))
            return
        if settings is None:
            self.zorvactl.json("ifcfg", "init", self.interface)
        for option in differing:
            self.store(option)
        self.bring_to_host()

    def store(self, option):
        value = self.wanted[option]
        if option == "domain":
            self.zorvactl.json("domain", self.interface, value)
        elif option == "servers":
            self.zorvactl.json("dns", "set", self.interface, *value)
        else:
            self.zorvactl.json("suffixes", "set", *value)

    def absent(self):
        settings = self.zorvactl.settings(self.interface)
        before = {} if settings is None else dict((option, value_of(option, settings)) for option in OPTIONS)
        self.note(before, {}, settings is not None)
        if settings is not None and not self.module.check_mode:
            self.zorvactl.json("ifcfg", "remove", self.interface)
        if not self.params["apply"]:
            return
        dry = ["--dry-run"] if self.module.check_mode else []
        self.take_applied(self.zorvactl.json("revert", self.interface, *dry)["results"])

    def note(self, before, after, changed):
        self.result["changed"] = changed
        if changed:
            self.result["diff"] = {"before": before, "after": after}

    def take_applied(self, results):
        for each in results:
            if each["interface"] != self.interface:
                continue
            if each.get("problem"):
                self.module.fail_json(msg="stored, but not applied: " + each["problem"], **self.result)
            if each["changes"]:
                self.result.update(changed=True, applied=each["changes"], owner=each["owner"])

    def apply(self, *words):
        return self.zorvactl.json("apply", self.interface, *words)["results"]

    def bring_to_host(self):
        if not self.params["apply"]:
            return
        dry = self.apply("--dry-run")
        if not any(each["changes"] or each.get("problem") for each in dry):
            return
        if self.params["confirm"] == 0:
            self.take_applied(self.apply())
            return
        self.take_applied(self.start_trial())

    def start_trial(self):
        """Applies on trial. The process that waits for the confirmation goes on after this module."""
        words = self.zorvactl.words("apply", self.interface, "--confirm", str(self.params["confirm"]), "--output", "json")
        with tempfile.TemporaryFile() as out, tempfile.TemporaryFile() as err:
            process = subprocess.Popen(words, stdin=subprocess.DEVNULL, stdout=out, stderr=err, start_new_session=True, cwd="/")
            end = time.time() + LONGEST_APPLY
            while time.time() < end:
                code = process.poll()
                out.seek(0)
                document = document_of(to_text(out.read()))
                if document is not None and code in (None, 0):
                    self.result["trial"] = code is None
                    return document["results"]
                if code is not None:
                    err.seek(0)
                    self.module.fail_json(msg="stored, but not applied: " + to_text(err.read()).strip(), rc=code, **self.result)
                time.sleep(0.05)
        process.terminate()
        self.module.fail_json(msg="stored, but not applied within {0} s".format(LONGEST_APPLY), **self.result)


def main():
    module = AnsibleModule(
        argument_spec=dict(
            ARGUMENTS,
            interface={"type": "str", "required": True},
            servers={"type": "list", "elements": "str"},
            domain={"type": "str"},
            suffixes={"type": "list", "elements": "str"},
            state={"type": "str", "choices": ["present", "absent"], "default": "present"},
            apply={"type": "bool", "default": True},
            confirm={"type": "int", "default": 60},
        ),
        supports_check_mode=True,
    )
    if module.params["confirm"] < 0:
        module.fail_json(msg="confirm is a number of seconds, and not " + str(module.params["confirm"]))
    task = Task(module)
    task.absent() if module.params["state"] == "absent" else task.present()
    module.exit_json(**task.result)


if __name__ == "__main__":
    main()
