#!/usr/bin/python3
"""Makes glTF files of every kind that the usual programs write from models of any format.

    makevariants.py MODELS NODE_MODULES/.bin OUT_FOLDER

OUT_FOLDER/MADE gets files of rare kinds (tools/gltfpictures/makemodels.py).
Every glTF 2.0 file below MODELS is one, as are those that `assimp export` makes of some models of other formats; of each
come variants by gltfpack, gltf-transform and gltf-pipeline. A program that fails on a file makes no variant of it. What
is in OUT_FOLDER already is kept.
"""
import concurrent.futures
import os
import shutil
import subprocess
import sys

sys.path.append(os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "gltfpictures"))
import makemodels  # noqa: E402

SECONDS = 120  # for one file

# Of other formats: skins, clips, several meshes, colours, materials.
OTHERS = """
    B3D/dwarf2.b3d BLEND/BlenderDefault_276.blend Collada/duck.dae Collada/cube_with_2UVs.DAE Collada/lights.dae
    FBX/huesitos.fbx FBX/box.fbx FBX/animation_with_skeleton.fbx FBX/spider.fbx IQM/mrfixit.iqm MD2/faerie.md2
    MD5/SimpleCube.md5mesh MS3D/twospheres.ms3d OBJ/spider.obj OBJ/cube_with_vertexcolors.obj PLY/Wuson.ply
    SMD/WusonSMD.smd X/Testwuson.X X/anim_test.x X/BCN_Epileptic.X MDL/MDL\\ (HL1)/man.mdl 3DS/fels.3ds LWO/LWO2/boxuv.lwo
    Ogre/TheThing/Mesh.mesh.xml XGL/Wuson.zgl 3DS/RotatingCube.3DS ASE/ThreeCubesGreen.ASE AMF/test1.amf
"""

VARIANTS = {
    "pack": "gltfpack -i {i} -o {o}",
    "pack-named": "gltfpack -kn -km -kv -i {i} -o {o}",
    "pack-c": "gltfpack -c -i {i} -o {o}",
    "pack-cc": "gltfpack -cc -kn -i {i} -o {o}",
    "pack-cf": "gltfpack -cf -i {i} -o {o}",
    "pack-plain": "gltfpack -noq -kn -i {i} -o {o}",
    "pack-shares": "gltfpack -vpn -vn 12 -vi -i {i} -o {o}",
    "pack-floats": "gltfpack -vpf -vtf -vnf -c -i {i} -o {o}",
    "pack-instances": "gltfpack -mi -i {i} -o {o}",
    "pack-raw-time": "gltfpack -af 0 -at 24 -ar 16 -as 24 -vp 16 -i {i} -o {o}",
    "transform-copy": "gltf-transform copy {i} {o}",
    "transform-draco": "gltf-transform draco {i} {o}",
    "transform-edgebreaker": "gltf-transform draco --method edgebreaker --quantize-position 16 {i} {o}",
    "transform-meshopt": "gltf-transform meshopt {i} {o}",
    "transform-meshopt-medium": "gltf-transform meshopt --level medium {i} {o}",
    "transform-quantize": "gltf-transform quantize {i} {o}",
    "transform-sparse": "gltf-transform sparse {i} {o} --ratio 0.1",
    "transform-instance": "gltf-transform instance {i} {o} --min 2",
    "transform-unweld": "gltf-transform unweld {i} {o}",
    "transform-webp": "gltf-transform webp {i} {o}",
    "transform-unlit": "gltf-transform unlit {i} {o}",
    "transform-sequence": "gltf-transform sequence {i} {o}",
    "transform-optimize": "gltf-transform optimize {i} {o}",
    "pipeline-draco": "gltf-pipeline -i {i} -o {o} -d",
    "pipeline-apart": "gltf-pipeline -i {i} -o {p} -s",
}


def run(command):
    try:
        return subprocess.run(command, capture_output=True, timeout=SECONDS).returncode == 0
    except subprocess.TimeoutExpired:
        return False


def plain(path):
    return "".join(c if c.isalnum() or c in ".-" else "_" for c in path)


def make_bases(models, out):
    bases = []
    for parent, folders, names in os.walk(os.path.join(models, "glTF2")):
        folders.sort()
        for name in sorted(names):
            if name.lower().endswith((".gltf", ".glb")):
                bases.append((os.path.join(parent, name), plain(os.path.relpath(os.path.join(parent, name), models))))
    for name in OTHERS.replace("\\ ", "\0").split():
        name = name.replace("\0", " ")
        made = os.path.join(out, plain(name) + ".glb")
        if not os.path.exists(made):
            run(["assimp", "export", os.path.join(models, name), made, "-fglb2"])
        if os.path.exists(made):
            bases.append((made, plain(name)))
    return bases


def make_variant(base, stem, name, binaries, out):
    folder = os.path.join(out, stem)
    os.makedirs(folder, exist_ok=True)
    target = os.path.join(folder, name + ".glb")
    apart = os.path.join(folder, name + ".gltf")
    if os.path.exists(target) or os.path.exists(apart):
        return
    words = [word.format(i=base, o=target, p=apart) for word in VARIANTS[name].split()]
    words[0] = os.path.join(binaries, words[0])
    if not run(words):
        for leftover in (target, apart):
            if os.path.exists(leftover):
                os.remove(leftover)


def main():
    models, binaries, out = sys.argv[1:]
    os.makedirs(out, exist_ok=True)
    makemodels.write_all(os.path.join(out, "MADE"))
    bases = make_bases(models, out)
    for path, _ in bases:
        if path.startswith(models):  # beside what they name
            folder = os.path.dirname(path)
            shutil.copytree(folder, os.path.join(out, "as-it-is", os.path.relpath(folder, models)), dirs_exist_ok=True)
    with concurrent.futures.ThreadPoolExecutor(os.cpu_count()) as pool:
        jobs = [pool.submit(make_variant, path, stem, name, binaries, out) for path, stem in bases for name in VARIANTS]
        for job in jobs:
            job.result()


if __name__ == "__main__":
    main()
