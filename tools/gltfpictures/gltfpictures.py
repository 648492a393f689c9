#!/usr/bin/python3
"""Draws glTF models of different kinds beside three.js in Chromium, and compares outlines and colours.

    gltfpictures.py CONVERTER VIEWER NODE_MODULES CHROMIUM FOLDER DOCS [NAME...]

FOLDER is what makevariants.py made; MADE/ is added to it. A camera is put into a copy of each file, and two lamps beside
it, so that both use the same view and light. Writes sheets of pairs to DOCS/pictures/gltf (orv left, three.js right)
and DOCS/gltfpictures.md. With names, only those are drawn, and their pairs go to FOLDER/pairs. Exit code 1 if a picture
is missing or an outline overlaps by less than is allowed.

Needs python3-numpy, python3-scipy and python3-pil, and so Debian's own Python.
"""
import json
import os
import shutil
import struct
import subprocess
import sys
import tempfile
from collections import namedtuple

import numpy as np
from PIL import Image, ImageDraw

import makemodels

HERE = os.path.dirname(os.path.abspath(__file__))
sys.path.append(os.path.join(HERE, "..", "gltfmodels"))
from posedglo import PosedGlo  # noqa: E402

WIDTH, HEIGHT = 640, 480
SMALL = (200, 150)
COLUMNS = 3  # of pairs on a sheet
ROWS = 5
GREY = 96.0
FIELD = 0.6  # of view from bottom to top, in radians
LEAST = 0.99  # of the outlines that has to overlap
FPS = 30.0
LAMPS = (((-0.2706, -0.2588, -0.0701, 0.9246), 0.8), ((-0.0436, 0.4981, 0.0251, 0.8656), 0.3))
SKY = {"zenith": "#6f9fd8", "horizon": "#e6ecf2", "ground": "#5c544c"}  # as in orv-convert

# file: below FOLDER; none for one of makemodels.py. moment: (clip, seconds), or None for the pose at rest. camera: the
# file's own, by the converter's name for it and by its number. lit: by the file's own lamps. least: see LEAST. remark:
# what differs and why, written after looking at the pair.
Model = namedtuple("Model", "name kind file moment camera lit least sky remark",
                   defaults=(None, None, None, False, LEAST, False, ""))

