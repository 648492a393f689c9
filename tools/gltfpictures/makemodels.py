"""Writes glTF files of kinds that are rare among models: each function of MODELS writes one into a folder."""
import json
import math
import os
import struct

import numpy as np
from PIL import Image, ImageDraw

COMPONENTS = {np.dtype("f4"): 5126, np.dtype("u4"): 5125, np.dtype("u2"): 5123, np.dtype("u1"): 5121}
SHAPES = {1: "SCALAR", 2: "VEC2", 3: "VEC3", 4: "VEC4", 16: "MAT4"}


class Gltf:
    """A file under construction; parts are identified by their index."""

    def __init__(self):
        self.root = {"asset": {"version": "2.0"}, "nodes": [], "meshes": [], "materials": [], "accessors": []}
        self.root.update({"bufferViews": [], "scenes": [{"nodes": []}], "scene": 0})
        self.data = b""

    def add(self, key, entry):
        self.root.setdefault(key, []).append(entry)
        return len(self.root[key]) - 1

    def view(self, values):
        packed = values.tobytes()
        view = self.add("bufferViews", {"buffer": 0, "byteOffset": len(self.data), "byteLength": len(packed)})
        self.data += packed + b"\0" * (-len(packed) % 4)
        return view

    def array(self, values, kind="f4", **more):
        values = np.ascontiguousarray(np.asarray(values, dtype=kind))
        values = values.reshape(len(values), -1)
        accessor = {"bufferView": self.view(values), "componentType": COMPONENTS[values.dtype], "count": len(values)}
        accessor.update({"type": SHAPES[values.shape[1]], **more})
        if kind == "f4":
            accessor.update(min=values.min(0).tolist(), max=values.max(0).tolist())
        return self.add("accessors", accessor)

    def material(self, colour=(1, 1, 1, 1), metal=0.0, rough=1.0, texture=None, **more):
        surface = {"baseColorFactor": list(colour), "metallicFactor": metal, "roughnessFactor": rough}
        if texture is not None:
            surface["baseColorTexture"] = texture if isinstance(texture, dict) else {"index": texture}
        return self.add("materials", {"pbrMetallicRoughness": surface, **more})

    def texture(self, uri, **sampler):
        image = self.add("images", {"uri": uri})
        entry = {"source": image}
        if sampler:
            entry["sampler"] = self.add("samplers", sampler)
        return self.add("textures", entry)

    def mesh(self, shape, material, faces=True, kind="u2", **more):
        """@param shape: arrays by the attributes' names, and "faces"; numbers are accessors that are there already."""
        attributes = {n: v if isinstance(v, int) else self.array(v) for n, v in shape.items() if n != "faces"}
        primitive = {"attributes": attributes, "material": material}
        if faces:
            primitive["indices"] = self.array(np.ravel(shape["faces"]), kind)
        return self.add("meshes", {"primitives": [{**primitive, **more}]})

    def node(self, parent=None, **entry):
        number = self.add("nodes", entry)
        holder = self.root["nodes"][parent].setdefault("children", []) if parent is not None else None
        (self.root["scenes"][0]["nodes"] if holder is None else holder).append(number)
        return number

    def animate(self, channels, name="clip"):
        """@param channels: (node, path, times, values, interpolation)"""
        animation = {"name": name, "samplers": [], "channels": []}
        for node, path, times, values, way in channels:
            sampler = {"input": self.array(times), "output": self.array(values), "interpolation": way}
            animation["channels"].append({"sampler": len(animation["samplers"]), "target": {"node": node, "path": path}})
            animation["samplers"].append(sampler)
        self.add("animations", animation)

    def use(self, *extensions):
        self.root["extensionsUsed"] = list(extensions)

    def write(self, folder, name="model"):
        self.root = {key: value for key, value in self.root.items() if value != []}
        self.root["buffers"] = [{"uri": name + ".bin", "byteLength": len(self.data)}]
        with open(os.path.join(folder, name + ".bin"), "wb") as file:
            file.write(self.data)
        with open(os.path.join(folder, "model.gltf"), "w", encoding="utf-8") as file:
            json.dump(self.root, file)


