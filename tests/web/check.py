#!/usr/bin/python3
"""The page in a real browser: Chromium without a window, drawing by SwiftShader.

    check.py BUILD WEBBUILD MODELS [NAME...]

BUILD has the tools and examples for this machine, WEBBUILD the page and the examples for browsers, MODELS is the folder of
models that other people made. A line for each check; exit code 1 if one fails. With names, those checks alone.
"""
import argparse
import base64
import gzip
import pathlib
import random
import shutil
import subprocess
import sys
import time
import traceback

import numpy
from PIL import Image
from selenium.webdriver.common.action_chains import ActionChains
from selenium.webdriver.common.actions.action_builder import ActionBuilder
from selenium.webdriver.common.actions.pointer_actions import PointerActions
from selenium.webdriver.common.actions.pointer_input import PointerInput
from selenium.webdriver.common.by import By
from selenium.webdriver.common.keys import Keys

from browser import Browser, Server, compare, read_png

LARGEST_DOWNLOAD = 300_000  # bytes of the page's files, compressed
WIDTH, HEIGHT = 640, 480
# Two drivers round apart: at edges, where each takes its own samples, and by a few steps of 255 in shades.
TOLERANCE = 24
ALLOWED_SHARE = 0.02
MODELS = {"duck": "Collada/duck.dae", "motion": "ASE/MotionCaptureROM.ase", "skin": "FBX/animation_with_skeleton.fbx"}
UNSHAPED = 71  # per cent of the example "scripts", from the top: below are lines that a library shapes which the browser lacks
MOMENTS = 8  # of a clip: those that the view is fitted to


class Bench:
    """Shared by the checks."""

    def __init__(self, build, web, models):
        self.build, self.web, self.models = build, web, models
        self.folder = web / "check"
        shutil.rmtree(self.folder, ignore_errors=True)
        self.folder.mkdir(parents=True)
        self.native = self.folder / "native"
        self.native.mkdir()
        shutil.copytree(web / "page", self.folder / "page")
        shutil.copytree(web / "examples", self.folder / "examples")
        for name, path in MODELS.items():
            run_here([build / "tools/convert/orv-convert", models / path, "--page", self.folder / name])
        self.server = Server(self.folder)
        self.browser = Browser()

    def close(self):
        self.browser.close()
        self.server.close()

    def scene(self, name):
        """The scene file of a model, as a path below the folder that is served."""
        return f"{name}/{pathlib.Path(MODELS[name]).stem}.glo"

    def files(self, name):
        """The same of a scene with its pictures."""
        stem = pathlib.Path(MODELS[name]).stem
        return [f"{name}/{path.name}" for path in sorted((self.folder / name).glob(f"{stem}*"))]

    def show(self, page, *wishes):
        """With the canvas as large as the window."""
        self.browser.open(f"{self.server.address}/{page}/?{'&'.join(('bars=0',) + wishes)}")

    def draw(self, name, *options):
        """By orv-view. @return the pictures."""
        out = self.native / f"{name}.png"
        run_here([self.build / "tools/view/orv-view", self.folder / self.scene(name), "--out", out, "--size",
                  f"{WIDTH}x{HEIGHT}", *options])
        return [read_png(path) for path in sorted(self.native.glob(f"{name}*.png"))]

    def run_example(self, name, *arguments):
        """By the program for this machine. @return the pictures, by name."""
        folder = self.native / name
        folder.mkdir(exist_ok=True)
        run_here([self.build / "examples" / name, *arguments], folder)
        return {path.name: read_png(path) for path in folder.glob("*.png")}


def run_here(words, folder=None):
    """Runs a program for this machine; its output is only shown if it fails."""
    done = subprocess.run(words, cwd=folder, capture_output=True, text=True)
    expect(done.returncode == 0, f"{words[0].name}: {done.stdout}{done.stderr}")


def expect(condition, message):
    if not condition:
        raise AssertionError(message)


