#!/usr/bin/env python3
"""Compares docs/troubleshooting.md with the messages of the engine and the tools.

messages.py [--list]

Messages are extracted from the sources: the texts of log calls, and of functions and variables that hold reasons of
failures. The texts between the values of a message have to be in the page, in a code span, with an ellipsis for each
value: "Cannot open %s" is `Cannot open …`. Single words, which are values themselves, are left out.

Faults caught: a message that the page does not explain, and an explanation of one that no longer exists. With --list
all of them are printed.
"""
import os
import pathlib
import re
import sys

SOURCE = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
LITERAL = r'"(?:[^"\\\n]|\\.)*"'
# Sources of messages: log calls, functions that log and return, exceptions of the readers, variables for reasons.
CALLS = re.compile(
    r"(?:\bORV_(?:LOG|GLO)_(?:ERROR|WARN)|\b(?:pssL|l)og(?:Error|Warn)|\b(?:fail|failAt|refuse|refuseFile|damaged|Fault|"
    r"ValidationError|failWithErrno|findConflict|setError|IOException)|\bfprintf)\s*\(|\b(?:error|reason|m_error|fault|problem|failure)(?:->|\.)?\w*\s*\+?=(?!=)|"
    r"\bconst char\* const (?!FOOTER|EXAMPLES)[A-Z_]+\s*=")
# Functions whose results are reasons.
REASONS = {
    "engine/facility/src/fonts/fonttables.cpp", "engine/facility/src/fonts/fontbaker.cpp",
    "engine/facility/api/orv/detail/fonttables.h", "engine/extra/src/fontface.cpp", "engine/extra/src/fontoutlines.cpp",
    "engine/extra/src/cfftable.cpp", "engine/extra/src/glyphprogram.cpp",
    "engine/facility/src/fonts/fontloader.cpp", "engine/facility/src/text/textstatement.cpp",
    "tools/view/options.cpp", "tools/convert/main.cpp", "tools/convert/guard.cpp", "tools/inspect/main.cpp",
}
# What the application for Android shows: its strings of such names are messages.
APPLICATION = re.compile(r'<string name="no_\w+">(.*?)</string>')
RETURN = re.compile(r"\breturn\b")
SPEC = re.compile(r"%(?:-?\d*\.?\d*\*?(?:ll|z|l|h)?[a-zA-Z])|%%")


def files():
    paths = [path for room in ("engine", "tools", "platforms") for path in sorted(pathlib.Path(SOURCE, room).rglob("*"))]
    names = [path.relative_to(SOURCE).as_posix() for path in paths if path.suffix in (".cpp", ".h", ".java", ".xml")]
    return [name for name in names if "/sanitize/" not in name and (not name.endswith(".xml") or "/res/values/" in name)]


def statement(text, begin):
    """From a place to the semicolon that ends the statement; literals skipped over."""
    end = begin
    for match in re.finditer(LITERAL + r"|;", text[begin:]):
        end = begin + match.end()
        if match.group() == ";":
            break
    return text[begin:end]


def unescape(literal):
    return re.sub(r"\\(.)", lambda match: {"n": " ", "r": " ", "t": " "}.get(match.group(1), match.group(1)), literal)


def fragments(piece):
    """The texts of a statement between its values: adjacent literals are one."""
    for run in re.findall(rf"{LITERAL}(?:\s*(?:PRI\w+\s*)?{LITERAL})*", piece):
        parts = [unescape(part[1:-1]) for part in re.findall(LITERAL, run)]
        whole = "".join(parts)
        if "PRI" in re.sub(LITERAL, "", run):
            whole = re.sub(r"%\d*x?$", "", "\0".join(re.sub(r"%\d*x?$", "", part) for part in parts))
        for text in re.split(SPEC.pattern + "|\0", whole):
            text = " ".join(text.split())
            if re.search(r"[A-Za-z]{2,}[^A-Za-z]* [^A-Za-z]*[A-Za-z]{2,}", text):
                yield text


def messages():
    found = {}
    for name in files():
        with open(os.path.join(SOURCE, name), encoding="utf-8") as file:
            text = re.sub(r"^\s*//.*$|(?<=[;{,)]) //.*$", "", file.read(), flags=re.M)
        for string in APPLICATION.findall(text):
            found.setdefault(string.strip(": "), name)
        places = [match.end() for match in CALLS.finditer(text)]
        if name in REASONS:
            places += [match.end() for match in RETURN.finditer(text)]
        for place in places:
            for fragment in fragments(statement(text, place)):
                found.setdefault(fragment, name)
    return found


def all_literals():
    """Every text of the sources, to find explanations of messages that do not exist."""
    for name in files():
        with open(os.path.join(SOURCE, name), encoding="utf-8") as file:
            text = file.read()
            yield from APPLICATION.findall(text)
            for run in re.findall(rf"{LITERAL}(?:\s*{LITERAL})*", text):
                whole = "".join(unescape(part[1:-1]) for part in re.findall(LITERAL, run))
                yield " ".join(SPEC.sub("\0", whole).split())


def invented(page):
    """Messages of the page's tables of which a part between values is in no source."""
    literals = "\n".join(set(all_literals()))
    for row in re.findall(r"^\| (`.*?`) \|", page, flags=re.M):
        for span in re.findall(r"`([^`]+)`", row):
            for part in normal(span).split("…"):
                part = part.strip()
                if re.search(r"[A-Za-z]{2,}.* .*[A-Za-z]{2,}", part) and part not in literals:
                    yield span


def normal(text):
    return " ".join(text.replace("\\|", "|").split())


def main():
    found = messages()
    if "--list" in sys.argv:
        for fragment, name in sorted(found.items(), key=lambda entry: (entry[1], entry[0])):
            print(f"{name}\t{fragment}")
        return 0
    with open(os.path.join(SOURCE, "docs/troubleshooting.md"), encoding="utf-8") as file:
        page = file.read()
    spans = [normal(span) for span in re.findall(r"(?<!`)`+([^`]+)`+", page)]
    missing = [f"{name}: {fragment}" for fragment, name in sorted(found.items()) if
               not any(fragment in span for span in spans)]
    if missing:
        print("docs/troubleshooting.md does not explain:\n" + "\n".join(missing))
    gone = sorted(set(invented(page)))
    if gone:
        print("docs/troubleshooting.md explains messages that do not exist:\n" + "\n".join(gone))
    print(f"{len(found)} texts of messages, {len(missing)} of them not explained.")
    return 1 if missing or gone or len(found) < 200 else 0


if __name__ == "__main__":
    sys.exit(main())
