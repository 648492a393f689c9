// The page around the engine: passes files and input to the engine, and shows its messages.

import { collectDropped, fetchFile, isModel, nameFile, readChosen } from "./files.js";
import { listenToHands, listenToKeys } from "./input.js";

const FOLDER = "/scene";
const BACKGROUNDS = [[0.84, 0.86, 0.89], [0.2, 0.22, 0.25], [1, 1, 1], [0, 0, 0]];
const ROUNDS = 8; // of files that refer to files
const COUNTS_INTERVAL = 200; // milliseconds

const find = (id) => document.getElementById(id);
const canvas = find("view");
const state = { model: "", scene: null, clip: 0, background: 0, loops: true, lost: false, stopped: false };
let engine = null;
let contextIsThere = Promise.resolve(); // while the context is lost: fulfilled when it is restored
let openings = 0; // a slow opening must not replace a later one

// --- the engine

const call = (name, ...values) => engine["_" + name](...values);
const callWithText = (name, text) => engine.ccall(name, "number", ["string"], [text]);

function describe() {
    return JSON.parse(engine.UTF8ToString(call("orvDescribe")));
}

/// "1 part", "4,212 triangles"
function count(number, word) {
    return `${number.toLocaleString("en")} ${word}${number === 1 ? "" : "s"}`;
}

function fileName(path) {
    return path.slice(path.lastIndexOf("/") + 1);
}

// --- what is said

function say(text) {
    find("status").textContent = text;
}

function showMessage(text, remarks = []) {
    find("text").textContent = text;
    find("remarks").replaceChildren(...remarks.map((remark) => {
        const item = document.createElement("li");
        item.textContent = remark;
        return item;
    }));
    find("more").hidden = remarks.length === 0;
    find("message").hidden = false;
}

function hideMessage() {
    find("message").hidden = true;
}

function stop(reason) {
    state.stopped = true;
    showMessage(`${reason} Load the page again to continue.`);
}

// --- frames

let isFrameWanted = false;
let moves = false;
let lastTime = 0;
let lastCounts = 0;
let took = 0;
const frameTimes = [];

function requestFrame() {
    if (isFrameWanted || state.lost || state.stopped)
        return;
    isFrameWanted = true;
    requestAnimationFrame(drawFrame);
}

function drawFrame(now) {
    isFrameWanted = false;
    if (state.lost || state.stopped || !state.scene)
        return;
    fitCanvas(); // the density may have changed
    const seconds = moves ? (now - lastTime) / 1000 : 0;
    lastTime = now;
    frameTimes.push(now);
    while (frameTimes[0] < now - 1000)
        frameTimes.shift();
    drawNow(seconds);
    if (moves)
        requestFrame();
}

/// Draws at once. Read the canvas before the script ends.
function drawNow(seconds = 0) {
    const before = performance.now();
    moves = call("orvDraw", seconds) !== 0;
    took = performance.now() - before;
    showTime();
    showCounts();
}

function showTime() {
    const clip = state.scene.clips[state.clip];
    const length = clip.end - clip.start;
    const paused = call("orvIsPaused") !== 0;
    const share = call("orvGetShare");
    if (find("play").classList.toggle("playing", !paused))
        find("play").lastElementChild.textContent = "Pause";
    else
        find("play").lastElementChild.textContent = "Play";
    find("time").value = share;
    const text = `${(share * length).toFixed(2)} / ${length.toFixed(2)} s`;
    find("clock").textContent = text;
    find("time").setAttribute("aria-valuetext", `${(share * length).toFixed(1)} of ${length.toFixed(1)} seconds`);
    const camera = call("orvGetCamera");
    if (find("camera").selectedIndex !== camera + 1)
        find("camera").selectedIndex = camera + 1;
}

function showCounts() {
    if (find("counts").hidden || performance.now() - lastCounts < COUNTS_INTERVAL && moves)
        return;
    lastCounts = performance.now();
    const counted = (what, word) => count(call("orvCount", what), word);
    find("counts").textContent = [
        moves ? `${frameTimes.length} frames a second` : "at rest",
        `${took.toFixed(1)} ms in the engine`,
        counted(0, "draw"), counted(1, "triangle"), counted(2, "GL call"), counted(3, "upload"),
        `${canvas.width} x ${canvas.height} pixels`].join("\n");
}

// --- scenes

function writeFile(name, bytes) {
    const path = `${FOLDER}/${name}`;
    engine.FS.mkdirTree(path.slice(0, path.lastIndexOf("/")));
    engine.FS.writeFile(path, bytes);
}

function removeFiles(folder) {
    for (const name of engine.FS.readdir(folder)) {
        const path = `${folder}/${name}`;
        if (name === "." || name === "..")
            continue;
        if (engine.FS.isDir(engine.FS.stat(path).mode)) {
            removeFiles(path);
            engine.FS.rmdir(path);
        } else {
            engine.FS.unlink(path);
        }
    }
}

