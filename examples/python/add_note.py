"""Puts a note into a recording, and nothing else in it changes. Usage: add_note.py FILE TEXT"""

import sys

import ktfiles

path, text = sys.argv[1:]
try:
    ktfiles.chunks(path).add("note", text.encode(), replace=True, timeout=10)
except TimeoutError:
    sys.exit(f"{path}: another program is still at work on it")
except ktfiles.Error as error:
    sys.exit(str(error))
for chunk in ktfiles.chunks(path).list():
    print(f"{chunk.id}  {chunk.size}")
