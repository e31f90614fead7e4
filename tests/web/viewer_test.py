"""The viewer's page in Chromium: files dropped, mouse and fingers, the inspector, pictures as qex render draws them.

Usage: viewer_test.py SITE NATIVE_BIN OUT    with the folder of QEX_REAL_FILES, if there is one, its dragon, too"""
import base64
import gzip
import itertools
import json
import os
import re
import shlex
import shutil
import struct
import subprocess
import sys
import unittest
import zipfile

from browser import COMPARE, FIND_LOSS, GL_ERROR, SOFTWARE_GL, Browser, serve

site, native, out = (os.path.abspath(path) for path in sys.argv[1:4])
SCENES = os.path.join(native, "scenes")
REAL = os.path.join(os.environ.get("QEX_REAL_FILES", ""), "scenes")
DROP = """
    const transfer = new DataTransfer();
    for (const url of a.slice(0, -1)) transfer.items.add(new File([await (await fetch(url)).arrayBuffer()], url.split('/').pop()));
    window.dispatchEvent(new DragEvent('drop', {dataTransfer: transfer, cancelable: true}));
"""
SKY = """
    const transfer = new DataTransfer(), input = [...document.querySelectorAll('.row')].find(row => row.firstChild.textContent === 'sky').children[1];
    transfer.items.add(new File([await (await fetch(a[0])).arrayBuffer()], 'sky.tga'));
    input.files = transfer.files;
    input.onchange();
"""
MESSAGE = "return document.getElementById('message').textContent"
SAVE = """
    const saved = new Promise(done => { HTMLAnchorElement.prototype.click = function() { done(this.href); }; });
    document.getElementById('screenshot').click();
    return saved;
"""
# Presses a control of a section of the panel, found by its label.
CONTROL = """
    const input = [...document.querySelectorAll('.row')].find(row => row.firstChild.textContent === a[0]).querySelector('input, select');
    if (input.type === 'checkbox') return input.click();
    input.value = a[1];
    for (const name of ['input', 'change']) input.dispatchEvent(new Event(name));
"""