def hold(name, native, drawn, tolerance=TOLERANCE, share=ALLOWED_SHARE):
    """@return a text for two pictures that are close enough."""
    found, most = compare(native, drawn, tolerance)
    if found > share:
        Image.fromarray(numpy.hstack([native, drawn, abs(native - drawn)]).astype("uint8")).save(f"{name}-differs.png")
    expect(found <= share, f"{name}: {100 * found:.2f} % of the pixels differ by more than {tolerance}, "
           f"{most} at most; see {name}-differs.png")
    return f"{name} {100 * found:.2f} %"


# --- the checks


def download(bench):
    """Fault caught: a page that takes longer to load from release to release."""
    sizes = {path.name: len(gzip.compress(path.read_bytes(), 9)) for path in (bench.web / "page").iterdir()}
    total = sum(sizes.values())
    expect(total <= LARGEST_DOWNLOAD, f"{total} bytes compressed, {LARGEST_DOWNLOAD} are allowed: {sizes}")
    return f"{total} of {LARGEST_DOWNLOAD} bytes, compressed"


def models(bench):
    """Fault caught: a browser's stricter GL draws something else than the viewer does."""
    said = []
    bench.browser.resize(WIDTH, HEIGHT)
    for name in MODELS:
        bench.show(name, "play=0")
        moves = bench.browser.run("return orvPage.state.scene.clips.some((clip) => clip.end > clip.start)")
        natives = bench.draw(name, *(["--frames", str(MOMENTS)] if moves else []))
        expect(len(natives) == (MOMENTS if moves else 1), f"{name}: {len(natives)} pictures of orv-view")
        for i, native in enumerate(natives):
            bench.browser.run("orvPage.run('share', values[0])", i / MOMENTS)
            said.append(hold(f"{name}-{i}", native, bench.browser.picture()))
        if name == "duck":
            bench.show(name, "camera=camera1")
            said.append(hold("duck-camera", bench.draw(name, "--camera", "camera1")[0], bench.browser.picture()))
    return f"by more than {TOLERANCE} of 255: " + ", ".join(said)


def examples(bench):
    """The same of whole programs: mirrors, targets, text over a frame and in many scripts, motion blur, shadows."""
    scenes = {f"/{path}": f"../{path}" for name in ("duck", "motion") for path in bench.files(name)}
    font, fallback = (f"/usr/share/fonts/truetype/{name}.ttf" for name in ("dejavu/DejaVuSans", "droid/DroidSansFallbackFull"))
    shutil.copyfile(font, bench.folder / "font.ttf")
    shutil.copyfile(fallback, bench.folder / "fallback.ttf")
    runs = {
        "showpiece": (["--duck", "/" + bench.scene("duck"), "--dancer", "/" + bench.scene("motion"), "--out", "a.png"], scenes),
        "stereo": (["--stereo", "--out", "a.png"], {}),
        "textpage": (["--font", font, "--out", "a.png"], {font: "../font.ttf"}),
        "scripts": (["--out", "a.png"], {font: "../font.ttf", fallback: "../fallback.ttf"}),
        "motionblur": (["--out", "a"], {}),
        "smoothmotion": (["--out", "a.png"], {}),
        "shadows": (["--out", "a.png"], {}),
    }
    said = []
    for name, (arguments, files) in runs.items():
        program = "showpiece" if name == "stereo" else name
        bench.browser.driver.get(f"{bench.server.address}/examples/example.html")
        drawn = bench.browser.run("return runExample(values[0], values[1])", [program, *arguments], files)
        here = [str(bench.folder) + word if word.endswith(".glo") else word for word in arguments]
        natives = bench.run_example(program, *here)
        expect(drawn["glError"] == 0, f"{name}: GL error {drawn['glError']}: {drawn['said']}")
        expect(drawn["pictures"].keys() == natives.keys(),
               f"{name}: {list(drawn['pictures'])} in place of {list(natives)}: {drawn['said']}")
        for path, picture in drawn["pictures"].items():
            pixels = numpy.frombuffer(base64.b64decode(picture["rgba"]), "uint8").astype(int)
            pixels = pixels.reshape(picture["height"], picture["width"], 4)[:, :, :3]
            rows = picture["height"] * UNSHAPED // 100 if name == "scripts" else picture["height"]
            said.append(hold(f"{name}-{path[:-4]}", natives[path][:rows], pixels[:rows]))
    return f"by more than {TOLERANCE} of 255: " + ", ".join(said)


