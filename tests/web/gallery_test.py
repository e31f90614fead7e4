"""Every page of the gallery in Chromium: draws what the native sample draws, before and after its context is lost twice.

Usage: gallery_test.py SITE NATIVE_BIN OUT [SAMPLE...]"""
import os
import subprocess
import sys
import unittest
from concurrent.futures import ThreadPoolExecutor

from browser import COMPARE, FIND_LOSS, GL_ERROR, SOFTWARE_GL, Browser, serve

site, native, out = (os.path.abspath(path) for path in sys.argv[1:4])
NAMES = sys.argv[4:] or sorted(name[:-4] for name in os.listdir(os.path.join(site, "gallery/pictures")))


def draw(name):
    picture = os.path.join(out, name + ".png")
    subprocess.run([os.path.join(native, "sample_" + name), picture, "1"], check=True, stdout=subprocess.DEVNULL)


class Gallery(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        os.makedirs(out, exist_ok=True)
        with ThreadPoolExecutor(os.cpu_count()) as pool:
            list(pool.map(draw, NAMES))
        cls.url = serve({"site": site, "native": out})

    # Neither side is antialiased, as drivers place samples differently.
    def test_pages_draw_like_native_programs_and_survive_lost_contexts(self):
        with Browser(*SOFTWARE_GL) as browser:
            for name in NAMES:
                with self.subTest(name):
                    browser.open(f"{self.url}/site/gallery/{name}.html?picture&samples=1")
                    browser.wait("document.body.dataset.frames === '1' || document.body.dataset.state === 'failed'")
                    far, count = browser.run(COMPARE, f"{self.url}/native/{name}.png")
                    print(f"\n{name}: {100 * far / count:.2f} % of the pixels differ by more than 3")
                    self.assertEqual(count, 960 * 540)
                    self.assertLess(far, 0.01 * count, "unlike the native picture")
                    self.assertEqual(browser.run(GL_ERROR), 0)
                    browser.run(FIND_LOSS)
                    for turn in (2, 3):
                        browser.run("loss.loseContext(); await new Promise(r => setTimeout(r, 100)); loss.restoreContext()")
                        browser.wait(f"document.body.dataset.frames === '{turn}'")
                        far, count = browser.run(COMPARE, None)
                        self.assertEqual(far, 0, f"not the picture from before loss {turn - 1}")
                    self.assertEqual(browser.run(GL_ERROR), 0)
                    self.assertEqual(browser.console(), [])

    def test_pages_run_and_say_what_is_wrong(self):
        with Browser(*SOFTWARE_GL) as browser:
            browser.open(f"{self.url}/site/gallery/17_walker.html")
            browser.wait("document.body.dataset.state === 'runs' && document.body.dataset.frames")
            self.assertEqual(browser.run("const c = document.getElementById('canvas');"
                                         "return c.width === Math.round(c.clientWidth * devicePixelRatio)"), True)
            browser.screenshot(os.path.join(out, "page.png"))
            self.assertEqual(browser.console(), [])
            browser.open(f"{self.url}/site/gallery/index.html")
            self.assertEqual(browser.run("return document.querySelectorAll('.card').length"),
                             len(os.listdir(os.path.join(site, "gallery/pictures"))))
            browser.screenshot(os.path.join(out, "index.png"))
            browser.open(f"{self.url}/site/gallery/16_crate.html?lost=crate.pvr")
            browser.wait("document.getElementById('message').textContent === 'crate.pvr: cannot be loaded (404)'")
        with Browser("--disable-3d-apis") as browser:
            browser.open(f"{self.url}/site/gallery/16_crate.html")
            browser.wait("document.getElementById('message').textContent.startsWith('This browser has no WebGL')")


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])
