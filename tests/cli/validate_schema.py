#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Holds a result against what a command says its results are like.

    validate_schema.py DESCRIPTION RESULT      what `cli describe` printed, what the command printed in JSON

The schema must itself be one (2020-12). Exits 1 and says where the result breaks it.
"""
import json
import sys

import jsonschema

with open(sys.argv[1], encoding="utf-8") as file:
    schema = json.load(file)["result"]
with open(sys.argv[2], encoding="utf-8") as file:
    result = json.load(file)
if schema["$schema"] != jsonschema.Draft202012Validator.META_SCHEMA["$id"]:
    sys.exit(f"{schema['$schema']} is another dialect")
jsonschema.Draft202012Validator.check_schema(schema)
errors = list(jsonschema.Draft202012Validator(schema).iter_errors(result))
for error in errors:
    print(f"{error.json_path}: {error.message}", file=sys.stderr)
sys.exit(1 if errors else 0)
