#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Assembles the pages and writes them as C++ source.

embed.py FOLDER CHART_JS OUTPUT

A page names what it is made of in double braces: {{part NAME}}, {{style NAME}}, {{script NAME}}
and {{policy}} are filled in here, and {{data}} is where the program puts data in, which cuts the
page in pieces.
The policy lets nothing run or style but what stands in the page now, by its hash.
"""

import base64
import hashlib
import re
import sys
from pathlib import Path


def content_hash(text):
    digest = hashlib.sha256(text.encode()).digest()
    return f"'sha256-{base64.b64encode(digest).decode()}'"


def policy(scripts, styles):
    return "; ".join([
        "default-src 'none'",
        f"script-src {' '.join(map(content_hash, scripts))}",
        f"style-src {' '.join(map(content_hash, styles))}",
        "base-uri 'none'",
        "form-action 'none'",
    ])


def assemble(folder, name, chart):
    scripts, styles = [], []

    def style(match):
        styles.append((folder / match[1]).read_text())
        return f"<style>{styles[-1]}</style>"

    def script(match):
        text = (chart if match[1] == "chart" else folder / match[1]).read_text()
        # A comment that names a map of the source would be fetched by a browser's inspector.
        text = re.sub(r"^//# sourceMappingURL=.*$", "", text, flags=re.MULTILINE)
        if "</script" in text.lower() or "<!--" in text:
            sys.exit(f"{match[1]} can't stand in a page")
        scripts.append(text)
        return f"<script>{text}</script>"

    page = (folder / name).read_text()
    page = re.sub(r"\{\{part (\S+)\}\}\n", lambda match: (folder / match[1]).read_text(), page)
    page = re.sub(r"\{\{style (\S+)\}\}", style, page)
    page = re.sub(r"\{\{script (\S+)\}\}", script, page)
    return page.replace("{{policy}}", policy(scripts, styles)).split("{{data}}")


def literal(text):
    delimiter = "PAGE"
    while f"){delimiter}\"" in text:
        delimiter += "_"
    return f'R"{delimiter}({text}){delimiter}"'


def definition(name, pieces):
    body = ",\n".join(literal(piece) for piece in pieces)
    return f"const std::string_view {name}[{len(pieces)}] = {{{body}}};\n"


def main(folder, chart, output):
    source = '#include "report/Template.h"\n\nnamespace report {\n'
    source += definition("pageTemplate", assemble(Path(folder), "page.html", Path(chart)))
    for name in ("index", "trend"):
        source += definition(f"{name}Template", assemble(Path(folder), f"{name}.html", Path(chart)))
    Path(output).write_text(source + "} // namespace report\n")


if __name__ == "__main__":
    main(*sys.argv[1:])
