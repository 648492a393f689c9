#!/usr/bin/env python3
"""Compiles the snippets of the pages, without generating code.

snippets.py WORK COMPILER FLAG...

A snippet that defines a function of a class stands by itself; any other is the body of a function, with the names of
tests/outside/snippets.h. Whole programs are built elsewhere, as are snippets cut from an example, which the line in front
of them links.

Fault caught: a snippet that does not compile, because an interface was renamed or the snippet was never right.
"""
import os
import pathlib
import re
import subprocess
import sys

SOURCE = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
# Names of objects from earlier snippets; a snippet may define them itself, in its own braces.
BEFORE = """RenderBlock inset(renderer, scene, mapCamera);
const auto model = loadGloFile(*pool, scene, "model.glo");
AnimationController player(model->getAnimationGroup());
Text text(*pool, font, Colour4f::WHITE);
"""
FROM_EXAMPLE = re.compile(r"\[examples/[\w-]+\.cpp\]\([^)]*\)[^\n]*\n\n\Z")
BLOCK = "const auto block = makeShared<RenderBlock>(renderer, scene, camera);\n"
BLOCKS = {"docs/guide.md": "RenderBlock block(renderer, scene, camera);\n"}


def snippets():
    root = pathlib.Path(SOURCE)
    for path in sorted([*root.glob("*.md"), *root.glob("docs/**/*.md")]):
        page = path.relative_to(root).as_posix()
        with open(os.path.join(SOURCE, page), encoding="utf-8") as file:
            text = file.read()
        for match in re.finditer(r"^```cpp\n(.*?)^```$", text, flags=re.M | re.S):
            is_cut = FROM_EXAMPLE.search(text, 0, match.start()) is not None
            if "#include" not in match.group(1) and not is_cut:
                yield page, text.count("\n", 0, match.start()) + 2, match.group(1)


def main():
    work, compiler, flags = sys.argv[1], sys.argv[2], [flag for flag in sys.argv[3:] if flag]
    found = list(snippets())
    parts = [f"#include \"{SOURCE}/tests/outside/snippets.h\""]
    for number, (page, line, text) in enumerate(found):
        place = f"#line {line} \"{page}\"\n"
        if re.match(r"\w+ \w+::\w+\(", text):
            parts.append(place + text)
        else:
            parts.append(f"bool snippet{number}()\n{{\n{BLOCKS.get(page, BLOCK)}{BEFORE}{{\n{place}{text}}}\nreturn true;\n}}")
    os.makedirs(work, exist_ok=True)
    path = os.path.join(work, "snippets.cpp")
    with open(path, "w", encoding="utf-8") as file:
        file.write("\n".join(parts) + "\n")
    code = subprocess.call([compiler, "-std=c++20", "-fsyntax-only", "-fno-rtti", *flags, path])
    print(f"{len(found)} snippets" + (" compile." if code == 0 else "; see above."))
    return 1 if code != 0 or len(found) < 15 else 0


if __name__ == "__main__":
    sys.exit(main())