MODELS = (
    Model("boxtextured", "GLB, textured", "as-it-is/glTF2/BoxTextured-glTF-Binary/BoxTextured.glb"),
    Model("engine", "83 nodes, 35 materials", "as-it-is/glTF2/2CylinderEngine-glTF-Binary/2CylinderEngine.glb"),
    Model("enginedraco", "Draco, edgebreaker", "glTF2_2CylinderEngine-glTF-Binary_2CylinderEngine.glb/transform-edgebreaker.glb"),
    Model("enginepacked", "meshopt, quantised, merged", "glTF2_2CylinderEngine-glTF-Binary_2CylinderEngine.glb/pack-cc.glb"),
    Model("engineinstances", "EXT_mesh_gpu_instancing", "glTF2_2CylinderEngine-glTF-Binary_2CylinderEngine.glb/transform-instance.glb"),
    Model("specgloss", "specular-glossiness, textured",
          "as-it-is/glTF2/BoxTextured-glTF-pbrSpecularGlossiness/BoxTextured.gltf",
          remark="three.js no longer supports this extension; the drawing page reads its colours."),
    Model("clearcoat", "clear coats, which are lost", "as-it-is/glTF2/ClearCoat-glTF/ClearCoatTest.gltf",
          remark="The clear coats are lost, as the report says."),
    Model("transforms", "KHR_texture_transform", "as-it-is/glTF2/textureTransform/TextureTransformTest.gltf",
          remark="In three.js rough surfaces reflect a little white everywhere: dark and saturated colours are paler."),
    Model("simpleskin", "skin, a clip at 1 s", "as-it-is/glTF2/simple_skin/simple_skin.gltf", (0, 1.0)),
    Model("badnormals", "normals that point inwards", "as-it-is/glTF2/BoxBadNormals-glTF-Binary/BoxBadNormals.glb",
          remark="Paler in three.js, as above."),
    Model("texcoords", "glTF of several textures", "as-it-is/glTF2/BoxTexcoords-glTF/boxTexcoords.gltf"),
    Model("cameras", "the file's own camera", "as-it-is/glTF2/cameras/Cameras.gltf", None, ("nodes[1]", 0),
          remark="No material, that is, a metal without gloss; in three.js its brightness depends on the angle."),
    Model("morphcube", "morph targets, a clip at 1 s",
          "as-it-is/glTF2/glTF-Sample-Models/AnimatedMorphCube-glTF/AnimatedMorphCube.gltf", (0, 1.0)),
    Model("boxmeshopt", "meshopt at its strongest", "glTF2_BoxTextured-glTF_BoxTextured.gltf/transform-meshopt.glb"),
    Model("transformswebp", "pictures of WebP", "glTF2_textureTransform_TextureTransformTest.gltf/transform-webp.glb",
          remark="Likewise."),
    Model("huesitos", "skin of 9 joints, at 0.8 s", "FBX_huesitos.fbx.glb", (0, 0.8),
          remark="Lit at each vertex here, at each pixel in three.js: highlights are softer."),
    Model("huesitosdraco", "skin in Draco, at 0.8 s", "FBX_huesitos.fbx/transform-draco.glb", (0, 0.8),
          remark="Likewise."),
    Model("rod", "skin in meshopt, at 0.4 s", "FBX_animation_with_skeleton.fbx/pack-cc.glb", (0, 0.4), least=0.98,
          remark="A rod twenty pixels thick: many of its pixels are edges."),
    Model("epileptic", "quantised skin, at 1 s", "X_BCN_Epileptic.X/pack-named.glb", (0, 1.0)),
    Model("wuson", "the second of several clips, at 0.5 s", "X_Testwuson.X.glb", (1, 0.5)),
    Model("spider", "six materials", "OBJ_spider.obj/pack-plain.glb",
          remark="Likewise."),
    Model("mrfixit", "16-bit shares for positions", "IQM_mrfixit.iqm/pack-shares.glb"),
    Model("faerie", "quantised, normals of 8 bits", "MD2_faerie.md2/pack.glb",
          remark="A metal, softer at the edges, as above."),
    Model("spheres", "KHR_materials_unlit", "MS3D_twospheres.ms3d/transform-unlit.glb"),
    Model("colouredcube", "colours of vertices, quantised", "OBJ_cube_with_vertexcolors.obj/pack-c.glb"),
    Model("coloured", "colours of vertices as bytes and as 16 bits; unlit"),
    Model("cutout", "MASK, one behind the other"),
    Model("panes", "BLEND, pane behind pane"),
    Model("blended", "alpha of pictures and of vertices"),
    Model("backs", "doubleSided, seen from behind"),
    Model("glow", "emission, its picture and strength"),
    Model("mirrored", "negative scales, one in another"),
    Model("bent", "skins that share joints, below scale, mirrored; at 0.5 s", None, (0, 0.5), least=0.95,
          remark="A mirroring armature: three.js takes the winding from the mesh's node and shows the inside, which is "
                 "black; here it follows the joints."),
    Model("morphed", "default weights of a mesh and of a node"),
    Model("movingmorph", "animated weights, at 0.8 s", None, (0, 0.8)),
    Model("seconduv", "TEXCOORD_1"),
    Model("wraps", "clamped, repeated, mirrored; nearest; turned"),
    Model("ways", "STEP, LINEAR, CUBICSPLINE; at 0.7 s", None, (0, 0.7)),
    Model("waysturn", "the same, second clip; at 0.6 s", "MADE/ways/model.gltf", (1, 0.6)),
    Model("many", "78,961 vertices"),
    Model("lamps", "point, spot, directional lights", lit=True,
          remark="The engine's lights have linear attenuation, see [convert.md](convert.md)."),
    Model("owncamera", "orthographic camera", None, None, ("nodes[3]", 0)),
    Model("plastics", "roughness; KHR_materials_specular",
          remark="Highlights of the smoothest surfaces are as small as the engine allows."),
    Model("metals", "metals under a plain sky (`--sky`)", sky=True,
          remark="The sky is as sharp in rough metals as in smooth ones; surfaces of metalness below 0.5 mirror nothing."),
    Model("bare", "no normals; strides; sparse without a buffer view"),
    Model("strips", "strips and fans"),
    Model("scenes", "the default scene; a hidden node", least=0.75,
          remark="three.js does not know KHR_node_visibility and shows the red sheet too."),
    Model("names", "UTF-8, percent signs, duplicate names; at 1 s", None, (0, 1.0)),
    Model("bumps", "normal maps without tangents"),
)


