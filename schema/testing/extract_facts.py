#!/usr/bin/env python3
"""Writes cim-facts.mof: what the CIM_ classes and qualifier types here must agree with.

    extract_facts.py SCHEMA_DIR > cim-facts.mof

SCHEMA_DIR holds DMTF's CIM Schema as MOF; subset.mof in it names the files in their order. The facts are the types of
the qualifiers; and of each class its superclass, its properties and methods with their types, and those qualifiers that
mean something to a program. No text goes into the output: a Description, or the words of a Values, are kept as a
checksum.

This reader is on purpose none of the project's own: a test reads the same files with schema/Mof.h and compares.
"""
import pathlib
import re
import sys

TOKEN = re.compile(r'//[^\n]*|/\*.*?\*/|"(?:\\.|[^"\\])*"|\'(?:\\.|[^\'\\])\'|[\w.+-]+|[{}\[\]();,:=]|#[^\n]*', re.S)
ESCAPE = re.compile(r"\\(x[0-9A-Fa-f]{1,4}|.)", re.S)
KEPT = {name.lower() for name in (
    "Abstract Aggregate Aggregation ArrayType Association Deprecated EmbeddedInstance EmbeddedObject Exception In "
    "Indication Key Max MaxLen MaxValue Min MinValue Out Override Propagated PUnit Required ValueMap Version Weak "
    "Write").split()}
TEXTS = {"description", "values"}
HEADER = """// Facts of CIM Schema 2.49 that the classes and qualifier types here must agree with: names, types, and the qualifiers
// that mean something to a program. Texts are not here; a checksum replaces each.
//
// Written by extract_facts.py.
"""


def unquoted(token):
    """The text of a string literal."""
    def character(match):
        code = match[1]
        return chr(int(code[1:], 16)) if code[0] == "x" and len(code) > 1 else \
            {"b": "\b", "t": "\t", "n": "\n", "f": "\f", "r": "\r"}.get(code, code)
    return ESCAPE.sub(character, token[1:-1])


def checksum(text):
    """FNV-1a with 32 bits."""
    value = 0x811C9DC5
    for byte in text.encode("utf-8"):
        value = (value ^ byte) * 0x01000193 % 2**32
    return f"#{value:08x}"


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

    def take_to(self, *marks):
        """The tokens before the next of the marks that is within no bracket."""
        begin, depth = self.at, 0
        while depth or self.peek() not in marks:
            depth += {"{": 1, "(": 1, "[": 1, "}": -1, ")": -1, "]": -1}.get(self.take(), 0)
        return self.tokens[begin:self.at]

    def declarations(self):
        """The qualifier types and classes of a file, as lines."""
        while self.peek():
            if self.peek().lower() == "qualifier":
                yield tidy(self.take_to(";")) + self.take(";")
            else:
                yield from self.class_lines()

    def qualifiers(self):
        """Those that are kept, as a text that goes before an element."""
        kept = []
        if self.peek() == "[":
            while self.take() != "]":
                name = self.take()
                value = self.take_to(",", "]")
                if name.lower() in KEPT:
                    kept.append(name + "".join(joined(value)))
                elif name.lower() in TEXTS:
                    kept.append(f'{name}("{checksum(text_of(value))}")' if value[0] == "(" else
                                f'{name}{{"{checksum(text_of(value))}"}}')
        return f"[{', '.join(kept)}] " if kept else ""

    def class_lines(self):
        qualifiers = self.qualifiers()
        yield qualifiers + tidy(self.take_to("{")) + " {"
        self.take("{")
        while self.peek() != "}":
            qualifiers = self.qualifiers()
            feature = self.take_to(";", "(", "=")
            line = qualifiers + tidy(feature)
            if self.peek() == "(":
                self.take()
                line += f"({', '.join(self.parameters())})"
            default = tidy(self.take_to(";"))
            yield f"  {line}{' ' if default else ''}{default}" + self.take(";")
        self.take("}")
        yield "}" + self.take(";")

    def parameters(self):
        while self.peek() != ")":
            yield self.qualifiers() + tidy(self.take_to(",", ")"))
            if self.peek() == ",":
                self.take()
        self.take(")")


def joined(value):
    """The tokens of a value; adjacent strings are one."""
    for index, token in enumerate(value):
        if index and token[0] == '"' and value[index - 1][0] == '"':
            token = token[1:]
        if index + 1 < len(value) and token[-1] == '"' and value[index + 1][0] == '"':
            token = token[:-1]
        yield token + (" " if token == "," else "")


def text_of(value):
    """The strings of a value, one to a line."""
    lines = [[]]
    for token in value:
        if token == ",":
            lines.append([])
        elif token[0] == '"':
            lines[-1].append(unquoted(token))
    return "\n".join("".join(line) for line in lines)


def tidy(tokens):
    """The tokens as a line: uint16 Sizes[4]"""
    return re.sub(r" ?([\[(]) | (?=[\]),;])", r"\1", " ".join(tokens))


def main():
    folder = pathlib.Path(sys.argv[1])
    print(HEADER)
    for name in re.findall(r'#pragma include \("([^"]+)"\)', (folder / "subset.mof").read_text(encoding="utf-8")):
        for line in Reader((folder / name).read_text(encoding="utf-8")).declarations():
            print(line)


main()
