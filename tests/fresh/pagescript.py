#!/usr/bin/env python3
"""Makes a shell script of the commands and files of a page.

pagescript.py PAGE.md > script

In the page, a fenced block without a language holds commands. One with a language is a file if the paragraph before it
has "Save this as `NAME`" or "is the whole `NAME`"; it is written where the commands have led. Other blocks are not run.
After every command that writes a .ppm, the middle of that picture is checked: it must not be black.
"""
import re
import sys

CHECK = r"""
lit() { # the middle pixel of a binary PPM whose header is one line
    read -r _ width height _ <"$1"
    tail -c +$(($(head -n 1 "$1" | wc -c) + 1 + (height / 2 * width + width / 2) * 3)) "$1" | head -c 3 | od -An -tu1 |
        grep -q '[1-9]' || { echo "$1 shows nothing in its middle" >&2; exit 1; }
}
"""


def make_script(page):
    lines = ["set -e", CHECK]
    counts = {"files": 0, "commands": 0}
    for match in re.finditer(r"^```(\w*)\n(.*?)^```$", page, flags=re.M | re.S):
        language, text = match.groups()
        before = page[:match.start()].rstrip().rsplit("\n\n", 1)[-1]
        name = re.search(r"(?:Save this as|is the whole) `([\w.]+)`", before)
        if language and name:
            lines.append(f"cat >{name.group(1)} <<'END OF THE FILE'\n{text}END OF THE FILE")
            counts["files"] += 1
        elif not language:
            for command in text.splitlines():
                counts["commands"] += 1
                lines.append(f"echo {quote('$ ' + command)}\n{command}")
                lines += [f"lit {picture}\nrm {picture}" for picture in re.findall(r"> *(\S+\.ppm)", command)]
    lines.append(f"echo 'The page holds: {counts['commands']} commands, {counts['files']} files.'")
    if min(counts.values()) == 0:
        sys.exit("pagescript: the page has no commands or no files; has its form changed?")
    return "\n".join(lines) + "\n"


def quote(text):
    return "'" + text.replace("'", "'\\''") + "'"


def main():
    with open(sys.argv[1], encoding="utf-8") as page:
        sys.stdout.write(make_script(page.read()))


if __name__ == "__main__":
    main()