def run(command):
    done = subprocess.run(command, capture_output=True, timeout=300)
    if done.returncode != 0:
        raise RuntimeError("%s: %s" % (command[0], done.stderr.decode(errors="replace").strip()[-400:]))


def open_gltf(path):
    """The JSON of a file, and what follows it in a binary one (None for a text)."""
    with open(path, "rb") as file:
        data = file.read()
    if data[:4] != b"glTF":
        return json.loads(data.decode("utf-8-sig")), None
    length = struct.unpack_from("<I", data, 12)[0]
    return json.loads(data[20 : 20 + length]), data[20 + length :]


def save_gltf(path, root, rest):
    text = json.dumps(root).encode()
    if rest is not None:
        text += b" " * (-len(text) % 4)
        text = struct.pack("<4sIIII", b"glTF", 2, 20 + len(text) + len(rest), len(text), 0x4E4F534A) + text + rest
    with open(path, "wb") as file:
        file.write(text)


def aim(points):
    """The transform of a camera that has all points in view, and how far the nearest and the farthest are."""
    back = np.array((0.45, 0.35, 1.0))
    back /= np.linalg.norm(back)
    right = np.cross((0, 1, 0), back)
    right /= np.linalg.norm(right)
    axes = np.stack([right, np.cross(back, right), back])
    seen = points @ axes.T
    middle = (seen.min(0) + seen.max(0)) / 2
    x, y, z = (seen - middle).T
    slope = np.tan(FIELD / 2)
    away = max((z + np.abs(y) / slope).max(), (z + np.abs(x) / slope * HEIGHT / WIDTH).max()) * 1.05
    matrix = np.eye(4)
    matrix[:3, :3] = axes.T
    matrix[:3, 3] = axes.T @ (middle + (0, 0, away))
    size = max(np.ptp(seen, axis=0).max(), 1e-6)
    return matrix, max(away - z.max() - 0.1 * size, 0.01 * size), away - z.min() + 0.1 * size


def add_eye(root, model, points):
    nodes = root["nodes"]
    shown = root["scenes"][root.get("scene", 0)].setdefault("nodes", [])
    matrix, near, far = aim(points)
    eye = {"name": "eye", "matrix": matrix.T.ravel().tolist(), "children": []}
    if not model.camera:
        root.setdefault("cameras", []).append({"type": "perspective", "name": "eye", "perspective": {
            "yfov": FIELD, "aspectRatio": WIDTH / HEIGHT, "znear": near, "zfar": far}})
        eye["camera"] = len(root["cameras"]) - 1
    nodes.append(eye)
    shown.append(len(nodes) - 1)
    if model.lit:
        return
    root["extensionsUsed"] = sorted({*root.get("extensionsUsed", []), "KHR_lights_punctual"})
    lights = root.setdefault("extensions", {}).setdefault("KHR_lights_punctual", {"lights": []})["lights"]
    for node in nodes:
        node.get("extensions", {}).pop("KHR_lights_punctual", None)
    lights.clear()
    for rotation, strength in LAMPS:
        lights.append({"type": "directional", "intensity": strength, "color": [1, 1, 1]})
        lamp = {"rotation": list(rotation), "extensions": {"KHR_lights_punctual": {"light": len(lights) - 1}}}
        nodes.append(lamp)
        eye["children"].append(len(nodes) - 1)


