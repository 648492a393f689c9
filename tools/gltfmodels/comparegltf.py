#!/usr/bin/python3
"""Converts glTF files and compares every triangle, line and point of the scenes with three.js.

    comparegltf.py CONVERTER NODE_MODULES FOLDER PAGE.md [OTHER_CONVERTER]

At rest and at four times of each clip (samples of the conversion), each triangle of one reader has to have one of the
other within 1/5,000 of the model's size, its corners in the same order round, and there have to be as many. Nothing but
the file is shared between the two: scene files are read and posed by posedglo.py, without the engine.

The results are written to PAGE.md below its marker; their counts are printed, also for another converter, such as an
older one. Exit code 1 if any file came out wrong.
"""
import concurrent.futures
import json
import os
import select
import struct
import subprocess
import sys
import tempfile

import numpy as np
from scipy.spatial import cKDTree

from posedglo import PosedGlo

FPS = 30.0
TOLERANCE = 2e-4  # of the model's size: rotations that were rounded are made whole again here, not by three.js
SLIVER = 1e-8  # area in squares of the model's size; rounding decides whether there is a smaller one
SECONDS = 300
MARKER = "<!-- ./run gltfmodels writes what follows -->"
GROUPS = ("right", "reported", "refused", "unread", "wrong")
MEANINGS = {
    "right": "the same as three.js reads",
    "reported": "the same except for reported losses",
    "refused": "refused with a reason",
    "unread": "converted; three.js does not read it",
    "wrong": "WRONG",
}
HERE = os.path.dirname(os.path.abspath(__file__))


def run(command):
    try:
        done = subprocess.run(command, capture_output=True, timeout=SECONDS)
        return done.returncode, done.stderr.decode(errors="replace")
    except subprocess.TimeoutExpired:
        return None, "took too long"


class Three:
    """A process that reads files by three.js, one after the other."""

    def __init__(self, modules):
        self.command = ["node", os.path.join(HERE, "readwiththree.mjs"), modules, str(FPS)]
        self.process = None

    def read(self, model, out):
        """What is wrong; "" for nothing."""
        if self.process is None or self.process.poll() is not None:
            self.process = subprocess.Popen(self.command, stdin=subprocess.PIPE, stdout=subprocess.PIPE,
                                            stderr=subprocess.DEVNULL, text=True)
        self.process.stdin.write(json.dumps({"model": model, "out": out}) + "\n")
        self.process.stdin.flush()
        answer = ""
        if select.select([self.process.stdout], [], [], SECONDS)[0]:
            answer = self.process.stdout.readline()
        if answer:
            return json.loads(answer)["fault"]
        self.process.kill()
        self.process.wait()
        return "Error: no answer"


three = None  # each worker's


def start_worker(modules):
    global three
    three = Three(modules)


def read_reference(path):
    """Three.js's clips, and its poses: (clip, time, {corners: faces})."""
    with open(path, "rb") as file:
        data = file.read()
    size = struct.unpack_from("<I", data)[0]
    head = json.loads(data[4 : 4 + size])
    numbers = np.frombuffer(data[4 + size :], dtype=np.float32)
    poses, at = [], 0
    for pose in head["poses"]:
        faces = {}
        for corners, count in zip((3, 2, 1), pose["counts"]):
            end = at + count * corners * 3
            faces[corners] = numbers[at:end].reshape(-1, corners, 3).astype(np.float64)
            at = end
        poses.append((pose["clip"], pose["time"], faces))  # the time is None in a damaged animation
    return head["clips"], poses


def areas(faces):
    if faces.shape[1] == 3:
        return np.linalg.norm(np.cross(faces[:, 1] - faces[:, 0], faces[:, 2] - faces[:, 0]), axis=1)
    return np.linalg.norm(faces[:, 1] - faces[:, 0], axis=1) ** 2


def deviation(faces, others, counted):
    """The largest distance of a face from its nearest counterpart, corner by corner in any rotation."""
    corners = faces.shape[1]
    if not counted.any():
        return 0.0
    if not len(others):
        return np.inf
    turns = [np.roll(others, turn, axis=1) for turn in range(corners)]
    tree = cKDTree(np.concatenate(turns).reshape(-1, corners * 3))
    return tree.query(faces[counted].reshape(-1, corners * 3))[0].max()


def compare(ours, theirs):
    """The largest deviation relative to the size, and the fault, "" for none."""
    everything = np.concatenate([faces.reshape(-1, 3) for faces in theirs.values()] or [np.zeros((0, 3))])
    size = np.linalg.norm(np.ptp(everything, axis=0)) if len(everything) else 1.0
    largest = 0.0
    for corners, name in ((3, "triangles"), (2, "lines"), (1, "points")):
        a, b = ours[corners], theirs[corners]
        if not np.isfinite(b).all():
            b = b[np.isfinite(b).all(axis=(1, 2))]
            a = a[: len(b)] if len(a) != len(b) else a
        solid_a = areas(a) > SLIVER * size * size if corners > 1 else np.ones(len(a), bool)
        solid_b = areas(b) > SLIVER * size * size if corners > 1 else np.ones(len(b), bool)
        if solid_a.sum() > len(b) or solid_b.sum() > len(a):
            return largest, "%d %s instead of %d" % (solid_a.sum(), name, solid_b.sum())
        worst = max(deviation(a, b, solid_a), deviation(b, a, solid_b)) / (size or 1.0)
        largest = max(largest, worst)
        if worst > TOLERANCE:
            return largest, "%s %.2g of the size away" % (name, worst)
    return largest, ""


