"""Keeps other programs from a file while two edits are made that belong together. Usage: hold_file.py FILE"""

import sys

import ktfiles

path = sys.argv[1]
with ktfiles.lock(path, write=True, timeout=10):
    chunks = ktfiles.chunks(path)
    count = int(chunks.get("cnt", b"0"))
    chunks["cnt"] = str(count + 1).encode()
    chunks["note"] = f"changed {count + 1} times".encode()
print(ktfiles.chunks(path)["note"].decode())
