#!/usr/bin/env python3
"""Turns the facts about CMPI in cmpi-abi.json into what abi_test.cpp and abi_test.c include.

usage: generate_abi_test.py cmpi-abi.json OUTPUT_FOLDER

Every entry of the facts becomes one line that the tests count, so that none is passed over in silence.
"""

import json
import pathlib
import re
import sys

# Macros by name and number of parameters. Their conditions are true in no version that the headers offer, and their
# slots were removed before version 1.0.
WITHDRAWN = {
    ("CMEvaluatePredicate", 4),
    ("CBSetInstance", 5),
}

# Type names in CMFmt... that no CMPI header defines, and their meaning.
TYPE_MENDS = {"CMPI_String": "CMPI_string", "CMPI_String*": "CMPIString*"}


class Facts:
    def __init__(self, path):
        self.data = json.loads(pathlib.Path(path).read_text())
        self.records = {record["name"]: record for record in self.data["records"]}
        # Version 1.0 lacks these whole types.
        types = self.data["records"] + self.data["enums"]
        self.only_200 = {entry["name"] for entry in types if not entry["in_100"]}
        # A macro that names a slot which its table lacks means the slot that version 2.1 names for it.
        self.slot_mends = {
            (defect["table"], defect["slot"]): defect["in_2_1"]["slot"]
            for defect in self.data["published_defects"]
            if defect["kind"] == "slot-missing" and "in_2_1" in defect
        }

    def field(self, record, name):
        return next(field for field in self.records[record]["fields"] if field["name"] == name)

    def slot(self, call):
        return self.slot_mends.get((call["table"], call["slot"]), call["slot"])


def is_function(field):
    return "returns" in field


def guarded(lines, only_200):
    """lines, compiled only where the headers offer version 2.0."""
    return ["#ifdef CMPI_VER_200", *lines, "#endif"] if only_200 else lines


def quoted(text):
    return json.dumps(text)


def records(facts):
    out = []
    for record in facts.data["records"]:
        name, kind = record["name"], record["kind"]
        whole = all(field["in_100"] for field in record["fields"])
        line = f"RECORD({name}, {kind} {record['tag']}, {kind}, {record['size']}, {record['align']})"
        out += guarded([line], not whole)
        for field in record["fields"]:
            line = f"FIELD({name}, {field['name']}, {field['offset']}, {field['size']}, {field['type']})"
            out += guarded([line], not field["in_100"])
    return out


def typedefs(facts):
    out = []
    for typedef in facts.data["typedefs"]:
        name, size = typedef["name"], typedef["size"]
        sized = f"TYPEDEF({name}, {size}, {typedef['align']}, {typedef['type']})"
        record = facts.records.get(name)
        grows = record and not all(field["in_100"] for field in record["fields"])
        unsized = f"TYPEDEF_WITHOUT_SIZE({name}, {typedef['type']})"
        if size is None:
            out.append(unsized)
        elif name in facts.only_200:
            out += guarded([sized], True)
        elif grows:
            out += ["#ifdef CMPI_VER_200", sized, "#else", unsized, "#endif"]
        else:
            out.append(sized)
    return out


def enums(facts):
    out = []
    for enum in facts.data["enums"]:
        out += guarded([f"ENUM({enum['name']}, enum {enum['tag']}, {enum['size']})"], not enum["in_100"])
        for value in enum["values"]:
            line = f"ENUMERATOR({enum['name']}, {value['name']}, {value['value']})"
            out += guarded([line], not value["in_100"])
    return out


def constants(facts):
    """The constants that have a value here; preprocessor_test.py tests the others."""
    out = []
    for constant in facts.data["constants"]:
        name = constant["name"]
        if not constant["active"]:
            continue
        if name == "CMPICurrentVersion":
            lines = [f"CURRENT_VERSION({name}, {constant['value']})"]
        elif "value" in constant:
            lines = [f"INTEGER({name}, {constant['value']})"]
        elif "string" in constant:
            lines = [f"STRING({name}, {quoted(constant['string'])})"]
        else:
            continue
        only_200 = "CMPI_VER_200" in constant["requires"] or name == "CMPI_VER_200"
        out += guarded(lines, only_200)
    return out