def grid(columns, rows, place, normal=None):
    """Faces over a grid with corners at place(u, v)."""
    at = [(u / columns, v / rows) for v in range(rows + 1) for u in range(columns + 1)]
    faces = []
    for v in range(rows):
        for u in range(columns):
            a = v * (columns + 1) + u
            b = a + columns + 1
            faces += [(a, b, a + 1), (a + 1, b, b + 1)]
    shape = {"POSITION": [place(*uv) for uv in at], "TEXCOORD_0": at, "faces": faces}
    if normal:
        shape["NORMAL"] = [normal(*uv) for uv in at]
    return shape


def ball(columns=32, rows=16, radius=1.0):
    def normal(u, v):
        turn, tilt = 2 * math.pi * u, math.pi * v
        return (math.sin(tilt) * math.sin(turn), math.cos(tilt), math.sin(tilt) * math.cos(turn))

    return grid(columns, rows, lambda u, v: [radius * c for c in normal(u, v)], normal)


def sheet(columns=1, rows=1, size=1.0):
    return grid(columns, rows, lambda u, v: (size * (2 * u - 1), size * (1 - 2 * v), 0.0), lambda u, v: (0, 0, 1))


def tube(rings, sides=16, radius=0.3):
    def normal(u, v):
        return (math.sin(2 * math.pi * u), 0.0, math.cos(2 * math.pi * u))

    return grid(sides, rings, lambda u, v: (radius * normal(u, v)[0], rings * (1 - v), radius * normal(u, v)[2]), normal)


def draw_letters(folder, name="letters.png", size=128):
    """A picture with four different corners, so that every rotation is visible."""
    image = Image.new("RGB", (size, size), (200, 180, 140))
    pen = ImageDraw.Draw(image)
    half = size // 2
    for x, y, colour in ((0, 0, "#b03030"), (half, 0, "#308030"), (0, half, "#3050b0")):
        pen.rectangle((x + 8, y + 8, x + half - 8, y + half - 8), fill=colour)
    pen.polygon(((half + 8, size - 8), (size - 8, size - 8), (size - 8, half + 8)), fill="#202020")
    image.save(os.path.join(folder, name))
    return name


def draw_holes(folder):
    image = Image.new("RGBA", (256, 256), (210, 150, 60, 255))
    pen = ImageDraw.Draw(image)
    for x in range(4):
        for y in range(4):
            pen.ellipse((x * 64 + 10, y * 64 + 10, x * 64 + 54, y * 64 + 54), fill=(210, 150, 60, 0))
    image.save(os.path.join(folder, "holes.png"))
    return "holes.png"


def draw_bumps(folder):
    y, x = np.mgrid[0:128, 0:128] / 128.0 * 2 * math.pi * 4
    slopes = np.stack([-0.5 * np.cos(x) * np.cos(y), -0.5 * np.sin(x) * np.sin(y), np.ones_like(x)], axis=-1)
    slopes /= np.linalg.norm(slopes, axis=-1, keepdims=True)
    Image.fromarray(np.uint8(np.round((slopes * 0.5 + 0.5) * 255))).save(os.path.join(folder, "bumps.png"))
    return "bumps.png"


def make_coloured(folder):
    """Vertex colours as bytes with alpha, as 16 bits without, unlit, and unused ones."""
    gltf = Gltf()
    shape = ball()
    rainbow = np.array(shape["NORMAL"]) * 0.5 + 0.5
    bytes4 = gltf.array(np.c_[rainbow * 255, np.full(len(rainbow), 255)].round(), "u1", normalized=True)
    shorts = np.zeros((len(rainbow), 4), "u2")  # a vertex begins at a multiple of four bytes
    shorts[:, :3] = (rainbow * 65535).round()
    wide = gltf.array(shorts, "u2", normalized=True)
    gltf.use("KHR_materials_unlit")
    plain, blue = gltf.material(), gltf.material((0.4, 0.5, 1, 1), doubleSided=True)
    unlit = gltf.material(extensions={"KHR_materials_unlit": {}})
    for i, (colours, material) in enumerate(((bytes4, plain), (wide, blue), (bytes4, unlit))):
        gltf.node(mesh=gltf.mesh({**shape, "COLOR_0": colours}, material), translation=[2.2 * i, 0, 0])
    gltf.write(folder)


def make_cutout(folder):
    gltf = Gltf()
    holes = gltf.texture(draw_holes(folder))
    front = gltf.material(texture=holes, alphaMode="MASK", doubleSided=True)
    back = gltf.material((0.2, 0.4, 0.9, 1))
    sharp = gltf.material((1, 1, 1, 0.7), texture=holes, alphaMode="MASK", alphaCutoff=0.6)
    gltf.node(mesh=gltf.mesh(sheet(), front))
    gltf.node(mesh=gltf.mesh(sheet(), sharp), translation=[0.4, 0.3, -0.5])
    gltf.node(mesh=gltf.mesh(ball(), back), translation=[0.5, 0, -2])
    gltf.node(mesh=gltf.mesh(ball(), front), translation=[-1.6, 0, -1.5])
    gltf.write(folder)


