#!/usr/bin/env python3
"""Compares the grammar of CIM-XML with documents.txt and, if available, with DMTF's document type.

    grammar_test.py --xmllint PROGRAM --grammar cim-xml.rng --documents documents.txt [--dtd DSP0203.dtd]

Without the document type, the grammar must accept and refuse what documents.txt says, and refuse every document that
has an element or an attribute that CIM-XML does not have. With it, both must also agree on every change of the valid
documents: a part is removed, doubled, moved, renamed, or replaced by each element of CIM-XML.
"""
import argparse
import copy
import pathlib
import subprocess
import sys
import tempfile
import xml.etree.ElementTree as ET

RNG = "{http://relaxng.org/ns/structure/1.0}"
XML = "{http://www.w3.org/XML/1998/namespace}"
NAMESPACE = '<LOCALNAMESPACEPATH><NAMESPACE NAME="root"/></LOCALNAMESPACEPATH>'

# The context of an element that is not a whole document.
FRAMES = [
    ('<CIM CIMVERSION="2.0" DTDVERSION="2.4">%s</CIM>', "MESSAGE DECLARATION"),
    ('<MESSAGE ID="1" PROTOCOLVERSION="1.4">%s</MESSAGE>',
     "SIMPLEREQ MULTIREQ SIMPLERSP MULTIRSP SIMPLEEXPREQ MULTIEXPREQ SIMPLEEXPRSP MULTIEXPRSP"),
    ("<SIMPLEREQ>%s</SIMPLEREQ>", "METHODCALL IMETHODCALL"),
    (f'<SIMPLEREQ>%s<IMETHODCALL NAME="O">{NAMESPACE}</IMETHODCALL></SIMPLEREQ>', "CORRELATOR"),
    ("<SIMPLERSP>%s</SIMPLERSP>", "METHODRESPONSE IMETHODRESPONSE"),
    ('<METHODRESPONSE NAME="M">%s</METHODRESPONSE>', "RETURNVALUE PARAMVALUE"),
    ('<IMETHODRESPONSE NAME="O">%s</IMETHODRESPONSE>', "IRETURNVALUE ERROR"),
    ("<DECLARATION>%s</DECLARATION>", "DECLGROUP"),
    ("<DECLGROUP>%s</DECLGROUP>", "VALUE.OBJECT QUALIFIER.DECLARATION"),
    ("<VALUE.OBJECT>%s</VALUE.OBJECT>", "CLASS INSTANCE instance"),
    ('<CLASS NAME="C">%s</CLASS>', "QUALIFIER METHOD"),
    ('<INSTANCE CLASSNAME="C">%s</INSTANCE>', "PROPERTY PROPERTY.ARRAY PROPERTY.REFERENCE"),
    ('<PROPERTY.REFERENCE NAME="R">%s</PROPERTY.REFERENCE>', "VALUE.REFERENCE"),
    ("<VALUE.REFERENCE>%s</VALUE.REFERENCE>", "INSTANCENAME CLASSNAME CLASSPATH"),
    ('<INSTANCENAME CLASSNAME="C">%s</INSTANCENAME>', "KEYVALUE"),
]
PLACES = {name: frame for frame, names in FRAMES for name in names.split()}

# Attributes whose values are words of a list.
WORDS = ("TYPE PARAMTYPE VALUETYPE ISARRAY EmbeddedObject PROPAGATED OVERRIDABLE TOSUBCLASS TOINSTANCE TRANSLATABLE "
         "CLASS ASSOCIATION REFERENCE PROPERTY METHOD PARAMETER INDICATION").split()

# Changes that the grammar refuses and the document type accepts.
STRICTER = {
    ("KEYVALUE", "without VALUETYPE"): "a key is a string where nothing else is said, so the value lacks its kind",
}


def whole(text):
    """The document of which the text is a part."""
    while (name := text[1:].split(None, 1)[0].split(">")[0].rstrip("/")) != "CIM":
        text = PLACES[name] % text
    return text


