"""The package, installed from its tarball, in Chromium: a page draws with it.

Usage: package_test.py TARBALL SCENES OUT"""
import os
import shutil
import subprocess
import sys
import tempfile
import unittest

from browser import SOFTWARE_GL, Browser, serve

tarball, scenes, out = (os.path.abspath(path) for path in sys.argv[1:4])
PAGE = """<!doctype html><meta charset="utf-8"><link rel="icon" href="data:,">
<canvas id="canvas" width="320" height="240"></canvas>
<script type="module">
import {createQex} from './node_modules/qex/index.js';
window.canvas = document.getElementById('canvas');
window.qex = await createQex(canvas, {antialias: false, preserveDrawingBuffer: true});
</script>"""
# The red ball, 0.8 across its middle at (-2, 0.8, -0.5), and how many pixels are redder than they are blue.
DRAW = """
    const model = window.model ??= await qex.loadModel('/scenes/red_ball.pod', {textures: ['plain.pvr']});
    qex.setLights([{direction: [0, 0, -1]}]);
    qex.setCamera({eye: [-2, 0.8, 3.5], target: [-2, 0.8, -0.5], fov: 1});
    if (!qex.draw({clear: [0, 0, 1]})) return 'lost';
    const gl = qex.context, pixels = new Uint8Array(320 * 240 * 4);
    gl.readPixels(0, 0, 320, 240, gl.RGBA, gl.UNSIGNED_BYTE, pixels);
    let red = 0;
    for (let i = 0; i < pixels.length; i += 4) red += pixels[i] > pixels[i + 2];
    return {red, corner: [...pixels.slice(0, 3)], bounds: model.bounds, error: gl.getError()};
"""


class Package(unittest.TestCase):
    def test_draws_after_installing(self):
        os.makedirs(out, exist_ok=True)
        folder = tempfile.mkdtemp(dir=out)
        self.addCleanup(shutil.rmtree, folder)
        subprocess.run(["npm", "install", "--silent", "--no-audit", "--no-fund", "--offline", "--prefix", folder, tarball],
                       check=True, stdout=subprocess.DEVNULL)
        with open(os.path.join(folder, "page.html"), "w", encoding="utf-8") as file:
            file.write(PAGE)
        url = serve({"site": folder, "scenes": scenes})
        with Browser(*SOFTWARE_GL) as browser:
            browser.open(f"{url}/site/page.html")
            browser.wait("window.qex")
            drawn = browser.run(DRAW)
            # A sphere of radius 1 seen from 4 away, 320 pixels for tan(0.5): a circle of radius
            # tan(asin(1 / 4)) / tan(0.5) * 160 = 75.6 pixels.
            self.assertAlmostEqual(drawn["red"], 3.14159 * 75.6 ** 2, delta=0.03 * 17960)
            self.assertEqual((drawn["corner"], drawn["error"]), ([0, 0, 255], 0))
            for axis, centre in enumerate((-2, 0.8, -0.5)):
                self.assertAlmostEqual(drawn["bounds"]["min"][axis], centre - 1, places=2)
                self.assertAlmostEqual(drawn["bounds"]["max"][axis], centre + 1, places=2)
            browser.run("window.loss = qex.context.getExtension('WEBGL_lose_context'); loss.loseContext();"
                        "await new Promise(r => setTimeout(r, 100))")
            self.assertEqual(browser.run(DRAW), "lost")
            browser.run("loss.restoreContext(); await new Promise(r => setTimeout(r, 300))")
            self.assertEqual(browser.run(DRAW), drawn)
            for source, message in (("'/scenes/none.pod'", "/scenes/none.pod: cannot be loaded (404)"),
                                    ("new ArrayBuffer(40)", "is not a scene that can be drawn")):
                said = browser.run(f"return qex.loadModel({source}).then(() => '', error => error.message)")
                self.assertIn(message, said)
            self.assertEqual(browser.run("qex.dispose(); return qex.models.size"), 0)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])
