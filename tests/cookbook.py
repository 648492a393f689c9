#!/usr/bin/env python3
"""Compares the snippets of docs/cookbook.md, and one of docs/text.md, with the examples that they are cut from.

cookbook.py [--write | --draw FOLDER_OF_EXAMPLES OUT]

A snippet is the text between the lines "// [cookbook" and "// cookbook]" of an example, all such parts joined. In the
page it follows the line that links the example. --write updates the pages. --draw has the examples draw their pictures
and compares them with those of the page.

Faults caught: a snippet or picture that differs from the example, an example that the page leaves out.
"""
import os
import re
import struct
import subprocess
import sys
import textwrap
import zlib

SOURCE = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
PAGES = ("docs/cookbook.md", "docs/text.md")
ENTRY = re.compile(r"(\[examples/([\w-]+)\.cpp\]\([^)]*\)[^\n]*\n\n```cpp\n)(.*?)(^```$)", flags=re.M | re.S)


def cut(name):
    with open(os.path.join(SOURCE, "examples", name + ".cpp"), encoding="utf-8") as file:
        parts = re.findall(r"^ *// \[cookbook\n(.*?)^ *// cookbook\]$", file.read(), flags=re.M | re.S)
    return "\n".join(textwrap.dedent(part) for part in parts)


def read_png(path):
    """@return width, height, bytes: RGBA, 8 bits each, which is all that the examples write."""
    with open(path, "rb") as file:
        data = file.read()
    width, height = struct.unpack(">II", data[16:24])
    packed, at = b"", 8
    while at < len(data):
        (size,), kind = struct.unpack(">I", data[at:at + 4]), data[at + 4:at + 8]
        packed += data[at + 8:at + 8 + size] if kind == b"IDAT" else b""
        at += size + 12
    rows, pixels, above = zlib.decompress(packed), bytearray(), bytearray(width * 4)
    for y in range(height):
        row = bytearray(rows[y * (width * 4 + 1):(y + 1) * (width * 4 + 1)])
        way, row = row[0], row[1:]
        for i in range(width * 4):
            left, upper, corner = (row[i - 4], above[i], above[i - 4]) if i > 3 else (0, above[i], 0)
            paeth = min((left, upper, corner), key=lambda value: abs(left + upper - corner - value))
            row[i] = row[i] + (0, left, upper, (left + upper) // 2, paeth)[way] & 255
        pixels += row
        above = row
    return width, height, bytes(pixels)


def compare(name, examples, out):
    """Draws an example. @return the fault, or nothing."""
    path = os.path.join(out, name + ".png")
    done = subprocess.run([os.path.join(examples, name), "--out", path], stdout=subprocess.PIPE, check=False,
                          stderr=subprocess.STDOUT, timeout=100)
    if done.returncode != 0:
        return [f"{name}: {done.stdout.decode(errors='replace')}"]
    kept = os.path.join(SOURCE, "docs/pictures/cookbook", name + ".png")
    if open(path, "rb").read() == open(kept, "rb").read():
        return []
    wanted, drawn = read_png(kept), read_png(path)
    if wanted[:2] != drawn[:2]:
        return [f"{path} has another size than the page's picture"]
    far = sum(abs(a - b) > 16 for a, b in zip(wanted[2], drawn[2]))
    return [f"{path}: {far} values of {len(drawn[2])} differ from the page's picture"] if far > len(drawn[2]) // 200 else []


def draw(examples, out):
    os.makedirs(out, exist_ok=True)
    names = [name[:-4] for name in sorted(os.listdir(os.path.join(SOURCE, "examples"))) if re.match(r"\d\d-.*\.cpp$", name)]
    failures = [failure for name in names for failure in compare(name, examples, out)]
    print("\n".join(failures) or f"{len(names)} examples draw what the page shows.")
    return 1 if failures else 0


def main():
    if sys.argv[1:2] == ["--draw"]:
        return draw(sys.argv[2], sys.argv[3])
    failures, pages = [], []
    for name in PAGES:
        with open(os.path.join(SOURCE, name), encoding="utf-8") as file:
            pages.append(file.read())
        current = ENTRY.sub(lambda entry: entry.group(1) + cut(entry.group(2)) + entry.group(4), pages[-1])
        if "--write" in sys.argv:
            with open(os.path.join(SOURCE, name), "w", encoding="utf-8") as file:
                file.write(current)
        elif pages[-1] != current:
            failures.append(f"{name} differs from the examples; tests/cookbook.py --write renews it")
    if "--write" in sys.argv:
        return 0
    page = pages[0]
    listed = {entry.group(2) for entry in ENTRY.finditer(page)}
    numbered = {name[:-4] for name in os.listdir(os.path.join(SOURCE, "examples")) if re.match(r"\d\d-.*\.cpp$", name)}
    failures += [f"docs/cookbook.md leaves out examples/{name}.cpp" for name in sorted(numbered - listed)]
    failures += [f"docs/cookbook.md shows no picture of {name}" for name in sorted(numbered)
                 if f"](pictures/cookbook/{name}.png)" not in page]
    failures += [f"examples/{name}.cpp has no part for the page" for name in sorted(listed) if not cut(name)]
    failures += [f"{name} shows no example" for name, text in zip(PAGES, pages) if not ENTRY.search(text)]
    print("\n".join(failures) or f"{len(listed)} recipes are what the examples do.")
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main())
