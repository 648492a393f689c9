#!/usr/bin/python3
"""Draws models of other people beside pictures of the same models by other renderers.

    modelpictures.py CONVERTER VIEWER FOLDER DOCS [NAME...]

FOLDER holds Debian's assimp-testmodels. Writes DOCS/pictures/models/NAME.png, orv-view on the left, the other one on the
right, and DOCS/modelpictures.md. With names, only those pictures are drawn again. Exit code 1 if one cannot be drawn.

Needs Debian's blender, python3-numpy (for Blender's readers), f3d, xvfb and python3-pil, and so Debian's own Python.
"""
import argparse
import base64
import json
import math
import os
import struct
import subprocess
import sys
import tempfile
import textwrap
import zipfile
from collections import namedtuple

from PIL import Image

WIDTH, HEIGHT = 320, 240
COLOURS = 200  # of a finished picture
BACKGROUND = (96, 96, 96)
SECONDS = 120  # for one picture
HERE = os.path.dirname(os.path.abspath(__file__))

# name: of the picture. file: in the folder. drawer: the other side. moment: seconds, or None for the pose at rest.
# kind: what the model is there for. remark: what differs, and why; written after looking at the pair.
Pair = namedtuple("Pair", "name file drawer kind remark moment up other", defaults=(None, "z", None))