def hands(bench):
    """Fault caught: a drag, a wheel, a key or a finger without effect or with a wrong one."""
    browser = bench.browser
    driver = browser.driver
    browser.resize(WIDTH, HEIGHT)

    def shows(action, script):
        """Whether events change the picture, and as the same commands do. @return an error or nothing."""
        bench.show("duck")
        before = browser.picture()
        action()
        after = browser.picture()
        bench.show("duck")
        browser.run(script)
        wanted = browser.picture()
        changed, _ = compare(before, after, 8)
        wrong, _ = compare(wanted, after, 8)
        if changed < 0.01 or wrong > 0.002:
            return f"{100 * changed:.2f} % changed, {100 * wrong:.2f} % other than {script}"
        return None

    canvas = lambda: driver.find_element(By.ID, "view")  # of the page that is open
    drag = lambda: ActionChains(driver).move_to_element(canvas()).click_and_hold().move_by_offset(80, 30).release().perform()

    def drag_with_shift():
        ActionChains(driver).key_down(Keys.SHIFT).perform()
        drag()
        ActionChains(driver).key_up(Keys.SHIFT).perform()

    def wheel():
        browser.command("Input.dispatchMouseEvent", type="mouseWheel", x=WIDTH // 2, y=HEIGHT // 2, deltaX=0,
                        deltaY=-300)
        time.sleep(0.3)

    def fingers(*moves):
        """Two fingers, from and to."""
        actions = ActionBuilder(driver, mouse=PointerInput("touch", "one"))
        other = actions.add_pointer_input("touch", "other")
        for source, (start, end) in zip((actions.pointer_action, PointerActions(other)), moves):
            source.move_to_location(*start)
            source.pointer_down()
            source.move_to_location(*end)
            source.pointer_up()
        actions.perform()

    press = lambda *keys: lambda: ActionChains(driver).click(canvas()).send_keys(*keys).perform()
    x, y = WIDTH // 2, HEIGHT // 2
    cases = {
        "drag": (drag, "orvPage.run('turn', 80, 30)"),
        "shift and drag": (drag_with_shift, "orvPage.run('pan', 80, 30)"),
        "wheel": (wheel, "orvPage.run('zoom', 3)"),
        "double click": (lambda: ActionChains(driver).double_click(canvas()).perform(),
                         f"orvPage.run('closer', {x}, {y})"),
        "right key": (press(Keys.ARROW_RIGHT, Keys.ARROW_RIGHT), "orvPage.run('turn', 24, 0)"),
        "plus": (press("+"), "orvPage.run('zoom', 1)"),
        "next camera": (press("c"), "orvPage.run('camera', 1)"),
        "backdrop": (press("b"), "orvPage.run('backdrop')"),
        "one finger": (lambda: fingers(((x, y), (x + 80, y + 30))), "orvPage.run('turn', 80, 30)"),
        "two fingers apart": (lambda: fingers(((x - 40, y), (x - 80, y)), ((x + 40, y), (x + 80, y))),
                              "orvPage.run('zoom', Math.log(2) / -Math.log(0.9))"),
        "two fingers along": (lambda: fingers(((x - 40, y), (x - 20, y + 50)), ((x + 40, y), (x + 60, y + 50))),
                              "orvPage.run('pan', 20, 50)"),
    }
    wrong = {}
    for name, case in cases.items():
        error = shows(*case)
        if error:
            wrong[name] = error
    expect(not wrong, str(wrong))

    browser.open(f"{bench.server.address}/motion/")
    playing = lambda: browser.run("return document.getElementById('play').classList.contains('playing')")
    expect(playing(), "a clip does not play by itself")
    ActionChains(driver).send_keys(" ").perform()
    browser.picture()
    expect(not playing(), "space does not pause")
    driver.find_element(By.ID, "time").send_keys(Keys.END)
    browser.picture()
    clock = driver.find_element(By.ID, "clock").text.split()
    expect(clock[0] == clock[2], f"the slider's end is no end of the clip: {clock}")
    return f"{len(cases)} kinds of events and the time line"