def make_panes(folder):
    gltf = Gltf()
    for i, colour in enumerate(((0.8, 0.1, 0.1, 0.4), (0.1, 0.7, 0.1, 0.4), (0.1, 0.1, 0.8, 0.7), (0.9, 0.8, 0.2, 1))):
        material = gltf.material(colour, alphaMode="BLEND" if colour[3] < 1 else "OPAQUE", doubleSided=True)
        gltf.node(mesh=gltf.mesh(sheet(), material), translation=[i * 0.6, i * 0.5, -i * 0.8])
    gltf.write(folder)


def make_blended(folder):
    """Alpha of a picture and of vertices, blended."""
    gltf = Gltf()
    fading = Image.new("RGBA", (64, 64))
    fading.putdata([(220, 60 + 2 * x, 40, 4 * y) for y in range(64) for x in range(64)])
    fading.save(os.path.join(folder, "fading.png"))
    pane = gltf.material(texture=gltf.texture("fading.png"), alphaMode="BLEND", doubleSided=True)
    veil = gltf.material((0.2, 0.6, 1, 1), alphaMode="BLEND", doubleSided=True)
    shape = sheet(8, 8)
    fade = [(1, 1, 1, u) for u, _ in shape["TEXCOORD_0"]]
    gltf.node(mesh=gltf.mesh(ball(), gltf.material((0.7, 0.7, 0.3, 1))), translation=[0.6, -0.2, -1.6])
    gltf.node(mesh=gltf.mesh(sheet(), pane))
    gltf.node(mesh=gltf.mesh({**shape, "COLOR_0": fade}, veil), translation=[1.4, 0.4, 0.6])
    gltf.write(folder)


def make_backs(folder):
    """Sheets seen from behind: two-sided, and one-sided, which are invisible."""
    gltf = Gltf()
    for i, sides in enumerate((True, False, True)):
        shape = grid(16, 16, lambda u, v: (2 * u - 1, 1 - 2 * v, 0.4 * math.sin(6 * u)),
                     lambda u, v: np.array((-1.2 * math.cos(6 * u), 0, 1)) / math.hypot(1.2 * math.cos(6 * u), 1))
        turned = {"rotation": [0, 1, 0, 0]} if i < 2 else {}
        material = gltf.material((0.9, 0.6 - 0.2 * i, 0.2 + 0.3 * i, 1), doubleSided=sides)
        gltf.node(mesh=gltf.mesh(shape, material), translation=[2.2 * i, 0, 0], **turned)
    gltf.write(folder)


def make_glow(folder):
    gltf = Gltf()
    gltf.use("KHR_materials_emissive_strength")
    letters = gltf.texture(draw_letters(folder))
    strong = {"KHR_materials_emissive_strength": {"emissiveStrength": 2.5}}
    materials = [gltf.material((0.3, 0.3, 0.3, 1), emissiveFactor=[0.4, 0.1, 0.0]),
                 gltf.material((0.1, 0.1, 0.1, 1), emissiveFactor=[1, 1, 1], emissiveTexture={"index": letters}),
                 gltf.material((0.2, 0.1, 0.1, 1), emissiveFactor=[0.1, 0.3, 0.2], extensions=strong)]
    for i, material in enumerate(materials):
        gltf.node(mesh=gltf.mesh(ball(), material), translation=[2.2 * i, 0, 0])
    gltf.write(folder)


def make_mirrored(folder):
    """Negative scales, one within another, and a matrix that mirrors."""
    gltf = Gltf()
    material = gltf.material(texture=gltf.texture(draw_letters(folder)))
    mesh = gltf.mesh(grid(24, 24, lambda u, v: (2 * u - 1, 1 - 2 * v, 0.5 * math.sin(4 * u) * v),
                          lambda u, v: np.array((-math.cos(4 * u) * v, 0.25 * math.sin(4 * u), 1))), material)
    gltf.node(mesh=mesh)
    outer = gltf.node(scale=[-1, 1, 1], translation=[2.3, 0, 0], mesh=mesh)
    gltf.node(outer, scale=[1, -0.5, 1], translation=[0, 1.7, 0], mesh=mesh)
    gltf.node(matrix=[0.96, 0, 0.28, 0, 0, -0.5, 0, 0, -0.28, 0, 0.96, 0, 0, 1.7, 0, 1], mesh=mesh)
    gltf.write(folder)


