#!/usr/bin/env python3
"""Writes cim-facts.json: what the CIM_ classes of this folder must agree with.

    extract_facts.py SCHEMA_DIR > cim-facts.json

SCHEMA_DIR holds DMTF's CIM Schema as MOF, one class to a file. Of each class the facts are its superclass, whether it
is abstract or an association, its properties (type, array, key, class of a reference) and its methods (return type,
parameters with their types). Names and types only; no text of the schema goes into the output.

This reader is on purpose none of the project's own: a test reads the same files with schema/Mof.h and compares.
"""
import json
import pathlib
import re
import sys

TOKEN = re.compile(r'//[^\n]*|/\*.*?\*/|"(?:\\.|[^"\\])*"|\'(?:\\.|[^\'\\])\'|[\w.+-]+|[{}\[\]();,:=]|#[^\n]*', re.S)
TYPES = {"boolean", "string", "datetime", "char16", "real32", "real64"} | {
    f"{sign}int{bits}" for sign in "us" for bits in (8, 16, 32, 64)}


class Reader:
    def __init__(self, text):
        self.tokens = [t for t in TOKEN.findall(text) if not t.startswith(("//", "/*", "#"))]
        self.at = 0

    def peek(self):
        return self.tokens[self.at] if self.at < len(self.tokens) else ""

    def take(self, expected=None):
        token = self.peek()
        assert expected is None or token.lower() == expected, (token, expected)
        self.at += 1
        return token

    def skip_to(self, *marks):
        depth = 0
        while depth or self.peek() not in marks:
            depth += {"{": 1, "(": 1, "[": 1, "}": -1, ")": -1, "]": -1}.get(self.take(), 0)

    def qualifiers(self):
        """The names of the qualifiers that stand here."""
        names = set()
        if self.peek() != "[":
            return names
        while self.take() != "]":
            names.add(self.take().lower())
            self.skip_to(",", "]")
        return names

    def typed_name(self):
        fact = {}
        first = self.take()
        if first.lower() in TYPES:
            fact["type"] = first.lower()
        else:
            self.take("ref")
            fact["type"], fact["class"] = "ref", first
        name = self.take()
        if self.peek() == "[":
            self.skip_to(";", ",", ")", "=")
            fact["array"] = True
        return name, fact

    def class_facts(self):
        qualifiers = self.qualifiers()
        self.take("class")
        name = self.take()
        fact = {"superclass": None, "abstract": "abstract" in qualifiers, "association": "association" in qualifiers,
                "properties": {}, "methods": {}}
        if self.peek() == ":":
            self.take()
            fact["superclass"] = self.take()
        self.take("{")
        while self.peek() != "}":
            self.feature(fact)
        return name, fact

    def feature(self, fact):
        qualifiers = self.qualifiers()
        name, typed = self.typed_name()
        if self.peek() == "(":
            fact["methods"][name] = {"type": typed["type"], "parameters": self.parameters()}
        else:
            if "key" in qualifiers:
                typed["key"] = True
            fact["properties"][name] = typed
        self.skip_to(";")
        self.take(";")

    def parameters(self):
        parameters = {}
        while self.take() != ")" and self.peek() != ")":
            self.qualifiers()
            name, typed = self.typed_name()
            parameters[name] = typed
        if self.peek() == ")":
            self.take()
        return parameters


def main():
    facts = {}
    for path in sorted(pathlib.Path(sys.argv[1]).glob("*/CIM_*.mof")):
        name, fact = Reader(path.read_text(encoding="utf-8")).class_facts()
        facts[name] = fact
    json.dump(facts, sys.stdout, indent=1, sort_keys=True)
    print()


main()
