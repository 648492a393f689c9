// Reads glTF files with three.js and writes where their triangles, lines and points are, at rest and at moments of their
// animations: node readwiththree.mjs NODE_MODULES FPS
//
// Standard input has a line for each file: {model, out} in JSON. Standard output gets one for each in turn: {fault, ms}, what
// is wrong ("" for nothing) and the processor's milliseconds for loading.
// OUT: the size of a JSON text (32 bits), the text ({clips, poses}), then for each pose its faces as 32-bit floats: triangles,
// lines, points.
import fs from 'node:fs';
import path from 'node:path';
import readline from 'node:readline';
import { createRequire } from 'node:module';
import { pathToFileURL } from 'node:url';

const [modules, fps] = process.argv.slice(2);
const load = (file) => import(pathToFileURL(path.join(path.resolve(modules), file)).href);
const MOST_CORNERS = 600000; // of a pose; larger models are compared at rest alone

globalThis.self = globalThis;
globalThis.window = globalThis;
console.warn = console.error = () => {};
globalThis.ProgressEvent ??= class { constructor(type) { this.type = type; } };
// Pictures are not compared here.
globalThis.createImageBitmap = async () => ({ width: 1, height: 1, close() {} });

const THREE = await load('three/build/three.module.js');
const { GLTFLoader } = await load('three/examples/jsm/loaders/GLTFLoader.js');
const { MeshoptDecoder } = await load('three/examples/jsm/libs/meshopt_decoder.module.js');
const draco3d = createRequire(path.join(path.resolve(modules), 'x.js'))('draco3d');

/// Unpacks in this process, where the loader of three.js wants a browser's workers.
class DracoHere {
  preload() { return this; }

  async decodeDracoFile(bytes, done, ids, types) {
    const draco = await draco3d.createDecoderModule();
    const decoder = new draco.Decoder();
    const buffer = new draco.DecoderBuffer();
    buffer.Init(new Int8Array(bytes), bytes.byteLength);
    const mesh = new draco.Mesh();
    if (!decoder.DecodeBufferToMesh(buffer, mesh).ok()) throw new Error('packed mesh is damaged');
    const geometry = new THREE.BufferGeometry();
    const corners = mesh.num_faces() * 3;
    const memory = draco._malloc(corners * 4);
    decoder.GetTrianglesUInt32Array(mesh, corners * 4, memory);
    geometry.setIndex(new THREE.BufferAttribute(new Uint32Array(draco.HEAPF32.buffer, memory, corners).slice(), 1));
    for (const name in ids) {
      const attribute = decoder.GetAttributeByUniqueId(mesh, ids[name]);
      const size = attribute.num_components();
      const Type = types && types[name] ? globalThis[types[name]] : Float32Array;
      const values = new draco.DracoFloat32Array();
      decoder.GetAttributeFloatForAllPoints(mesh, attribute, values);
      const array = new Float32Array(mesh.num_points() * size);
      for (let i = 0; i < array.length; ++i) array[i] = values.GetValue(i);
      const made = new THREE.BufferAttribute(Type === Float32Array ? array : Type.from(array), size);
      geometry.setAttribute(name, made);
    }
    done(geometry);
  }
}

function toDataUri(url) {
  if (/^(data|blob):/.test(url)) return url;
  const plain = decodeURIComponent(url);
  const file = [plain, url].find((name) => fs.existsSync(name));
  return file ? 'data:application/octet-stream;base64,' + fs.readFileSync(file).toString('base64') : url;
}

async function read(model) {
  const manager = new THREE.LoadingManager();
  manager.setURLModifier(toDataUri);
  const loader = new GLTFLoader(manager);
  loader.setMeshoptDecoder(MeshoptDecoder);
  loader.setDRACOLoader(new DracoHere());
  loader.setKTX2Loader({ load: (url, onLoad) => onLoad(new THREE.Texture()), detectSupport() {} });
  const bytes = fs.readFileSync(model);
  const gltf = await loader.parseAsync(bytes.buffer.slice(bytes.byteOffset, bytes.byteOffset + bytes.length),
                                       path.dirname(model) + '/');
  const { json } = gltf.parser;
  for (let i = 0; i < (json.nodes?.length ?? 0); ++i) // which three.js does not read
    if (json.nodes[i].extensions?.KHR_node_visibility?.visible === false)
      (await gltf.parser.getDependency('node', i)).visible = false;
  return gltf;
}