def fill_tables(facts):
    """For each table a function that points every slot to its recorder."""
    out = []
    for record in facts.data["records"]:
        slots = [field for field in record["fields"] if is_function(field)]
        if not slots:
            continue
        name = record["name"]
        lines = [f"inline void fill({name}& table) {{"]
        for field in slots:
            line = f"  table.{field['name']} = Slot<&{name}::{field['name']}>::call;"
            lines += guarded([line], not field["in_100"] and record["in_100"])
        lines.append("}")
        out += guarded(lines, not record["in_100"])
    return out


def macro_argument(facts, macro, name, call):
    """How a test passes the macro parameter name: (expression, words that the slot should see)."""
    if name == call["object"]:
        return "object", ["word(object)"]
    if name == "parms":
        return "CMFmtArgs1(CMFmtSint(-7))", ["1", "CMPI_sint32", "word(-7L)"]
    slot = facts.field(call["table"], facts.slot(call))
    for position, argument in enumerate(call["args"]):
        match = re.fullmatch(r"(?:\((.*)\))?(\w+)", argument)
        if match.group(2) != name:
            continue
        kind = slot["param_types"][position]
        expression = f"argument<{kind}>({position})"
        if match.group(1) == "CMPIValue*":
            # The macro takes a pointer to whatever variable holds the value.
            return f"CMPI_ABI_VALUE({position})", [f"word(CMPI_ABI_VALUE({position}))"]
        if match.group(1) == "void*":
            return f"argument<CMPIInstance *>({position})", [f"word(argument<CMPIInstance *>({position}))"]
        return expression, [f"word({expression})"]
    raise ValueError(f"{macro['name']}: the call does not pass on the parameter {name}")


def call_check(facts, macro, call, object_type, table, label):
    passed, words = [], {}
    for name in macro["params"]:
        expression, seen = macro_argument(facts, macro, name, call)
        passed.append(expression)
        words[name] = seen
    expected = []
    for argument in call["args"]:
        name = re.fullmatch(r"(?:\(.*\))?(\w+)", argument).group(1)
        expected += ["0"] if name == "NULL" else words[name]
    slot = f"&{table}::{facts.slot(call)}"
    return [
        f"inline void {label}() {{",
        f"  Fake<{object_type}> fake;",
        f"  {object_type}* object = fake.get();",
        f"  expectAnswer<{slot}>({macro['name']}({', '.join(passed)}));",
        f"  expectCall<{slot}>({{{', '.join(expected)}}});",
        "}",
    ]


def read_check(facts, macro, call, label):
    field = facts.field(call["table"], facts.slot(call))
    return [
        f"inline void {label}() {{",
        "  Fake<CMPIBroker> fake;",
        "  CMPIBroker* object = fake.get();",
        f"  fake.{call['via']}.{field['name']} = argument<{field['type']}>(5);",
        f"  EXPECT_EQ(word({macro['name']}(object)), word(argument<{field['type']}>(5)));",
        "}",
    ]


def pair_check(macro, label):
    kind, cast = macro["expands_to"]
    ctype = re.fullmatch(r"\((.*)\)v", cast).group(1)
    ctype, kind = TYPE_MENDS.get(ctype, ctype), TYPE_MENDS.get(kind, kind)
    given = f"argument<{ctype}>(9)" if "*" in ctype else "9"
    return [
        f"inline void {label}() {{",
        f"  EXPECT_TRUE((std::is_same_v<Unqualified<decltype(second({macro['name']}({given})))>, {ctype}>));",
        f"  EXPECT_EQ(inserts(CMFmtArgs1({macro['name']}({given}))),",
        f"            (Words{{1, {kind}, word(static_cast<{ctype}>({given}))}}));",
        "}",
    ]


def list_check(macro, label):
    count = macro["count"]
    given = ", ".join(f"CMFmtUint({k + 40})" for k in range(count))
    seen = "".join(f", CMPI_uint32, {k + 40}" for k in range(count))
    return [
        f"inline void {label}() {{",
        f"  EXPECT_EQ(inserts({macro['name']}({given})), (Words{{{count}{seen}}}));",
        "}",
    ]


