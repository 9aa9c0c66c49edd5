#!/usr/bin/env python3
"""Compares the headers with cmpi-abi.json where one translation unit is not enough: other platforms, other versions of
CMPI, C beside C++, and each header included alone.

usage: preprocessor_test.py --c COMPILER --cxx COMPILER [unittest options]
"""

import argparse
import functools
import itertools
import json
import pathlib
import re
import subprocess
import sys
import unittest

FOLDER = pathlib.Path(__file__).resolve().parent
FACTS = json.loads((FOLDER / "cmpi-abi.json").read_text())
PLATFORM = "CMPI_PLATFORM_LINUX_GENERIC_GNU"
HEADERS = list(FACTS["headers"])
STRICT = ["-Wall", "-Wextra", "-Wpedantic", "-Wconversion", "-Wshadow", "-Werror"]
COMPILERS = {}

# The headers choose these by CMPI_VERSION; the tests of the version check them.
VERSION_NAMES = {"CMPI_VER_100", "CMPI_VER_200", "CMPICurrentVersion"}

# The published text is empty there; these headers name the slots that stay empty with it.
TEXT_MENDS = {("CMIndicationMIFactoryExtensions", ""): "NULL,NULL,"}


def compiler(language):
    return [COMPILERS[language], "-x", language, "-std=c11" if language == "c" else "-std=c++20", f"-I{FOLDER}"]


def run(language, source, *options):
    command = [*compiler(language), *options, "-"]
    return subprocess.run(command, input=source, text=True, capture_output=True, timeout=120, check=False)


@functools.lru_cache(maxsize=None)
def macros(language, defines):
    """All object-like macros after the headers were included: name to text without blanks."""
    source = "".join(f'#include "{header}"\n' for header in HEADERS)
    result = run(language, source, "-E", "-dM", *(f"-D{define}" for define in defines))
    if result.returncode != 0:
        raise AssertionError(f"{language} {defines}: {result.stderr}")
    found = re.findall(r"^#define (\w+)(?: (.*))?$", result.stdout, re.MULTILINE)
    return {name: re.sub(r"\s", "", text) for name, text in found}


def holds(requirement, language, defines):
    """Whether a preprocessor condition of the facts holds."""
    if requirement == "!HAVE_STRUCT_TIMESPEC":
        return not any(define.startswith("HAVE_STRUCT_TIMESPEC") for define in defines)
    names = {define.partition("=")[0] for define in defines} | {"CMPI_VER_100", "CMPI_VER_200"}
    if language == "c++":
        names.add("__cplusplus")
    text = re.sub(r"\(__GNUC__ >= 4\)", "True", requirement)
    text = re.sub(r"defined\((\w+)\)", r"\1", text)
    text = re.sub(r"\b(?!True\b)([A-Za-z_]\w*)", lambda match: str(match[1] in names), text)
    text = text.replace("!", " not ").replace("&&", " and ").replace("||", " or ")
    return eval(text, {"__builtins__": {}})  # the words True, False, not, and, or, and parentheses


class Platforms(unittest.TestCase):
    def test_each_platform_of_the_standard_is_accepted(self):
        for symbol in FACTS["platform_selection"]["symbols"]:
            with self.subTest(symbol):
                self.assertIn(symbol, macros("c++", (symbol,)))

    def test_no_platform_is_an_error_that_says_so(self):
        for header in HEADERS:
            with self.subTest(header):
                result = run("c", f'#include "{header}"\n', "-fsyntax-only")
                self.assertNotEqual(result.returncode, 0)
                self.assertIn("no platform chosen", result.stderr)

    def test_every_constant_without_a_value_has_its_text_where_it_applies(self):
        defines = [
            (PLATFORM,),
            (PLATFORM, "CMPI_VER_86"),
            ("CMPI_PLATFORM_WIN32_IX86_MSVC",),
            ("CMPI_PLATFORM_ZOS_ZSERIES_IBM",),
            ("CMPI_PLATFORM_HPUX_ACC",),
        ]
        configurations = list(itertools.product(("c", "c++"), defines))
        checked = 0
        for constant in FACTS["constants"]:
            name = constant["name"]
            if name in VERSION_NAMES or "value" in constant or "string" in constant:
                continue
            text = re.sub(r"\s", "", constant["text"])
            text = TEXT_MENDS.get((name, text), text)
            fitting = [
                configuration
                for configuration in configurations
                if all(holds(requirement, *configuration) for requirement in constant["requires"])
            ]
            with self.subTest(name, text=text):
                self.assertTrue(fitting, "no configuration meets its conditions")
                for configuration in fitting:
                    self.assertEqual(macros(*configuration).get(name), text, configuration)
            checked += 1
        elsewhere = FACTS["counts"]["constants_integer"] + FACTS["counts"]["constants_string"]
        by_version = [c for c in FACTS["constants"] if c["name"] in VERSION_NAMES and "value" not in c]
        self.assertEqual(checked + elsewhere + len(by_version), FACTS["counts"]["constants"])


