"""The schemas of docs/schemas, and whether JSON that the command wrote is as they say."""
import functools
import json
import pathlib

import jsonschema

FOLDER = pathlib.Path(__file__).parents[2] / "docs" / "schemas"
SHAPES = {"--json": "array", "--jsonl": "lines", "--ndjson": "lines"}
OBJECTS = {"get": "chunks-get", "add": "chunks-edit", "remove": "chunks-edit", "media": "project-media", "dirs": "project-dirs"}


def shape_of(arguments):
    """How the arguments ask for JSON, if they do."""
    words = [str(argument) for argument in arguments if isinstance(argument, (str, pathlib.Path))]
    words = words[:words.index("--")] if "--" in words else words
    shape = next((SHAPES[word] for word in words if word in SHAPES), None)
    return shape or ("lines" if words and words[0] == "index" and name_of(words) == "index-export" else None)


def name_of(arguments):
    """The schema of what a command line prints."""
    words = [str(argument) for argument in arguments]
    verb, item = words[0], next((word for word in words[1:] if not word.startswith("-")), "")
    if verb == "index" and (item == "export" or "--records" in words):
        return "index-export"
    if verb == "index" and item == "merge":
        return "index-merge"
    if verb in ("adm", "info") and "--check" in words:
        return f"{verb}-check"
    if verb == "chunks" and item in OBJECTS or verb == "project" and item in OBJECTS:
        return OBJECTS[item]
    if verb == "tags" and item in ("set", "remove", "copy"):
        return "tags-edit"
    if verb == "meta" and item in ("set", "remove", "import", "copy"):
        return "meta-edit"
    if verb == "project" and item in ("backup", "restore", "settle", "rename-alternative"):
        return "project-edit"
    return verb


def with_common(schema):
    """The schema with what it refers to in common.json."""
    common = json.loads((FOLDER / "common.json").read_text())["$defs"]
    schema["$defs"] |= {f"common-{name}": part for name, part in common.items()}
    return json.loads(json.dumps(schema).replace("common.json#/$defs/", "#/$defs/common-"))


@functools.cache
def validator(name):
    schema = with_common(json.loads((FOLDER / f"{name}.json").read_text()))
    jsonschema.Draft202012Validator.check_schema(schema)
    return jsonschema.Draft202012Validator(schema)


def check(arguments, output, shape):
    """Raises an exception for what is not as its schema says, or no JSON: NaN and the same key twice are none."""
    def unique(pairs):
        keys = [key for key, _ in pairs]
        if len(set(keys)) != len(keys):
            raise ValueError(f"a key twice: {keys}")
        return dict(pairs)
    read = functools.partial(json.loads, object_pairs_hook=unique, parse_constant=lambda word: 1 / 0)
    text = output.decode()
    records = [read(line) for line in text.splitlines()] if shape == "lines" else read(text)
    try:
        validator(name_of(arguments)).validate(records)
    except jsonschema.ValidationError as error:
        best = jsonschema.exceptions.best_match([error])
        raise AssertionError(f"{arguments}: {best.message[:2000]} at {list(best.absolute_path)}") from None
