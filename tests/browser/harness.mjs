// A browser, and pages of it on the server at VORELIX_URL, for the tests beside this file.
import assert from 'node:assert/strict';
import { createRequire } from 'node:module';
import { after } from 'node:test';

const { chromium } = createRequire(process.env.VORELIX_NODE_FOLDER)('playwright-core');
const kPatienceMs = 20_000;
export const base = process.env.VORELIX_URL;

let started;
async function start() {
    await becomes(async () => (await fetch(base).catch(() => ({ ok: false }))).ok, true);
    // The sandbox of Chromium does not start for root, who runs tests in containers.
    return chromium.launch({
        executablePath: process.env.VORELIX_CHROMIUM, chromiumSandbox: process.getuid() !== 0,
        args: ['--mute-audio', '--autoplay-policy=no-user-gesture-required'],
    });
}
after(async () => (await started)?.close());

// Runs `work(page)` on a page of its own, of which nothing may complain: no error on the console, none that
// a script did not catch, no dialog of a script. `expected` fits complaints that the test causes.
export async function withPage(work, { fragment = '', expected = /^$/, prepare = () => {}, ...options } = {}) {
    started ??= start();
    const context = await (await started).newContext({ viewport: { width: 1280, height: 800 }, ...options });
    context.setDefaultTimeout(kPatienceMs);
    const page = await context.newPage();
    const complaints = [];
    const complain = (text) => expected.test(text) || complaints.push(text);
    page.on('console', (message) => ['error', 'warning'].includes(message.type()) && complain(message.text()));
    page.on('pageerror', (error) => complain(error.stack));
    page.on('dialog', (dialog) => { complain(`dialog ${dialog.message()}`); dialog.dismiss(); });
    try {
        await prepare(page);
        await open(page, fragment);
        await work(page);
        assert.deepEqual(complaints, []);
    } finally {
        await context.close();
    }
}

export async function open(page, fragment) {
    await page.goto(`${base}${fragment}`);
    await settled(page);
}

// Waits for a view that has loaded.
export const settled = (page) => page.locator('main .view:has(h1:not(:empty)):not(:has([aria-busy]))').waitFor();

export const titles = (page) => page.locator('table.songs td.title .clamped').allTextContents();

// Waits until the page bar tells this range.
export const shows = (page, range) => page.locator('.range', { hasText: range }).waitFor();

// Waits until `read()` gives `wanted`; fails with what it gave last.
export async function becomes(read, wanted) {
    const end = Date.now() + kPatienceMs;
    for (;;) {
        const got = await read();
        try {
            assert.deepEqual(got, wanted);
            return;
        } catch (error) {
            if (Date.now() > end) {
                throw error;
            }
            await new Promise((resolve) => { setImmediate(resolve); });
        }
    }
}

export const said = (page, text) => page.locator('#status', { hasText: text }).waitFor();
export const button = (scope, name) => scope.getByRole('button', { name, exact: true });

// Asks the server as a program does, past the page.
export async function ask(page, action, parameters = {}, method = 'get') {
    const data = method === 'get' ? { params: { action, ...parameters } } : { form: { action, ...parameters } };
    data.maxRetries = 2; // The server may end an idle connection just when it is used again.
    const answer = await (await page.request[method](`${base}webapi`, data)).json();
    assert.equal(answer.success, true, JSON.stringify(answer));
    return answer;
}

// Runs `work(page, id)` with a playlist of the songs with these titles, in this order.
export const withPlaylist = (title, names, work, options) => withPage(async (page) => {
    const { songs } = await ask(page, 'songs', { limit: 500 });
    const ids = names.map((name) => songs.find((song) => song.title === name).id);
    const { id } = await ask(page, 'playlist-create', { title, songs: ids.join() }, 'post');
    try {
        await open(page, `#/playlist?id=${id}`);
        await work(page, id);
    } finally {
        // What the page still asks about the playlist would find it gone.
        await page.goto('about:blank');
        await ask(page, 'playlist-delete', { id }, 'post');
    }
}, options);