PAIRS = (
    Pair("boxtextured", "glTF2/BoxTextured-glTF/BoxTextured.gltf", "blender", "glTF 2.0, textured",
         "The same. Cycles softens with 16 samples a pixel, the engine with four along edges."),
    Pair("engine", "glTF2/2CylinderEngine-glTF-Binary/2CylinderEngine.glb", "blender", "GLB, 83 nodes, 35 materials",
         "Every part in its place and colour. The gaps between the ribs are darker in Blender, where parts shade each "
         "other."),
    Pair("clearcoat", "glTF2/ClearCoat-glTF/ClearCoatTest.gltf", "blender", "glTF 2.0, normal maps, a blended material",
         "Colours and bumps agree. The report lists the clear coats as lost. In Blender they are all that the third "
         "column shows; here it is black except for highlights, and the background shows through the second one."),
    Pair("texturetransform", "glTF2/textureTransform/TextureTransformTest.gltf", "blender", "glTF 2.0, texture transforms",
         "All arrows end at the green ticks on both sides. Blender is darker, since its lamps light the panes at an "
         "angle."),
    Pair("glass", "(made)", "blender", "glTF 2.0, transparent",
         "The same order and mixture of colours. Blender's panes cast shadows on each other."),
    Pair("lines", "glTF2/glTF-Asset-Generator/Mesh_PrimitiveMode/Mesh_PrimitiveMode_02.gltf", "f3d", "glTF 2.0, lines",
         "The same outline; VTK's line is thinner, since its picture is scaled down.", None, "y"),
    Pair("simpleskin", "glTF2/simple_skin/simple_skin.gltf", "blender", "glTF 2.0, skin, animated, at 1 s",
         "The same bend at the same time. Brighter here: the lamp faces the flat sheet.", 1.0),
    Pair("tentacle", "(made)", "blender", "glTF 2.0, skin of 30 joints, animated, at 1 s",
         "The same curve in the same shades, here in two parts because of the limit of 20 joints, without a seam.", 1.0),
    Pair("morphcube", "glTF2/glTF-Sample-Models/AnimatedMorphCube-glTF/AnimatedMorphCube.gltf", "blender",
         "glTF 2.0, morph targets", "The same shape at rest. While the animation plays, one mesh for each shape is shown "
         "in turn."),
    Pair("skeleton", "FBX/animation_with_skeleton.fbx", "blender", "FBX, skin, animated, at 0.4 s",
         "The same pose. Where the rod bends it is a little narrower here: vertices have up to six joints, of which the "
         "engine uses four. Here the file's own lamp lights it from below; Blender's picture has other lamps.", 0.4),
    Pair("huesitos", "FBX/huesitos.fbx", "blender", "FBX, skin of 9 joints, animated, at 0.8 s",
         "The same pose. The lamp is again the file's. Blender reads the file's opacity of 0 as invisible; it was "
         "overridden for this picture.", 0.8),
    Pair("spiderfbx", "FBX/spider.fbx", "blender", "FBX, units, a light and a camera, missing pictures",
         "The same parts in the same places. The pictures are missing: Blender shows magenta, the converter reports them "
         "and keeps the colours."),
    Pair("duck", "Collada/duck.dae", "blender", "Collada, textured, a light and a camera",
         "The same; the light here is the file's. Blender's highlights are those of a default roughness."),
    Pair("nested", "Collada/box_nested_animation.dae", "blender", "Collada, animated, at 0.6 s",
         "The box has the same orientation.", 0.6),
    Pair("instances", "Collada/teapot_instancenodes.DAE", "blender", "Collada, instances",
         "The same places. Paler in Blender, which reads the file's colours as linear, not as sRGB."),
    Pair("cinema", "Collada/Cinema4D.dae", "blender", "Collada of Cinema 4D, three meshes",
         "The same; Blender adds shadows."),
    Pair("human", "Collada/human.zae", "blender", "Collada in an archive, 28,796 triangles",
         "The same shape. Paler in Blender: the file's colours again."),
    Pair("vertexcolours", "Collada/kwxport_test_vcolors.dae", "blender", "Collada, three materials, vertex colours",
         "The pictures have the same orientation. Here the file's vertex colours (red, white, green) multiply them; "
         "Blender's reader ignores those."),
    Pair("spiderobj", "OBJ/spider.obj", "blender", "OBJ, 6 materials, 4 pictures",
         "The same pictures in the same places."),
    Pair("manyvertices", "(made)", "blender", "OBJ, 102,400 vertices in one mesh",
         "The same waves, without a gap where the parts of at most 65,536 vertices meet. Darker here: without a colour in "
         "the "
         "file the converter takes grey of 0.6, Blender of 0.8."),
    Pair("wusonstl", "STL/Wuson.stl", "blender", "STL, normals of no length",
         "The same shape. Smooth here, since the normals are recomputed; faceted in Blender.", None, "y"),
    Pair("spiderstl", "STL/Spider_binary.stl", "blender", "STL, normals of the wrong side",
         "The same, smooth here, faceted in Blender. With the file's normals it would be black.", None, "y"),
    Pair("fels", "3DS/fels.3ds", "f3d", "3DS",
         "The same rock, here with the normals from libassimp, in VTK faceted."),
    Pair("alphacubes", "3DS/cubes_with_alpha.3DS", "f3d", "3DS, transparent",
         "The same cubes; the large one in front is slightly transparent. Other colours: the file has teal, blue, "
         "green as ambient and dark red, orange, magenta as diffuse colours, and VTK draws the ambient ones."),
    Pair("monkey", "BLEND/Suzanne_248.blend", "blender", "Blender 2.48",
         "The same monkey; its face looks long because the eye is near. Smooth here below 66 degrees, faceted in Blender "
         "3.4."),
    Pair("monkeysubdiv", "BLEND/SuzanneSubdiv_252.blend", "blender", "Blender 2.52, a subdivided mesh",
         "The same outline: it looks upwards, its chin towards the eye, in both. Faces of this mesh share no vertices: "
         "Blender's subdivision leaves gaps between them; libassimp joins them first, so it is rounder."),
    Pair("torus", "BLEND/TorusLightsCams_250_compressed.blend", "blender", "Blender 2.50, five lights, two cameras",
         "The same shape. Too bright here, and black where no lamp reaches: the file's five lamps add up, and libassimp "
         "does not return their attenuation. Blender's picture has other lamps."),
    Pair("wusonsmd", "SMD/WusonSMD.smd", "blender", "SMD, beside the same model as PLY",
         "The same animal, the same way up. Darker: the picture that the SMD file names is missing.", None, "y",
         "PLY/Wuson.ply"),
    Pair("wusonx", "X/Testwuson.X", "blender", "X, 37 joints, beside the same model as PLY",
         "The same animal from another file, in which it looks the other way.", None, "y", "PLY/Wuson.ply"),
)


