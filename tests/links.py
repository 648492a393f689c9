#!/usr/bin/env python3
"""Checks the links of Markdown pages to files and headings.

links.py FOLDER...

Faults caught: a page that was moved or renamed, a heading that was reworded, an installed page whose picture was left
behind. Links to other hosts are not followed. Exit code: 1 for a link that leads nowhere, 0 otherwise.
"""
import os
import re
import sys
from urllib.parse import unquote


def strip_code(text):
    text = re.sub(r"^```.*?^```", "", text, flags=re.M | re.S)
    return re.sub(r"`[^`\n]*`", lambda code: "x" * len(code.group()), text)


def anchors(path):
    """The names that a page's headings have: lower case, words joined by dashes."""
    with open(path, encoding="utf-8") as page:
        text = re.sub(r"^```.*?^```", "", page.read(), flags=re.M | re.S)
    names = set()
    for heading in re.findall(r"^#+ +(.+?)\s*$", text, flags=re.M):
        kept = re.sub(r"[^\w\- ]", "", heading.lower())
        names.add(kept.replace(" ", "-"))
    return names


def check(page):
    """The broken links of a page."""
    with open(page, encoding="utf-8") as file:
        text = strip_code(file.read())
    for link in re.findall(r"\]\(([^)\s]+)\)", text):
        if re.match(r"[a-z]+:", link):
            continue
        name, _, anchor = link.partition("#")
        target = os.path.normpath(os.path.join(os.path.dirname(page), unquote(name))) if name else page
        if not os.path.exists(target):
            yield link
        elif anchor and target.endswith(".md") and anchor not in anchors(target):
            yield link


def main():
    pages = []
    for folder in sys.argv[1:]:
        for place, folders, names in os.walk(folder):
            folders[:] = [name for name in folders if name not in (".git", "build")]
            pages += [os.path.join(place, name) for name in names if name.endswith(".md")]
    dead = [f"{page}: {link}" for page in sorted(pages) for link in check(page)]
    print("\n".join(dead + [f"{len(pages)} pages, {len(dead)} links that lead nowhere"]))
    return 1 if dead or not pages else 0


if __name__ == "__main__":
    sys.exit(main())
