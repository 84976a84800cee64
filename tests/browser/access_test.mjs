import assert from 'node:assert/strict';
import { test } from 'node:test';
import { becomes, button, open, said, settled, titles, withPage, withPlaylist } from './harness.mjs';
import { contrastFaults } from './contrast.mjs';

const kControls = new Set(['button', 'link', 'textbox', 'searchbox', 'combobox', 'checkbox', 'slider', 'spinbutton', 'dialog',
    'table', 'navigation', 'region', 'DisclosureTriangle']);

async function namelessControls(page) {
    const session = await page.context().newCDPSession(page);
    const { nodes } = await session.send('Accessibility.getFullAXTree');
    const controls = nodes.filter(({ ignored, role }) => !ignored && kControls.has(role?.value));
    assert.ok(controls.length > 2);
    return controls.filter(({ name }) => !name?.value?.trim()).map(({ role }) => role.value);
}

const widthOver = (page) => page.evaluate(() => document.documentElement.scrollWidth - innerWidth);

// The states of the page that are looked at: a fragment, and what is done there.
const kStates = [
    ['#/songs', async (page) => {
        await button(page, 'Play a').click();
        await page.getByLabel('Choose 100 Proof', { exact: true }).check();
    }],
    ['#/songs?album=Iron+Road', () => {}],
    ['#/songs?q=zzzz', () => {}],
    ['#/artists', () => {}],
    ['#/playlists', async (page) => {
        await page.locator('#account summary').click();
        await button(page, 'Delete playlist Looked at').click();
    }],
    ['#/playlist?id=ID', () => {}],
    ['#/playlist?id=999999', (page) => page.getByRole('alert').getByText('not there any more').waitFor()],
    ['#/queue', () => {}],
    ['#/songs', async (page) => {
        await page.getByLabel('Choose Café', { exact: true }).check();
        await button(page, 'Add to queue').click();
        await said(page, '1 song added');
        await page.getByLabel('Choose Café', { exact: true }).check();
        await button(page, 'Add to playlist…').click();
    }],
];

for (const [name, options] of [
    ['Light', { colorScheme: 'light' }],
    ['Dark', { colorScheme: 'dark' }],
    ['OnAPhone', { viewport: { width: 320, height: 568 }, hasTouch: true }],
]) {
    test(`ReadableAndNamed${name}`, () => withPlaylist('Looked at', ['Café', '100 Proof'], async (page, id) => {
        for (const [fragment, act] of kStates) {
            await open(page, fragment.replace('ID', id));
            await page.reload();
            await settled(page);
            await act(page);
            await page.evaluate(() => Promise.allSettled(document.getAnimations().map(({ finished }) => finished)));
            assert.deepEqual(await page.evaluate(contrastFaults), [], fragment);
            assert.deepEqual(await namelessControls(page), [], fragment);
            assert.equal(await widthOver(page), 0, fragment);
        }
    }, { ...options, expected: /404/ }));
}

const kFocusOrder = ['Skip to the list', 'vorelix, all songs', 'Search songs', 'Search in', 'Songs', 'Artists', 'Albums', 'Genres',
    'Playlists', 'demo', 'Play all', 'Choose all songs of this page', 'Title', 'Artist', 'Album', 'Genre', 'Year', 'Time',
    'Choose Halfway to Noon', 'Play Halfway to Noon', 'Beyoncé', 'Golden Hours', 'Pop', 'Rows', 'Previous song',
    'Play random songs', 'Next song', 'Mute', 'Volume', 'Queue'];

test('TheTabKeyGoesThroughEverythingInOrderAndShowsWhere', () => withPage(async (page) => {
    await page.evaluate(() => document.activeElement.blur());
    const seen = [];
    for (const _ of kFocusOrder) {
        await page.keyboard.press('Tab');
        seen.push(await page.evaluate(() => {
            const { activeElement: element } = document;
            const style = getComputedStyle(element);
            const label = element.getAttribute('aria-label') ?? element.labels?.[0]?.firstChild.textContent ?? element.textContent;
            const visible = style.outlineStyle !== 'none' && parseFloat(style.outlineWidth) >= 2;
            return `${label.replace('Account', '').trim()}${visible ? '' : ' (focus not visible)'}`;
        }));
    }
    assert.deepEqual(seen.map((label) => (label === process.env.VORELIX_USER ? 'demo' : label)), kFocusOrder);
}, { fragment: '#/songs?q=halfway' }));

test('TheSkipLinkLeadsToTheList', () => withPage(async (page) => {
    await page.keyboard.press('Tab');
    await page.keyboard.press('Enter');
    await page.keyboard.press('Tab');
    assert.equal(await page.evaluate(() => document.activeElement.closest('main') !== null), true);
    assert.equal(await page.evaluate(() => location.hash), '#/songs');
}, { fragment: '#/songs' }));

test('LessMotionMeansNone', () => withPage(async (page) => {
    const moving = await page.evaluate(() => [...document.querySelectorAll('*')]
        .filter((element) => parseFloat(getComputedStyle(element).transitionDuration) > 0).length);
    assert.equal(moving, 0);
}, { reducedMotion: 'reduce' }));

// Made here: a connection that the server ends while it is asked again would fail the test.
const kRights = { usb: true, streaming: true, playlist: true, upnp: true, editsong: true };
const withoutRight = (right) => (page) => page.route(/action=rights/, (route) => route.fulfill(
    { json: { success: true, user: 'admin', mask: 31, ...kRights, [right]: false } }));

test('WithoutARightControlsTellWhy', async () => {
    const why = (right) => new RegExp(`may not .* Ask whoever looks after the device for the right “${right}”`);
    await withPage(async (page) => {
        await page.getByLabel('Choose Café', { exact: true }).check();
        const add = button(page, 'Add to playlist…');
        assert.equal(await add.getAttribute('aria-disabled'), 'true');
        const described = await add.getAttribute('aria-describedby');
        assert.match(await page.locator(`#${described}`).textContent(), why('playlist'));
        await add.click({ force: true });
        assert.equal(await page.getByRole('dialog').count(), 0);
        await page.getByRole('link', { name: 'Playlists' }).click();
        await page.getByText(why('playlist')).waitFor();
    }, { prepare: withoutRight('playlist') });
    await withPage((page) => page.getByText(why('streaming')).waitFor(), { prepare: withoutRight('streaming') });
});

const refusal = (key) => JSON.stringify({ success: false, errno: { section: 'songs', key, line: 1 } });
const kRefusals = [
    [0, '', 'The server does not answer.', true],
    [200, '{"success":false}', 'The audio service is switched off.', false],
    [200, '<html>', 'could not be read', false],
    [401, '', 'Reload the page and sign in.', false],
    [403, refusal('streaming'), 'right “streaming”', false],
    [409, refusal('busy'), 'Try again in a moment.', true],
    [500, refusal('database'), 'the server’s log tells why', true],
];

test('RefusalsAreToldInPlainWords', () => withPage(async (page) => {
    const alert = page.getByRole('alert');
    for (const [status, body, words, again] of kRefusals) {
        await page.route(/action=songs/, (route) => (status ? route.fulfill({ status, body }) : route.abort()));
        await page.getByLabel('Search songs').fill(`café${status}`);
        await alert.getByText(words).waitFor();
        await page.unroute(/action=songs/);
        if (again) {
            await button(alert, 'Try again').click();
        } else {
            await button(alert, 'Dismiss message').click();
        }
        await becomes(() => alert.textContent(), '');
        await page.getByLabel('Search songs').fill('café');
        await becomes(() => titles(page), ['Café']);
    }
}, { expected: /Failed to load resource/ }));