def context(bench):
    """Fault caught: a lost context that leaves the page black, elsewhere, or a little different."""
    browser = bench.browser
    browser.resize(WIDTH, HEIGHT)
    cases = {"duck": "orvPage.run('turn', 33, 5); orvPage.run('zoom', 2); orvPage.run('pan', 9, 9)",
             "duck camera=camera1": "", "motion": "orvPage.run('share', 0.3); orvPage.run('backdrop')",
             "skin": "orvPage.run('share', 0.4)"}
    for page, script in cases.items():
        bench.show(*page.split(), "play=0")
        browser.run(script)
        before = browser.picture()
        browser.run("""
            const view = document.getElementById("view");
            const lose = view.getContext("webgl").getExtension("WEBGL_lose_context");
            const happens = (name) => new Promise((resolve) => view.addEventListener(name, () => setTimeout(resolve), {once: true}));
            for (let i = 0; i < 2; ++i) {
                const lost = happens("webglcontextlost");
                lose.loseContext();
                await lost;
                if (document.getElementById("message").hidden)
                    throw new Error("nothing is said of a lost context");
                const restored = happens("webglcontextrestored");
                lose.restoreContext();
                await restored;
            }""")
        most = compare(before, browser.picture(), 0)[1]
        expect(most == 0, f"{page}: {most} of 255 off")
        expect(browser.run("return document.getElementById('message').hidden"), "the message stays")
    open_while_lost(bench)
    return f"{len(cases)} views, lost twice, the same bit for bit; opened while it was lost"


def open_while_lost(bench):
    """Fault caught: a scene that is opened, or still being loaded, while the context is lost, and is refused."""
    browser = bench.browser
    bench.show("motion", "play=0")
    wanted = browser.picture()
    lose = """
        const view = document.getElementById("view");
        window.extension = view.getContext("webgl").getExtension("WEBGL_lose_context");
        const lost = new Promise((resolve) => view.addEventListener("webglcontextlost", () => setTimeout(resolve), {once: true}));
        window.extension.loseContext();
        await lost;
        """
    restore = """
        window.extension.restoreContext();
        for (let i = 0; i < 50 && orvPage.state.model !== values[0]; ++i)
            await new Promise((resolve) => setTimeout(resolve, 100));
        const message = document.getElementById("message");
        return orvPage.state.model === values[0] && message.hidden ? "" : `${orvPage.state.model}, ${message.innerText}`;"""
    motion = pathlib.Path(bench.scene("motion")).name
    bench.show("duck")
    browser.run(lose + """
        orvPage.openFiles([{ name: values[0].split("/").pop(), bytes: new Uint8Array(await (await fetch("/" + values[0])).arrayBuffer()) }]);
        if (!document.getElementById("text").textContent.includes("context is lost"))
            throw new Error("a file opened without a context: " + document.getElementById("text").textContent);""", bench.scene("motion"))
    said = browser.run(restore, motion)
    expect(not said, f"a file opened without a context is not shown later: {said}")
    browser.run("orvPage.run('play'); orvPage.run('share', 0)")
    expect(compare(wanted, browser.picture(), 0)[1] == 0, "a file opened without a context looks otherwise")

    arrives = bench.server.hold(f"/{bench.scene('motion')}?held")
    browser.driver.get(f"{bench.server.address}/page/?play=0&bars=0&model=/{bench.scene('motion')}?held")
    browser.run("while (!document.getElementById('welcome').hidden) await new Promise((resolve) => setTimeout(resolve, 50));" + lose)
    arrives.set()
    said = browser.run(restore, motion)
    expect(not said, f"a scene whose context was lost while it was loaded is not shown later: {said}")