function pickCorners(mesh, count) {
  const at = (i) => (mesh.geometry.index ? mesh.geometry.index.getX(i) : i);
  const total = mesh.geometry.index ? mesh.geometry.index.count : mesh.geometry.attributes.position.count;
  const corners = [];
  if (mesh.isLine && !mesh.isLineSegments) {
    const last = mesh.isLineLoop ? total : total - 1;
    for (let i = 0; i < last; ++i) corners.push(at(i), at((i + 1) % total));
  } else {
    for (let i = 0; i + count <= total; i += count) for (let c = 0; c < count; ++c) corners.push(at(i + c));
  }
  return corners;
}

function pose(scene) {
  scene.updateMatrixWorld(true);
  const faces = { 3: [], 2: [], 1: [] };
  const place = new THREE.Vector3();
  const instance = new THREE.Matrix4();
  scene.traverseVisible((mesh) => {
    const count = mesh.isMesh ? 3 : mesh.isLine ? 2 : mesh.isPoints ? 1 : 0;
    if (!count) return;
    const corners = pickCorners(mesh, count);
    for (let i = 0; i < (mesh.isInstancedMesh ? mesh.count : 1); ++i) {
      if (mesh.isInstancedMesh) mesh.getMatrixAt(i, instance);
      for (const corner of corners) {
        if (mesh.isMesh) mesh.getVertexPosition(corner, place);
        else place.fromBufferAttribute(mesh.geometry.attributes.position, corner);
        if (mesh.isInstancedMesh) place.applyMatrix4(instance);
        place.applyMatrix4(mesh.matrixWorld);
        faces[count].push(place.x, place.y, place.z);
      }
    }
  });
  return faces;
}

function write(gltf, out) {
  const poses = [];
  const floats = [];
  function add(clip, time) {
    const faces = pose(gltf.scene);
    poses.push({ clip, time, counts: [3, 2, 1].map((count) => faces[count].length / 3 / count) });
    for (const count of [3, 2, 1]) floats.push(Buffer.from(new Float32Array(faces[count]).buffer));
    return faces[3].length / 3;
  }
  const size = add(-1, 0);
  const mixer = new THREE.AnimationMixer(gltf.scene);
  for (let clip = 0; clip < gltf.animations.length && size <= MOST_CORNERS; ++clip) {
    const duration = gltf.animations[clip].duration;
    const action = mixer.clipAction(gltf.animations[clip]);
    action.setLoop(THREE.LoopOnce);
    action.clampWhenFinished = true;
    const samples = Math.ceil(duration * fps - 1e-6);
    for (const sample of new Set([0, Math.floor(samples / 3), Math.floor((2 * samples) / 3), samples])) {
      action.reset().play();
      const time = Math.min(sample / fps, duration);
      mixer.setTime(time);
      add(clip, time);
    }
    action.stop();
    mixer.uncacheAction(gltf.animations[clip]);
  }
  const clips = gltf.animations.map((clip) => ({ name: clip.name, duration: clip.duration }));
  const text = Buffer.from(JSON.stringify({ clips, poses }));
  const head = Buffer.alloc(4);
  head.writeUInt32LE(text.length);
  fs.writeFileSync(out, Buffer.concat([head, text, ...floats]));
}

process.on('unhandledRejection', () => {}); // of parts that are no longer awaited after another one has failed
for await (const line of readline.createInterface({ input: process.stdin })) {
  const { model, out } = JSON.parse(line);
  let fault = '';
  let ms = 0;
  try {
    const start = process.cpuUsage();
    const gltf = await read(model);
    const spent = process.cpuUsage(start);
    ms = (spent.user + spent.system) / 1000;
    write(gltf, out);
  } catch (error) {
    fault = String(error) || 'Error';
  }
  console.log(JSON.stringify({ fault, ms }));
}
process.exit(0);