class Painter:
    def __init__(self, converter, viewer, folder, scratch):
        self.converter, self.viewer, self.folder, self.scratch = converter, viewer, folder, scratch

    def convert(self, path, scene, model):
        command = [self.converter, path, scene, "--report", scene + ".json", "--fps", str(FPS)]
        run(command + (["--sky"] if model.sky else []))
        with open(scene + ".json", encoding="utf-8") as file:
            return json.load(file)

    def draw(self, model):
        """Draws our side as PNG files. @return the work for three.js."""
        source = os.path.join(self.folder, model.file or "MADE/%s/model.gltf" % model.name)
        home = os.path.join(self.scratch, model.name)
        if source.endswith(".glb"):
            os.makedirs(home)
        else:
            shutil.copytree(os.path.dirname(source), home)
        scene = os.path.join(home, "orv-scene.glo")
        report = self.convert(source, scene, model)
        clip = report["clips"][model.moment[0]] if model.moment else None
        faces = PosedGlo(scene).pose(clip["start"] + model.moment[1] + 0.02 / FPS if clip else None)
        points = np.concatenate([corners.reshape(-1, 3) for corners in faces.values()])
        root, rest = open_gltf(source)
        add_eye(root, model, points[np.isfinite(points).all(1)])
        copy = os.path.join(home, "seen" + os.path.splitext(source)[1])
        save_gltf(copy, root, rest)
        self.convert(copy, scene, model)
        out = os.path.join(self.scratch, model.name)
        for background in ("black", "white"):
            command = [self.viewer, scene, "--out", "%s-orv-%s.png" % (out, background), "--background", background]
            command += ["--size", "%dx%d" % (WIDTH, HEIGHT), "--camera", model.camera[0] if model.camera else "eye"]
            if model.moment:
                command += ["--time", str(model.moment[1] + 0.02 / FPS)]
                command += ["--clip", clip["name"]] if len(report["clips"]) > 1 else []
            run(command)
        number, seconds = model.moment or (None, 0.0)
        return {"model": copy, "out": out + "-three", "width": WIDTH, "height": HEIGHT, "clip": number, "time": seconds,
                "camera": model.camera[1] if model.camera else -1, "sky": SKY if model.sky else None}


def read_picture(path):
    """Colours times how much of a pixel is covered, and the latter."""
    black, white = (np.asarray(Image.open("%s-%s.png" % (path, name)).convert("RGB"), float) for name in ("black", "white"))
    return black, np.clip(1.0 - (white - black).mean(2) / 255.0, 0.0, 1.0)


def show(picture):
    colours, cover = picture
    return Image.fromarray(np.uint8(np.clip(colours + (1.0 - cover[..., None]) * GREY, 0, 255)))


def compare(ours, theirs):
    """The share of both outlines that is common, and the mean difference of colours where both cover, of 255."""
    either = np.maximum(ours[1], theirs[1]).sum()
    both = (ours[1] > 0.5) & (theirs[1] > 0.5)
    overlap = np.minimum(ours[1], theirs[1]).sum() / either if either else 0.0
    return overlap, np.abs(ours[0] - theirs[0])[both].mean() if both.any() else 255.0


def make_pair(model, ours, theirs):
    pair = Image.new("RGB", (SMALL[0] * 2 + 2, SMALL[1] + 14), "white")
    for i, picture in enumerate((ours, theirs)):
        pair.paste(show(picture).resize(SMALL, Image.LANCZOS), (i * (SMALL[0] + 2), 14))
    ImageDraw.Draw(pair).text((2, 1), model.name, fill="black")
    return pair