def read(path):
    """(verdict, title, document) of each document in the file."""
    for block in path.read_text(encoding="utf-8").split("\n\n"):
        first, _, text = block.strip("\n").partition("\n")
        verdict, _, title = first.partition(": ")
        if text.startswith("<"):
            yield verdict, title, whole(text)


class Validator:
    def __init__(self, xmllint, *options):
        self.command = [xmllint, "--noout", "--nonet", *options]

    def refused(self, documents):
        """The indices of the documents that are not valid."""
        refused = set()
        with tempfile.TemporaryDirectory() as directory:
            names = [f"{index}.xml" for index in range(len(documents))]
            for name, document in zip(names, documents):
                pathlib.Path(directory, name).write_text(document, encoding="utf-8")
            for start in range(0, len(names), 2000):
                run = subprocess.run(self.command + names[start:start + 2000], cwd=directory, stderr=subprocess.PIPE,
                                     text=True, check=False)
                lines = run.stderr.splitlines()
                refused |= {int(line.split(".xml ")[0]) for line in lines if line.endswith("fails to validate")}
                refused |= {int(line.split(" ")[1].split(".xml")[0]) for line in lines
                            if line.startswith("Document ") and " does not validate against " in line}
                if run.returncode not in (0, 3, 4):
                    sys.exit(f"xmllint ended with {run.returncode}: {run.stderr[:2000]}")
        return refused


def serialised(root):
    return ET.tostring(root, encoding="unicode")


def attribute_changes(element):
    """(what was done, how to do it, whether no document may have that) of each change of an element's attributes."""
    yield "with an unknown attribute", lambda one: one.set("UNKNOWN", "x"), True
    for name in list(element.attrib):
        short = name.replace(XML, "xml:")
        yield f"without {short}", lambda one, name=name: one.attrib.pop(name), False
        if name in WORDS and not (name == "CLASS" and element.tag != "SCOPE"):
            yield f"with an unknown {short}", lambda one, name=name: one.set(name, "unknown"), True


def content_changes(element, samples):
    """The same of an element's content."""
    def rename(one):
        one.tag = "UNKNOWN"

    def insert(index, tag):
        return lambda one: one.insert(index, copy.deepcopy(samples[tag]) if tag in samples else ET.Element(tag))

    yield "renamed", rename, True
    yield "with an unknown element at its beginning", insert(0, "UNKNOWN"), True
    yield "with an unknown element at its end", insert(len(element), "UNKNOWN"), True
    yield "emptied", lambda one: [one.remove(child) for child in list(one)], False
    yield "with text at its beginning", lambda one: setattr(one, "text", "text"), False
    for tag in samples:
        yield f"with {tag} at its end", insert(len(element), tag), False


def child_changes(element, samples):
    """The same of an element's children, as changes of the element."""
    children = list(element)
    for index, child in enumerate(children):
        if index and child.tag == children[index - 1].tag:
            continue
        where = f"child {index} ({child.tag})"
        yield f"{where} removed", lambda one, i=index: one.remove(one[i]), False
        yield f"{where} doubled", lambda one, i=index: one.insert(i, copy.deepcopy(one[i])), False
        if index + 1 < len(children):
            yield f"{where} after its neighbour", lambda one, i=index: one.insert(i, swap(one, i)), False
        for tag in samples:
            def replace(one, i=index, tag=tag):
                one[i] = copy.deepcopy(samples[tag])
            yield f"{where} replaced by {tag}", replace, False


def swap(one, index):
    second = one[index + 1]
    one.remove(second)
    return second


def mutants(documents, samples):
    """{changed document: (title, element, what was done, whether no document may have that)}"""
    found = {}
    done = set()
    for verdict, title, document in documents:
        if verdict not in ("valid", "typed"):
            continue
        root = ET.fromstring(document)
        for position, element in enumerate(root.iter()):
            changes = []
            if is_new(done, element.tag, *((name, name in WORDS and value) for name, value in element.items())):
                changes += attribute_changes(element)
            if verdict == "valid" and is_new(done, element.tag, *(child.tag for child in element), None):
                changes += [*content_changes(element, samples), *child_changes(element, samples)]
            for what, change, never in changes:
                changed = copy.deepcopy(root)
                change(list(changed.iter())[position])
                found.setdefault(serialised(changed), (title, element.tag, what, never))
    return found


