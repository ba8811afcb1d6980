"""A table of the loops below folders, by tempo. Usage: tags_table.py FOLDER..."""

import sys
from typing import Any, Dict, List

import ktfiles

COLUMNS = ["tempo", "key", "mode", "signature", "genre", "path"]


def words(value: Any) -> str:
    return f"{value:g}" if isinstance(value, float) else str(value)


loops: List[Dict[str, Any]] = []
for loop in ktfiles.scan(list(sys.argv[1:]), on_error=lambda error: print(error, file=sys.stderr)):
    loops.append(loop)
for loop in sorted(loops, key=lambda loop: float(loop.get("tempo", 0))):
    print("\t".join(words(loop.get(column, "")) for column in COLUMNS))
