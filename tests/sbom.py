#!/usr/bin/env python3
"""Compares the bill of materials with the binaries.

sbom.py SPDX.json READELF NAME=BINARY...

Faults caught: a library that a program is linked with and the list has not, or the other way round; an entry without
fields that SPDX 2.3 requires; a relationship to a missing entry. Of the run-time libraries of the compiler, libm and
libgcc_s count as parts of libc and libstdc++.
"""
import json
import re
import subprocess
import sys

PARTS = {"libm": "libc", "ld-linux-x86": "libc", "ld-linux-aarch64": "libc", "libgcc_s": "libstdc++"}
DOCUMENT_KEYS = {"spdxVersion", "dataLicense", "SPDXID", "name", "documentNamespace", "creationInfo", "packages"}


def needed(readelf, binary):
    text = subprocess.check_output([readelf, "-d", binary]).decode()
    names = {re.sub(r"(-\d[\d.]*)?\.so.*", "", name) for name in re.findall(r"NEEDED.*\[(.*)\]", text)}
    return {PARTS.get(name, name) for name in names}


def main():
    with open(sys.argv[1], encoding="utf-8") as file:
        document = json.load(file)
    failures = [f"the document has no {key}" for key in DOCUMENT_KEYS - document.keys()]
    if not re.fullmatch(r"\d{4}-\d\d-\d\dT\d\d:\d\d:\d\dZ", document["creationInfo"]["created"]):
        failures.append("created: " + document["creationInfo"]["created"])
    names = {package["SPDXID"]: package["name"] for package in document["packages"]}
    if len(names) != len(document["packages"]):
        failures.append("two packages of one SPDXID")
    for package in document["packages"]:
        if not re.fullmatch(r"SPDXRef-[A-Za-z0-9.+-]+", package["SPDXID"]) or not package.get("downloadLocation"):
            failures.append(f"{package['name']} lacks what SPDX asks for")
        if package["versionInfo"] in ("", "NOASSERTION"):
            failures.append(f"{package['name']} has no version")
    linked = {}
    for relation in document["relationships"]:
        ends = relation["spdxElementId"], relation["relatedSpdxElement"]
        if not set(ends) <= set(names) | {"SPDXRef-DOCUMENT"}:
            failures.append(f"a relationship to nothing: {ends}")
        elif relation["relationshipType"] == "DYNAMIC_LINK":
            linked.setdefault(names[ends[0]], set()).add(names[ends[1]])
    for name, binary in (argument.split("=", 1) for argument in sys.argv[3:]):
        asked, listed = needed(sys.argv[2], binary), linked.get(name, set())
        if asked - listed:
            failures.append(f"{name} is linked with {asked - listed}, which the list has not")
        if listed - asked - {"libGLESv2", "libEGL"}:  # which the linker leaves out where nothing calls them
            failures.append(f"{name} is not linked with {listed - asked}")
    print("\n".join(failures) or f"{len(names)} packages are what the binaries are made of.")
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main())