def bind(gltf, rings, joints, parent=None, step=1.0):
    nodes, holder = [], parent
    for i in range(joints):
        holder = gltf.node(holder, name="joint %d" % i, translation=[0, step if i else 0, 0])
        nodes.append(holder)
    matrices = []
    for i in range(joints):
        matrix = np.eye(4)
        matrix[1, 3] = -i * step
        matrices.append(matrix.T.ravel())
    skin = gltf.add("skins", {"joints": nodes, "inverseBindMatrices": gltf.array(matrices)})
    return skin, nodes


def attach(gltf, shape, step):
    """Each vertex follows the joint below it and the one above."""
    heights = np.array(shape["POSITION"])[:, 1] / step
    low = np.floor(heights).astype(int)
    share = heights - low
    last = int(heights.max())
    joints = np.stack([np.minimum(low, last - 1), np.minimum(low + 1, last - 1), low * 0, low * 0], axis=1)
    weights = np.stack([1 - share, share, share * 0, share * 0], axis=1)
    return {**shape, "JOINTS_0": gltf.array(joints, "u1"), "WEIGHTS_0": gltf.array(weights)}


def make_bent(folder):
    """Two figures that share their joints, one below a scaled node, and a third in a mirrored armature."""
    gltf = Gltf()
    half = math.sin(0.25), math.cos(0.25)
    shape = attach(gltf, tube(4), 1.0)
    mesh = gltf.mesh(shape, gltf.material((0.8, 0.5, 0.2, 1)))
    wide = {**shape, "POSITION": np.array(shape["POSITION"]) * [0.5, 1, 3]}
    flat = gltf.mesh(wide, gltf.material((0.3, 0.6, 0.3, 1)))
    skin, nodes = bind(gltf, 4, 4)
    gltf.node(mesh=mesh, skin=skin)
    scaled = gltf.node(scale=[3, 3, 3], translation=[5, 5, 5])
    gltf.node(scaled, mesh=flat, skin=skin)
    mirror = gltf.node(scale=[-1, 1, 1], translation=[-1.5, 0, 0])
    other, more = bind(gltf, 4, 4, mirror)
    gltf.node(mesh=mesh, skin=other)
    turns = [(0, 0, 0, 1), (0, 0, half[0], half[1])]
    gltf.animate([(node, "rotation", [0, 1], turns, "LINEAR") for node in nodes[1:] + more[1:]], "bend")
    gltf.write(folder)


def make_morphed(folder):
    """Default weights of the mesh, those of a node over them, and shapes that change normals and are sparse."""
    gltf = Gltf()
    shape = ball()
    normals = np.array(shape["NORMAL"])
    spike = np.zeros_like(normals)
    spike[:, 1] = np.clip(normals[:, 1], 0, 1) ** 4
    flat = np.zeros_like(normals)
    flat[:, 2] = -0.8 * normals[:, 2]
    steep = np.zeros_like(normals)
    steep[:, 2] = 0.5 * normals[:, 2]
    moved = np.flatnonzero(spike[:, 1] > 0.05)
    sparse = {"componentType": 5126, "type": "VEC3", "count": len(normals), "min": [0, 0, 0], "max": [0, 1, 0]}
    sparse["sparse"] = {"count": len(moved), "indices": {"bufferView": gltf.view(moved.astype("u2")), "componentType": 5123},
                        "values": {"bufferView": gltf.view(spike[moved].astype("f4"))}}
    targets = [{"POSITION": gltf.add("accessors", sparse)}, {"POSITION": gltf.array(flat), "NORMAL": gltf.array(steep)}]
    mesh = gltf.mesh(shape, gltf.material((0.7, 0.3, 0.6, 1)), targets=targets)
    gltf.root["meshes"][mesh]["weights"] = [1.0, 0.0]
    gltf.node(mesh=mesh)
    gltf.node(mesh=mesh, weights=[0.2, 0.9], translation=[2.3, 0, 0])
    gltf.write(folder)


