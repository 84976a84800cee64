import { ask } from '../api.js';
import { Choice } from '../choice.js';
import { h, icon, iconButton, wordButton } from '../dom.js';
import { count, nameOf } from '../format.js';
import { PageBar } from '../pagebar.js';
import { pageNumber } from '../route.js';
import { cells, columns, followPlayer, markCurrent, playCell, playOrPause } from './rows.js';
import { View, emptyNote, pageOf } from './view.js';

const kKinds = ['artist', 'album', 'genre'];
const kSortable = columns.map(({ key }) => key);

// All songs, those that a search finds, or those of one artist, album or genre.
export class Songs extends View {
    static needs = 'streaming';
    #rows = [];
    #songs = [];
    #total = 0;
    #query = {};
    #tbody = h('tbody');
    #headers = new Map();

    constructor(app) {
        super(app);
        this.pages = new PageBar('songs', (page) => this.#go({ page }));
        this.choice = new Choice(app.songActions());
        this.random = wordButton('shuffle', 'Play random songs', () => app.shuffle());
        this.playAll = wordButton('play', 'Play all', () => this.#play(0), 'strong');
        this.tools.append(...this.#sortTools(), this.random, this.playAll);
        this.table = h('table', { class: 'songs' }, h('caption', { class: 'unseen' }), this.#head(), this.#tbody);
        this.empty = h('div');
        this.body.append(this.table, this.empty, this.choice.bar, this.pages.element);
        this.unfollow = followPlayer(app.player, () => markCurrent(this.#rows, app.player));
    }

    leave() {
        super.leave();
        this.unfollow();
    }

    #head() {
        const headers = columns.map(({ key, label, className }) => {
            const button = h('button', { type: 'button', onclick: () => this.#sortBy(key) }, label, icon('up'));
            const header = h('th', { scope: 'col', class: className }, button);
            this.#headers.set(key, header);
            return header;
        });
        return h('thead', {}, h('tr', {}, h('td', { class: 'box-cell' }, this.choice.allBox),
            h('th', { scope: 'col', class: 'play-cell' }, h('span', { class: 'unseen' }, 'Play')), headers));
    }

    // Narrow screens do not show all headers, so the order is chosen here.
    #sortTools() {
        this.sort = h('select', { id: 'sort' }, columns.map(({ key, label }) => h('option', { value: key }, label === 'No.' ? 'Track' : label)));
        this.sort.addEventListener('change', () => this.#go({ sort: this.sort.value, dir: undefined }));
        this.direction = iconButton('up', 'Reverse the order', { onclick: () => this.#sortBy(this.#order().sort) });
        return [h('div', { class: 'narrow-sort' }, h('label', { for: 'sort' }, 'Sort by'), this.sort, this.direction)];
    }

    #order() {
        const sort = kSortable.includes(this.#query.sort) ? this.#query.sort : this.#query.album !== undefined ? 'track' : 'title';
        return { sort, direction: this.#query.dir === 'desc' ? 'desc' : 'asc' };
    }

    #sortBy(key) {
        const { sort, direction } = this.#order();
        this.#go({ sort: key, dir: sort === key && direction === 'asc' ? 'desc' : undefined });
    }

    #go(changes) {
        this.app.go('songs', { ...this.#query, page: undefined, ...changes }, { focus: false });
    }

    #parameters() {
        const { sort, direction } = this.#order();
        const kinds = Object.fromEntries(kKinds.filter((kind) => kind in this.#query).map((kind) => [kind, this.#query[kind]]));
        const what = Object.keys(kinds).length > 0 ? kinds
            : { keyword: this.#query.q || undefined, category: this.#query.q ? this.#query.in : undefined };
        return { ...what, sort, direction };
    }

    get #kind() {
        return kKinds.find((name) => name in this.#query);
    }

    get title() {
        const kind = this.#kind;
        if (kind) {
            return nameOf(kind, this.#query[kind]);
        }
        return this.#query.q ? `Songs with “${this.#query.q}”` : 'Songs';
    }

    async update(query) {
        this.#query = query;
        this.heading.textContent = this.title;
        this.#showOrder();
        await this.load((signal) => ask('songs', { ...this.#parameters(), ...pageOf(query) }, signal),
            (answer) => this.#show(answer));
    }

    #showOrder() {
        const { sort, direction } = this.#order();
        for (const [key, header] of this.#headers) {
            key === sort ? header.setAttribute('aria-sort', direction === 'asc' ? 'ascending' : 'descending')
                : header.removeAttribute('aria-sort');
        }
        this.sort.value = sort;
        this.direction.classList.toggle('turned', direction === 'desc');
        this.table.classList.toggle('with-track', this.#query.album !== undefined || sort === 'track');
    }

    #show({ songs, total }) {
        if (this.leaveMissingPage('songs', this.#query, songs.length, total)) {
            return;
        }
        this.#songs = songs;
        this.#total = total;
        const made = songs.map((song, index) => this.#row(song, index));
        this.#rows = made.map(({ song, row }) => [song, row]);
        this.#tbody.replaceChildren(...this.#rows.map(([, row]) => row));
        this.choice.show(made.map(({ song, box }) => [song.id, song, box]));
        markCurrent(this.#rows, this.app.player);
        this.pages.update(pageNumber(this.#query), songs.length, total);
        this.table.caption.textContent = `${this.title}, ${this.pages.text}`;
        this.table.hidden = songs.length === 0;
        const some = this.#kind !== undefined || Boolean(this.#query.q);
        this.random.hidden = some;
        this.playAll.hidden = !some || songs.length === 0;
        this.empty.replaceChildren(...(songs.length ? [] : [this.#nothing()]));
        this.app.notices.whisper(total ? `${count(total, 'song')}, ${this.pages.text}` : 'No songs found');
    }

    #nothing() {
        return this.#query.q
            ? emptyNote('Nothing found', 'Try fewer letters, or search in all. Case and accents do not matter.')
            : emptyNote('No songs here', 'Music that is put into the music folder appears here once it is scanned.');
    }

    #row(song, index) {
        const { player } = this.app;
        const play = () => playOrPause(player, song.stream === player.current?.stream, () => this.#play(index));
        const box = this.choice.box(song.id, song);
        const row = h('tr', { ondblclick: (event) => !event.target.closest('a, button, input') && this.#play(index) },
            h('td', { class: 'box-cell' }, box), playCell(this.app, song, play), cells(song, kSortable));
        return { song, row, box };
    }

    // Plays the page from one song on, and then the pages that follow.
    #play(index) {
        const parameters = this.#parameters();
        let next = pageOf(this.#query).offset + this.#songs.length;
        const more = async () => {
            const { songs } = await ask('songs', { ...parameters, offset: next, limit: 50 });
            next += songs.length;
            return songs;
        };
        this.app.player.start(this.#songs, index, next < this.#total ? more : null);
    }
}
