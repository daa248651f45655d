#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Reads a document as a program that gets it from a pipe would, and prints what an expression makes of it.

    formats.py json|yaml|xml|csv|keyvalue EXPRESSION < DOCUMENT

The expression sees the document as d: for json and yaml what the parser gives, for xml the root element, for csv a list of
rows as dicts, for keyvalue a dict from paths to values.
"""
import csv
import io
import json
import sys
import xml.etree.ElementTree

import yaml

READERS = {
    "json": json.loads,
    "yaml": yaml.safe_load,
    "xml": xml.etree.ElementTree.fromstring,
    "csv": lambda text: list(csv.DictReader(io.StringIO(text.decode(), newline=""), strict=True)),
    "keyvalue": lambda text: {path: json.loads(value) for path, value in
                              (line.split("=", 1) for line in text.decode().splitlines())},
}

d = READERS[sys.argv[1]](sys.stdin.buffer.read())
print(eval(sys.argv[2], {"d": d, "json": json}))  # the expression stands in the test that runs this