def is_new(done, *shape):
    """Whether an element of this shape is seen for the first time."""
    known = shape in done
    done.add(shape)
    return not known


def samples_of(documents):
    """{tag: the smallest element of that name in the valid documents}"""
    samples = {}
    for verdict, _, document in documents:
        for element in ET.fromstring(document).iter() if verdict == "valid" else ():
            known = samples.get(element.tag)
            if known is None or len(serialised(element)) < len(serialised(known)):
                samples[element.tag] = element
    for element in samples.values():
        element.tail = None
    return samples


def uncovered(grammar, documents):
    """Elements and attributes of the grammar that no document that both accept has."""
    tree = ET.parse(grammar)
    known = {element.get("name") for kind in ("element", "attribute") for element in tree.iter(RNG + kind)}
    for verdict, _, document in documents:
        for element in ET.fromstring(document).iter() if verdict in ("valid", "typed") else ():
            known -= {element.tag, *(name.replace(XML, "xml:") for name in element.attrib)}
    return known


class Report:
    def __init__(self):
        self.problems = 0

    def say(self, text, document=""):
        self.problems += 1
        if self.problems <= 20:
            print(text, document, sep="\n" if document else "")


def check_verdicts(documents, refused, who, accepting, report):
    for index, (verdict, title, document) in enumerate(documents):
        if (index in refused) == (verdict in accepting):
            report.say(f"{who} {'refuses' if index in refused else 'accepts'} '{verdict}: {title}'", document)


def check_mutants(found, grammar, dtd, report):
    texts = [text for text, (_, _, _, never) in found.items() if never or dtd is not None]
    refused = grammar.refused(texts)
    for index, text in enumerate(texts):
        if found[text][3] and index not in refused:
            report.say("The grammar accepts what CIM-XML does not have: " + ", ".join(found[text][:3]), text)
    print(f"{len(texts)} changed documents, of which the grammar refuses {len(refused)}")
    if dtd is not None:
        compare([(text, *found[text]) for text in texts], refused, dtd.refused(texts), report)


def compare(changed, by_grammar, by_dtd, report):
    """Both must refuse the same of the changed documents."""
    explained = set()
    for index in by_grammar ^ by_dtd:
        text, title, tag, what, _ = changed[index]
        if index in by_grammar and (tag, what) in STRICTER:
            explained.add((tag, what))
        else:
            report.say(f"Only the {'grammar' if index in by_grammar else 'DTD'} refuses '{title}', {tag} {what}", text)
    for missing in STRICTER.keys() - explained:
        report.say(f"No document shows that the grammar is stricter about {missing}")


def main():
    parser = argparse.ArgumentParser()
    for name in ("xmllint", "grammar", "documents"):
        parser.add_argument("--" + name, required=True, type=pathlib.Path)
    parser.add_argument("--dtd", type=pathlib.Path)
    arguments = parser.parse_args()
    documents = list(read(arguments.documents))
    texts = [document for _, _, document in documents]
    grammar = Validator(arguments.xmllint, "--relaxng", arguments.grammar.resolve())
    dtd = Validator(arguments.xmllint, "--dtdvalid", arguments.dtd.resolve()) if arguments.dtd else None
    report = Report()
    for name in sorted(uncovered(arguments.grammar, documents)):
        report.say(f"No valid document has {name}")
    check_verdicts(documents, grammar.refused(texts), "The grammar", ("valid", "typed", "laxer"), report)
    if dtd is not None:
        check_verdicts(documents, dtd.refused(texts), "The DTD", ("valid", "typed", "stricter"), report)
    check_mutants(mutants(documents, samples_of(documents)), grammar, dtd, report)
    print(f"{len(documents)} documents, {report.problems} problems")
    sys.exit(1 if report.problems else 0)


main()
