#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Turns the tables of texts (en.json and its siblings) into C++.

compile.py FOLDER KEYS_HEADER TABLES_SOURCE LANGUAGE...

A table is nested JSON; "verdict": {"passed": "Passed"} has the key "verdict.passed". A text is a
string, or {"one": ..., "other": ...} if it depends on the number that its placeholder {count} gets.
English has every key. A text that another table lacks is English in the program; the test
LanguageTables reports it.
"""

import json
import sys
from pathlib import Path

FORMS = {"one", "other"}


def flat(table, prefix=""):
    """Key and forms of each text: a tuple (one, other)."""
    texts = {}
    for name, value in table.items():
        key = prefix + name
        if isinstance(value, str):
            texts[key] = (value, value)
        elif set(value) == FORMS:
            texts[key] = (value["one"], value["other"])
        else:
            texts.update(flat(value, key + "."))
    return texts


def read(path):
    def unique(pairs):
        names = [name for name, _ in pairs]
        doubled = {name for name in names if names.count(name) > 1}
        if doubled:
            sys.exit(f"{path} has {', '.join(doubled)} twice")
        return dict(pairs)

    return flat(json.loads(path.read_text(encoding="utf-8"), object_pairs_hook=unique))


def literal(text):
    # Bytes beyond ASCII stay as they are: sources are UTF-8. JSON's escapes are C++'s too.
    return json.dumps(text, ensure_ascii=False)


def write_if_changed(path, text):
    """Whoever includes an unchanged header is not compiled again."""
    if not path.is_file() or path.read_text(encoding="utf-8") != text:
        path.write_text(text, encoding="utf-8")


def main(folder, header, source, *languages):
    tables = {language: read(Path(folder) / f"{language}.json") for language in languages}
    keys = sorted(tables["en"], key=str.encode)
    write_if_changed(
        Path(header),
        "// Made from report/languages/en.json; change that file instead.\n#pragma once\n\n"
        "#include <string_view>\n\nnamespace languages {\n\n"
        "/// In the order of their bytes.\n"
        f"inline constexpr std::string_view textKeys[] = {{\n"
        + "".join(f"    {literal(key)},\n" for key in keys)
        + "};\n\n} // namespace languages\n")
    rows = []
    for language in languages:
        texts = [tables[language].get(key, tables["en"][key]) for key in keys]
        rows.append(f"const Forms table_{language}[] = {{\n" + "".join(
            f"    {{{literal(one)}, {literal(other)}}},\n" for one, other in texts) + "};\n")
    write_if_changed(
        Path(source),
        '#include "report/languages/Tables.h"\n\nnamespace languages {\nnamespace {\n\n'
        + "\n".join(rows)
        + "\n} // namespace\n\nconst Forms* const tables[] = {"
        + ", ".join(f"table_{language}" for language in languages)
        + "};\n\n} // namespace languages\n")


if __name__ == "__main__":
    main(*sys.argv[1:])