def write_sheets(pairs, folder):
    os.makedirs(folder, exist_ok=True)
    per_sheet, names = COLUMNS * ROWS, []
    for first in range(0, len(pairs), per_sheet):
        some = pairs[first : first + per_sheet]
        width, height = some[0].size
        sheet = Image.new("RGB", ((width + 8) * COLUMNS - 8, (height + 4) * -(-len(some) // COLUMNS)), "white")
        for i, pair in enumerate(some):
            sheet.paste(pair, (i % COLUMNS * (width + 8), i // COLUMNS * (height + 4)))
        names.append("sheet%d.jpg" % (len(names) + 1))
        sheet.save(os.path.join(folder, names[-1]), quality=82, optimize=True)
    return names


INTRODUCTION = """# glTF beside three.js, drawn

Made by `./run gltfpictures`: {count} glTF models of different kinds, drawn by `orv-convert` and `orv-view` and by three.js 0.187 in headless
Chromium. Camera and lamps are those of each file; the pictures are {width} x {height} pixels. *Overlap*: the intersection of
the two outlines divided by their union, pixels at the edges counted by coverage; at least {least} % unless a remark says why
not. *Colour*: the mean difference over the pixels that both cover, of 255.

On the sheets, orv is on the left of each pair. {below} of {count} outlines overlap by less than {least} %.

"""


def write_page(docs, rows, sheets):
    below = sum(1 for _, overlap, _ in rows if overlap < LEAST)
    with open(os.path.join(docs, "gltfpictures.md"), "w", encoding="utf-8") as file:
        file.write(INTRODUCTION.format(count=len(rows), width=WIDTH, height=HEIGHT, least=round(LEAST * 100), below=below))
        for name in sheets:
            file.write("![pairs of pictures, orv on the left](pictures/gltf/%s)\n\n" % name)
        file.write("| model | kind | overlap | colour | |\n|---|---|---|---|---|\n")
        for model, overlap, colour in rows:
            kind = "%s%s" % (model.kind, " (made by the script)" if not model.file else "")
            file.write("| %s | %s | %.2f %% | %.1f | %s |\n" % (model.name, kind, overlap * 100, colour, model.remark))


def main():
    converter, viewer, modules, chromium, folder, docs, *names = sys.argv[1:]
    makemodels.write_all(os.path.join(folder, "MADE"))
    chosen = [model for model in MODELS if not names or model.name in names]
    failed = False
    with tempfile.TemporaryDirectory(ignore_cleanup_errors=True) as scratch:
        painter, jobs = Painter(converter, viewer, folder, scratch), []
        for model in chosen:
            try:
                jobs.append(painter.draw(model))
            except (RuntimeError, OSError, KeyError, ValueError) as error:
                print("%s: %r" % (model.name, error), file=sys.stderr)
                failed = True
        with open(os.path.join(scratch, "jobs.json"), "w", encoding="utf-8") as file:
            json.dump(jobs, file)
        script = os.path.join(HERE, "drawwiththree.mjs")
        failed |= subprocess.run(["node", script, modules, chromium, file.name]).returncode != 0
        rows, pairs = [], []
        for model in chosen:
            sides = [os.path.join(scratch, model.name + side) for side in ("-orv", "-three")]
            if not all(os.path.exists(side + "-white.png") for side in sides):
                continue
            ours, theirs = (read_picture(side) for side in sides)
            rows.append((model, *compare(ours, theirs)))
            pairs.append(make_pair(model, ours, theirs))
            failed |= rows[-1][1] < model.least
            print("%-16s %6.2f %% %5.1f%s" % (model.name, rows[-1][1] * 100, rows[-1][2],
                                              "" if rows[-1][1] >= model.least else "  LOW"), flush=True)
            if names:
                kept = os.path.join(folder, "pairs")
                os.makedirs(kept, exist_ok=True)
                for picture, side in ((ours, "orv"), (theirs, "three")):
                    show(picture).save(os.path.join(kept, "%s-%s.png" % (model.name, side)))
    if not names:
        write_page(docs, rows, write_sheets(pairs, os.path.join(docs, "pictures", "gltf")))
    return 1 if failed else 0


if __name__ == "__main__":
    sys.exit(main())
