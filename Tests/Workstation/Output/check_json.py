"""Holds what whole runs printed as JSON against its schema, and makes sure that the schema refuses everything else.

check_json.py SCHEMA FOLDER: takes the files that the runs of fxscan left in the folder; each is read once and removed.
"""

import copy
import json
import pathlib
import sys

try:
    import jsonschema
except ImportError:
    sys.exit("SKIPPED: python3-jsonschema is not installed")

# What no member may be.
WRONG = {"wrong": [None]}


def strict(schema):
    """The schema without room for members that it does not describe."""
    if isinstance(schema, list):
        return [strict(each) for each in schema]
    if not isinstance(schema, dict):
        return schema
    made = {key: strict(value) for key, value in schema.items()}
    if schema.get("type") == "object":
        made["additionalProperties"] = False
    return made


def variants(value):
    """Copies of a JSON value, each with one wrong member, or one too many."""
    if isinstance(value, dict):
        yield {**value, "undescribed": 1}
    keys = value if isinstance(value, dict) else range(len(value)) if isinstance(value, list) else []
    for key in keys:
        for change in [WRONG, *variants(value[key])]:
            changed = copy.copy(value)
            changed[key] = change
            yield changed


def shape(value):
    """Members, whatever their values: of documents of one shape one is enough to be spoilt."""
    if isinstance(value, dict):
        return tuple((key, shape(each)) for key, each in sorted(value.items()))
    return tuple(sorted({shape(each) for each in value})) if isinstance(value, list) else ()


def thinned(value):
    """One element of each shape is enough, too."""
    if isinstance(value, dict):
        return {key: thinned(each) for key, each in value.items()}
    return list({shape(each): thinned(each) for each in value}.values()) if isinstance(value, list) else value


def main():
    schema = json.loads(pathlib.Path(sys.argv[1]).read_text("utf-8"))
    jsonschema.Draft202012Validator.check_schema(schema)
    validator = jsonschema.Draft202012Validator(strict(schema))
    faults, types, shapes = [], {}, {}
    for file in sorted(pathlib.Path(sys.argv[2]).glob("*.json*")):
        text = file.read_text("utf-8")
        file.unlink()
        for document in map(json.loads, text.splitlines() if file.suffix == ".jsonl" else [text]):
            kind = document.get("type", "document")
            types[kind] = types.get(kind, 0) + 1
            shapes[shape(document)] = document
            if not validator.is_valid(document):
                part = {"document": "result", "summary": "result"}.get(kind, kind)
                for error in validator.evolve(schema={"$ref": f"#/$defs/{part}"}).iter_errors(document):
                    faults.append(f"{file.name}: {error.json_path}: {error.message[:300]}")
    wrong = 0
    for document in shapes.values():
        for changed in variants(thinned(document)):
            wrong += 1
            if validator.is_valid(changed):
                faults.append(f"taken although it is wrong: {json.dumps(changed)[:2000]}")
    faults += [f"no run printed a {kind}" for kind in ("document", "begin", "plan", "probe", "summary") if kind not in types]
    print(*faults, f"{types}, {wrong} wrong ones", sep="\n")
    return 1 if faults else 0


sys.exit(main())
