import { h, iconButton, wordButton } from '../dom.js';
import { count, titleOf } from '../format.js';
import { cells, followPlayer, markCurrent, playCell, playOrPause } from './rows.js';
import { View, emptyNote } from './view.js';

const kColumns = ['title', 'artist', 'album', 'duration'];

// What plays and what comes after it.
export class Queue extends View {
    static needs = 'streaming';
    title = 'Queue';
    #shown = [];
    #rows = [];

    constructor(app) {
        super(app);
        this.heading.textContent = this.title;
        this.tools.append(wordButton('shuffle', 'Play random songs', () => app.shuffle()));
        this.unfollow = followPlayer(app.player, () => this.#follow());
    }

    leave() {
        super.leave();
        this.unfollow();
    }

    async update() {
        this.#show();
    }

    #follow() {
        if (this.#shown !== this.app.player.queue) {
            this.#show();
        }
        this.#mark();
    }

    #mark() {
        markCurrent(this.#rows, this.app.player, (song, index) => index === this.app.player.index);
    }

    #show() {
        const { player } = this.app;
        this.#shown = player.queue;
        this.#rows = player.queue.map((song, index) => [song, this.#row(song, index)]);
        const head = ['Play', 'Title', 'Artist', 'Album', 'Time', 'Remove'].map((label, index) => h('th', { scope: 'col',
            class: ['play-cell', 'title', 'wide', 'wide', 'number', 'last-cell'][index] },
        index % 5 ? label : h('span', { class: 'unseen' }, label)));
        this.body.replaceChildren(player.queue.length
            ? h('table', { class: 'songs' }, h('caption', { class: 'unseen' }, `Queue, ${count(player.queue.length, 'song')}`),
                h('thead', {}, h('tr', {}, head)), h('tbody', {}, this.#rows.map(([, row]) => row)))
            : emptyNote('The queue is empty', 'Play a song of any list, or random ones; what follows it is shown here.'));
        this.#mark();
    }

    #row(song, index) {
        const { player } = this.app;
        return h('tr', {}, playCell(this.app, song, () => playOrPause(player, index === player.index, () => player.jump(index))),
            cells(song, kColumns), h('td', { class: 'last-cell' }, iconButton('close', `Remove ${titleOf(song)} from the queue`,
                { onclick: () => this.#remove(song, index) })));
    }

    #remove(song, index) {
        this.app.player.remove(index);
        this.app.notices.whisper(`${titleOf(song)} removed from the queue`);
        const buttons = this.body.querySelectorAll('.last-cell button');
        (buttons[Math.min(index, buttons.length - 1)] ?? this.heading).focus();
    }
}