def growth(bench):
    """Fault caught: memory or GL objects that stay when another model is opened."""
    browser = bench.browser
    browser.resize(WIDTH, HEIGHT)
    browser.driver.get("about:blank")
    browser.command("Page.enable")
    count = browser.command("Page.addScriptToEvaluateOnNewDocument", source="""
        window.glObjects = 0;
        for (const kind of ["Buffer", "Texture", "Program", "Shader", "Framebuffer", "Renderbuffer"]) {
            const gl = WebGLRenderingContext.prototype;
            const make = gl["create" + kind], remove = gl["delete" + kind];
            gl["create" + kind] = function (...args) { ++window.glObjects; return make.apply(this, args); };
            gl["delete" + kind] = function (it) { if (it) --window.glObjects; return remove.call(this, it); };
        }""")
    bench.show("page")
    measure = """
        const names = values[1];
        const files = await Promise.all(names.map(async (path) => ({ name: path.split("/").pop(),
            bytes: new Uint8Array(await (await fetch("/" + path)).arrayBuffer()) })));
        for (let i = 0; i < values[0]; ++i) {
            orvPage.openFiles(files);
            orvPage.drawNow();
        }
        return { memory: orvPage.countMemory(), objects: window.glObjects };"""

    def open_often(times):
        found = browser.run(measure, times, bench.files("duck"))
        browser.command("HeapProfiler.collectGarbage")
        return {**found, "heap": browser.command("Runtime.getHeapUsage")["usedSize"]}

    early = open_often(10)
    late = open_often(100)
    browser.command("Page.removeScriptToEvaluateOnNewDocument", identifier=count["identifier"])
    expect(early["objects"] > 0 and late["objects"] == early["objects"], f"GL objects: {early} {late}")
    expect(late["memory"] == early["memory"], f"memory of the program: {early} {late}")
    expect(late["heap"] < early["heap"] + 1_000_000, f"memory of the script: {early} {late}")
    return f"{late['objects']} GL objects, {late['memory'] >> 20} MiB, script {late['heap'] / 1e6:.1f} MB after 10 as after 110"