function fillSelect(select, names, isShown) {
    select.replaceChildren(...names.map((name) => new Option(name)));
    select.hidden = !isShown;
}

/// Loads what has been written into FOLDER. @param model  its name in there.
function load(model) {
    const isLoaded = callWithText("orvOpen", `${FOLDER}/${model}`) !== 0;
    const scene = describe();
    state.model = isLoaded ? model : "";
    state.scene = isLoaded ? scene : null;
    state.clip = 0;
    moves = false;
    frameTimes.length = 0;
    return scene;
}

function show(model, scene) {
    const remarks = scene.remarks.map((remark) => remark.text);
    const isOpen = state.scene !== null;
    const name = fileName(model);
    find("welcome").hidden = isOpen;
    find("all").hidden = !isOpen;
    find("bar").hidden = true;
    canvas.classList.toggle("empty", !isOpen); // otherwise it would still show the last frame
    find("name").textContent = isOpen ? name : "orv viewer";
    document.title = isOpen ? `${name} - orv viewer` : "orv viewer";
    if (!isOpen) {
        canvas.setAttribute("aria-label", "Nothing is open");
        call("orvClose");
        showMessage(`${name} cannot be opened: it is damaged, ` +
            (isModel(name) === 1 ? "or not a scene." : "or a file that it names is missing."), remarks);
        return;
    }
    const errors = scene.remarks.filter((remark) => remark.error).length;
    if (errors > 0)
        showMessage(`${name} is open, but some of its files could not be loaded. Drop missing files here.`, remarks);
    else
        hideMessage();
    call("orvSetLooping", state.loops ? 1 : 0);
    fillSelect(find("clip"), scene.clips.map((clip) => clip.name || "without a name"), scene.clips.length > 1);
    fillSelect(find("camera"), ["free view", ...scene.cameras.map((camera) => camera || "without a name")], scene.cameras.length > 0);
    find("transport").hidden = !scene.clips.some((clip) => clip.end > clip.start);
    find("bar").hidden = find("transport").hidden && find("clip").hidden && find("camera").hidden;
    fitCanvas(); // beside the bar, if there is one
    call("orvFrameAll");
    labelView();
    say(`${name} is open.`);
    requestFrame();
}

function labelView() {
    const scene = state.scene;
    const camera = scene.cameras[call("orvGetCamera")];
    canvas.setAttribute("aria-label", `${fileName(state.model)}: ${count(scene.parts, "part")}, ` +
        `${count(scene.triangles, "triangle")}, ${camera ? `through camera ${camera}` : "seen freely"}`);
}

/// Shows the scene among some files, or adds the files to the open scene; once the context is restored if it is lost.
/// @param files  of {name, bytes}; names may have folders.
function openFiles(files) {
    if (files.length === 0 || state.stopped)
        return;
    if (state.lost) {
        openWhenRead(contextIsThere.then(() => files));
        return;
    }
    const models = files.map((file) => file.name).filter(isModel).sort((one, other) =>
        isModel(one) - isModel(other) || one.split("/").length - other.split("/").length || (one < other ? -1 : 1));
    if (models.length === 0 && !state.model) {
        showMessage(files.length === 1
            ? `${files[0].name} is not a .glo scene. orv-convert model.glb --page folder converts a model to one.`
            : `There is no .glo scene among these ${files.length} files. orv-convert model.glb --page folder converts a model to one.`);
        return;
    }
    const model = models.length > 0 ? models[0] : state.model;
    const folder = models.length === 0 ? model.slice(0, model.lastIndexOf("/") + 1) : "";
    if (models.length > 0) {
        ++openings;
        removeFiles(FOLDER);
    }
    for (const file of files)
        writeFile(folder + file.name, file.bytes);
    show(model, load(model));
}

/// @return a URL on the page's own server, with the name of a file.
function readAddress(address) {
    let url;
    try {
        url = new URL(address, location.href);
    } catch {
        throw new Error(`${address} is not an address`);
    }
    if (url.origin !== location.origin)
        throw new Error(`${address}: this page opens what is on its own server`);
    if (!nameFile(url))
        throw new Error(`${address} names no file`);
    return url;
}

