#!/usr/bin/env python3
"""Converts models as part of a build, and folders of models.

scenes.py PREFIX WORK GENERATOR

Faults caught: a scene that is not made again when a file of its model has changed, or is made again without need; a
broken model that stops the others of a folder, is forgotten or is converted each time; models that no shard converts, or
two do; an interrupted conversion that counts as done; a missing picture that is not looked for again; two models with
one scene, or scenes beside the target of a link.
"""
import json
import os
import shutil
import struct
import subprocess
import sys
import time
import zlib

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))
from installedtools import make_model  # noqa: E402

PREFIX, WORK, GENERATOR = os.path.abspath(sys.argv[1]), os.path.abspath(sys.argv[2]), sys.argv[3]
CONVERT = os.path.join(PREFIX, "bin/orv-convert")
PROJECT = """cmake_minimum_required(VERSION 3.22)
project(scenes LANGUAGES CXX)
find_package(orv 1.0 REQUIRED)
orv_add_scenes(models a/one.gltf "b c/two.gltf" OUT scenes OPTIONS --scale 2)
orv_add_scenes(models "b c/paint.obj" OUT scenes)
orv_add_scenes(models a/three.gltf OUT scenes)
"""


def run(*command, wanted=0):
    done = subprocess.run(command, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, timeout=250, check=False)
    text = done.stdout.decode(errors="replace")
    if done.returncode != wanted:
        sys.exit(f"{command} exits with {done.returncode}, not {wanted}:\n{text}")
    return text


def expect(condition, *what):
    if not condition:
        sys.exit("not as wanted: " + " ".join(map(str, what)))


def touch_later(path):
    """Changes a file's time by what every file system keeps apart."""
    later = time.time() + 5
    os.utime(path, (later, later))


def stamp(*names):
    return [os.stat(os.path.join(WORK, name)).st_mtime_ns for name in names]


def make_painted(path):
    """A triangle with a picture, paint.png, which is not there."""
    with open(path, "w", encoding="utf-8") as file:
        file.write("mtllib paint.mtl\nv 0 0 0\nv 1 0 0\nv 1 1 0\nvt 0 0\nvt 1 0\nvt 1 1\nusemtl a\n"
                   "f 1/1 2/2 3/3\n")
    with open(os.path.join(os.path.dirname(path), "paint.mtl"), "w", encoding="utf-8") as file:
        file.write("newmtl a\nKd 1 1 1\nmap_Kd paint.png\n")


def make_picture(path):
    def chunk(kind, data):
        return struct.pack(">I", len(data)) + kind + data + struct.pack(">I", zlib.crc32(kind + data))

    with open(path, "wb") as file:
        file.write(b"\x89PNG\r\n\x1a\n" + chunk(b"IHDR", struct.pack(">IIBBBBB", 1, 1, 8, 2, 0, 0, 0)) +
                   chunk(b"IDAT", zlib.compress(b"\0\xff\0\0")) + chunk(b"IEND", b""))


def check_build():
    for model in ("a/one.gltf", "b c/two.gltf", "a/three.gltf"):
        os.makedirs(os.path.join(WORK, os.path.dirname(model)), exist_ok=True)
        make_model(os.path.join(WORK, model))
    make_painted(os.path.join(WORK, "b c/paint.obj"))
    with open(os.path.join(WORK, "CMakeLists.txt"), "w", encoding="utf-8") as file:
        file.write(PROJECT)
    build = os.path.join(WORK, "build")
    scenes = ["build/scenes/one.glo", "build/scenes/two.glo"]
    run("cmake", "-G", GENERATOR, "-S", WORK, "-B", build, "-DCMAKE_PREFIX_PATH=" + PREFIX)
    run("cmake", "--build", build)
    before = stamp(*scenes)
    run("cmake", "--build", build)
    expect(stamp(*scenes) == before, "scenes were made again although nothing had changed")
    time.sleep(1.1)
    make_picture(os.path.join(WORK, "b c/paint.png"))
    run("cmake", "--build", build)
    expect(os.path.exists(os.path.join(build, "scenes/paint-paint.png")), "a picture that has come is not taken")
    expect(stamp(*scenes) == before, "scenes were made again for a picture that is none of theirs")
    touch_later(os.path.join(WORK, "b c/corners.bin"))
    run("cmake", "--build", build)
    after = stamp(*scenes)
    expect(after[0] == before[0] and after[1] != before[1],
           "a file that one model names has changed; scenes before and after:", before, after)


