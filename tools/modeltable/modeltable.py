#!/usr/bin/python3
"""Converts every model of a folder and writes the results as a Markdown page.

    modeltable.py CONVERTER FOLDER PAGE.md

A model is a file whose extension the Assimp library knows. The library's own command, `assimp info`, reads each file too.
The exit code is 1 if the converter neither converts a file nor refuses it with a reason.
"""
import argparse
import concurrent.futures
import json
import os
import subprocess
import sys
import tempfile

SECONDS = 120  # for one file; the converter's own limit is lower
MARKER = "<!-- ./run gltfmodels writes what follows -->"  # and this program leaves it
GROUPS = ("converted", "refused", "unread", "FAILED")
MEANINGS = {
    "converted": "converted",
    "refused": "refused",
    "unread": "refused, as the library cannot read it",
    "FAILED": "FAILED",
}


def run(command):
    """Exit code (None: took too long) and output."""
    try:
        done = subprocess.run(command, capture_output=True, timeout=SECONDS)
        return done.returncode, done.stdout.decode(errors="replace"), done.stderr.decode(errors="replace")
    except subprocess.TimeoutExpired:
        return None, "", "took too long"


def find_models(folder):
    listed = run(["assimp", "listext"])[1]
    extensions = {entry.strip().lstrip("*").lower() for entry in listed.split(";")}
    for parent, folders, names in os.walk(folder):
        folders.sort()
        for name in sorted(names):
            if os.path.splitext(name)[1].lower() in extensions:
                yield os.path.relpath(os.path.join(parent, name), folder)


def describe(report):
    """What a report says of the result, in a few words."""
    scene = report["scene"]
    numbers = [(name, scene[name]) for name in ("triangles", "lines", "points", "skins", "materials", "cameras", "lights")]
    numbers += [("clips", len(report["clips"])), ("textures", len(report["textures"]))]
    words = ["%d %s" % (number, name if number > 1 else name[:-1]) for name, number in numbers if number]
    words += ["%d %s" % (len(report[name]), name) for name in ("approximated", "lost") if report[name]]
    return ", ".join(words)


def convert(converter, folder, model):
    """The group of a model, and a remark."""
    path = os.path.join(folder, model)
    readable = run(["assimp", "info", path])[0] == 0
    with tempfile.TemporaryDirectory() as scratch:
        report = os.path.join(scratch, "report.json")
        code, _, error = run([converter, path, os.path.join(scratch, "model.glo"), "--report", report,
                              "--allow", folder])
        if code == 0:
            with open(report, encoding="utf-8") as file:
                return "converted", describe(json.load(file))
    reason = error.strip().replace(folder + os.sep, "")
    if code != 1 or not reason:
        return "FAILED", "exit code %s: %s" % (code, reason)
    reason = reason.split("\n")[0].replace("orv-convert: ", "", 1).replace(model + ": ", "", 1)
    return "refused" if readable else "unread", reason


def write_page(page, rows):
    formats = {}
    for model, (group, remark) in rows:
        formats.setdefault(model.split(os.sep)[0], []).append((model, group, remark))
    others = ""
    if os.path.exists(page):
        with open(page, encoding="utf-8") as file:
            others = "".join(file.read().partition(MARKER)[1:])
    with open(page, "w", encoding="utf-8") as file:
        out = lambda text="": file.write(text + "\n")
        out("# Converting other people's models")
        out()
        out("Made by `./run models`: every file of Debian's `assimp-testmodels` with the extension of a model,")
        out("converted by `orv-convert`. *Refused, as the library cannot read it*: `assimp info` fails on that file too; many")
        out("of these files are damaged on purpose.")
        out()
        out("| folder | " + " | ".join(MEANINGS[group] for group in GROUPS) + " |")
        out("|---|" + "---|" * len(GROUPS))
        totals = dict.fromkeys(GROUPS, 0)
        for name, models in formats.items():
            counts = {group: sum(1 for model in models if model[1] == group) for group in GROUPS}
            for group in GROUPS:
                totals[group] += counts[group]
            out("| %s | %s |" % (name, " | ".join(str(counts[group] or "") for group in GROUPS)))
        out("| all | %s |" % " | ".join(str(totals[group]) for group in GROUPS))
        for name, models in formats.items():
            out()
            out("## " + name)
            out()
            out("| file | outcome | |")
            out("|---|---|---|")
            for model, group, remark in models:
                cells = (os.path.relpath(model, name), MEANINGS[group], remark)
                out("| %s | %s | %s |" % tuple(cell.replace("|", "\\|").replace("<", "&lt;") for cell in cells))
        if others:
            file.write("\n" + others)
    return totals


def main():
    parser = argparse.ArgumentParser(description=__doc__.split("\n")[0])
    parser.add_argument("converter")
    parser.add_argument("folder")
    parser.add_argument("page")
    arguments = parser.parse_args()
    models = list(find_models(arguments.folder))
    rows = []
    with concurrent.futures.ThreadPoolExecutor(os.cpu_count()) as pool:
        outcomes = pool.map(lambda model: convert(arguments.converter, arguments.folder, model), models)
        for model, outcome in zip(models, outcomes):
            rows.append((model, outcome))
            if sys.stderr.isatty():
                print("\r%d of %d" % (len(rows), len(models)), end="", file=sys.stderr)
    totals = write_page(arguments.page, rows)
    print(", ".join("%d %s" % (totals[group], MEANINGS[group]) for group in GROUPS) + ": " + arguments.page)
    return 1 if totals["FAILED"] else 0


if __name__ == "__main__":
    sys.exit(main())
