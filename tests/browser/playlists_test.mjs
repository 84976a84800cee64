import assert from 'node:assert/strict';
import { test } from 'node:test';
import { ask, becomes, button, open, said, shows, titles, withPage, withPlaylist } from './harness.mjs';

const kFour = ['Café', 'Slow Rain', 'Hidden_Track', '夜曲'];

async function choose(page, ...names) {
    for (const name of names) {
        await page.getByLabel(`Choose ${name}`, { exact: true }).check();
    }
}

// What the page shows, and what the server has.
async function holds(page, id, wanted) {
    await becomes(() => titles(page), wanted);
    await becomes(async () => (await ask(page, 'playlist', { id })).entries.map(({ title }) => title), wanted);
}

test('MadeFilledAndDeletedByHand', () => withPage(async (page) => {
    const list = page.locator('.names');
    await page.getByRole('link', { name: 'Playlists' }).click();
    await page.getByLabel('New playlist').fill('Evening');
    await button(page, 'Create').click();
    await list.getByRole('link', { name: 'Evening' }).waitFor();

    await page.getByRole('link', { name: 'Songs', exact: true }).click();
    await choose(page, 'Slow Rain');
    await page.getByLabel('Search songs').fill('café');
    await becomes(() => titles(page), ['Café']);
    await choose(page, 'Café');
    await page.getByText('2 songs chosen').waitFor();
    const add = button(page, 'Add to playlist…');
    await add.click();
    await page.getByRole('dialog').waitFor();
    await page.keyboard.press('Escape');
    await becomes(() => add.evaluate((element) => element === document.activeElement), true);
    await add.click();
    await page.getByLabel('Playlist', { exact: true }).selectOption('Evening');
    await button(page.getByRole('dialog'), 'Add').click();
    await said(page, '2 songs added to “Evening”');
    await page.getByText('songs chosen').waitFor({ state: 'hidden' });

    await page.getByRole('link', { name: 'Playlists' }).click();
    await list.getByRole('link', { name: 'Evening' }).click();
    await becomes(() => titles(page), ['Slow Rain', 'Café']);
    await button(page, 'Delete playlist').click();
    await button(page.getByRole('dialog'), 'Cancel').click();
    assert.deepEqual(await titles(page), ['Slow Rain', 'Café']);
    await button(page, 'Delete playlist').click();
    await button(page.getByRole('dialog'), 'Delete').click();
    await said(page, '“Evening” deleted');
    await becomes(() => page.locator('h1').textContent(), 'Playlists');
    assert.equal(await list.getByRole('link', { name: 'Evening' }).count(), 0);
}));

test('ANewOneFromChosenSongs', () => withPage(async (page) => {
    await choose(page, 'Café', 'a');
    await button(page, 'Add to playlist…').click();
    await page.getByLabel('Playlist', { exact: true }).selectOption('New playlist…');
    await page.getByLabel('Title of the new playlist').fill('From a choice');
    await button(page.getByRole('dialog'), 'Add').click();
    await said(page, '2 songs added to “From a choice”');
    const { playlists } = await ask(page, 'playlists');
    const { id } = playlists.find(({ title }) => title === 'From a choice');
    await open(page, `#/playlist?id=${id}`);
    await holds(page, id, ['Café', 'a']);
    await ask(page, 'playlist-delete', { id }, 'post');
}, { fragment: '#/songs' }));

const kDrags = [
    ['mouse', 0, 2, ['Slow Rain', 'Hidden_Track', 'Café', '夜曲']],
    ['mouse', 3, 0, ['夜曲', 'Slow Rain', 'Hidden_Track', 'Café']],
    ['Escape', 0, 3, ['夜曲', 'Slow Rain', 'Hidden_Track', 'Café']],
];

test('DragReorders', () => withPlaylist('Dragged', kFour, async (page, id) => {
    for (const [how, from, to, wanted] of kDrags) {
        const rows = page.locator('table.songs tbody tr');
        const target = await rows.nth(to).boundingBox();
        await rows.nth(from).locator('.handle').hover();
        await page.mouse.down();
        await page.mouse.move(target.x + 50, target.y + target.height * (to > from ? 0.9 : 0.1), { steps: 5 });
        await page.locator('.drop-before, .drop-after').waitFor();
        if (how === 'Escape') {
            await page.keyboard.press('Escape');
            await page.locator('.drop-before, .drop-after').waitFor({ state: 'detached' });
        }
        await page.mouse.up();
        await holds(page, id, wanted);
    }
}));

const kKeys = [
    ['Move down: Café', 'Enter', ['Slow Rain', 'Café', 'Hidden_Track', '夜曲'], 'Café moved to position 2 of 4'],
    ['Move down: Café', 'Space', ['Slow Rain', 'Hidden_Track', 'Café', '夜曲'], 'Café moved to position 3 of 4'],
    ['Move up: 夜曲', 'Home', ['夜曲', 'Slow Rain', 'Hidden_Track', 'Café'], '夜曲 moved to position 1 of 4'],
    ['Move up: Slow Rain', 'End', ['夜曲', 'Hidden_Track', 'Café', 'Slow Rain'], 'Slow Rain moved to position 4 of 4'],
    ['Move up: Slow Rain', 'ArrowUp', ['夜曲', 'Hidden_Track', 'Slow Rain', 'Café'], 'Slow Rain moved to position 3 of 4'],
];

test('KeysReorderAndKeepTheFocus', () => withPlaylist('Keyed', kFour, async (page, id) => {
    for (const [name, key, wanted, words] of kKeys) {
        await button(page, name).press(key);
        await said(page, words);
        await holds(page, id, wanted);
        await becomes(() => page.evaluate(() => document.activeElement.getAttribute('aria-label')), name);
    }
    for (const key of ['ArrowUp', 'ArrowUp', 'ArrowDown']) {
        await page.keyboard.press(key);
    }
    await holds(page, id, ['夜曲', 'Slow Rain', 'Hidden_Track', 'Café']);
}));

test('AMoveToAnotherPageIsFollowed', () => withPlaylist('Long', [...kFour, ...kFour, ...kFour], async (page, id) => {
    await page.getByLabel('Rows').selectOption('10');
    await shows(page, '1–10 of 12');
    await page.locator('.move-down').first().press('End');
    await shows(page, '11–12 of 12');
    await becomes(() => titles(page), ['夜曲', 'Café']);
    assert.deepEqual((await ask(page, 'playlist', { id })).entries.at(-1).title, 'Café');
}));

test('SongsAreRemovedOneByOneAndTogether', () => withPlaylist('Shrinking', kFour, async (page, id) => {
    await button(page, 'Remove Slow Rain from the playlist').click();
    await said(page, 'Slow Rain removed');
    await holds(page, id, ['Café', 'Hidden_Track', '夜曲']);
    await choose(page, 'Café', '夜曲');
    await button(page, 'Remove from playlist').click();
    await said(page, '2 songs removed');
    await holds(page, id, ['Hidden_Track']);
    await button(page, 'Remove Hidden_Track from the playlist').click();
    await page.getByText('This playlist is empty').waitFor();
}));

test('AChangeElsewhereIsShownAndNothingIsMoved', () => withPlaylist('Shared', kFour, async (page, id) => {
    await ask(page, 'playlist-remove', { id, positions: '0', total: 4 }, 'post');
    await button(page, 'Move down: Slow Rain').click();
    await page.getByRole('alert').getByText('changed elsewhere').waitFor();
    await holds(page, id, kFour.slice(1));
}, { expected: /409/ }));