def convert(out, *options, folder="models", wanted=0):
    """@return how many were converted, unchanged and failed."""
    text = run(CONVERT, os.path.join(WORK, folder), os.path.join(WORK, out), *options, wanted=wanted)
    numbers = [int(word) for word in text.splitlines()[-1].replace(",", "").split() if word.isdigit()]
    expect(text.count("orv-convert: ") == numbers[3], "errors in", text)
    return tuple(numbers[1:])


def check_folder():
    models = os.path.join(WORK, "models")
    names = ["a/a.gltf", "b/deep/b.gltf", "c/c.gltf", "d/d d.gltf", "e/e.gltf"]
    for name in names:
        os.makedirs(os.path.dirname(os.path.join(models, name)))
        make_model(os.path.join(models, name))
    with open(os.path.join(models, "c/broken.obj"), "w", encoding="utf-8") as file:
        file.write("f 1 2 3\n")

    expect(convert("out", wanted=1) == (5, 0, 1), "at first")
    expect(convert("out", wanted=1) == (0, 5, 1), "again")
    report = json.load(open(os.path.join(WORK, "out/b/deep/b.json"), encoding="utf-8"))
    expect(len(report["inputs"]) == 2 and report["scene"]["bytes"] > 0, report)
    os.remove(os.path.join(models, "c/broken.obj"))
    touch_later(os.path.join(models, "a/corners.bin"))
    expect(convert("out") == (1, 4, 0), "after a change of a file that a model names")
    expect(convert("out", "--scale", "2", "--jobs", "3") == (5, 0, 0), "with other options, three at a time")
    os.remove(os.path.join(WORK, "out/e/e.json"))  # as if it had been interrupted before the report
    os.remove(os.path.join(WORK, "out/d/d d.glo"))
    expect(convert("out", "--scale", "2") == (2, 3, 0), "after a scene and a report were lost")
    expect(convert("out", "--scale", "2", "--again") == (5, 0, 0), "--again")

    os.makedirs(os.path.join(WORK, "painted/sub"))
    make_painted(os.path.join(WORK, "painted/paint.obj"))
    make_picture(os.path.join(WORK, "painted/paint.png"))
    shutil.copy(os.path.join(WORK, "painted/paint.obj"), os.path.join(WORK, "painted/paint-obj.obj"))
    make_model(os.path.join(WORK, "painted/paint.gltf"))
    os.makedirs(os.path.join(WORK, "elsewhere"))
    with open(os.path.join(WORK, "elsewhere/plain.obj"), "w", encoding="utf-8") as file:
        file.write("v 0 0 0\nv 1 0 0\nv 1 1 0\nf 1 2 3\n")
    os.symlink(os.path.join(WORK, "elsewhere/plain.obj"), os.path.join(WORK, "painted/sub/link.obj"))
    expect(convert("out2", folder="painted") == (4, 0, 0), "two of one name, and one named like what becomes of them")
    expect(os.listdir(os.path.join(WORK, "elsewhere")) == ["plain.obj"], "something is beside what a link leads to")
    names = {name for name in os.listdir(os.path.join(WORK, "out2")) if name.endswith(".glo")}
    expect(names == {"paint-gltf.glo", "paint-obj.glo", "paint-obj-obj.glo"}, names)
    os.remove(os.path.join(WORK, "out2/paint-obj-paint.png"))
    expect(convert("out2", folder="painted") == (1, 3, 0), "after a texture was lost")

    parts = [convert("parts", "--shard", f"{i}/3") for i in (1, 2, 3)]
    expect(sum(part[0] for part in parts) == 5, "of three shards", parts)
    expect(convert("parts") == (0, 5, 0), "after all shards")
    run(CONVERT, models, os.path.join(WORK, "out"), "--shard", "4/3", wanted=2)
    run(CONVERT, os.path.join(models, "a/a.gltf"), os.path.join(WORK, "a.glo"), "--shard", "1/3", wanted=2)


def main():
    shutil.rmtree(WORK, ignore_errors=True)
    os.makedirs(WORK)
    check_build()
    check_folder()
    print("Builds and folders convert what has changed, and nothing else.")


if __name__ == "__main__":
    main()
