import assert from 'node:assert/strict';
import { test } from 'node:test';
import { becomes, button, shows, titles, withPage } from './harness.mjs';

const kFormats = [
    ['mp3', 'Halfway to Noon'], ['flac', 'Full Throttle'], ['ogg', 'Sólarljós'], ['opus', 'Łódź by Night'], ['m4a', '夜曲'],
    ['wav', 'Slow Rain'],
];

const advances = (page) => becomes(() => page.locator('#audio').evaluate(({ currentTime, paused }) => currentTime > 0.2 && !paused), true);
const nowPlaying = (page) => page.locator('#player strong').textContent();
const current = (page) => page.locator('tr[aria-current] td.title .clamped').allTextContents();

test('EveryFormatPlaysAndItsRowIsMarked', () => withPage(async (page) => {
    for (const [format, title] of kFormats) {
        await button(page, `Play ${title}`).click();
        await advances(page);
        assert.deepEqual([format, await nowPlaying(page), ...await current(page)], [format, title, title]);
    }
    const player = page.getByRole('region', { name: 'Player' });
    await button(player, 'Pause').click();
    await becomes(() => page.locator('#audio').evaluate(({ paused }) => paused), true);
    await button(page, 'Play Slow Rain').click();
    await button(player, 'Pause').waitFor();
}));

test('TheNextSongFollowsBeyondThePage', () => withPage(async (page) => {
    await page.getByLabel('Rows').selectOption('10');
    await shows(page, '1–10 of 36');
    const last = (await titles(page))[9];
    await button(page, `Play ${last}`).click();
    await advances(page);
    await page.getByLabel('Position in the song').press('End');
    await becomes(async () => await nowPlaying(page) !== last, true);
    await advances(page);
    const follower = await nowPlaying(page);
    await button(page, 'Next page').click();
    await becomes(async () => (await titles(page))[0], follower);
    await becomes(() => current(page), [follower]);
    await button(page, 'Previous song').click();
    await becomes(() => nowPlaying(page), last);
}));

test('RandomSongsMakeAQueue', () => withPage(async (page) => {
    await button(page.locator('main'), 'Play random songs').click();
    await advances(page);
    await page.getByRole('link', { name: 'Queue' }).click();
    await becomes(async () => (await titles(page)).length, 36);
    const [first, second, third] = await titles(page);
    assert.deepEqual(await current(page), [first]);
    await button(page, `Remove ${second} from the queue`).first().click();
    await becomes(async () => (await titles(page))[1], third);
    await button(page, 'Next song').click();
    await becomes(() => nowPlaying(page), third);
}));

test('ASongWhoseFileIsGoneIsToldAndSkipped', () => withPage(async (page) => {
    let gone = null;
    await page.route(/action=stream/, (route) => {
        gone ??= route.request().url();
        return route.request().url() === gone ? route.fulfill({ status: 404, body: '{"success":false}' }) : route.continue();
    });
    await button(page, 'Play Full Throttle').click();
    await page.getByRole('alert').getByText('“Full Throttle” did not play. The file of this song is gone.').waitFor();
    await advances(page);
    assert.notEqual(await nowPlaying(page), 'Full Throttle');
}, { expected: /404/, fragment: '#/songs?album=Iron+Road' }));