def make_moving_morph(folder):
    """Weights that move, of a mesh whose node moves, too."""
    gltf = Gltf()
    shape = ball(24, 12)
    normals = np.array(shape["NORMAL"])
    spike, dent = np.zeros_like(normals), np.zeros_like(normals)
    spike[:, 1] = np.clip(normals[:, 1], 0, 1) ** 4
    dent[:, 0] = -np.clip(normals[:, 0], 0, 1) ** 2
    targets = [{"POSITION": gltf.array(spike)}, {"POSITION": gltf.array(dent)}]
    mesh = gltf.mesh(shape, gltf.material((0.3, 0.6, 0.7, 1)), targets=targets)
    node = gltf.node(mesh=mesh)
    gltf.node(mesh=gltf.mesh(shape, gltf.material((0.6, 0.6, 0.6, 1))), translation=[3, 0, 0])
    gltf.animate([(node, "weights", [0, 0.5, 1], np.array([0, 0, 1, 0, 0.5, 1.2]), "LINEAR"),
                  (node, "translation", [0, 1], [(0, 0, 0), (0.5, 0.3, 0)], "LINEAR")], "grow")
    gltf.write(folder)


def make_second_uv(folder):
    gltf = Gltf()
    letters = gltf.texture(draw_letters(folder))
    shape = sheet()
    shape["TEXCOORD_1"] = [(1 - 2 * v, u) for u, v in shape["TEXCOORD_0"]]
    first = gltf.material(texture=letters)
    second = gltf.material(texture={"index": letters, "texCoord": 1})
    gltf.node(mesh=gltf.mesh(shape, first))
    gltf.node(mesh=gltf.mesh(shape, second), translation=[2.3, 0, 0])
    gltf.write(folder)


def make_wraps(folder):
    """Pictures that are clamped, repeated and mirrored, unfiltered ones, and one with a transform."""
    gltf = Gltf()
    name = draw_letters(folder, size=64)
    gltf.use("KHR_texture_transform")
    wide = sheet()
    wide["TEXCOORD_0"] = [(3 * u - 1, 3 * v - 1) for u, v in wide["TEXCOORD_0"]]
    for i, wrap in enumerate((33071, 10497, 33648)):
        texture = gltf.texture(name, wrapS=wrap, wrapT=wrap, magFilter=9728 if i == 2 else 9729)
        gltf.node(mesh=gltf.mesh(wide, gltf.material(texture=texture)), translation=[2.2 * i, 0, 0])
    turned = {"index": gltf.texture(name), "extensions": {"KHR_texture_transform": {"rotation": 0.5, "scale": [2, 2],
                                                                                    "offset": [0.1, 0.3]}}}
    gltf.node(mesh=gltf.mesh(sheet(), gltf.material(texture=turned)), translation=[6.6, 0, 0])
    gltf.write(folder)


def make_ways(folder):
    """Keys in steps, lines and curves; the second clip turns the first of them by a cubic curve."""
    gltf = Gltf()
    letters = gltf.texture(draw_letters(folder))
    mesh = gltf.mesh(sheet(), gltf.material(texture=letters, doubleSided=True))
    nodes = [gltf.node(mesh=mesh, name="sheet", translation=[2.5 * i, 0, 0]) for i in range(3)]  # one name for all
    places = [[(2.5 * i, 0, 0), (2.5 * i, 1.5, 0), (2.5 * i, 0.5, 1)] for i in range(3)]
    curve = np.zeros((9, 3))
    curve[1::3] = places[2]
    curve[3::3] = [(0, -4, 0), (0, 2, 2)]
    gltf.animate([(nodes[0], "translation", [0, 0.4, 1], places[0], "STEP"),
                  (nodes[1], "translation", [0, 0.4, 1], places[1], "LINEAR"),
                  (nodes[2], "translation", [0, 0.4, 1], curve, "CUBICSPLINE")], "up")
    quarter = math.sin(math.pi / 4)
    turn = [(0, 0, 0, 0), (0, 0, 0, 1), (0, 0, 2, 0), (0, 0, 0, 0), (0, 0, quarter, quarter), (0, 0, 0, 0)]
    gltf.animate([(nodes[0], "rotation", [0, 1], turn, "CUBICSPLINE"),
                  (nodes[1], "scale", [0, 1], [(1, 1, 1), (0.5, -1, 1)], "LINEAR")], "turn")
    gltf.write(folder)