def function_macros(facts):
    functions, cases = [], []
    for macro in facts.data["function_macros"]:
        name, kind = macro["name"], macro["kind"]
        only_200 = "CMPI_VER_200" in macro["requires"]
        label = f"check{name}"
        if (name, len(macro["params"])) in WITHDRAWN:
            cases.append(f"WITHDRAWN({name})")
            if sum(other["name"] == name for other in facts.data["function_macros"]) == 1:
                cases += [f"#ifdef {name}", f'#error "{name} has no slot to call"', "#endif"]
            continue
        if kind == "table-call" and macro["calls"][0]["table"] is None:
            for table in macro["generic_over"]:
                call = dict(macro["calls"][0], table=table)
                lines = call_check(facts, macro, call, table.removesuffix("FT"), table, f"{label}Of{table}")
                functions += guarded(lines, table in facts.only_200)
                cases += guarded([f"CASE_PART({name}, {label}Of{table})"], table in facts.only_200)
            cases.append(f"CASE_OF_PARTS({name})")
            continue
        if kind == "table-call":
            call = macro["calls"][0]
            lines = call_check(facts, macro, call, call["object_type"], call["table"], label)
        elif kind == "table-read":
            lines = read_check(facts, macro, macro["calls"][0], label)
        elif kind == "vararg-pair":
            lines = pair_check(macro, label)
        elif kind == "vararg-list":
            lines = list_check(macro, label)
        else:
            cases.append(f"CASE_BY_HAND({name})")
            continue
        functions += guarded(lines, only_200)
        cases += guarded([f"CASE({name}, {label})"], only_200)
        if only_200:
            cases += [f"#if !defined(CMPI_VER_200) && defined({name})", f'#error "{name} came with 2.0"', "#endif"]
    return functions, cases


def provider_function(field, name):
    params = ", ".join(field["param_types"])
    return f"static {field['returns']} {name}({params}) {{ return {{CMPI_RC_OK, nullptr}}; }}"


def expectations(facts, factory, broker_kind):
    """Checks of the table that a factory macro filled."""
    table = factory["table"]
    out = []
    for slot, value in factory["table_slots"].items():
        if slot == "miName":
            out.append(f"  EXPECT_STREQ(mi->ft->miName, {quoted(value.strip(chr(34)).replace('<pn>', broker_kind))});")
        elif value == "CMPICurrentVersion":
            out.append(f"  EXPECT_EQ(mi->ft->{slot}, CMPICurrentVersion);")
        else:
            target = value.replace("<pfx>", "Sample").replace("(pfx)", "(Sample)")
            out.append(f"  EXPECT_EQ(mi->ft->{slot}, static_cast<decltype(mi->ft->{slot})>({target}));")
    for slot in factory["table_slots_left_zero"]:
        null = [f"  EXPECT_EQ(mi->ft->{slot}, nullptr);"]
        if "trailing_extension_macro" in factory:
            owner = "CmpiIndicationMI::drive" if factory["style"] == "c++-class" else "Sample"
            full = f"  EXPECT_EQ(mi->ft->{slot}, {owner}{slot[0].upper()}{slot[1:]});"
            out += ["#ifdef CMPI_VER_86", full, "#else", *null, "#endif"]
        else:
            out += guarded(null, not facts.field(table, slot)["in_100"])
    return out


def mi_kind(factory):
    return re.fullmatch(r"<pn>_Create_(\w+)MI", factory["entry_point"]).group(1)


def helper_cases(factory):
    """Checks of a macro that the factories are made of: its text, in the branch that the compiler takes."""
    name, published = factory["name"], factory["expands_to"]
    if "!CMPI_VER_100" in factory["requires"]:
        return [f"WITHDRAWN_HELPER({name})"]
    if published == "":
        # These headers name the slots that stay empty with it.
        text = "NULL,NULL,"
    else:
        text = re.sub(r"\s*##\s*", "", published)
        text = re.sub(r"\b(pfx|pn)(?=[A-Z]|\b)|(?<=base)pn\b", "X", text).replace(" ", "")
    line = f"HELPER({name}(X), {quoted(text)})"
    if not factory["requires"]:
        return [line]
    conditions = [f"!defined({text[1:]})" if text[0] == "!" else f"defined({text})" for text in factory["requires"]]
    return [f"#if {' && '.join(conditions)}", line, "#else", f"OTHER_BRANCH({name})", "#endif"]


