"""Draws a model with Blender's own reader and its Cycles renderer, from orv-view's viewpoint.

    blender --background --factory-startup --python drawwithblender.py -- MODEL PICTURE.png WIDTH HEIGHT TIME UP

TIME in seconds, or "rest". UP: "z" where Blender's reader turns the model to its own axes, "y" where it keeps the file's
numbers.
"""
import math
import sys

import bpy
import mathutils
import numpy

numpy.bool = bool  # a name that Blender 3.4 uses and numpy has dropped

FIELD_OF_VIEW = math.radians(40)
FILLED_SHARE = 0.9
READERS = {
    ".gltf": bpy.ops.import_scene.gltf,
    ".glb": bpy.ops.import_scene.gltf,
    ".fbx": bpy.ops.import_scene.fbx,
    ".obj": bpy.ops.wm.obj_import,
    ".dae": bpy.ops.wm.collada_import,
    ".ply": bpy.ops.import_mesh.ply,
    ".stl": bpy.ops.import_mesh.stl,
    ".wrl": bpy.ops.import_scene.x3d,
    ".x3d": bpy.ops.import_scene.x3d,
}
FIRST_FRAMES = {".fbx": 1}  # where a file's time 0 comes to lie; 0 for the others


def read(model):
    extension = "." + model.rsplit(".", 1)[1].lower()
    if extension == ".blend":
        bpy.ops.wm.open_mainfile(filepath=model)
    else:
        bpy.ops.wm.read_factory_settings(use_empty=True)
        READERS[extension](filepath=model)
    for thing in list(bpy.data.objects):
        if thing.type in ("LIGHT", "CAMERA"):
            bpy.data.objects.remove(thing)
    return extension


def make_visible():
    """Makes materials visible whose FBX file has an opacity of 0, which some programs write for opaque."""
    for material in bpy.data.materials:
        for node in material.node_tree.nodes if material.use_nodes else ():
            alpha = node.inputs.get("Alpha") if node.type == "BSDF_PRINCIPLED" else None
            if alpha and not alpha.is_linked and alpha.default_value == 0:
                alpha.default_value = 1


def show_vertex_colours():
    """Blender keeps them and shows them only through a material that asks for them."""
    for mesh in bpy.data.meshes:
        if mesh.color_attributes and not any(mesh.materials):
            material = bpy.data.materials.new("colours")
            material.use_nodes = True
            nodes = material.node_tree.nodes
            colours = nodes.new("ShaderNodeVertexColor")
            colours.layer_name = mesh.color_attributes[0].name
            material.node_tree.links.new(colours.outputs[0], nodes["Principled BSDF"].inputs["Base Color"])
            mesh.materials.clear()
            mesh.materials.append(material)


def find_places():
    """The current position of every vertex."""
    graph = bpy.context.evaluated_depsgraph_get()
    places = []
    for instance in graph.object_instances:
        thing = instance.object
        if thing.type != "MESH" or thing.hide_render:
            continue
        mesh = thing.to_mesh()
        coordinates = numpy.empty(len(mesh.vertices) * 3, dtype=numpy.float32)
        mesh.vertices.foreach_get("co", coordinates)
        matrix = numpy.array(instance.matrix_world)
        places.append(coordinates.reshape(-1, 3) @ matrix[:3, :3].T + matrix[:3, 3])
        thing.to_mesh_clear()
    return numpy.concatenate(places)


def frame(scene, places, up, width, height):
    """Puts the camera where the model fills the view."""
    towards = (0.5, -1.0, 0.4) if up == "z" else (0.5, 0.4, 1.0)
    back = numpy.array(towards) / numpy.linalg.norm(towards)
    right = numpy.cross((0, 0, 1) if up == "z" else (0, 1, 0), back)
    right /= numpy.linalg.norm(right)
    over = numpy.cross(back, right)
    middle = (places.min(axis=0) + places.max(axis=0)) / 2
    radius = numpy.linalg.norm(places.max(axis=0) - places.min(axis=0)) / 2
    distance = radius / math.sin(FIELD_OF_VIEW / 2)
    spread = math.tan(FIELD_OF_VIEW / 2)
    for _ in range(8):
        seen = places - (middle + back * distance)
        depth = numpy.maximum(-(seen @ back), distance / 100)
        x = seen @ right / depth / (spread * width / height)
        y = seen @ over / depth / spread
        middle = middle + right * (x.max() + x.min()) / 2 * spread * width / height * distance
        middle = middle + over * (y.max() + y.min()) / 2 * spread * distance
        distance *= max(numpy.ptp(x), numpy.ptp(y)) / 2 / FILLED_SHARE
    camera = bpy.data.cameras.new("eye")
    camera.sensor_fit = "VERTICAL"
    camera.angle = FIELD_OF_VIEW
    camera.clip_start = distance / 100
    camera.clip_end = distance + radius * 4
    eye = bpy.data.objects.new("eye", camera)
    axes = numpy.identity(4)
    axes[:3, 0], axes[:3, 1], axes[:3, 2], axes[:3, 3] = right, over, back, middle + back * distance
    eye.matrix_world = mathutils.Matrix(axes.tolist())
    scene.collection.objects.link(eye)
    scene.camera = eye
    for direction, strength in ((back + right * -0.5 + over * 0.7, 2.5), (back * 0.4 + right, 1.0)):
        sun = bpy.data.objects.new("sun", bpy.data.lights.new("sun", "SUN"))
        sun.data.energy = strength
        sun.rotation_mode = "QUATERNION"
        sun.rotation_quaternion = mathutils.Vector(direction.tolist()).to_track_quat("Z", "Y")
        scene.collection.objects.link(sun)


def draw(scene, picture, width, height):
    scene.world = bpy.data.worlds.new("grey")
    scene.world.use_nodes = True
    scene.world.node_tree.nodes["Background"].inputs[0].default_value = (0.25, 0.25, 0.25, 1)
    scene.render.engine = "CYCLES"
    scene.cycles.device = "CPU"
    scene.cycles.samples = 16
    scene.cycles.use_denoising = False
    scene.cycles.transparent_max_bounces = 16
    scene.view_settings.view_transform = "Standard"
    scene.render.film_transparent = True
    scene.render.resolution_x, scene.render.resolution_y, scene.render.resolution_percentage = width, height, 100
    scene.render.image_settings.file_format = "PNG"
    scene.render.image_settings.color_mode = "RGBA"
    scene.render.use_compositing = scene.render.use_sequencer = False
    scene.render.filepath = picture
    bpy.ops.render.render(write_still=True)


def main():
    model, picture, width, height, time, up = sys.argv[sys.argv.index("--") + 1 :]
    extension = read(model)
    make_visible()
    show_vertex_colours()
    scene = bpy.context.scene
    if time != "rest":
        position = FIRST_FRAMES.get(extension, 0) + float(time) * scene.render.fps / scene.render.fps_base
        scene.frame_set(int(position), subframe=position - int(position))
    frame(scene, find_places(), up, int(width), int(height))
    draw(scene, picture, int(width), int(height))


main()
