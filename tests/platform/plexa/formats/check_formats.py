#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Reads what format_cases prints, parses each document with parsers that are not ours, and compares it with its value.

    check_formats.py PROGRAM

Bytes that are no UTF-8 stand in every format as the visible text \\xff; what else a format cannot hold is undone here by the
rules that platform/plexa/README.md tells.
"""
import base64
import csv
import io
import json
import re
import subprocess
import sys
import unicodedata
import xml.etree.ElementTree

import yaml

FORMATS = ["simple", "table", "tree", "json", "yaml", "xml", "csv", "keyvalue"]
CLASSES = 27
csv.field_size_limit(1 << 30)


class Struct(list):
    """Pairs of names and values in order, and the structure's name."""
    def __init__(self, pairs, name=None):
        super().__init__(pairs)
        self.name = name


def text_of(bytes_):
    return bytes_.decode("utf-8", "backslashreplace")


class Dump:
    def __init__(self, text):
        self.text, self.at = text, 0

    def upto(self):
        end = self.text.index(";", self.at)
        part, self.at = self.text[self.at:end], end + 1
        return part

    def hex(self):
        return text_of(bytes.fromhex(self.upto()))

    def value(self):
        kind, self.at = self.text[self.at], self.at + 1
        if kind in "NTF":
            return {"N": None, "T": True, "F": False}[kind]
        if kind == "I":
            return int(self.upto())
        if kind == "S":
            return self.hex()
        if kind == "L":
            return [self.value() for _ in range(int(self.upto()))]
        name = self.hex()
        return Struct([(self.hex(), self.value()) for _ in range(int(self.upto()))], name)


def choose(value, names):
    """The outermost structures with these fields alone."""
    if isinstance(value, Struct):
        fields = dict(value)
        return Struct([(name, fields[name]) for name in names], value.name)
    return [choose(each, names) for each in value]


def same(left, right):
    """Equal in types too: 1 is not True, and the order of fields counts."""
    if isinstance(left, Struct) or isinstance(right, Struct):
        return (isinstance(left, Struct) and isinstance(right, Struct) and len(left) == len(right)
                and all(a[0] == b[0] and type(b[0]) is str and same(a[1], b[1]) for a, b in zip(left, right)))
    if isinstance(left, list):
        return isinstance(right, list) and len(left) == len(right) and all(map(same, left, right))
    return type(left) is type(right) and left == right


def parse_json(document):
    return json.loads(document, object_pairs_hook=Struct)


def parse_yaml(document, loader):
    def plain(value):
        if isinstance(value, dict):
            return Struct([(key, plain(each)) for key, each in value.items()])
        return [plain(each) for each in value] if isinstance(value, list) else value

    return plain(yaml.load(document, Loader=loader))


def parse_xml(document):
    def attribute(element, name):
        coded = element.get(name + "-base64")
        return base64.b64decode(coded, validate=True).decode() if coded is not None else element.get(name)

    def value(element):
        if element.tag == "record":
            return Struct([(attribute(each, "key"), value(each)) for each in element], attribute(element, "type"))
        if element.tag == "list":
            return [value(each) for each in element]
        assert len(element) == 0, "a scalar with elements"
        text = element.text or ""
        if element.tag == "text":
            if element.get("encoding") == "base64":
                return base64.b64decode(text, validate=True).decode()
            return text
        return {"int": int, "bool": {"true": True, "false": False}.get, "null": lambda _: None}[element.tag](text)

    root = xml.etree.ElementTree.fromstring(document)
    assert root.tag == "result" and len(root) == 1
    return value(root[0])


def names_agree(value, parsed):
    """XML alone tells the names of structures."""
    if isinstance(value, Struct):
        return value.name == parsed.name and all(names_agree(a[1], b[1]) for a, b in zip(value, parsed))
    return not isinstance(value, list) or all(map(names_agree, value, parsed))


def csv_cells(document):
    """The cells by the grammar of RFC 4180, each with whether it was quoted."""
    cell = re.compile(r'"((?:[^"]|"")*)"|([^",\r\n]*)')
    at, rows, row = 0, [], []
    while at < len(document):
        match = cell.match(document, at)
        quoted = match.group(1) is not None
        row.append((match.group(1).replace('""', '"') if quoted else match.group(2), quoted))
        at = match.end()
        if document.startswith(",", at):
            at += 1
        else:
            assert document.startswith("\r\n", at), f"no line end at {at}"
            at += 2
            rows.append(row)
            row = []
    assert not row
    return rows


def csv_text(cell):
    def undo(match):
        code = match.group(1)
        return {"n": "\n", "r": "\r", "t": "\t", "\\": "\\"}.get(code[0]) or chr(int(code[1:], 16))

    return re.sub(r"\\(\\|r|t|x[0-9a-f]{2}|u[0-9a-f]{4}|U[0-9a-f]{8})", undo, cell)