def damage(bench):
    """Fault caught: a page that stops or shows no message for a damaged scene or another file."""
    browser = bench.browser
    browser.resize(WIDTH, HEIGHT)
    bench.show("page")
    good = (bench.folder / "duck/duck.glo").read_bytes()
    chance = random.Random(1)
    bad = [good[:length] for length in (0, 1, 7, 8, 40, 200, len(good) // 2, len(good) - 1)]
    for _ in range(60):
        spoilt = bytearray(good)
        for _ in range(chance.randrange(1, 20)):
            spoilt[chance.randrange(len(spoilt))] = chance.randrange(256)
        bad.append(bytes(spoilt))
    refused = browser.run("""
        const message = document.getElementById("message");
        let refused = 0;
        for (const text of values[0]) {
            message.hidden = true;
            const bytes = Uint8Array.from(atob(text), (c) => c.charCodeAt(0));
            orvPage.openFiles([{ name: "bad.glo", bytes }]);
            if (orvPage.state.stopped)
                throw new Error("the engine has stopped");
            if (orvPage.state.scene)
                orvPage.drawNow();
            else if (message.hidden)
                throw new Error("nothing is said of a file that was refused");
            else
                ++refused;
        }
        return refused;""", [base64.b64encode(one).decode() for one in bad])
    expect(refused >= 8, f"only {refused} of {len(bad)} refused")
    says = lambda: browser.run("return [document.getElementById('message').hidden, document.getElementById('message').innerText].join(' ')")

    browser.run("orvPage.openFiles([{ name: 'a.txt', bytes: new Uint8Array(3) }])")
    expect("a.txt is not a .glo scene" in says(), says())
    browser.run("orvPage.openFiles([{ name: 'duck.glo', bytes: new Uint8Array(await (await fetch('/duck/duck.glo')).arrayBuffer()) }])")
    expect("some of its files could not be loaded" in says() and "duck" in browser.run("return document.getElementById('remarks').textContent"), says())
    for wish, words in {"model=/duck/none.glo": "none.glo cannot be fetched: 404", "model=http://127.0.0.1:1/a.glo": "its own server",
                        "model=100%25.glo": "100%.glo cannot be fetched: 404", "model=/duck/": "names no file", "model=http://": "is not an address",
                        "model=/page/viewer.css": "cannot be opened", "model=/duck/duck.glo&camera=nobody": "no camera \"nobody\""}.items():
        bench.show("page", wish)
        expect(words in says(), f"{wish}: {says()}")
    bench.show("page", "model=/duck/duck.glo")
    expect(says().startswith("true") and browser.run("return orvPage.state.scene !== null"), "a good file after bad ones: " + says())
    return f"{refused} of {len(bad)} damaged scenes refused, the others drawn; 9 messages"


def pages(bench):
    """Fault caught: an empty page for a model with an odd name; an incomplete or missing page without a message."""
    convert = bench.build / "tools/convert/orv-convert"
    folder = bench.native / "pages"
    folder.mkdir()
    odd = folder / "a#b%20 <i>&</script>\u00e4.dae".replace("/", "")
    duck = bench.models / MODELS["duck"]
    shutil.copyfile(duck, odd)
    shutil.copyfile(duck.parent / "duckCM.tga", folder / "duckCM.tga")
    run_here([convert, odd, "--page", bench.folder / "odd"])
    bench.browser.resize(WIDTH, HEIGHT)
    bench.show("duck")
    wanted = bench.browser.picture()
    bench.show("odd")
    most = compare(wanted, bench.browser.picture(), 0)[1]
    expect(most == 0, f"{odd.name}: {most} of 255 off")
    expect(bench.browser.driver.title.startswith(odd.stem), bench.browser.driver.title)

    (folder / "broken.dae").write_text("broken")
    (folder / "file").write_text("")
    (folder / "taken/index.html").mkdir(parents=True)
    alone = folder / "bin/orv-convert"
    alone.parent.mkdir()
    shutil.copy(convert, alone)
    for program, model, page, reason in ((convert, "broken.dae", "new", "broken.dae: "),
                                         (convert, odd, "file", "file: "), (convert, odd, "no/new", "no/new: "),
                                         (convert, odd, "taken", "index.html: Is a directory"),
                                         (alone, odd, "new", "the page for browsers has not been built")):
        done = subprocess.run([program, model, "--page", page], cwd=folder, capture_output=True, text=True)
        expect(done.returncode == 1 and reason in done.stderr, f"{page}: {done.returncode} {done.stderr}")
    expect(not (folder / "new").exists() and [path.name for path in (folder / "taken").iterdir()] == ["index.html"],
           f"left behind: {[str(path) for path in folder.rglob('*')]}")
    return "an odd name; five failures that leave nothing behind"


def files(bench):
    """Fault caught: files that are chosen or dropped and not opened; a scene of an address without its pictures."""
    browser = bench.browser
    browser.resize(WIDTH, HEIGHT)
    bench.show("duck")
    wanted = browser.picture()
    paths = [str(bench.folder / path) for path in bench.files("duck")]

    def matches(what):
        for _ in range(50):
            if browser.run("return orvPage.state.scene !== null"):
                break
            time.sleep(0.1)
        most = compare(wanted, browser.picture(), 0)[1]
        expect(most == 0, f"{what}: {most} of 255 off")

    bench.show("page", "model=/duck/duck.glo")
    matches("named in the address")
    bench.show("page")
    browser.driver.find_element(By.ID, "filechooser").send_keys("\n".join(paths))
    matches("chosen")
    for what, dropped in (("dropped", paths), ("dropped as a folder", [str(bench.folder / "duck")])):
        bench.show("page")
        for kind in ("dragEnter", "dragOver", "drop"):
            browser.command("Input.dispatchDragEvent", type=kind, x=100, y=100,
                            data={"items": [], "files": dropped, "dragOperationsMask": 1})
        matches(what)
    arrives = bench.server.hold(f"/{bench.scene('skin')}?held")
    browser.driver.get(f"{bench.server.address}/page/?bars=0&model=/{bench.scene('skin')}?held")
    browser.run("while (!document.getElementById('welcome').hidden) await new Promise((resolve) => setTimeout(resolve, 50));")
    browser.driver.find_element(By.ID, "filechooser").send_keys("\n".join(paths))
    matches("chosen before the scene of the address has come")
    arrives.set()
    browser.run("await orvPage.ready")
    matches("chosen, and then the scene of the address comes")
    return "named, chosen, dropped, dropped as a folder, chosen while another is loaded: the same picture"


def requests(bench):
    """Fault caught: a page that sends requests to another server, or requests missing files."""
    bench.server.answers.clear()
    bench.browser.severe()
    for page in MODELS:
        bench.show(page)
    asked = bench.browser.run("return performance.getEntriesByType('resource').map((entry) => entry.name)")
    elsewhere = [url for url in asked if not url.startswith(bench.server.address)]
    failed = [path for path, code in bench.server.answers if code >= 400]
    expect(not elsewhere and not failed, f"{elsewhere} {failed}")
    complaints = bench.browser.severe()
    expect(not complaints, str(complaints))
    return f"{len(bench.server.answers)} answers, all of the page's own server and none missing"


def sizes(bench):
    """Fault caught: a page cut off, or a picture of the wrong sharpness, on some screen; controls without a name."""
    browser = bench.browser
    for width, height, density in ((1280, 800, 1), (360, 640, 3), (640, 360, 2.5), (240, 320, 1), (2560, 1300, 1.5)):
        browser.resize(width, height, density, touch=density > 2)
        browser.open(f"{bench.server.address}/skin/?play=0")
        found = browser.run("""
            await new Promise((resolve) => requestAnimationFrame(() => requestAnimationFrame(resolve)));
            const view = document.getElementById("view");
            const cut = [...document.querySelectorAll("button, select, input[type=range], h1, output")].filter((item) => {
                const box = item.getBoundingClientRect();
                return box.width > 0 && (box.left < 0 || box.top < 0 || box.right > innerWidth || box.bottom > innerHeight);
            }).map((item) => item.id);
            return { cut, size: [view.width, view.height], shown: [view.clientWidth, view.clientHeight] };""")
        wanted = [round(side * density) for side in found["shown"]]
        expect(found["shown"][0] == width and found["shown"][1] > height / 2, f"{width} x {height}: {found['shown']} are left for the view")
        expect(not found["cut"], f"{width} x {height}: cut off: {found['cut']}")
        expect(found["size"] == wanted, f"{width} x {height} at {density}: {found['size']} pixels, not {wanted}")
    browser.resize(WIDTH, HEIGHT)
    browser.open(f"{bench.server.address}/skin/?play=0")
    browser.resize(WIDTH, HEIGHT, 2)
    moved = browser.run("orvPage.run('turn', 1, 0); await new Promise((resolve) => setTimeout(resolve, 200)); return document.getElementById('view').width")
    expect(moved == 2 * WIDTH, f"on a display of twice the density: {moved} pixels")
    browser.resize(WIDTH, HEIGHT)
    nodes = browser.command("Accessibility.getFullAXTree")["nodes"]
    names = {}
    for node in nodes:
        role = node.get("role", {}).get("value")
        if role in ("button", "slider", "combobox", "application", "heading", "status"):
            names.setdefault(role, []).append(node.get("name", {}).get("value", ""))
    nameless = {role for role, all_names in names.items() if role != "status" and "" in all_names}
    expect(not nameless and {"button", "slider", "application", "status"} <= names.keys(), str(names))
    expect("triangles" in names["application"][0], names["application"][0])
    return f"5 screens; for a screen reader: {names['application'][0]}"


CHECKS = (download, requests, files, pages, models, examples, hands, context, growth, damage, sizes)


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("build", type=pathlib.Path)
    parser.add_argument("web", type=pathlib.Path)
    parser.add_argument("models", type=pathlib.Path)
    parser.add_argument("names", nargs="*")
    arguments = parser.parse_args()
    bench = Bench(arguments.build.resolve(), arguments.web.resolve(), arguments.models)
    failed = 0
    try:
        for check in CHECKS:
            if arguments.names and check.__name__ not in arguments.names:
                continue
            start = time.monotonic()
            try:
                said = check(bench)
                print(f"ok      {check.__name__} ({time.monotonic() - start:.1f} s): {said}", flush=True)
            except Exception as error:
                failed += 1
                print(f"FAILED  {check.__name__}: {error if isinstance(error, AssertionError) else traceback.format_exc()}", flush=True)
    finally:
        bench.close()
    return 1 if failed else 0


if __name__ == "__main__":
    sys.exit(main())
