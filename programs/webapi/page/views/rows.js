import { h, iconButton, setIcon } from '../dom.js';
import { nameOf, time, titleOf } from '../format.js';
import { link } from '../route.js';

function named(kind) {
    return (song) => h('a', { href: link('songs', { [kind]: song[kind] }), class: 'clamped' },
        nameOf(kind, song[kind]));
}

// The columns of every table of songs. `wide` ones go where the screen is narrow; the artist then stands
// below the title.
export const columns = [
    { key: 'track', label: 'No.', className: 'number', cell: (song) => (song.track ? String(song.track) : '') },
    { key: 'title', label: 'Title', className: 'title', cell: (song) => titleCell(song) },
    { key: 'artist', label: 'Artist', className: 'wide', cell: named('artist') },
    { key: 'album', label: 'Album', className: 'wide', cell: named('album') },
    { key: 'genre', label: 'Genre', className: 'wide genre', cell: named('genre') },
    { key: 'year', label: 'Year', className: 'number wide year', cell: (song) => (song.year ? String(song.year) : '') },
    { key: 'duration', label: 'Time', className: 'number', cell: (song) => (song.duration ? time(song.duration) : '') },
];

function titleCell(song) {
    const title = titleOf(song);
    return [h('span', { class: 'clamped', title }, title),
        h('span', { class: 'below' }, nameOf('artist', song.artist)),
        song.stream || song.id ? null : h('span', { class: 'note' }, 'Not in the library, cannot be played here')];
}

export function cells(song, keys) {
    return columns.filter(({ key }) => keys.includes(key))
        .map(({ className, cell }) => h('td', { class: className }, cell(song)));
}

export function playCell(app, song, onPlay) {
    const button = song.stream && app.may('streaming')
        ? iconButton('play', `Play ${titleOf(song)}`, { class: 'icon-button row-play', onclick: onPlay }) : null;
    return h('td', { class: 'play-cell' }, button);
}

// Marks the row of the song that plays. `rows` are [song, row], `isCurrent` tells which song it is.
export function markCurrent(rows, player, isCurrent = (song) => song.stream && song.stream === player.current?.stream) {
    rows.forEach(([song, row], index) => {
        const current = Boolean(isCurrent(song, index));
        const button = row.querySelector('.row-play');
        row.classList.toggle('current', current);
        current ? row.setAttribute('aria-current', 'true') : row.removeAttribute('aria-current');
        if (button) {
            const label = `${current && player.playing ? 'Pause' : 'Play'} ${titleOf(song)}`;
            button.setAttribute('aria-label', label);
            button.title = label;
            setIcon(button.firstElementChild, current && player.playing ? 'pause' : 'play');
        }
    });
}

// A press of a row's play button: the song that is current goes on or pauses, any other begins.
export function playOrPause(player, isCurrent, begin) {
    isCurrent ? player.toggle() : begin();
}

// Keeps the mark of the song that plays right until the view is left; gives what ends that.
export function followPlayer(player, mark) {
    player.addEventListener('change', mark);
    return () => player.removeEventListener('change', mark);
}