def check_csv(document, value):
    rows = csv_cells(document)
    read = list(csv.reader(io.StringIO(document, newline=""), strict=True))
    # A line without anything is a row of no cells to the module, and of one empty cell to the grammar.
    assert [[c for c, _ in row] if row != [("", False)] else [] for row in rows] == read, "csv.reader reads other cells"
    elements = value if isinstance(value, list) and not isinstance(value, Struct) else [value]
    if all(isinstance(each, Struct) for each in elements):
        columns = []
        for each in elements:
            columns += [name for name, _ in each if name not in columns]
        header = [csv_text(c) for c, _ in rows[0]]
        if elements:
            assert header == (columns or [""]), f"header {header}"
        expected = [[dict(each).get(name) for name in columns] for each in elements]
    else:
        assert rows[0] == [("result", False)], "header"
        expected = [[each] for each in elements]
    assert len(rows) == len(expected) + 1, "number of rows"
    for row, values in zip(rows[1:], expected):
        for (cell, quoted), each in zip(row, values):
            if each is None:
                assert (cell, quoted) == ("", False), f"unset is {cell!r}"
            elif isinstance(each, str):
                assert csv_text(cell) == each and (quoted or each != ""), f"{each!r} is {cell!r}"
            elif isinstance(each, list):
                assert same(each, parse_json(cell)), f"{each!r} is {cell!r}"
            else:
                assert cell == json.dumps(each), f"{each!r} is {cell!r}"
        assert len(row) == max(1, len(values)), "number of cells"


def parse_keyvalue(document):
    segment = re.compile(r'\[(\d+)\]|"(?:[^"\\]|\\.)*"|[^.=\[\]"]+')

    def path_of(line):
        if line.startswith("result="):
            return [], line[len("result="):]
        path, at = [], 0
        while line[at] != "=":
            match = segment.match(line, at)
            text = match.group(0)
            path.append(int(match.group(1)) if match.group(1) else json.loads(text) if text[0] == '"' else text)
            at = match.end()
            at += line[at] == "."
        return path, line[at + 1:]

    def put(node, path, value):
        if not path:
            return value
        step, rest = path[0], path[1:]
        if isinstance(step, int):
            node = [] if node is None else node
            assert step in (len(node) - 1, len(node)), "places of a list in order"
            if step == len(node):
                node.append(put(None, rest, value))
            else:
                node[step] = put(node[step], rest, value)
        else:
            node = Struct([]) if node is None else node
            if node and node[-1][0] == step:
                node[-1] = (step, put(node[-1][1], rest, value))
            else:
                node.append((step, put(None, rest, value)))
        return node

    result = None
    for line in document.removesuffix("\n").split("\n"):
        path, value = path_of(line)
        result = put(result, path, parse_json(value))
    return result


def texts(value):
    if isinstance(value, Struct):
        return [t for _, each in value for t in texts(each)]
    if isinstance(value, list):
        return [t for each in value for t in texts(each)]
    return [value] if isinstance(value, str) else []


def check_safe(format_, document):
    """Nothing that acts on a terminal or hides in it, whatever the texts hold."""
    allowed = "\r\n" if format_ == "csv" else "\n"
    for character in set(document):
        category = unicodedata.category(character)
        assert character in allowed or category not in ("Cc", "Cf", "Zl", "Zp"), f"holds {character!r}"
    assert document.replace("\r\n", "").count("\r") == 0, "a carriage return alone"
    assert document == "" or document.endswith("\n"), "does not end with its line"


def check(format_, document, value, name):
    text = document.decode("utf-8")
    check_safe(format_, text)
    if format_ == "json":
        assert same(value, parse_json(text))
    elif format_ == "yaml":
        assert same(value, parse_yaml(text, yaml.SafeLoader)), "as Python's parser reads it"
        assert same(value, parse_yaml(text, yaml.CSafeLoader)), "as libyaml reads it"
    elif format_ == "xml":
        parsed = parse_xml(document)
        assert same(value, parsed)
        assert names_agree(value, parsed), "names of structures"
    elif format_ == "csv":
        check_csv(text, value)
    elif format_ == "keyvalue":
        assert same(value, parse_keyvalue(text))
    elif not name.startswith("command "):  # whose settings leave fields out
        for each in texts(value):
            if each.isascii() and each.isprintable() and each.strip():
                assert each.strip() in text, f"{each!r} is not shown"


def main():
    output = subprocess.run([sys.argv[1]], stdout=subprocess.PIPE, check=True).stdout
    stream = io.BytesIO(output)
    failures, cases, documents, classes = 0, 0, 0, set()
    name = value = None
    while line := stream.readline():
        word, rest = line.decode().rstrip("\n").split(" ", 1)
        if word == "case":
            name, seen = rest, []
            cases += 1
            if name.startswith("command "):
                classes.add(name.split()[1])
        elif word == "value":
            value = Dump(rest).value()
        elif word == "chosen":
            value = choose(value, [text_of(bytes.fromhex(each)) for each in rest.split()])
        else:
            format_, _, size = rest.split()
            document = stream.read(int(size))
            stream.readline()
            documents += 1
            seen.append(format_)
            assert seen == FORMATS[:len(seen)], "a format is left out"
            try:
                check(format_, document, value, name)
            except Exception as error:  # pylint: disable=broad-except
                failures += 1
                if failures <= 20:
                    print(f"{name}: {format_}: {type(error).__name__}: {str(error)[:300]}\n    {document[:300]!r}")
    print(f"{cases} results of {len(classes)} command classes, {documents} documents, {failures} of them wrong")
    complete = len(classes) == CLASSES and documents == cases * len(FORMATS) and cases > 6000
    return 0 if failures == 0 and complete else 1


if __name__ == "__main__":
    sys.exit(main())