def find_ranges(clips, report):
    """The start of each of three.js's clips on the scene's time line; None for one that the scene has not."""
    made = report["clips"]
    if len(made) == len(clips):
        return [clip["start"] for clip in made]
    left = list(made)
    starts = []
    for clip in clips:
        same = next((other for other in left if other["name"] == clip["name"]), None)
        starts.append(same["start"] if same else None)
        if same:
            left.remove(same)
    return starts


def add_options(converter):
    """A converter with its options to find pictures of libassimp's test models."""
    known = subprocess.run([converter, "--help"], capture_output=True, text=True).stdout
    return [converter] + (["--allow", "/usr/share/assimp"] if "--allow" in known else [])


def judge(converters, model):
    """For each converter the group of a model, and a remark."""
    with tempfile.TemporaryDirectory() as scratch:
        reference = os.path.join(scratch, "three.bin")
        fault = three.read(model, reference)
        poses = None if fault else read_reference(reference)
        return [judge_one(converter, model, poses, fault, scratch) for converter in converters]


def judge_one(converter, model, reference, unread, scratch):
    scene, report = (os.path.join(scratch, name) for name in ("a.glo", "a.json"))
    code, error = run([*converter, model, scene, "--report", report, "--fps", str(FPS)])
    if code != 0:
        reason = error.strip().split("\n")[-1].replace("orv-convert: ", "", 1).replace(model + ": ", "", 1)
        return ("refused", reason) if code == 1 and reason else ("wrong", "exit code %s" % code)
    if unread:
        return "unread", unread[:200]
    with open(report, encoding="utf-8") as file:
        report = json.load(file)
    clips, poses = reference
    posed = PosedGlo(scene)
    codes = {entry["code"] for entry in report["lost"]}
    coarse = {entry["code"] for entry in report["approximated"]} & {"shape-steps"}
    starts = find_ranges(clips, report)
    largest, compared = 0.0, 0
    for clip, time, faces in poses:
        if clip >= 0 and (time is None or "morph-animation" in codes or coarse or starts[clip] is None):
            continue
        moment = None if clip < 0 else starts[clip] + time + 0.02 / FPS
        worst, fault = compare(posed.pose(moment), faces)
        largest, compared = max(largest, worst), compared + 1
        if fault:
            where = "at rest" if clip < 0 else "clip %d at %.3g s" % (clip, time)
            return "wrong", "%s: %s" % (where, fault)
    remark = "%d triangles, %d poses, deviation %.1g" % (len(poses[0][2][3]), compared, largest)
    lost = codes & {"morph-animation", "attribute", "primitive", "face", "animation-target", "extension"}
    told = sorted(lost | coarse)
    return ("reported", remark + "; " + ", ".join(told)) if told else ("right", remark)


def find_models(folder):
    for parent, folders, names in os.walk(folder):
        folders.sort()
        for name in sorted(names):
            path = os.path.join(parent, name)
            if name.lower().endswith((".gltf", ".glb")) and os.path.getsize(path) > 0:
                yield path


def count(rows, number):
    """How many files there are in each group for one of the converters."""
    return {group: sum(1 for _, found in rows if found[number][0] == group) for group in GROUPS}


def write_page(page, folder, rows):
    """@param rows: (model, [(group, remark) of each converter])"""
    with open(page, encoding="utf-8") as file:
        kept = file.read().split(MARKER)[0]
    totals = count(rows, 0)
    with open(page, "w", encoding="utf-8") as file:
        out = lambda text="": file.write(text + "\n")
        file.write(kept.rstrip("\n") + "\n\n")
        out(MARKER)
        out("# glTF beside three.js")
        out()
        out("Made by `./run gltfmodels`: glTF files of `assimp-testmodels`, models of other formats as `assimp export` writes")
        out("them, what gltfpack, gltf-transform and gltf-pipeline make of each, and files made for rare kinds. Every triangle,")
        out("line and point of the converted scene is compared with three.js, at rest and at four times of each clip; the")
        out("deviation is a fraction of the model's size, and more than 1/5,000 is wrong.")
        out()
        out("| outcome | files |")
        out("|---|---|")
        for group in GROUPS:
            out("| %s | %d |" % (MEANINGS[group], totals[group]))
        out()
        out("| file | outcome | |")
        out("|---|---|---|")
        for model, found in rows:
            group, remark = found[0]
            cells = (os.path.relpath(model, folder), MEANINGS[group], remark.replace(folder + os.sep, ""))
            out("| %s | %s | %s |" % tuple(cell.replace("|", "\\|").replace("<", "&lt;") for cell in cells))


def main():
    converter, modules, folder, page, *others = sys.argv[1:]
    converters = [add_options(name) for name in (converter, *others)]
    models = list(find_models(folder))
    rows = []
    with concurrent.futures.ProcessPoolExecutor(os.cpu_count(), initializer=start_worker, initargs=(modules,)) as pool:
        outcomes = pool.map(judge, [converters] * len(models), models)
        for model, found in zip(models, outcomes):
            rows.append((model, found))
            if found[0][0] == "wrong":
                print(model + ": " + found[0][1], flush=True)
            if sys.stderr.isatty():
                print("\r%d of %d" % (len(rows), len(models)), end="", file=sys.stderr)
    write_page(page, folder, rows)
    for i, name in enumerate((converter, *others)):
        totals = count(rows, i)
        print(name + ": " + ", ".join("%d %s" % (totals[group], MEANINGS[group]) for group in GROUPS))
    return 1 if count(rows, 0)["wrong"] else 0


if __name__ == "__main__":
    sys.exit(main())