def make_many(folder):
    """More vertices than 16 bits count."""
    gltf = Gltf()
    gltf.node(mesh=gltf.mesh(grid(280, 280, lambda u, v: (4 * u, 2 * math.sin(9 * v) * 0.2, 4 * v),
                                  lambda u, v: np.array((0, 1, -3.6 * math.cos(9 * v) / 4))
                                  / math.hypot(1, 3.6 * math.cos(9 * v) / 4)),
                             gltf.material((0.3, 0.7, 0.8, 1)), kind="u4"))
    gltf.write(folder)


def make_lamps(folder):
    """A lamp of each kind that the format has, without any other light."""
    gltf = Gltf()
    gltf.use("KHR_lights_punctual")
    lights = [{"type": "point", "color": [1, 0.6, 0.3], "intensity": 3, "range": 6},
              {"type": "spot", "color": [0.4, 0.6, 1], "intensity": 6, "range": 12,
               "spot": {"innerConeAngle": 0.2, "outerConeAngle": 0.4}},
              {"type": "directional", "intensity": 0.2}]
    gltf.root["extensions"] = {"KHR_lights_punctual": {"lights": lights}}
    gltf.node(mesh=gltf.mesh(sheet(64, 64, 3.0), gltf.material()))
    gltf.node(mesh=gltf.mesh(ball(), gltf.material((0.9, 0.9, 0.9, 1))), translation=[0, 0, 1])
    for i, place in enumerate(((-2, 1, 1.5), (1.7, 0.5, 4), (0, 0, 5))):
        gltf.node(translation=list(place), extensions={"KHR_lights_punctual": {"light": i}})
    gltf.write(folder)


def make_own_camera(folder):
    """An orthographic camera of the file's own that looks at a slant."""
    gltf = Gltf()
    material = gltf.material(texture=gltf.texture(draw_letters(folder)), doubleSided=True)
    mesh = gltf.mesh(sheet(), material)
    for i, turn in enumerate(((0, 0, 0, 1), (0, 0.7071068, 0, 0.7071068), (0.7071068, 0, 0, 0.7071068))):
        gltf.node(mesh=mesh, rotation=list(turn), translation=[0.5 * i, 0, 0])
    camera = gltf.add("cameras", {"type": "orthographic", "name": "slanted",
                                  "orthographic": {"xmag": 2.4, "ymag": 1.8, "znear": 0.1, "zfar": 20}})
    gltf.node(camera=camera, translation=[4, 3, 6], rotation=[-0.1985, 0.2866, 0.0609, 0.9353])
    gltf.write(folder)


def make_plastics(folder):
    """Roughness from left to right; below, weaker or coloured specular reflection."""
    gltf = Gltf()
    gltf.use("KHR_materials_specular", "KHR_materials_ior")
    shape = ball()
    for i in range(4):
        rough = 0.2 + 0.2 * i
        gltf.node(mesh=gltf.mesh(shape, gltf.material((0.7, 0.1, 0.1, 1), rough=rough)), translation=[2.2 * i, 0, 0])
        others = {"KHR_materials_specular": {"specularFactor": 0.3 * i, "specularColorFactor": [0.3, 0.5, 1]}}
        material = gltf.material((0.1, 0.1, 0.4, 1), rough=0.3, extensions=others)
        gltf.node(mesh=gltf.mesh(shape, material), translation=[2.2 * i, -2.2, 0])
    gltf.write(folder)


def make_metals(folder):
    """Metals under a plain sky: gold of growing roughness, and half a metal."""
    gltf = Gltf()
    shape = ball()
    for i in range(4):
        material = gltf.material((1.0, 0.77, 0.34, 1), metal=1.0, rough=0.1 + 0.25 * i)
        gltf.node(mesh=gltf.mesh(shape, material), translation=[2.2 * i, 0, 0])
        material = gltf.material((0.9, 0.9, 0.95, 1), metal=1.0 - 0.25 * i, rough=0.2)
        gltf.node(mesh=gltf.mesh(shape, material), translation=[2.2 * i, -2.2, 0])
    gltf.write(folder)


