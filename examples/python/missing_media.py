"""Lists the media that projects use and that are not there. Usage: missing_media.py PACKAGE..."""

import sys

import ktfiles

for package in sys.argv[1:]:
    for alternative in ktfiles.Project(package).alternatives:
        for media in alternative.missing:
            print(f"{package}: {alternative.name}: {media.path}")