def run(command):
    """None, or why it failed."""
    try:
        done = subprocess.run(command, capture_output=True, timeout=SECONDS)
    except subprocess.TimeoutExpired:
        return "took too long"
    if done.returncode == 0:
        return None
    return (done.stderr or done.stdout).decode(errors="replace").strip()[-300:]


def write_wavy_torus(path):
    """A mesh of more vertices than 16-bit indices allow; seams or wrong indices would show in its waves."""
    rings, sides = 640, 160
    with open(path, "w", encoding="ascii") as file:
        for ring in range(rings):
            angle = 2 * math.pi * ring / rings
            for side in range(sides):
                turn = 2 * math.pi * side / sides
                thickness = 0.4 + 0.04 * math.sin(8 * turn + 24 * angle)
                out = 1 + thickness * math.cos(turn)
                file.write("v %.6f %.6f %.6f\n" % (out * math.cos(angle), thickness * math.sin(turn), -out * math.sin(angle)))
        file.write("s 1\n")
        for ring in range(rings):
            for side in range(sides):
                corners = [(ring, side), (ring + 1, side), (ring + 1, side + 1), (ring, side + 1)]
                file.write("f %s\n" % " ".join(str(r % rings * sides + s % sides + 1) for r, s in corners))


def write_gltf(path, root, arrays):
    """Adds a buffer to a file's root, and an accessor for each array of (format of struct, glTF type, rows)."""
    data = b""
    root["accessors"], root["bufferViews"] = [], []
    for kind, shape, rows in arrays:
        packed = b"".join(struct.pack("<" + kind, *row) for row in rows)
        root["bufferViews"].append({"buffer": 0, "byteOffset": len(data), "byteLength": len(packed)})
        component = {"f": 5126, "H": 5123}[kind[-1]]
        accessor = {"bufferView": len(root["accessors"]), "componentType": component, "type": shape, "count": len(rows)}
        if kind[-1] == "f":
            accessor["min"] = [min(column) for column in zip(*rows)]
            accessor["max"] = [max(column) for column in zip(*rows)]
        root["accessors"].append(accessor)
        data += packed + b"\0" * (-len(packed) % 4)
    uri = "data:application/octet-stream;base64," + base64.b64encode(data).decode()
    root["buffers"] = [{"uri": uri, "byteLength": len(data)}]
    root["asset"] = {"version": "2.0"}
    with open(path, "w", encoding="ascii") as file:
        json.dump(root, file)


def write_tentacle(path):
    """A tube along 30 joints, each slightly rotated relative to the one before."""
    joints, sides = 30, 12
    places, normals, owners, weights, faces = [], [], [], [], []
    for ring in range(joints):
        radius = 1.5 * (1 - 0.8 * ring / joints)
        for side in range(sides):
            out = (math.cos(2 * math.pi * side / sides), 0.0, -math.sin(2 * math.pi * side / sides))
            places.append((out[0] * radius, float(ring), out[2] * radius))
            normals.append(out)
            owners.append((ring, max(ring - 1, 0), 0, 0))
            weights.append((0.5, 0.5, 0.0, 0.0))
            if ring + 1 < joints:
                a, b = ring * sides + side, ring * sides + (side + 1) % sides
                faces += [(a,), (b,), (b + sides,), (a,), (b + sides,), (a + sides,)]
    binds = [(1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, -joint, 0, 1) for joint in range(joints)]
    turns = [(0.0, 0.0, 0.0, 1.0), (0.0, 0.0, math.sin(0.13), math.cos(0.13))]
    arrays = [("3f", "VEC3", places), ("3f", "VEC3", normals), ("4H", "VEC4", owners), ("4f", "VEC4", weights)]
    arrays += [("H", "SCALAR", faces), ("16f", "MAT4", binds), ("f", "SCALAR", [(0.0,), (2.0,)]), ("4f", "VEC4", turns)]
    nodes = [{"name": "joint %d" % i, "translation": [0, int(i > 0), 0], "children": [i + 1]} for i in range(joints)]
    del nodes[-1]["children"]
    primitive = {"attributes": {"POSITION": 0, "NORMAL": 1, "JOINTS_0": 2, "WEIGHTS_0": 3}, "indices": 4, "material": 0}
    channels = [{"sampler": 0, "target": {"node": i, "path": "rotation"}} for i in range(1, joints)]
    root = {
        "nodes": nodes + [{"name": "tentacle", "mesh": 0, "skin": 0}],
        "scenes": [{"nodes": [0, joints]}],
        "scene": 0,
        "meshes": [{"primitives": [primitive]}],
        "skins": [{"joints": list(range(joints)), "inverseBindMatrices": 5}],
        "animations": [{"samplers": [{"input": 6, "output": 7}], "channels": channels}],
        "materials": [make_gltf_material([0.1, 0.5, 0.2, 1.0])],
    }
    write_gltf(path, root, arrays)


