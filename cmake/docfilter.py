#!/usr/bin/env python3
"""Adapts the headers' comments to doxygen; the target docs reads every header through this filter.

docfilter.py HEADER > filtered header

In the headers a comment applies to the declaration below it and to those that follow up to the next blank line: that of
getNear() also applies to setNear(). Doxygen applies it only to the first, so its first sentences are repeated before the
others, on the same line, which keeps line numbers in warnings. A comment after `///<` applies to its line and to the
following lines without one. Operators without a comment do what they do for built-in types. Friend declarations are not
part of the interface and are left out.
"""
import re
import sys

FRIEND = re.compile(r"^\s*friend\b[^;{]*;")
OPERATOR = re.compile(r"\boperator\s*(?:[^\w\s]|bool\b)")
POINTER = re.compile(r"^\s*using Ptr = SharedPtr<")
NO_DECLARATION = re.compile(r"^\s*(?:[{}#]|//|public:|protected:|private:|ORV_CLASS_NAME|namespace\b|template\b.*>$|\)|$)")


def brief(lines):
    """The sentences before the first command or empty line of a comment."""
    text = ""
    for line in lines:
        line = re.sub(r"^\s*///<?\s?", "", line).strip()
        if not line or line.startswith("@"):
            break
        text += " " + line
    whole = " ".join(re.sub(r"^\s*///<?\s?", "", line).strip() for line in lines)
    return text.strip().split(" @")[0] or (whole if whole.startswith("@return") else "")


def main():
    with open(sys.argv[1], encoding="utf-8") as file:
        lines = file.read().split("\n")
    comment, shared, is_open, has_own = [], "", False, False
    for line in lines:
        stripped = line.strip()
        if stripped.startswith("///") and not is_open:
            comment.append(line)
            has_own = True
        elif not stripped or stripped == "{":  # what is within braces is something else
            comment, shared, has_own, is_open = [], "", False, False
        elif not is_open and not NO_DECLARATION.match(line):
            trailing = re.search(r"///<.*", line)
            if FRIEND.match(line):
                line = ""
            elif POINTER.match(line) and not comment and not trailing:
                line = "/** A pointer that shares it. */ " + line
            elif has_own:
                shared = brief(comment) or shared
            elif trailing:
                shared = shared or brief([trailing.group()])
            elif OPERATOR.search(line) and not shared:
                line = f"/** Does what it does for built-in types. */ {line.lstrip()}"
            elif shared:
                line = f"/** {shared} */ {line.lstrip()}"
            comment, has_own = [], False
        print(line)
        if stripped and not stripped.startswith("//"):
            code = re.sub(r"//.*", "", line).strip()
            is_open = bool(code) and not NO_DECLARATION.match(line) and code[-1] not in ";{}:"


if __name__ == "__main__":
    main()
