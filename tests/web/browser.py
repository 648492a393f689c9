"""Helpers for the checks of the page: a web server, a real browser, and comparing pictures."""
import base64
import functools
import http.server
import io
import threading

import numpy
from PIL import Image
from selenium import webdriver
from selenium.webdriver.chrome.service import Service


class Server:
    """Serves a folder on a free local port, in a thread, and records the requests."""

    def __init__(self, folder):
        answers = self.answers = []
        held = self.held = {}  # by path: what its requests wait for

        class Handler(http.server.SimpleHTTPRequestHandler):
            def do_GET(self):
                if self.path in held:
                    held[self.path].wait()
                super().do_GET()

            def log_request(self, code="-", size="-"):
                answers.append((self.path, int(code)))

            def log_error(self, *_):
                pass

        self.http = http.server.ThreadingHTTPServer(
            ("127.0.0.1", 0), functools.partial(Handler, directory=str(folder)))
        self.address = f"http://127.0.0.1:{self.http.server_port}"
        threading.Thread(target=self.http.serve_forever, daemon=True).start()

    def hold(self, path):
        """@return an event: requests for the path wait until it is set. The browser must not have the file in its cache."""
        self.held[path] = threading.Event()
        return self.held[path]

    def close(self):
        self.http.shutdown()


class Browser:
    """Chromium without a window, drawing by SwiftShader: no GPU is needed, and pictures are the same everywhere."""

    def __init__(self):
        options = webdriver.ChromeOptions()
        for argument in ("--headless=new", "--no-sandbox", "--disable-dev-shm-usage", "--use-angle=swiftshader",
                         "--enable-unsafe-swiftshader", "--hide-scrollbars", "--force-color-profile=srgb",
                         "--disable-background-networking", "--no-first-run"):
            options.add_argument(argument)
        options.binary_location = "/usr/bin/chromium"
        options.set_capability("goog:loggingPrefs", {"browser": "ALL"})
        self.driver = webdriver.Chrome(service=Service("/usr/bin/chromedriver"), options=options)
        self.driver.set_script_timeout(120)

    def close(self):
        self.driver.quit()

    def command(self, name, **parameters):
        """One of the DevTools protocol."""
        return self.driver.execute_cdp_cmd(name, parameters)

    def resize(self, width, height, density=1, touch=False):
        self.command("Emulation.setDeviceMetricsOverride", width=width, height=height, deviceScaleFactor=density,
                     mobile=touch)
        self.command("Emulation.setTouchEmulationEnabled", enabled=touch, maxTouchPoints=5)

    def run(self, script, *values):
        """A function's body, which may wait. @return what it returns."""
        wrapped = ("const done = arguments[arguments.length - 1]; const values = [...arguments].slice(0, -1);"
                   f"(async () => {{ {script} }})().then((answer) => done({{answer}}), (error) => done({{error: String(error.stack || error)}}))")
        outcome = self.driver.execute_async_script(wrapped, *values)
        if "error" in outcome:
            raise RuntimeError(outcome["error"])
        return outcome["answer"]

    def open(self, address):
        """Opens the viewer's page and waits until the scene of its address is shown."""
        self.driver.get(address)
        self.run("await orvPage.ready")

    def picture(self):
        """The canvas, drawn this moment, as an array of rows of pixels of red, green and blue."""
        data = self.run("orvPage.drawNow(); return document.getElementById('view').toDataURL()")
        return decode(base64.b64decode(data.split(",")[1]))

    def severe(self):
        """The console's errors since the last call."""
        return [entry["message"] for entry in self.driver.get_log("browser") if entry["level"] == "SEVERE"]


def decode(png):
    return numpy.asarray(Image.open(io.BytesIO(png)).convert("RGB")).astype(int)


def read_png(path):
    return decode(path.read_bytes())


def compare(one, other, tolerance):
    """@return the share of pixels of which a channel differs by more than the tolerance, and the largest difference."""
    if one.shape != other.shape:
        raise AssertionError(f"{one.shape[1]} x {one.shape[0]} pixels beside {other.shape[1]} x {other.shape[0]}")
    difference = abs(one - other).max(axis=2)
    return float((difference > tolerance).mean()), int(difference.max())