def make_bare(folder):
    """Without indices and normals, so faceted; with a stride; without a buffer view."""
    gltf = Gltf()
    shape = ball(12, 8)
    corners = np.array(shape["POSITION"], "f4")[np.ravel(shape["faces"])]
    gltf.node(mesh=gltf.mesh({"POSITION": corners}, gltf.material((0.6, 0.7, 0.3, 1)), faces=False))
    strided = np.zeros((len(corners), 5), "f4")
    strided[:, 1:4] = corners
    view = gltf.view(strided)
    gltf.root["bufferViews"][view]["byteStride"] = 20
    apart = gltf.add("accessors", {"bufferView": view, "byteOffset": 4, "componentType": 5126, "type": "VEC3",
                                   "count": len(corners), "min": [-1, -1, -1], "max": [1, 1, 1]})
    gltf.node(mesh=gltf.mesh({"POSITION": apart}, gltf.material((0.3, 0.4, 0.8, 1)), faces=False), translation=[2.2, 0, 0])
    sheet_of = sheet(4, 4)
    sparse = {"componentType": 5126, "type": "VEC3", "count": 25, "min": [-1, -1, 0], "max": [1, 1, 0]}
    sparse["sparse"] = {"count": 25, "indices": {"bufferView": gltf.view(np.arange(25, dtype="u1")), "componentType": 5121},
                        "values": {"bufferView": gltf.view(np.array(sheet_of["POSITION"], "f4"))}}
    number = gltf.add("accessors", sparse)
    gltf.node(mesh=gltf.mesh({**sheet_of, "POSITION": number}, gltf.material((0.8, 0.4, 0.4, 1))), translation=[4.4, 0, 0])
    gltf.write(folder)


def make_strips(folder):
    """Strips and fans of triangles, of which every second one of a strip is wound the other way."""
    gltf = Gltf()
    material = gltf.material((0.8, 0.7, 0.3, 1))
    rim = [(math.cos(0.5 * i), math.sin(0.5 * i), 0) for i in range(13)]
    ribbon = [(0.3 * i - 1.5, -1 if i % 2 else 1, 0.4 * math.sin(i)) for i in range(11)]
    for i, (places, mode) in enumerate(((ribbon, 5), ([(0, 0, 0)] + rim, 6))):
        shape = {"POSITION": places, "NORMAL": [(0, 0, 1)] * len(places)}
        gltf.node(mesh=gltf.mesh(shape, material, faces=False, mode=mode), translation=[3 * i, 0, 0])
    gltf.write(folder)


def make_scenes(folder):
    """The second of two scenes is the one to show, and a node of it is hidden."""
    gltf = Gltf()
    gltf.use("KHR_node_visibility")
    shown = gltf.mesh(ball(), gltf.material((0.2, 0.7, 0.4, 1)))
    other = gltf.mesh(sheet(), gltf.material((0.9, 0.1, 0.1, 1), doubleSided=True))
    for i in range(3):
        gltf.node(mesh=(shown, other, other)[i], translation=[2 * i, 0, 0])
    gltf.root["nodes"][1]["extensions"] = {"KHR_node_visibility": {"visible": False}}
    gltf.root["scenes"] = [{"name": "wrong", "nodes": [2]}, {"name": "right", "nodes": [0, 1]}]
    gltf.root["scene"] = 1
    gltf.write(folder)


def make_names(folder):
    """Names with blanks, percent signs and letters of other alphabets, and nodes of one name that move."""
    gltf = Gltf()
    draw_letters(folder, "Straße 100% α.png")
    texture = gltf.texture("Stra%C3%9Fe%20100%25%20%CE%B1.png")
    mesh = gltf.mesh(sheet(), gltf.material(texture=texture, doubleSided=True, name="Grün|x/y"))
    nodes = [gltf.node(mesh=mesh, name="Блок", translation=[2.3 * i, 0, 0]) for i in range(2)]
    gltf.animate([(nodes[1], "translation", [0, 1], [(2.3, 0, 0), (2.3, 1, 0)], "LINEAR")], "")
    gltf.write(folder, "größe")


def make_bumps(folder):
    gltf = Gltf()
    bumps = {"index": gltf.texture(draw_bumps(folder))}
    gltf.node(mesh=gltf.mesh(ball(48, 24), gltf.material((0.7, 0.6, 0.5, 1), normalTexture=bumps)))
    gltf.node(mesh=gltf.mesh(sheet(), gltf.material((0.5, 0.6, 0.7, 1), rough=0.4, normalTexture=bumps)),
              translation=[2.3, 0, 0])
    gltf.write(folder)


def write_all(folder):
    """Each model into a folder of its own."""
    for name, make in MODELS.items():
        home = os.path.join(folder, name)
        os.makedirs(home, exist_ok=True)
        make(home)


MODELS = {name[5:].replace("_", ""): function for name, function in list(globals().items()) if name.startswith("make_")}
