"""Reads scene files without the engine and says where their triangles, lines and points are at a time."""
import struct

import numpy as np

TYPES = {0: np.int8, 1: np.uint8, 2: np.int16, 3: np.uint16, 4: np.float32, 5: np.float32, 6: np.float32}
CORNERS = {0: 1, 3: 2, 5: 3}  # of the primitives that the converter writes


class Chunks:
    """Fields of a chunk, one after the other."""

    def __init__(self, data):
        self.data = data
        self.at = 0

    def more(self):
        return self.at < len(self.data)

    def take(self, form):
        values = struct.unpack_from("<" + form, self.data, self.at)
        self.at += struct.calcsize("<" + form)
        return values if len(values) > 1 else values[0]

    def text(self):
        size = self.take("I")
        self.at += size
        return bytes(self.data[self.at - size : self.at - 1]).decode(errors="replace")

    def matrix(self):
        return np.array(self.take("16f"), dtype=np.float64).reshape(4, 4).T  # columns in the file

    def chunk(self):
        name = bytes(self.data[self.at : self.at + 4]).decode()
        size = struct.unpack_from("<I", self.data, self.at + 4)[0]
        self.at += 8 + size
        return name, Chunks(self.data[self.at - size : self.at])


class Node:
    pass


def rotate(axis_angle):
    x, y, z, angle = axis_angle
    s, c = np.sin(angle * 0.5), np.cos(angle * 0.5)
    x, y, z, w = x * s, y * s, z * s, c
    return np.array(
        [
            [1 - 2 * (y * y + z * z), 2 * (x * y - z * w), 2 * (x * z + y * w)],
            [2 * (x * y + z * w), 1 - 2 * (x * x + z * z), 2 * (y * z - x * w)],
            [2 * (x * z - y * w), 2 * (y * z + x * w), 1 - 2 * (x * x + y * y)],
        ]
    )


class PosedGlo:
    def __init__(self, path):
        with open(path, "rb") as file:
            top = Chunks(memoryview(file.read()))
        self.geometries, self.skins, self.tracks, self.clips = {}, {}, {}, []
        body = top.chunk()[1]
        body.take("I")  # the axis that points up
        readers = {"LGEO": self.read_geometry, "LCTL": self.read_skin, "LANM": self.read_animation}
        while body.more():
            name, data = body.chunk()
            if name in readers:
                for _ in range(data.take("I")):
                    readers[name](data.chunk()[1])
            if name == "SCNE":
                data.text()
                self.top = self.read_node(data.chunk()[1])

    def read_geometry(self, data):
        name = data.text()
        vertices = data.chunk()[1]
        count, attributes = vertices.take("II")
        described = []
        for _ in range(attributes):
            field = vertices.chunk()[1]
            described.append((field.text(),) + field.take("iIiiI"))
        raw = np.frombuffer(vertices.chunk()[1].data, dtype=np.uint8)
        columns = {}
        for attribute, components, kind, offset, stride, normalize in described:
            size = components * np.dtype(TYPES[kind]).itemsize
            rows = np.lib.stride_tricks.as_strided(raw[offset:], (count, size), (stride, 1)) if count else raw[:0]
            columns[attribute] = np.ascontiguousarray(rows).view(TYPES[kind]).reshape(count, -1).astype(np.float64)
        sets = []
        for _ in range(data.take("I")):
            kind, buffers = (part := data.chunk()[1]).take("II")
            indices = np.arange(count)
            if buffers:
                indices = np.frombuffer(part.chunk()[1].data[4:], dtype=np.uint16)
            sets.append((CORNERS[kind], indices.astype(np.int64)))
        self.geometries[name] = columns, sets

    def read_skin(self, data):
        name, geometry = data.text(), data.text()
        data.take("i")
        data.matrix()
        joints = []
        for _ in range(data.take("I")):
            joint = data.chunk()[1]
            joints.append((joint.text(), joint.matrix()))
        self.skins[name] = geometry, joints

    def read_animation(self, data):
        name = data.text()
        ranges = [data.take("ff") for _ in range(data.take("I"))]
        self.clips.append((name, ranges[-1] if ranges else None))
        for _ in range(data.take("I")):
            self.read_channel(data.chunk()[1])

    def read_channel(self, data):
        kind, target, what = data.text(), data.text(), data.text()
        _, components, _, count = data.take("4I")
        keys = np.frombuffer(data.data[data.at :], dtype=np.float32).reshape(count, 1 + components)
        if kind == "node":
            self.tracks.setdefault(target.removeprefix("node-"), {})[what] = keys.astype(np.float64)

    def read_node(self, data):
        node = Node()
        node.name = data.text()
        data.text()
        node.matrix = data.matrix()
        node.values = {name: np.array(data.take(form)) for name, form in
                       (("translation", "3f"), ("rotation", "4f"), ("scale", "3f"))}
        node.geometry = node.skin = None
        for slot in ("GREF", "SREF", "LREF", "CREF"):
            if data.take("I"):
                reference = data.chunk()[1].text()
                node.geometry = reference if slot == "GREF" else node.geometry
                node.skin = reference if slot == "SREF" else node.skin
        node.children = [self.read_node(data.chunk()[1]) for _ in range(data.take("I"))]
        return node

    def local(self, node, time):
        tracks = self.tracks.get(node.name)
        if time is None or not tracks:
            return node.matrix
        values = dict(node.values)
        for what, keys in tracks.items():
            at = np.searchsorted(keys[:, 0], np.float32(time), side="right") - 1
            values[what] = keys[max(at, 0), 1:]
        made = np.eye(4)
        made[:3, :3] = rotate(values["rotation"]) * values["scale"]
        made[:3, 3] = values["translation"]
        return made

    def pose(self, time=None):
        """By number of corners (3: triangles, 2: lines, 1: points) an array of faces x corners x 3. time None: at rest."""
        worlds, drawn = {}, []

        def walk(node, parent):
            world = parent @ self.local(node, time)
            worlds.setdefault(node.name, world)
            if node.geometry or node.skin:
                drawn.append((node, world))
            for child in node.children:
                walk(child, world)

        walk(self.top, np.eye(4))
        faces = {1: [], 2: [], 3: []}
        for node, world in drawn:
            geometry, joints = self.skins[node.skin] if node.skin else (node.geometry, None)
            columns, sets = self.geometries[geometry]
            places = np.c_[columns["a_position"], np.ones(len(columns["a_position"]))]
            if joints is None:
                posed = (places @ world.T)[:, :3]
            else:
                matrices = np.stack([worlds[name] @ inverse for name, inverse in joints])
                chosen = matrices[columns["a_joints"].astype(int)]  # vertices x 4 x 4 x 4
                posed = np.einsum("vj,vjrc,vc->vr", columns["a_weights"], chosen, places)[:, :3]
            for corners, indices in sets:
                faces[corners].append(posed[indices].reshape(-1, corners, 3))
        return {corners: np.concatenate(parts) if parts else np.zeros((0, corners, 3)) for corners, parts in faces.items()}