def make_gltf_material(colour):
    surface = {"baseColorFactor": colour, "metallicFactor": 0.0, "roughnessFactor": 0.6}
    return {"pbrMetallicRoughness": surface, "alphaMode": "OPAQUE" if colour[3] == 1 else "BLEND", "doubleSided": True}


def write_glass(path):
    """Three panes, one behind the other, and a solid one at the back."""
    colours = [[0.8, 0.1, 0.1, 0.4], [0.1, 0.7, 0.1, 0.4], [0.1, 0.1, 0.8, 0.7], [0.9, 0.8, 0.2, 1.0]]
    places = [(-1.0, -1.0, 0.0), (1.0, -1.0, 0.0), (1.0, 1.0, 0.0), (-1.0, 1.0, 0.0)]
    arrays = [("3f", "VEC3", places), ("3f", "VEC3", [(0.0, 0.0, 1.0)] * 4)]
    arrays.append(("H", "SCALAR", [(i,) for i in (0, 1, 2, 0, 2, 3)]))
    attributes = {"POSITION": 0, "NORMAL": 1}
    count = range(len(colours))
    root = {
        "nodes": [{"mesh": i, "translation": [i * 0.6, i * 0.5, -i * 0.8]} for i in count],
        "scenes": [{"nodes": list(count)}],
        "scene": 0,
        "meshes": [{"primitives": [{"attributes": attributes, "indices": 2, "material": i}]} for i in count],
        "materials": [make_gltf_material(colour) for colour in colours],
    }
    write_gltf(path, root, arrays)


MADE = {
    "manyvertices": ("torus.obj", write_wavy_torus),
    "tentacle": ("tentacle.gltf", write_tentacle),
    "glass": ("glass.gltf", write_glass),
}


def find_model(pair, folder, scratch):
    """The file for both sides, decompressed if one of them cannot read it."""
    if pair.file == "(made)":
        model = os.path.join(scratch, MADE[pair.name][0])
        MADE[pair.name][1](model)
        return model
    model = os.path.join(folder, pair.file)
    if not model.endswith(".zae"):
        return model
    with zipfile.ZipFile(model) as archive:
        archive.extractall(scratch)
        return os.path.join(scratch, next(name for name in archive.namelist() if name.lower().endswith(".dae")))


def draw_ours(arguments, pair, model, picture):
    scene = picture + ".glo"
    error = run([arguments.converter, model, scene, "--allow", arguments.folder])
    if error:
        return error
    command = [arguments.viewer, scene, "--out", picture, "--size", "%dx%d" % (WIDTH, HEIGHT)]
    command += ["--background", "#%02x%02x%02x" % BACKGROUND]
    return run(command + (["--time", str(pair.moment)] if pair.moment is not None else []))


def draw_with_blender(pair, model, picture):
    script = os.path.join(HERE, "drawwithblender.py")
    moment = "rest" if pair.moment is None else str(pair.moment)
    command = ["blender", "--background", "--factory-startup", "--python-exit-code", "1", "--python", script, "--"]
    return run(command + [model, picture, str(WIDTH), str(HEIGHT), moment, pair.up])


