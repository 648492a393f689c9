#!/usr/bin/env python3
"""Writes windmill.gltf: a tower of boxes whose sails turn once in four seconds, the clip "turn"."""
import base64
import json
import math
import struct

NODES, MATERIALS = [], []
BOX = {"positions": [], "normals": [], "indices": []}
for axis in range(3):
    for sign in (-1, 1):
        normal = [0, 0, 0]
        normal[axis] = sign
        first = len(BOX["positions"])
        for u, v in ((-1, -1), (1, -1), (1, 1), (-1, 1)):
            corner = [0, 0, 0]
            corner[axis], corner[(axis + 1) % 3], corner[(axis + 2) % 3] = sign, u * sign, v
            BOX["positions"].append(corner)
            BOX["normals"].append(normal)
        BOX["indices"] += [first, first + 1, first + 2, first, first + 2, first + 3]


def add_node(name, material=None, place=(0, 0, 0), size=(1, 1, 1), turn=None, children=()):
    node = {"name": name, "translation": list(place), "scale": list(size)}
    if material is not None:
        node["mesh"] = material
    if turn is not None:
        node["rotation"] = [0, 0, math.sin(turn / 2), math.cos(turn / 2)]
    if children:
        node["children"] = list(children)
    NODES.append(node)
    return len(NODES) - 1


STONE, ROOF, WOOD = range(3)
COLOURS = [("stone", (0.80, 0.76, 0.68)), ("roof", (0.62, 0.25, 0.18)), ("wood", (0.45, 0.30, 0.17))]
MATERIALS = [{"name": name, "pbrMetallicRoughness": {"baseColorFactor": [*colour, 1], "metallicFactor": 0,
                                                     "roughnessFactor": 0.9}} for name, colour in COLOURS]
tower = [add_node(f"floor {i}", STONE, (0, 0.4 + 0.8 * i, 0), (0.8 - 0.12 * i, 0.4, 0.8 - 0.12 * i)) for i in range(3)]
roof = add_node("roof", ROOF, (0, 2.6, 0), (0.62, 0.2, 0.62))
sails = []
for i in range(4):
    angle = i * math.pi / 2
    sail = add_node(f"sail {i}", WOOD, (0, 0.75, 0), (0.16, 0.6, 0.03))
    sails.append(add_node(f"arm {i}", None, turn=angle, children=[sail]))
hub = add_node("hub", None, (0, 2.3, 0.75), children=[*sails, add_node("boss", WOOD, (0, 0, -0.08), (0.1, 0.1, 0.14))])
top = add_node("windmill", children=[*tower, roof, hub])

times = [0, 1, 2, 3, 4]
turns = [(0, 0, math.sin(i * math.pi / 4), math.cos(i * math.pi / 4)) for i in times]
parts = [
    (struct.pack("<72f", *sum(BOX["positions"], [])), 5126, 24, "VEC3", {"min": [-1, -1, -1], "max": [1, 1, 1]}),
    (struct.pack("<72f", *sum(BOX["normals"], [])), 5126, 24, "VEC3", {}),
    (struct.pack("<36H", *BOX["indices"]), 5123, 36, "SCALAR", {}),
    (struct.pack("<5f", *times), 5126, 5, "SCALAR", {"min": [0], "max": [4]}),
    (struct.pack("<20f", *[number for turn in turns for number in turn]), 5126, 5, "VEC4", {}),
]
data, views, accessors = b"", [], []
for part, component, count, kind, more in parts:
    views.append({"buffer": 0, "byteOffset": len(data), "byteLength": len(part)})
    accessors.append({"bufferView": len(views) - 1, "componentType": component, "count": count, "type": kind, **more})
    data += part
model = {
    "asset": {"version": "2.0"}, "scene": 0, "scenes": [{"nodes": [top]}], "nodes": NODES, "materials": MATERIALS,
    "meshes": [{"name": COLOURS[i][0], "primitives": [{"attributes": {"POSITION": 0, "NORMAL": 1}, "indices": 2,
                                                       "material": i}]} for i in range(3)],
    "animations": [{"name": "turn", "samplers": [{"input": 3, "output": 4}],
                    "channels": [{"sampler": 0, "target": {"node": hub, "path": "rotation"}}]}],
    "accessors": accessors, "bufferViews": views,
    "buffers": [{"byteLength": len(data),
                 "uri": "data:application/octet-stream;base64," + base64.b64encode(data).decode()}],
}
with open("windmill.gltf", "w", encoding="utf-8") as file:
    json.dump(model, file, indent=1)
    file.write("\n")
