import { h, iconButton, isUsable, setIcon, setUsable } from './dom.js';
import { nameOf, time, titleOf } from './format.js';
import { link } from './route.js';
import { tile } from './tile.js';

function slider(label, max, onInput) {
    const input = h('input', { type: 'range', min: 0, max, step: 'any', 'aria-label': label });
    input.addEventListener('input', () => onInput(Number(input.value)));
    return input;
}

function setSlider(input, value, text) {
    input.value = value;
    input.style.setProperty('--part', `${(100 * value) / (Number(input.max) || 1)}%`);
    input.setAttribute('aria-valuetext', text);
}

function relabel(button, label, name) {
    button.setAttribute('aria-label', label);
    button.title = label;
    setIcon(button.firstElementChild, name);
}

// The bar at the foot of the page. `shuffle()` is called by the play button while the queue is empty.
export function playerBar(element, player, shuffle) {
    const { audio } = player;
    const now = h('div', { class: 'now' });
    const play = iconButton('play', 'Play', { class: 'icon-button main-button',
        onclick: () => (player.current ? player.toggle() : shuffle()) });
    const previous = iconButton('previous', 'Previous song',
        { onclick: () => isUsable(previous) && player.previous() });
    const next = iconButton('next', 'Next song', { onclick: () => isUsable(next) && player.next() });
    const position = slider('Position in the song', 1, (value) => { audio.currentTime = value; });
    const passed = h('span', { class: 'passed' });
    const whole = h('span', { class: 'whole' });
    const mute = iconButton('sound', 'Mute', { onclick: () => { audio.muted = !audio.muted; } });
    const volume = slider('Volume', 1, (value) => Object.assign(audio, { volume: value, muted: value === 0 }));
    const queue = h('a', { class: 'icon-button', href: link('queue'), 'aria-label': 'Queue', title: 'Queue' },
        iconButton('queue', '').firstElementChild);

    element.append(now, h('div', { class: 'buttons' }, previous, play, next),
        h('div', { class: 'position' }, passed, position, whole),
        h('div', { class: 'sound' }, mute, volume), queue, audio);

    const showSong = () => {
        const song = player.current;
        now.replaceChildren(...(song
            ? [tile(song.album || titleOf(song)), h('div', { class: 'words' }, h('strong', {}, titleOf(song)),
                h('span', {}, nameOf('artist', song.artist)))]
            : [h('span', { class: 'quiet' }, 'Nothing is playing')]));
    };
    const showTime = () => {
        const length = Number.isFinite(audio.duration) ? audio.duration : player.current?.duration ?? 0;
        position.max = length || 1;
        position.disabled = !player.current;
        setSlider(position, audio.currentTime, `${time(audio.currentTime)} of ${time(length)}`);
        passed.textContent = time(audio.currentTime);
        whole.textContent = time(length);
    };
    const showSound = () => {
        const level = audio.muted ? 0 : audio.volume;
        setSlider(volume, level, `${Math.round(100 * level)} %`);
        relabel(mute, audio.muted ? 'Unmute' : 'Mute', audio.muted ? 'silent' : 'sound');
    };
    const show = () => {
        relabel(play, player.playing ? 'Pause' : player.current ? 'Play' : 'Play random songs',
            player.playing ? 'pause' : 'play');
        setUsable(previous, player.current !== null);
        setUsable(next, player.hasNext);
        showSong();
        showTime();
    };
    player.addEventListener('change', show);
    audio.addEventListener('timeupdate', showTime);
    audio.addEventListener('volumechange', showSound);
    show();
    showSound();
}