def extension_slots(facts, factory):
    """The slots that are filled only with CMPI_VER_86: (field, end of the function's name)."""
    if "trailing_extension_macro" not in factory:
        return []
    slots = factory["table_slots_left_zero"]
    return [(facts.field(factory["table"], slot), f"{slot[0].upper()}{slot[1:]}") for slot in slots]


def stub_functions(facts, factory, prefix):
    """The functions that a CM...MIStub with the prefix expects: (field, name)."""
    for slot, value in factory["table_slots"].items():
        field = facts.field(factory["table"], slot)
        if is_function(field):
            name = value.replace("CMInstanceMIStubChange(pfx)", "<pfx>ModifyInstance").replace("<pfx>", prefix)
            yield field, name


def factory_check(facts, factory, provider, create):
    kind = mi_kind(factory)
    unset = ["  EXPECT_EQ(mi->hdl, nullptr);"] if factory["style"] == "c" else []
    return [
        f"inline void check{factory['name']}() {{",
        f"  {factory['entry_returns']}mi = {create}({provider}_Create_{kind}MI);",
        "  ASSERT_NE(mi, nullptr);",
        *unset,
        *expectations(facts, factory, provider),
        "}",
    ]


def mi_factories(facts):
    functions, classes, uses, checks, cases = [], {}, [], [], []
    for factory in facts.data["mi_factories"]:
        name, style = factory["name"], factory["style"]
        if style == "helper":
            cases += helper_cases(factory)
            continue
        extension = extension_slots(facts, factory)
        if style == "c":
            functions += [provider_function(*function) for function in stub_functions(facts, factory, "Sample")]
            functions.append("#ifdef CMPI_VER_86")
            functions += [provider_function(field, f"Sample{end}") for field, end in extension]
            functions.append("#endif")
            uses.append(f"{name}(Sample, SampleProvider, sampleBroker, ++sampleHooks)")
            checks += factory_check(facts, factory, "SampleProvider", "createSample")
        else:
            own = f"Cmpi{mi_kind(factory)}MI"
            for slot, value in factory["table_slots"].items():
                field = facts.field(factory["table"], slot)
                if is_function(field):
                    owner, _, target = value.partition("::")
                    classes.setdefault(owner, []).append(provider_function(field, target))
            classes[own] += [provider_function(field, f"drive{end}") for field, end in extension]
            uses.append(f"{name}(ClassProvider<{own}>, ClassProvider)")
            checks += factory_check(facts, factory, "ClassProvider", "createOfClass")
        cases.append(f"CASE({name}, check{name})")
    return functions, classes, uses, checks, cases


def c_pointer_to(kind):
    """The C type of a pointer to kind, a type as the facts write it."""
    return kind.replace("(*)", "(**)", 1) if "(*)" in kind else f"{kind} *"


def c_provider_function(field, name):
    params = ", ".join(f"{kind} a{i}" for i, kind in enumerate(field["param_types"]))
    ignored = " ".join(f"(void)a{i};" for i in range(len(field["param_types"])))
    return f"static {field['returns']} {name}({params}) {{ {ignored} CMReturn(CMPI_RC_OK); }}"


def c_assert(condition, what):
    return f"_Static_assert({condition}, {quoted(what)});"


