import assert from 'node:assert/strict';
import { test } from 'node:test';
import { base, becomes, button, open, settled, titles, withPage } from './harness.mjs';

const kBeyonce = ['Café', 'Crème Brûlée', 'Halfway to Noon', 'She Said "Hello" & It\'s Fine'];
const range = (page) => page.locator('.range').textContent();
const heading = (page) => page.locator('h1').textContent();
const focused = (page) => page.evaluate(() => document.activeElement.tagName);
// The texts of a column, with one hyphen for those that sort as one.
const cells = (page, column) => page.locator(`table.songs tbody td:nth-child(${column})`).evaluateAll((all) => all
    .map((cell) => (cell.firstElementChild ?? cell).textContent.replace(/[‐–]/g, '-')));

test('SearchFindsAsYouTypeInOneRequest', () => withPage(async (page) => {
    const asked = [];
    page.on('request', (request) => request.url().includes('keyword=') && asked.push(request.url()));
    await page.getByLabel('Search songs').pressSequentially('beyonce');
    await becomes(() => titles(page), kBeyonce);
    assert.equal(asked.length, 1, asked.join('\n'));
    assert.equal(await heading(page), 'Songs with “beyonce”');
    assert.equal(await focused(page), 'INPUT');

    await page.getByLabel('Search in').selectOption('Titles');
    await page.getByText('Nothing found').waitFor();
    await page.getByLabel('Search songs').fill('');
    await becomes(() => range(page), '1–36 of 36');
}));

test('AnAnswerThatIsStaleIsDropped', () => withPage(async (page) => {
    let release;
    const held = new Promise((resolve) => { release = resolve; });
    await page.route(/keyword=rain/, async (route) => {
        await held;
        await route.continue().catch(() => {});
    });
    const gone = page.waitForEvent('requestfailed', (request) => request.url().includes('keyword=rain'));
    const sent = page.waitForRequest(/keyword=rain/);
    await page.getByLabel('Search songs').fill('rain');
    await sent;
    await page.getByLabel('Search songs').fill('beyonce');
    await becomes(() => titles(page), kBeyonce);
    release();
    await gone;
    await becomes(() => titles(page), kBeyonce);
}));

test('ColumnsSortBothWays', () => withPage(async (page) => {
    const columns = [['Title', 4], ['Artist', 5], ['Album', 6], ['Genre', 7], ['Year', 8], ['Time', 9]];
    for (const [name, column] of columns) {
        const header = page.getByRole('columnheader', { name, exact: true });
        const way = () => header.getAttribute('aria-sort');
        const first = name === 'Title' ? 'descending' : 'ascending';
        await header.getByRole('button').press('Enter');
        await becomes(way, first);
        await settled(page);
        const there = await cells(page, column);
        await header.getByRole('button').click();
        await becomes(way, first === 'ascending' ? 'descending' : 'ascending');
        await settled(page);
        await becomes(async () => (await cells(page, column)).reverse(), there);
        assert.notEqual(there[0], there.at(-1), name);
        assert.equal(await page.locator('th[aria-sort]').count(), 1);
    }
}));

test('PagesAndTheBackButton', () => withPage(async (page) => {
    await page.getByLabel('Rows').selectOption('10');
    await becomes(() => range(page), '1–10 of 36');
    const first = await titles(page);
    await button(page, 'Next page').click();
    await becomes(() => range(page), '11–20 of 36');
    assert.equal(new Set([...first, ...await titles(page)]).size, 20);
    await button(page, 'Last page').click();
    await becomes(() => range(page), '31–36 of 36');
    assert.equal(await button(page, 'Next page').getAttribute('aria-disabled'), 'true');
    await page.getByLabel('Page', { exact: true }).fill('3');
    await page.getByLabel('Page', { exact: true }).press('Enter');
    await becomes(() => range(page), '21–30 of 36');

    await page.reload();
    await becomes(() => range(page), '21–30 of 36');
    for (const wanted of ['31–36 of 36', '11–20 of 36', '1–10 of 36']) {
        await page.goBack();
        await becomes(() => range(page), wanted);
    }
    assert.deepEqual(await titles(page), first);
    await open(page, '#/songs?page=99');
    await becomes(() => range(page), '31–36 of 36');
}));

test('ArtistsAlbumsAndGenresLeadToTheirSongs', () => withPage(async (page) => {
    const ways = [
        ['Artists', 'Björk', ['Hidden_Track', 'HiddenXTrack', 'Sólarljós']],
        ['Albums', 'Iron Road', ['Full Throttle', 'Ünder the Wheels', '100% Proof', '100 Proof']],
        ['Genres', 'Jazz', ['Æbler og Øl', 'Łódź by Night', 'Straße nach Süden']],
        ['Albums', 'Unknown album', ['No Album, No Year', 'Untitled Recording']],
    ];
    for (const [view, name, wanted] of ways) {
        await page.getByRole('navigation', { name: 'Library' }).getByRole('link', { name: view }).click();
        await becomes(() => heading(page), view);
        await becomes(() => focused(page), 'H1');
        await page.locator('.names').getByRole('link', { name, exact: true }).click();
        await becomes(() => heading(page), name);
        await becomes(async () => (await titles(page)).sort(), [...wanted].sort());
        if (view === 'Albums' && name === 'Iron Road') {
            assert.deepEqual(await titles(page), wanted);
        }
        await becomes(() => focused(page), 'H1');
        await page.goBack();
        await becomes(() => heading(page), view);
    }
}));

test('MarkupInTagsAndTitlesStaysText', () => withPage(async (page) => {
    const markup = '<img src=x onerror=alert(1)>';
    const elements = () => page.locator('img:not(.brand img), main b, #player b, [onerror]').count();
    await page.getByLabel('Search songs').fill('<');
    await becomes(() => titles(page), [markup, 'Rock & Roll & <b>Bold</b>']);
    await button(page, `Play ${markup}`).click();
    await becomes(() => page.locator('#player strong').textContent(), markup);
    await becomes(async () => (await page.title()).includes(markup), true);
    await page.getByRole('link', { name: 'Playlists' }).click();
    await page.getByLabel('New playlist').fill(markup.replace('/', ''));
    await button(page, 'Create').click();
    await button(page, `Delete playlist ${markup}`).click();
    await page.getByRole('dialog').getByText(markup).waitFor();
    assert.equal(await elements(), 0);
    await button(page.getByRole('dialog'), 'Delete').click();
    await page.getByText('deleted').waitFor();
    assert.match((await page.request.get(base)).headers()['content-security-policy'], /default-src 'self'/);
}));