/// Shows a scene from the page's own server.
/// @param address  relative to the page.
/// @param names    the files that it needs, relative to the scene; without them they are requested as they are found
///                 missing.
/// @return whether it is shown; if not, there is a message, or something else was opened meanwhile.
async function openAddress(address, names) {
    const url = readAddress(address);
    const opening = ++openings;
    const isLatest = async () => {
        await contextIsThere;
        return opening === openings;
    };
    const model = nameFile(url);
    const tried = new Set([model]);
    const get = async (name) => {
        tried.add(name);
        const bytes = await fetchFile(new URL(name.split("/").map(encodeURIComponent).join("/"), url));
        return { name, bytes };
    };
    say(`${model} is being loaded.`);
    const files = [{ name: model, bytes: await fetchFile(url) }];
    if (names)
        files.push(...await Promise.all(names.filter((name) => name !== model).map(get)));
    if (!await isLatest())
        return false;
    removeFiles(FOLDER);
    for (const file of files)
        writeFile(file.name, file.bytes);
    let scene = load(model);
    for (let round = 0; !names && state.scene && round < ROUNDS; ++round) {
        const missing = scene.missing.map((path) => path.slice(FOLDER.length + 1)).filter((name) => !tried.has(name));
        const found = (await Promise.allSettled(missing.map(get))).filter((answer) => answer.status === "fulfilled");
        if (found.length === 0)
            break;
        if (!await isLatest())
            return false;
        for (const answer of found)
            writeFile(answer.value.name, answer.value.bytes);
        scene = load(model);
    }
    show(model, scene);
    return state.scene !== null;
}

// --- commands

function chooseClip(index) {
    const count = state.scene.clips.length;
    const clip = (index % count + count) % count;
    call("orvStepClip", clip - state.clip);
    state.clip = clip;
    find("clip").selectedIndex = clip;
    say(`Clip ${find("clip").value}`);
}

function chooseCamera(index) {
    const count = state.scene.cameras.length + 1;
    call("orvUseCamera", ((index + 1) % count + count) % count - 1);
    showTime();
    labelView();
    say(find("camera").value);
}

function toggle(button, panel) {
    find(panel).hidden = !find(panel).hidden;
    const isShown = String(!find(panel).hidden);
    find(button).setAttribute(find(button).hasAttribute("aria-expanded") ? "aria-expanded" : "aria-pressed", isShown);
}

function toggleScreen() {
    if (document.fullscreenElement)
        document.exitFullscreen();
    else
        document.documentElement.requestFullscreen().catch(() => say("The browser does not allow full screen."));
}

const commands = {
    all: () => call("orvFrameAll"),
    camera: (count) => chooseCamera(call("orvGetCamera") + count),
    clip: (count) => chooseClip(state.clip + count),
    play: () => {
        call("orvTogglePaused");
        say(call("orvIsPaused") ? "Paused" : "Playing");
    },
    step: (frames) => call("orvStep", frames),
    share: (share) => call("orvSeekShare", share),
    speed: (factor) => {
        call("orvScaleSpeed", factor);
        say(`Speed ${call("orvGetSpeed")}`);
    },
    loop: () => {
        state.loops = !state.loops;
        call("orvSetLooping", state.loops ? 1 : 0);
        say(state.loops ? "Loops" : "Stops at the end");
    },
    backdrop: () => {
        state.background = (state.background + 1) % BACKGROUNDS.length;
        call("orvSetBackground", ...BACKGROUNDS[state.background]);
    },
    info: () => toggle("info", "counts"),
    help: () => toggle("help", "keys"),
    away: () => {
        hideMessage();
        if (!find("keys").hidden)
            toggle("help", "keys");
    },
    turn: (right, down) => call("orvTurn", right, down),
    pan: (right, down) => call("orvPan", right * devicePixelRatio, down * devicePixelRatio),
    zoom: (steps) => call("orvZoom", steps),
    closer: (x, y) => call("orvLookCloser", x * canvas.width / canvas.clientWidth, y * canvas.height / canvas.clientHeight),
};
const WITHOUT_SCENE = new Set(["help", "away", "info", "backdrop", "loop"]);

function run(command, ...values) {
    if (!engine || state.stopped || state.lost || !state.scene && !WITHOUT_SCENE.has(command))
        return;
    commands[command](...values);
    if (command === "turn" || command === "pan" || command === "zoom" || command === "closer")
        labelView();
    requestFrame();
}

// --- the page

function fitCanvas() {
    const width = Math.max(1, Math.round(canvas.clientWidth * devicePixelRatio));
    const height = Math.max(1, Math.round(canvas.clientHeight * devicePixelRatio));
    if (width === canvas.width && height === canvas.height)
        return;
    call("orvSetSize", width, height);
    if (state.scene && !state.lost)
        drawNow(); // a canvas of another size is empty
}

function listenToContext() {
    let tellThere = null;
    canvas.addEventListener("webglcontextlost", (event) => {
        event.preventDefault(); // so that it may be restored
        state.lost = true;
        contextIsThere = new Promise((resolve) => { tellThere = resolve; });
        call("orvLoseContext");
        showMessage("The WebGL context is lost. The view returns when the browser restores it.");
    });
    canvas.addEventListener("webglcontextrestored", () => {
        state.lost = false;
        moves = false;
        if (call("orvRestoreContext") === 0) {
            stop("The WebGL context is restored, but the scene could not be loaded again.");
            return;
        }
        hideMessage();
        requestFrame();
        tellThere();
    });
}