def write_cubes(path, count):
    """Nodes of one cube with normals, in rows of 32."""
    points, normals = [], []
    for axis, sign in itertools.product(range(3), (-1, 1)):
        for a, b in ((-1, -1), (1, -1), (1, 1), (-1, -1), (1, 1), (-1, 1)):
            face = (sign, a * sign, b)  # along the axis and the two that follow it
            points += [0.4 * face[(i - axis) % 3] for i in range(3)]
            normals += [sign * (i == axis) for i in range(3)]
    data = struct.pack(f"<{len(points) * 2}f", *points, *normals)
    view = [{"buffer": 0, "byteOffset": i * len(points) * 4, "byteLength": len(points) * 4} for i in (0, 1)]
    accessors = [{"bufferView": i, "componentType": 5126, "count": 36, "type": "VEC3"} for i in (0, 1)]
    accessors[0].update({"min": [-0.4] * 3, "max": [0.4] * 3})
    with open(path, "w", encoding="utf-8") as file:
        json.dump({"asset": {"version": "2.0"}, "scene": 0, "scenes": [{"nodes": list(range(count))}],
                   "nodes": [{"mesh": 0, "translation": [i % 32, i // 32, 0]} for i in range(count)],
                   "meshes": [{"primitives": [{"attributes": {"POSITION": 0, "NORMAL": 1}}]}],
                   "buffers": [{"byteLength": len(data), "uri": "data:application/octet-stream;base64," + base64.b64encode(data).decode()}],
                   "bufferViews": view, "accessors": accessors}, file)


class ViewerPage(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        os.makedirs(out, exist_ok=True)
        cls.files = os.path.join(out, "files")
        shutil.rmtree(cls.files, ignore_errors=True)
        os.makedirs(cls.files)
        cls.url = serve({"site": site, "scenes": SCENES, "files": cls.files, "real": REAL})
        cls.browser = Browser(*SOFTWARE_GL)
        cls.addClassCleanup(cls.browser.__exit__)

    def setUp(self):
        self.browser.open(f"{self.url}/site/viewer/index.html?samples=1")
        self.wait_for(1)

    def tearDown(self):
        self.assertEqual(self.browser.console(), [])

    def wait_for(self, loads):
        self.browser.wait(f"document.body.dataset.loads === '{loads}'")

    def settle(self):
        """Until no picture is asked for."""
        self.browser.run("let frames; do { frames = document.body.dataset.frames; await new Promise(r => setTimeout(r, 150)); }"
                         " while (frames !== document.body.dataset.frames)")

    def far(self, *urls):
        self.settle()
        far, count = self.browser.run(COMPARE, *(urls or [None]))
        return far / count

    def drop(self, loads, *urls):
        self.browser.run(DROP, *urls)
        self.wait_for(loads)

    def expect_as_native(self, folder, name):
        """The picture that the page saves is that of the command line which it copies."""
        self.settle()
        saved = self.browser.run(SAVE)
        self.browser.run("document.getElementById('copy').click()")
        words = shlex.split(self.browser.run(MESSAGE))
        picture = os.path.join(self.files, name)
        words[words.index("--output=picture.png")] = f"--output={picture}"
        subprocess.run([os.path.join(native, "qex"), *words[1:], "--antialias=1"], cwd=folder, check=True,
                       stdout=subprocess.DEVNULL)
        far = self.far(f"{self.url}/files/{name}", saved)
        print(f"\n{name}: {100 * far:.2f} % of the pixels differ by more than 3 from qex render")
        self.browser.screenshot(os.path.join(out, name))
        self.assertLess(far, 0.01)

    def test_first_load_is_small(self):
        sizes = []
        for folder, _, names in os.walk(os.path.join(site, "viewer")):
            for name in names:
                with open(os.path.join(folder, name), "rb") as file:
                    sizes.append(len(gzip.compress(file.read(), 9)))
        self.assertLess(sum(sizes), 250_000)

    def test_pictures_are_those_of_the_command(self):
        browser = self.browser
        self.expect_as_native(SCENES, "first.png")
        for label, value in (("shader", "gouraud"), ("background", "#203040"), ("mirror", None)):
            before = self.far()
            browser.run(CONTROL, label, value)
            self.assertGreater(self.far(), 0.01, label)
            self.expect_as_native(SCENES, f"{label}.png")
        self.assertEqual(browser.run(GL_ERROR), 0)

    def test_mouse_fingers_and_keys(self):
        browser = self.browser
        box = browser.run("const b = document.getElementById('canvas').getBoundingClientRect();"
                          "return [b.x + b.width / 2, b.y + b.height / 2]")
        x, y = box
        self.far()
        for kind, pointers in (("mouse", [[(x, y), (x + 90, y + 10)]]), ("touch", [[(x, y), (x - 60, y)]]),
                               ("touch", [[(x - 30, y), (x - 120, y)], [(x + 30, y), (x + 120, y)]])):
            browser.act(kind, *pointers)
            self.assertGreater(self.far(), 0.02, kind)
        chosen = "return [...document.querySelectorAll('.node.chosen')].map(row => row.textContent)"
        self.assertEqual(browser.run(chosen), [])
        browser.act("mouse", [(x, y)])
        self.settle()
        self.assertEqual(len(browser.run(chosen)), 1)
        self.far()
        browser.run(CONTROL, "module", "depth")
        self.assertGreater(self.far(), 0.01)
        browser.run("window.dispatchEvent(new KeyboardEvent('keydown', {key: 'Escape'}))")
        self.settle()
        self.assertEqual(browser.run(chosen), [])

    def test_a_picture_becomes_the_sky(self):
        with open(os.path.join(self.files, "sky.tga"), "wb") as file:  # six blue squares in a cross
            file.write(bytes([0, 0, 2, 0, 0, 0, 0, 0, 0, 0, 0, 0, 4, 0, 3, 0, 24, 0]) + bytes([255, 80, 0]) * 12)
        self.far()
        self.browser.run(SKY, f"{self.url}/files/sky.tga")
        self.browser.run("await new Promise(r => setTimeout(r, 300))")
        self.assertGreater(self.far(), 0.3)
        self.browser.run(CONTROL, "water")
        self.assertGreater(self.far(), 0.05)

    def test_files_are_dropped_and_broken_ones_named(self):
        browser = self.browser
        with zipfile.ZipFile(os.path.join(self.files, "walker.zip"), "w", zipfile.ZIP_DEFLATED) as archive:
            for name in ("walker.pod", "walker.pvr"):
                archive.write(os.path.join(SCENES, name), "folder/" + name)
        with open(os.path.join(SCENES, "walker.pod"), "rb") as file:
            scene = file.read()
        for name, content in (("cut.pod", scene[:5000]), ("no.zip", b"PK nothing"), ("words.txt", b"words")):
            with open(os.path.join(self.files, name), "wb") as file:
                file.write(content)
        self.drop(2, f"{self.url}/files/walker.zip")
        self.assertEqual(browser.run("return document.getElementById('name').textContent"), "walker.pod")
        self.assertEqual(browser.run(MESSAGE), "")
        # Stopped and put to a frame, it is the command's picture.
        browser.run("document.getElementById('play').click(); const bar = document.getElementById('frame');"
                    "bar.value = 12; bar.dispatchEvent(new Event('input'))")
        self.expect_as_native(SCENES, "walker.png")
        self.far()
        for name, words in (("cut.pod", "cut.pod: "), ("no.zip", "no.zip: is no zip archive"),
                            ("words.txt", "words.txt: is no POD scene, texture or emitter")):
            browser.run(DROP, f"{self.url}/files/{name}")
            browser.wait(f"document.getElementById('message').textContent.startsWith('{words}')")
        self.assertEqual(self.far(), 0, "the former scene stays")
        self.drop(3, f"{self.url}/scenes/view.pvr")  # by itself: a picture
        self.assertEqual(browser.run("return document.getElementById('name').textContent"), "view.pvr")

    @unittest.skipUnless(os.path.exists(os.path.join(REAL, "Dragon.pod")), "QEX_REAL_FILES has no dragon")
    def test_the_dragon_is_dropped(self):
        self.drop(2, *(f"{self.url}/real/{name}" for name in ("Dragon.pod", "Dragon-diffuse.jpg", "Dragon-eye.jpg")))
        self.browser.run("document.getElementById('play').click()")
        self.expect_as_native(REAL, "dragon.png")

    def test_lost_contexts_come_back(self):
        browser = self.browser
        browser.run(CONTROL, "boxes")
        self.far()
        browser.run(FIND_LOSS)
        for turn in (1, 2):
            browser.run("loss.loseContext(); await new Promise(r => setTimeout(r, 100)); loss.restoreContext();"
                        "await new Promise(r => setTimeout(r, 300))")
            self.wait_for(turn + 1)
            self.assertEqual(self.far(), 0, f"not the picture from before loss {turn}")
        self.assertEqual(browser.run(GL_ERROR), 0)

    def test_a_thousand_nodes_take_few_calls(self):
        """Lean drawing holds in the page: a node is a matrix or two and a draw."""
        write_cubes(os.path.join(self.files, "cubes.gltf"), 1000)
        subprocess.run([os.path.join(native, "qex"), "convert", "cubes.gltf", "-o", "cubes.pod"], cwd=self.files, check=True,
                       stdout=subprocess.DEVNULL)
        browser = self.browser
        for label in ("floor", "shadow"):
            browser.run(CONTROL, label)
        self.drop(2, f"{self.url}/files/cubes.pod")
        browser.run("""[...document.querySelectorAll('summary')].find(s => s.textContent === 'Statistics').click();
            for (let i = 0; i < 140; ++i) {
                document.getElementById('canvas').dispatchEvent(new WheelEvent('wheel', {deltaY: i % 2 ? 1 : -1}));
                await new Promise(requestAnimationFrame);
            }""")
        self.settle()
        browser.screenshot(os.path.join(out, "cubes.png"))
        figures = browser.run("return document.getElementById('figures').textContent")
        print("\n1,000 lit cubes: " + figures)
        self.assertLess(int(re.search(r"(\d+) GL calls", figures)[1]), 6500)

    def test_without_webgl_a_sentence_is_on_the_page(self):
        with Browser("--disable-3d-apis") as browser:
            browser.open(f"{self.url}/site/viewer/index.html")
            browser.wait("document.getElementById('message').textContent.startsWith('This browser has no WebGL')")


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])