class Versions(unittest.TestCase):
    def test_the_version_that_is_asked_for_is_the_one_that_holds(self):
        for case in FACTS["version_selection"]["cases"]:
            version = case["CMPI_VERSION"]
            if case.get("error"):
                continue
            with self.subTest(version):
                found = macros("c++", (PLATFORM,) if version is None else (PLATFORM, f"CMPI_VERSION={version}"))
                current = found["CMPICurrentVersion"]
                self.assertEqual(int(found[current]), case["CMPICurrentVersion"])
                for name in ("CMPI_VER_100", "CMPI_VER_200", *FACTS["version_selection"]["never_defined"]):
                    self.assertEqual(name in found, name in case["defines"], name)

    def test_another_version_is_an_error_that_says_so(self):
        for version in ("210", "90", "0"):
            with self.subTest(version):
                options = ["-fsyntax-only", f"-D{PLATFORM}", f"-DCMPI_VERSION={version}"]
                result = run("c", '#include "cmpidt.h"\n', *options)
                self.assertNotEqual(result.returncode, 0)
                self.assertIn("CMPI_VERSION must be 100 or 200", result.stderr)

    def test_all_versions_means_the_latest(self):
        found = macros("c", (PLATFORM, "CMPI_VERSION=100", "CMPI_VER_ALL"))
        self.assertIn("CMPI_VER_200", found)

    def test_version_one_lacks_what_came_later(self):
        found = macros("c", (PLATFORM, "CMPI_VERSION=100"))
        later = [c["name"] for c in FACTS["constants"] if c["requires"] == ["CMPI_VER_200"]]
        self.assertTrue(later)
        for name in later:
            self.assertNotIn(name, found)

    def test_synonyms_can_be_turned_off(self):
        found = macros("c", (PLATFORM, "CMPI_NO_SYNONYM_SUPPORT"))
        synonyms = [c["name"] for c in FACTS["constants"] if c["requires"] == ["!CMPI_NO_SYNONYM_SUPPORT"]]
        self.assertTrue(synonyms)
        for name in synonyms:
            self.assertNotIn(name, found)


class Includes(unittest.TestCase):
    def test_each_header_stands_alone_under_strict_warnings(self):
        variants = [[], ["-DCMPI_INLINE"], ["-DCMPI_VERSION=100"], ["-DCMPI_VERSION=100", "-DCMPI_INLINE"]]
        for language, header, variant in itertools.product(("c", "c++"), HEADERS, variants):
            with self.subTest(language=language, header=header, variant=variant):
                strict = [*STRICT, "-Wold-style-cast"] if language == "c++" else STRICT
                source = f'#include "{header}"\nextern int unit;\n'
                result = run(language, source, "-fsyntax-only", *strict, f"-D{PLATFORM}", *variant)
                self.assertEqual(result.returncode, 0, result.stderr)

    def test_each_header_keeps_its_guard_and_its_includes(self):
        for header, facts in FACTS["headers"].items():
            text = (FOLDER / header).read_text()
            with self.subTest(header):
                self.assertIn(f"#ifndef {facts['guard']}\n#define {facts['guard']}\n", text)
                for include in facts["includes"]:
                    spelled = f'"{include["file"]}"' if include["form"] == "local" else f"<{include['file']}>"
                    self.assertIn(f"#include {spelled}\n", text)
                self.assertEqual('extern "C" {' in text, facts["extern_c_in_cxx"])

    def test_each_name_lives_in_its_header(self):
        for header, facts in FACTS["headers"].items():
            text = (FOLDER / header).read_text()
            for name in [*facts["typedefs"], *facts["enums"], *facts["constants"], *facts["records_declared_only"]]:
                with self.subTest(header, name=name):
                    self.assertRegex(text, rf"\b{name}\b")


if __name__ == "__main__":
    parser = argparse.ArgumentParser()
    parser.add_argument("--c", required=True)
    parser.add_argument("--cxx", required=True)
    arguments, rest = parser.parse_known_args()
    COMPILERS.update({"c": arguments.c, "c++": arguments.cxx})
    unittest.main(argv=[sys.argv[0], *rest])