/// Moving the window to another display may change the density without changing the canvas's size on the page.
function listenToDensity() {
    matchMedia(`(resolution: ${devicePixelRatio}dppx)`).addEventListener("change", () => {
        requestFrame();
        listenToDensity();
    }, { once: true });
}

/// Opens the files of a promise, or shows the reason of its failure.
async function openWhenRead(promise) {
    try {
        openFiles(await promise);
    } catch (error) {
        showMessage(`The files cannot be read: ${error.message}`);
    }
}

function listenToFiles() {
    const choose = (button, chooser) => find(button).addEventListener("click", () => find(chooser).click());
    choose("choose", "filechooser");
    choose("files", "filechooser");
    choose("folder", "folderchooser");
    for (const chooser of [find("filechooser"), find("folderchooser")]) {
        chooser.addEventListener("change", async () => {
            await openWhenRead(readChosen(chooser.files));
            chooser.value = ""; // so that the same file can be chosen again
        });
    }
    addEventListener("dragover", (event) => {
        event.preventDefault();
        find("drop").hidden = false;
    });
    addEventListener("dragleave", (event) => {
        if (!event.relatedTarget)
            find("drop").hidden = true;
    });
    addEventListener("drop", (event) => {
        event.preventDefault();
        find("drop").hidden = true;
        openWhenRead(collectDropped(event.dataTransfer));
    });
}

function listenToButtons() {
    const press = (button, command, ...values) => find(button).addEventListener("click", () => run(command, ...values));
    press("play", "play");
    press("all", "all");
    press("info", "info");
    press("help", "help");
    press("backdrop", "backdrop");
    find("screen").hidden = !document.fullscreenEnabled;
    find("screen").addEventListener("click", toggleScreen);
    find("dismiss").addEventListener("click", hideMessage);
    find("time").addEventListener("input", () => run("share", Number(find("time").value)));
    find("clip").addEventListener("change", () => run("clip", find("clip").selectedIndex - state.clip));
    find("camera").addEventListener("change", () => run("camera", find("camera").selectedIndex - 1 - call("orvGetCamera")));
}

/// The address's other parameters: ?camera=name&clip=name&time=seconds&play=0&bars=0
function applyAddress(wishes) {
    const clip = wishes.has("clip") ? state.scene.clips.findIndex(({ name }) => name === wishes.get("clip")) : 0;
    const camera = wishes.has("camera") ? state.scene.cameras.indexOf(wishes.get("camera")) : -1;
    if (clip < 0)
        showMessage(`There is no clip "${wishes.get("clip")}".`);
    if (clip > 0)
        run("clip", clip);
    if (wishes.has("camera") && camera < 0)
        showMessage(`There is no camera "${wishes.get("camera")}".`);
    if (camera >= 0)
        chooseCamera(camera);
    const { start, end } = state.scene.clips[state.clip];
    if (end > start && wishes.has("time"))
        run("share", Math.min(Math.max(Number(wishes.get("time")) / (end - start), 0), 1) || 0);
    if (end > start && wishes.get("play") === "0")
        run("play");
}

async function start() {
    if (location.protocol === "file:") {
        showMessage("Browsers run this page only from a web server. In its folder: python3 -m http.server");
        return;
    }
    engine = await startOrv({ print: () => {}, printErr: () => {}, onAbort: (why) => stop(`The engine has stopped: ${why}.`) });
    engine.FS.mkdir(FOLDER);
    if (callWithText("orvStart", "#view") === 0) {
        stop("This browser has no WebGL, which the view needs.");
        return;
    }
    listenToContext();
    listenToFiles();
    listenToButtons();
    listenToHands(canvas, run);
    listenToKeys(run);
    new ResizeObserver(fitCanvas).observe(canvas);
    listenToDensity();
    fitCanvas();
    const given = JSON.parse(find("scene").textContent);
    const wishes = new URLSearchParams(location.search);
    document.body.classList.toggle("bare", wishes.get("bars") === "0");
    const model = wishes.get("model") || encodeURIComponent(given.model || "");
    if (!model)
        return;
    find("welcome").hidden = true;
    if (await openAddress(model, wishes.has("model") ? undefined : given.files))
        applyAddress(wishes);
}

/// For other scripts: ready, state, opening files of {name, bytes}, drawing a frame at once, commands.
window.orvPage = {
    ready: start().catch((error) => {
        find("welcome").hidden = state.scene !== null;
        showMessage(error.message);
    }),
    state, openFiles, drawNow, run,
    countMemory: () => engine.HEAP8.length, // bytes
};