def c_layout(facts):
    """Sizes, offsets, types, enumerators and constants, checked by a C compiler."""
    out = []
    for record in facts.data["records"]:
        name = record["name"]
        out.append(c_assert(f"sizeof({name}) == {record['size']}", f"size of {name}"))
        for field in record["fields"]:
            member = f"{name}.{field['name']}"
            out.append(c_assert(f"offsetof({name}, {field['name']}) == {field['offset']}", f"offset of {member}"))
            of_type = f"_Generic(&(({name}*)0)->{field['name']}, {c_pointer_to(field['type'])}: 1, default: 0)"
            out.append(c_assert(of_type, f"type of {member}"))
    for enum in facts.data["enums"]:
        for value in enum["values"]:
            out.append(c_assert(f"{value['name']} == {value['value']}", f"value of {value['name']}"))
    for constant in facts.data["constants"]:
        if constant["active"] and "value" in constant:
            out.append(c_assert(f"{constant['name']} == {constant['value']}", f"value of {constant['name']}"))
    return out


def c_macros(facts):
    """A C function around each macro that calls a slot."""
    out = []
    for macro in facts.data["function_macros"]:
        name, call = macro["name"], (macro.get("calls") or [{}])[0]
        if macro["kind"] != "table-call" or (name, len(macro["params"])) in WITHDRAWN:
            continue
        for table in macro.get("generic_over", [call["table"]]):
            slot = facts.field(table, facts.slot(dict(call, table=table)))
            object_type = call["object_type"] or table.removesuffix("FT")
            params, passed = [f"{object_type}* object"], []
            for parameter in macro["params"]:
                if parameter == call["object"]:
                    passed.append("object")
                elif parameter == "parms":
                    passed.append("CMFmtArgs2(CMFmtSint(1), CMFmtChars(\"two\"))")
                else:
                    at = next(i for i, text in enumerate(call["args"]) if re.fullmatch(rf"(\(.*\))?{parameter}", text))
                    params.append(f"{slot['param_types'][at]} {parameter}_")
                    passed.append(f"{parameter}_")
            suffix = table if "generic_over" in macro else ""
            label = f"cUses{name}{suffix}"
            out.append(f"void {label}({', '.join(params)});")
            out.append(f"void {label}({', '.join(params)}) {{ (void){name}({', '.join(passed)}); }}")
    return out


def c_stubs(facts):
    """A provider in C made with each CM...MIStub."""
    out = []
    for factory in facts.data["mi_factories"]:
        if factory["style"] != "c":
            continue
        out += [c_provider_function(*function) for function in stub_functions(facts, factory, "C")]
        out.append("#ifdef CMPI_VER_86")
        out += [c_provider_function(field, f"C{end}") for field, end in extension_slots(facts, factory)]
        out.append("#endif")
        out.append(f"{factory['name']}(C, CProvider, cBroker, CMNoHook)")
    return out


def counts(facts):
    out = []
    for key, value in facts.data["counts"].items():
        name = "".join(part.title() for part in key.split("_"))
        out.append(f"constexpr int k{name} = {value};")
    return out


def main():
    facts = Facts(sys.argv[1])
    folder = pathlib.Path(sys.argv[2])
    folder.mkdir(parents=True, exist_ok=True)
    macro_functions, macro_cases = function_macros(facts)
    functions, classes, uses, factory_checks, factory_cases = mi_factories(facts)
    class_lines = []
    for owner, members in classes.items():
        base = "" if owner == "CmpiBaseMI" else " : CmpiBaseMI"
        extra = ["BASE_MEMBERS"] if owner == "CmpiBaseMI" else []
        members = list(dict.fromkeys(member for member in members))
        class_lines += [f"struct {owner}{base} {{", *extra, *members, "};"]
    files = {
        "abi_counts.inc": counts(facts),
        "abi_records.inc": records(facts),
        "abi_typedefs.inc": typedefs(facts),
        "abi_enums.inc": enums(facts),
        "abi_constants.inc": constants(facts),
        "abi_fill.inc": fill_tables(facts),
        "abi_macro_checks.inc": macro_functions,
        "abi_macro_cases.inc": macro_cases,
        "abi_factory_functions.inc": functions + class_lines,
        "abi_factory_uses.inc": uses,
        "abi_factory_checks.inc": factory_checks,
        "abi_factory_cases.inc": factory_cases,
        "abi_c.inc": c_layout(facts) + c_macros(facts) + c_stubs(facts),
    }
    for name, lines in files.items():
        (folder / name).write_text("\n".join(lines) + "\n")


if __name__ == "__main__":
    main()
