"""Runs zorvactl on the managed host and reads its JSON documents."""
from __future__ import absolute_import, division, print_function

__metaclass__ = type

import json


def document_of(text):
    """The document, or None if the text is none of the version that is known here."""
    try:
        document = json.loads(text)
    except ValueError:
        return None
    if isinstance(document, dict) and document.get("version") == 1:
        return document
    return None


class Zorvactl(object):
    """The program, with the configuration that the task names."""

    def __init__(self, module):
        self.module = module
        self.program = module.params["executable"] or module.get_bin_path("zorvactl", required=True, opt_dirs=["/usr/local/bin"])

    def words(self, *words):
        return [self.program] + list(words)

    def json(self, *words):
        """What the command writes. Fails the task if the command fails."""
        code, out, err = self.module.run_command(self.words(*words) + ["--output", "json"])
        document = document_of(out)
        if code != 0 or document is None:
            self.module.fail_json(msg="zorvactl {0}: {1}".format(" ".join(words), (err or out).strip() or "no JSON document"), rc=code)
        return document

    def settings(self, interface):
        """The settings that are stored for the interface, by key; None if it has no file."""
        files = self.json("ifcfg", "list")["results"]
        if not any(each["interface"] == interface for each in files):
            return None
        values = {}
        for line in self.json("ifcfg", "show", interface)["lines"]:
            values.setdefault(line["key"], line["value"])
        return values


ARGUMENTS = {"executable": {"type": "path"}}
