#!/usr/bin/python3
"""Prints how long glTF files take: conversion, libassimp's own reading (as it is, and with what its preset
TargetRealtime_Quality makes of it), three.js's loading.

    timegltf.py CONVERTER TOOLBENCH NODE_MODULES FOLDER [OTHER_CONVERTER]

FOLDER is what makevariants.py made; large files are made beside it. Times are of the processor in ms (user and system,
all processes), the best of several, since others may use the machine; three.js's without the start of node. With another
converter, its times, too.
"""
import json
import os
import resource
import subprocess
import sys

import numpy as np

HERE = os.path.dirname(os.path.abspath(__file__))
sys.path.append(os.path.join(HERE, "..", "gltfpictures"))
from makemodels import Gltf  # noqa: E402

ROUNDS = 7
SIDE = 760  # vertices of the large grid's edge
ENGINE = "glTF2_2CylinderEngine-glTF-Binary_2CylinderEngine.glb"
FILES = (
    ("skinned figure, a clip", "X_BCN_Epileptic.X.glb"),
    ("skinned animal, three clips", "X_Testwuson.X.glb"),
    ("textured box", "as-it-is/glTF2/BoxTextured-glTF/BoxTextured.gltf"),
    ("engine, 75,730 triangles", "as-it-is/glTF2/2CylinderEngine-glTF-Binary/2CylinderEngine.glb"),
    ("the same, meshopt", ENGINE + "/pack-cc.glb"),
    ("the same, Draco", ENGINE + "/pipeline-draco.glb"),
    ("grid, 1,152,162 triangles", "../gltftimes/model.gltf"),
    ("the same, quantised and meshopt", "../gltftimes/meshopt.glb"),
    ("the same, Draco", "../gltftimes/draco.glb"),
)


def make_grid(folder, binaries):
    home = os.path.join(folder, "..", "gltftimes")
    os.makedirs(home, exist_ok=True)
    whole = os.path.join(home, "model.gltf")
    if not os.path.exists(whole):
        v, u = np.mgrid[0:SIDE, 0:SIDE] / (SIDE - 1.0)
        numbers = np.arange(SIDE * SIDE).reshape(SIDE, SIDE)
        a, b, c, d = numbers[:-1, :-1], numbers[1:, :-1], numbers[:-1, 1:], numbers[1:, 1:]
        up = np.stack([-0.5 * np.cos(5 * u), np.ones_like(u), np.zeros_like(u)], -1)
        shape = {
            "POSITION": np.stack([u, 0.1 * np.sin(5 * u), v], -1).reshape(-1, 3),
            "NORMAL": (up / np.linalg.norm(up, axis=-1, keepdims=True)).reshape(-1, 3),
            "TEXCOORD_0": np.stack([u, v], -1).reshape(-1, 2),
            "faces": np.stack([a, b, c, c, b, d], -1),
        }
        gltf = Gltf()
        gltf.node(mesh=gltf.mesh(shape, gltf.material(), kind="u4"))
        gltf.write(home)
    for name, command in (("meshopt", ["gltfpack", "-c", "-i", whole, "-o"]), ("draco", ["gltf-transform", "draco", whole])):
        made = os.path.join(home, name + ".glb")
        if not os.path.exists(made):
            subprocess.run([os.path.join(binaries, command[0]), *command[1:], made], capture_output=True, check=True)


def measure(command):
    """None if it fails."""
    best = None
    for _ in range(ROUNDS):
        before = resource.getrusage(resource.RUSAGE_CHILDREN)
        if subprocess.run(command, capture_output=True).returncode != 0:
            return None
        after = resource.getrusage(resource.RUSAGE_CHILDREN)
        spent = after.ru_utime + after.ru_stime - before.ru_utime - before.ru_stime
        best = min(best or spent, spent)
    return best * 1e3


def load_with_three(modules, path):
    command = ["node", os.path.join(HERE, "readwiththree.mjs"), modules, "30"]
    request = json.dumps({"model": path, "out": os.devnull}) + "\n"
    answers = [subprocess.run(command, capture_output=True, text=True, input=request).stdout for _ in range(ROUNDS)]
    return min((json.loads(answer)["ms"] for answer in answers if answer), default=None)


def main():
    converter, bench, modules, folder, *others = sys.argv[1:]
    make_grid(folder, os.path.join(modules, ".bin"))
    print("| | MB | converted | %sread by libassimp | the same, for drawing | loaded by three.js |"
          % ("before | " if others else ""))
    print("|---|---|---|---|---|---|" + ("---|" if others else ""))
    for kind, name in FILES:
        path = os.path.join(folder, name)
        scene = os.path.join(folder, "timed.glo")
        size = sum(os.path.getsize(path[: -len("gltf")] + end) for end in ("gltf", "bin")) if "gltftimes" in path and \
            path.endswith("gltf") else os.path.getsize(path)
        times = [measure([program, path, scene]) for program in [converter, *others]]
        times += [measure([bench, way, path]) for way in ("--read", "--read-for-drawing")]
        times.append(load_with_three(modules, path))
        cells = ["%.0f" % time if time is not None else "-" for time in times]
        print("| %s | %.1f | %s |" % (kind, size / 1e6, " | ".join(cells)), flush=True)


if __name__ == "__main__":
    main()
