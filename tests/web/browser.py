"""Chromium without a window, driven over the W3C WebDriver protocol, and a server for what it is to see."""
import http.server
import json
import os
import re
import subprocess
import threading
import time
import urllib.error
import urllib.request

SOFTWARE_GL = ("--use-gl=angle", "--use-angle=swiftshader", "--enable-unsafe-swiftshader")
with open(os.path.join(os.path.dirname(os.path.abspath(__file__)), "compare.js"), encoding="utf-8") as file:
    COMPARE = file.read()
FIND_LOSS = "window.loss = document.getElementById('canvas').getContext('webgl').getExtension('WEBGL_lose_context'); "
GL_ERROR = "return document.getElementById('canvas').getContext('webgl').getError()"


def serve(folders):
    """Serves folders under their prefixes: {"site": FOLDER}; what a request marks as lost?NAME is not there. The URL."""
    class Handler(http.server.SimpleHTTPRequestHandler):
        lost = ""

        def translate_path(self, path):
            prefix, _, rest = path.lstrip("/").split("?")[0].partition("/")
            return os.path.join(folders.get(prefix, "/nowhere"), rest)

        def do_GET(self):
            marked = re.search(r"[?&]lost=([\w.]+)", self.path)
            if marked:
                Handler.lost = marked[1]
            elif self.path.endswith(".html"):
                Handler.lost = ""
            if Handler.lost and self.path.endswith("/" + Handler.lost):
                return self.send_error(404)
            return super().do_GET()

        def log_message(self, *_):
            pass
    Handler.extensions_map = {**Handler.extensions_map, ".js": "text/javascript", ".mjs": "text/javascript",
                              ".wasm": "application/wasm"}
    server = http.server.ThreadingHTTPServer(("127.0.0.1", 0), Handler)
    threading.Thread(target=server.serve_forever, daemon=True).start()
    return f"http://127.0.0.1:{server.server_port}"


class Browser:
    def __init__(self, *options):
        self.driver = subprocess.Popen(["chromedriver", "--port=0"], stdout=subprocess.PIPE, text=True)
        for line in self.driver.stdout:
            port = re.search(r"started successfully on port (\d+)", line)
            if port:
                break
        self.url = f"http://127.0.0.1:{port[1]}"
        arguments = ["--headless=new", "--no-sandbox", "--disable-dev-shm-usage", "--window-size=1400,1000", *options]
        session = self.call("POST", "/session", {"capabilities": {"alwaysMatch": {
            "goog:chromeOptions": {"args": arguments}, "goog:loggingPrefs": {"browser": "ALL"},
            "timeouts": {"script": 30000}}}})
        self.url += "/session/" + session["sessionId"]

    def __enter__(self):
        return self

    def __exit__(self, *_):
        try:
            self.call("DELETE", "")
        finally:
            self.driver.terminate()
            self.driver.wait()
            self.driver.stdout.close()

    def call(self, method, path, body=None):
        request = urllib.request.Request(self.url + path, method=method, headers={"Content-Type": "application/json"},
                                         data=json.dumps(body).encode() if body is not None else None)
        try:
            with urllib.request.urlopen(request, timeout=60) as response:
                return json.load(response)["value"]
        except urllib.error.HTTPError as error:
            raise RuntimeError(json.load(error)["value"]["message"].split("\n")[0]) from None

    def open(self, url):
        self.console()
        self.call("POST", "/url", {"url": url})

    def run(self, script, *arguments):
        """The result of the body of an asynchronous function."""
        body = f"const done = arguments[arguments.length - 1]; (async (...a) => {{ {script} }})(...arguments)" \
               ".then(done, error => done({thrown: String(error)}))"
        result = self.call("POST", "/execute/async", {"script": body, "args": list(arguments)})
        if isinstance(result, dict) and "thrown" in result:
            raise RuntimeError(result["thrown"])
        return result

    def wait(self, condition, seconds=20):
        end = time.monotonic() + seconds
        while not self.run(f"return Boolean({condition})"):
            if time.monotonic() > end:
                raise TimeoutError(f"{condition}; message: " + str(self.run("return document.body.textContent.slice(0, 300)")))
            time.sleep(0.05)

    def console(self):
        """Errors on the console since the last call."""
        return [e["message"] for e in self.call("POST", "/se/log", {"type": "browser"}) if e["level"] == "SEVERE"]

    def act(self, kind, *pointers):
        """Pointers of a kind, a list of (x, y) in the page each: down at the first place, along the others, up."""
        def source(i, places):
            move = [{"type": "pointerMove", "x": int(x), "y": int(y), "duration": 40} for x, y in places]
            return {"type": "pointer", "id": f"{kind}{i}", "parameters": {"pointerType": kind},
                    "actions": [move[0], {"type": "pointerDown", "button": 0}, *move[1:], {"type": "pointerUp", "button": 0}]}
        self.call("POST", "/actions", {"actions": [source(i, places) for i, places in enumerate(pointers)]})

    def screenshot(self, path):
        import base64
        with open(path, "wb") as file:
            file.write(base64.b64decode(self.call("GET", "/screenshot")))