def draw_with_f3d(pair, model, picture):
    """Drawn large, since f3d leaves wide margins, and cropped."""
    command = ["xvfb-run", "-a", "f3d", model, "--output=" + picture, "--resolution=%d,%d" % (WIDTH * 3, HEIGHT * 3)]
    command += ["--camera-azimuth-angle=26.6", "--camera-elevation-angle=19.7", "--no-background", "--quiet"]
    command += ["--depth-peeling", "--fxaa", "--up=+" + pair.up.upper()]
    error = run(command)
    if error:
        return error
    large = Image.open(picture).convert("RGBA")
    box = large.getchannel("A").getbbox() or (0, 0, 1, 1)
    scale = 0.9 * min(WIDTH / (box[2] - box[0]), HEIGHT / (box[3] - box[1]))
    size = [max(1, round((box[i + 2] - box[i]) * scale)) for i in (0, 1)]
    small = Image.new("RGBA", (WIDTH, HEIGHT))
    small.paste(large.crop(box).resize(size, Image.LANCZOS), ((WIDTH - size[0]) // 2, (HEIGHT - size[1]) // 2))
    small.save(picture)
    return None


DRAWERS = {"blender": draw_with_blender, "f3d": draw_with_f3d}


def draw_pair(arguments, pair, target):
    """None, or why there is no picture."""
    with tempfile.TemporaryDirectory() as scratch:
        model = find_model(pair, arguments.folder, scratch)
        ours, theirs = os.path.join(scratch, "ours.png"), os.path.join(scratch, "theirs.png")
        other = os.path.join(arguments.folder, pair.other) if pair.other else model
        error = draw_ours(arguments, pair, model, ours) or DRAWERS[pair.drawer](pair, other, theirs)
        if error or not os.path.exists(theirs):
            return error or "no picture came from " + pair.drawer
        both = Image.new("RGBA", (WIDTH * 2 + 2, HEIGHT), (*BACKGROUND, 255))
        for picture, left in ((ours, 0), (theirs, WIDTH + 2)):
            both.alpha_composite(Image.open(picture).convert("RGBA"), (left, 0))
        both.convert("RGB").quantize(COLOURS).save(target, optimize=True)
    return None


def write_page(page):
    with open(page, "w", encoding="utf-8") as file:
        file.write(INTRODUCTION)
        for pair in PAIRS:
            file.write("\n## %s\n\n" % pair.kind)
            source = "Made by the script" if pair.file == "(made)" else "`%s`" % pair.file
            beside = " from `%s`" % pair.other if pair.other else ""
            file.write("%s; on the right %s%s\n\n" % (source, pair.drawer, beside))
            file.write("![%s](pictures/models/%s.png)\n\n%s\n" % (pair.kind, pair.name, textwrap.fill(pair.remark, 118)))


INTRODUCTION = """# Other people's models beside another renderer

Made by `./run modelpictures`: models of Debian's `assimp-testmodels`, and some made by the script where it has none of
a kind. On the left the picture by `orv-convert` and `orv-view`, on the right the same file from the same viewpoint,

- by **Blender** 3.4, its own readers (or those of OpenCOLLADA) and Cycles, with two lamps and a grey sky in place of
  the file's lights;
- by **f3d**, VTK's own readers and renderer, for what Blender does not read.

Neither uses libassimp for these files. Blender lights in linear light and shows sRGB. So does the engine for glTF; other
formats are lit in sRGB values, and slanted surfaces are darker than in Blender. The texts were written after looking at
each pair.

These pairs showed faults, now mended: glTF texture transforms turned around a wrong point, linear glTF colours read as
sRGB, STL normals of no length or pointing to the back, Collada exponents below 1 drawn as highlights all over, and SMD
files that lay on their backs.
"""


def main():
    parser = argparse.ArgumentParser(description=__doc__.split("\n")[0])
    for name in ("converter", "viewer", "folder", "docs"):
        parser.add_argument(name)
    parser.add_argument("names", nargs="*")
    arguments = parser.parse_args()
    pictures = os.path.join(arguments.docs, "pictures", "models")
    os.makedirs(pictures, exist_ok=True)
    failed = 0
    for pair in PAIRS:
        if arguments.names and pair.name not in arguments.names:
            continue
        error = draw_pair(arguments, pair, os.path.join(pictures, pair.name + ".png"))
        if error:
            failed += 1
            print("%s: %s" % (pair.file, error), file=sys.stderr)
    write_page(os.path.join(arguments.docs, "modelpictures.md"))
    return 1 if failed else 0


if __name__ == "__main__":
    sys.exit(main())
