#!/usr/bin/env python3
"""Writes the gallery: a page a sample, the program that runs them, their files and pictures, and an index.

Usage: gallery.py WEB_BUILD NATIVE_BIN OUT    folders: of samples.js and samples.wasm; of the native samples and their
scenes/; to write to"""
import html
import json
import os
import re
import shutil
import subprocess
import sys
from concurrent.futures import ThreadPoolExecutor

HERE = os.path.dirname(os.path.abspath(__file__))
SAMPLES = os.path.join(os.path.dirname(HERE), "samples")
TOKEN = re.compile(r"""(?P<c>//[^\n]*|/\*.*?\*/)|(?P<s>"(?:\\.|[^"\\\n])*"|'(?:\\.|[^'\\\n])*')|(?P<k>^\#\w+|\b(?:
    auto|bool|break|case|char|const|constexpr|continue|do|double|else|enum|extern|false|float|for|if|int|
    int32_t|nullptr|return|sizeof|static|struct|switch|true|uint32_t|unsigned|void|while)\b)""", re.S | re.M | re.X)
PAGE = """<!doctype html>
<html lang="en">
<meta charset="utf-8">
<meta name="viewport" content="width=device-width, initial-scale=1">
<title>{title}</title>
<link rel="icon" href="data:,">
<link rel="stylesheet" href="gallery.css">
{body}
</html>
"""
SAMPLE = """<nav><span>{previous}</span><a href="index.html">All samples</a><span>{next}</span></nav>
<h1>{title}</h1>
<p class="faint">{text}</p>
<main class="sample">
<div class="stage"><canvas id="canvas" width="960" height="540" style="background-image: url(pictures/{name}.png)"></canvas>
<div id="track"><div id="bar"></div></div>
<div id="message" role="status"><noscript>The picture is what would be drawn: scripts are switched off.</noscript></div></div>
<pre tabindex="0"><code>{source}</code></pre>
</main>
<script type="application/json" id="sample">{data}</script>
<script type="module" src="sample.js"></script>"""
INDEX = """<h1>Qex: samples</h1>
<p class="faint">Small programs, one idea each, running in the page on WebGL 1.</p>
<div class="cards">
{cards}
</div>"""
CARD = """<a class="card" href="{name}.html"><img src="pictures/{name}.png" width="960" height="540" loading="lazy" alt="">
<h2>{title}</h2><p>{text}</p></a>"""


def read(path, mode="r"):
    with open(path, mode) as file:
        return file.read()


def write(path, text):
    with open(path, "w", encoding="utf-8") as file:
        file.write(text)


def highlight(source):
    out, at = [], 0
    for match in TOKEN.finditer(source):
        out += [html.escape(source[at:match.start()]), f'<span class="{match.lastgroup}">{html.escape(match[0])}</span>']
        at = match.end()
    return "".join(out) + html.escape(source[at:])


class Sample:
    def __init__(self, file):
        self.name = os.path.splitext(file)[0]
        self.source = read(os.path.join(SAMPLES, file))
        comment = re.match(r"(?:// ?.*\n)+|/\*.*?\*/", self.source, re.S if self.source.startswith("/*") else 0)[0]
        words = re.sub(r"^\s*(?://|/\*|\*/|\*)|\*/\s*$", " ", comment, flags=re.M).split()
        text = re.sub(r"^Sample \d+: ", "", " ".join(words))
        self.text = text[0].upper() + text[1:]
        self.title = re.search(r'Window_Open\(&window, "(.*?)"', self.source)[1]


def files_of(source, folder, names):
    """What a sample loads: files that its source names, those that they name, and what cuts textures out."""
    found, contents = [], [source.encode()]
    while contents:
        content = contents.pop()
        for name in names:
            stem, end = os.path.splitext(name)
            cut_out = stem.endswith("_a") and stem[:-2] + end in found
            if name not in found and (name.encode() in content or cut_out):
                found.append(name)
                contents += [read(os.path.join(folder, name), "rb")]
    return sorted(found)


def main(build, native, out):
    for folder in ("files", "pictures"):
        os.makedirs(os.path.join(out, folder), exist_ok=True)
    for path in [os.path.join(build, name) for name in ("samples.js", "samples.wasm")] + \
            [os.path.join(HERE, name) for name in ("gallery.css", "page.js", "sample.js")]:
        shutil.copy(path, out)
    scenes = os.path.join(native, "scenes")
    names = sorted(name for name in os.listdir(scenes) if name != "done")
    samples = [Sample(file) for file in sorted(os.listdir(SAMPLES)) if re.match(r"\d.*\.c(pp)?$", file)]

    def draw(sample):
        picture = os.path.join(out, "pictures", sample.name + ".png")
        subprocess.run([os.path.join(native, "sample_" + sample.name), picture], check=True, stdout=subprocess.DEVNULL)
    with ThreadPoolExecutor(os.cpu_count()) as pool:
        list(pool.map(draw, samples))

    def link(i, before, after):
        if not 0 <= i < len(samples):
            return ""
        return f'<a href="{samples[i].name}.html">{before}{html.escape(samples[i].title)}{after}</a>'
    for i, sample in enumerate(samples):
        files = files_of(sample.source, scenes, names)
        for name in files:
            shutil.copy(os.path.join(scenes, name), os.path.join(out, "files"))
        data = {"sample": sample.name, "wasm": os.path.getsize(os.path.join(build, "samples.wasm")),
                "files": [{"name": n, "size": os.path.getsize(os.path.join(scenes, n))} for n in files]}
        body = SAMPLE.format(name=sample.name, title=html.escape(sample.title), text=html.escape(sample.text),
                             previous=link(i - 1, "← ", ""), next=link(i + 1, "", " →"),
                             source=highlight(sample.source), data=json.dumps(data))
        write(os.path.join(out, sample.name + ".html"), PAGE.format(title="Qex: " + html.escape(sample.title), body=body))
    cards = "\n".join(CARD.format(name=s.name, title=html.escape(s.title), text=html.escape(s.text))
                      for s in samples)
    write(os.path.join(out, "index.html"), PAGE.format(title="Qex: samples", body=INDEX.format(cards=cards)))


if __name__ == "__main__":
    if len(sys.argv) != 4:
        sys.exit(__doc__)
    main(*sys.argv[1:])
