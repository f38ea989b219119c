#!/usr/bin/env python3
"""Writes the property lists of this folder with Python's plistlib, an independent writer."""
import datetime
import plistlib
from pathlib import Path

VALUES = {
    "Nerova Hue Workbench": {"library_path": "/opt/\"quoted\" $(exit) `x` 'y' \\z \u00fc; & |"},
    "a:b": "colon",
    "John's": -7,
    "large": 4294967296,
    "real": 0.1,
    "yes": True,
    "date": datetime.datetime(2024, 2, 29, 12, 0, 0),
    "list": ["first", {"second": "inside"}],
    "bytes": b"\0\1\2",
    "empty": "",
}

for name, form in (("values.xml.plist", plistlib.FMT_XML), ("values.bin.plist", plistlib.FMT_BINARY)):
    (Path(__file__).parent / name).write_bytes(plistlib.dumps(VALUES, fmt=form, sort_keys=False))
