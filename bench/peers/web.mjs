// Serves a folder, opens its page in headless Chromium and prints what it measured; a picture of the page lies beside.
import {createServer} from 'node:http';
import {readFile} from 'node:fs/promises';
import {join} from 'node:path';
import puppeteer from 'puppeteer-core';

const folder = process.argv[2], hash = process.argv[3] ?? '';
const types = {html: 'text/html', js: 'text/javascript', wasm: 'application/wasm'};
const server = createServer(async (request, response) => {
    const name = new URL(request.url, 'http://x').pathname.slice(1);
    if (name === 'favicon.ico') return void response.writeHead(204).end();
    try {
        const bytes = await readFile(join(folder, name));
        response.writeHead(200, {'Content-Type': types[name.split('.').pop()] ?? 'application/octet-stream'});
        response.end(bytes);
    } catch {
        response.writeHead(404).end();
    }
});
await new Promise(done => server.listen(0, '127.0.0.1', done));
const browser = await puppeteer.launch({
    executablePath: '/usr/bin/chromium',
    args: ['--no-sandbox', '--use-gl=angle', '--use-angle=swiftshader', '--enable-unsafe-swiftshader'],
    protocolTimeout: 600000,
});
try {
    const page = await browser.newPage();
    page.on('console', message => console.error(message.text()));
    page.on('pageerror', error => console.error(String(error)));
    await page.goto(`http://127.0.0.1:${server.address().port}/web.html${hash}`);
    await page.waitForFunction('window.times', {timeout: 120000});
    for (const {name, engine, three} of await page.evaluate('window.times'))
        console.log(`| ${name} | ${engine.toFixed(2)} | ${three.toFixed(2)} | ${(engine / three).toFixed(2)} |`);
    await page.screenshot({path: join(folder, 'page.png')});
} finally {
    await browser.close();
    server.close();
}
