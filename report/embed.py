#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Assembles the pages and writes them as C++ source.

embed.py FOLDER CHART_JS OUTPUT

{{part NAME}}, {{style NAME}}, {{script NAME}} and {{policy}} are filled in here. Every other name in
double braces is a hole that the program fills; {{text KEY}} is a text in the page's language.
Through the policy, a page runs and styles itself with nothing but what it contains, by its hash.
The build fails if a page or a script asks for a text that en.json does not have.
"""

import base64
import hashlib
import re
import sys
from pathlib import Path

sys.dont_write_bytecode = True  # The source tree stays as it is.
sys.path.insert(0, str(Path(__file__).resolve().parent / "languages"))
from compile import literal, read  # noqa: E402

PAGES = ("page", "index", "trend")


def content_hash(text):
    digest = hashlib.sha256(text.encode()).digest()
    return f"'sha256-{base64.b64encode(digest).decode()}'"


def policy(scripts, styles):
    allowed = " ".join(map(content_hash, scripts)) or "'none'"
    return "; ".join([
        "default-src 'none'",
        f"script-src {allowed}",
        f"style-src {' '.join(map(content_hash, styles))}",
        "base-uri 'none'",
        "form-action 'none'",
    ])


def check_texts(name, page, scripts, keys):
    """Texts of holes, and those of scripts: "page.range" is script.page.range in the table."""
    wanted = set(re.findall(r"\{\{text ([^\s}]+)\}\}", page))
    wanted |= {"script." + key for script in scripts
               for key in re.findall(r'"((?:common|page|trend|index)\.[A-Za-z0-9.]+)"', script)}
    missing = wanted - set(keys)
    foreign = {key for key in wanted if key.startswith("script.")
               and not key.startswith(("script.common.", f"script.{name}."))}
    if missing or foreign:
        sys.exit(f"{name}.html and its scripts can't have the texts "
                 + ", ".join(sorted(missing | foreign)))


def assemble(folder, name, chart, keys):
    """Pairs of a piece of the page and the hole that follows it."""
    scripts, styles = [], []

    def style(match):
        styles.append((folder / match[1]).read_text())
        return f"<style>{styles[-1]}</style>"

    def script(match):
        text = (chart if match[1] == "chart" else folder / match[1]).read_text()
        # A comment that names a map of the source would be fetched by a browser's inspector.
        text = re.sub(r"^//# sourceMappingURL=.*$", "", text, flags=re.MULTILINE)
        if "</script" in text.lower() or "<!--" in text or "{{" in text and match[1] != "chart":
            sys.exit(f"{match[1]} can't stand in a page")
        scripts.append(text)
        return f"<script>\0{len(scripts) - 1}\0</script>"

    page = (folder / f"{name}.html").read_text()
    page = re.sub(r"\{\{part (\S+)\}\}\n", lambda match: (folder / match[1]).read_text(), page)
    page = re.sub(r"\{\{style (\S+)\}\}", style, page)
    page = re.sub(r"\{\{script (\S+)\}\}", script, page)
    own = [text for text in scripts if len(text) < 100_000]  # Chart.js has no texts of ours.
    check_texts(name, page, own, keys)
    page = page.replace("{{policy}}", policy(scripts, styles))
    cut = re.split(r"\{\{([^}]*)\}\}", page)
    cut = [re.sub("\0(\\d+)\0", lambda match: scripts[int(match[1])], piece) for piece in cut]
    return list(zip(cut[::2], [*cut[1::2], ""]))


def raw(text):
    delimiter = "PAGE"
    while f"){delimiter}\"" in text:
        delimiter += "_"
    return f'R"{delimiter}({text}){delimiter}"'


def definition(name, pieces):
    body = ",\n".join(f"{{{raw(piece)}, {literal(hole)}}}" for piece, hole in pieces)
    return (f"const Piece {name}Pieces[] = {{{body}}};\n"
            f"const std::span<const Piece> {name}Template = {name}Pieces;\n")


def main(folder, chart, output):
    folder = Path(folder)
    keys = read(folder / "languages" / "en.json")
    source = '#include "report/Template.h"\n\nnamespace report {\n'
    for name in PAGES:
        source += definition(name, assemble(folder, name, Path(chart), keys))
    Path(output).write_text(source + "} // namespace report\n")


if __name__ == "__main__":
    main(*sys.argv[1:])
