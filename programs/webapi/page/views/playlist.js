import { ask, change } from '../api.js';
import { Choice } from '../choice.js';
import { h, icon, iconButton, isUsable, setUsable, wordButton } from '../dom.js';
import { count, titleOf } from '../format.js';
import { PageBar, pageSize } from '../pagebar.js';
import { Reorder } from '../reorder.js';
import { pageNumber } from '../route.js';
import { deletePlaylist } from './playlists.js';
import { cells, followPlayer, markCurrent, playCell, playOrPause } from './rows.js';
import { View, emptyNote, pageOf } from './view.js';

const kColumns = ['title', 'artist', 'album', 'duration'];
// Where a key, or the button of an arrow, moves an entry.
const kSteps = {
    ArrowUp: (position) => position - 1,
    ArrowDown: (position) => position + 1,
    Home: () => 0,
    End: (_, last) => last,
};
const kHeaders = [['Play', 'play-cell'], ['Title', 'title'], ['Artist', 'wide'], ['Album', 'wide'], ['Time', 'number']];

// The entries of one playlist. An edit names positions, so edits run one after the other, each on what
// the one before left; one that fails shows the playlist as it is now and drops those that wait.
export class Playlist extends View {
    static needs = 'playlist';
    title = 'Playlist';
    #query = {};
    #entries = [];
    #rows = [];
    #total = 0;
    #edits = Promise.resolve();
    #generation = 0;
    #tbody = h('tbody');

    constructor(app) {
        super(app);
        this.heading.textContent = this.title;
        this.choice = new Choice([
            { label: 'Remove from playlist', className: 'danger', run: (_, positions) => this.#remove(positions) },
            app.playAction(), app.queueAction(),
        ]);
        this.tools.append(...(app.may('streaming') ? [wordButton('play', 'Play', () => this.#play(0), 'strong')] : []),
            wordButton('delete', 'Delete playlist', () => this.#delete()));
        this.table = h('table', { class: 'songs entries' }, h('caption', { class: 'unseen' }), this.#head(), this.#tbody);
        this.hint = h('p', { class: 'hint', id: 'move-hint' },
            'Drag songs by their handle, or use the arrow buttons; on these, the keys Home and End move a song to the top or the end.');
        this.empty = h('div');
        this.pages = new PageBar('entries', (page) => app.go('playlist', { ...this.#query, page }, { focus: false }));
        this.body.append(this.hint, this.table, this.empty, this.choice.bar, this.pages.element);
        this.tools.hidden = this.table.hidden = this.hint.hidden = this.pages.element.hidden = true;
        this.reorder = new Reorder(this.#tbody, (from, to) => this.#move(this.#entries[from], () => this.#first + to, '.move-up'));
        this.unfollow = followPlayer(app.player, () => markCurrent(this.#rows, app.player));
    }

    leave() {
        super.leave();
        this.unfollow();
    }

    get #first() {
        return pageOf(this.#query).offset;
    }

    #head() {
        const unseen = (text) => h('span', { class: 'unseen' }, text);
        return h('thead', {}, h('tr', {}, h('td', { class: 'box-cell' }, this.choice.allBox),
            kHeaders.map(([label, name]) => h('th', { scope: 'col', class: name }, name === 'play-cell' ? unseen(label) : label)),
            h('th', { scope: 'col', class: 'move-cell' }, unseen('Move and remove'))));
    }

    async update(query) {
        if (query.id !== this.#query.id) {
            this.choice.clear();
        }
        this.#query = query;
        await this.#reload();
    }

    #reload() {
        const id = this.#query.id ?? '';
        return this.load((signal) => ask('playlist', { id, ...pageOf(this.#query) }, signal), (answer) => this.#show(answer));
    }

    #show({ title, entries, total }) {
        if (this.leaveMissingPage('playlist', this.#query, entries.length, total)) {
            return;
        }
        this.title = title || 'Untitled';
        this.heading.textContent = this.title;
        this.app.retitle();
        this.tools.hidden = false;
        this.#entries = entries;
        this.#total = total;
        this.#showRows();
        this.app.notices.whisper(count(total, 'song'));
    }

    #showRows() {
        const made = this.#entries.map((entry, index) => this.#row(entry, index));
        this.#rows = made.map(({ row }, index) => [this.#entries[index], row]);
        this.#tbody.replaceChildren(...made.map(({ row }) => row));
        this.choice.clear();
        this.choice.show(made.map(({ box }, index) => [this.#first + index, this.#entries[index], box]));
        markCurrent(this.#rows, this.app.player);
        this.pages.update(pageNumber(this.#query), this.#entries.length, this.#total);
        this.table.caption.textContent = `${this.title}, ${this.pages.text}`;
        this.table.hidden = this.hint.hidden = this.#total === 0;
        this.empty.replaceChildren(...(this.#total ? [] : [emptyNote('This playlist is empty',
            'Choose songs in any list by their boxes, then “Add to playlist”.')]));
    }

    #row(entry, index) {
        const position = this.#first + index;
        const title = titleOf(entry);
        const box = this.choice.box(position, entry);
        const step = (name, label, target) => {
            const button = iconButton(name, `${label} ${title}`, { class: `icon-button move-${name}`, 'aria-describedby': 'move-hint',
                onclick: () => isUsable(button) && this.#move(entry, target, `.move-${name}`),
                onkeydown: (event) => this.#moveByKey(event, entry, `.move-${name}`) });
            setUsable(button, target(position) >= 0 && target(position) < this.#total);
            return button;
        };
        const row = h('tr', {}, h('td', { class: 'box-cell' }, box),
            playCell(this.app, entry, () => playOrPause(this.app.player, entry.stream === this.app.player.current?.stream,
                () => this.#play(index))), cells(entry, kColumns),
            h('td', { class: 'move-cell' }, h('div', { class: 'moves' },
                step('up', 'Move up:', kSteps.ArrowUp), step('down', 'Move down:', kSteps.ArrowDown),
                h('span', { class: 'handle', title: 'Drag to move' }, icon('drag')),
                iconButton('close', `Remove ${title} from the playlist`, { class: 'icon-button remove',
                    onclick: () => this.#remove([position]) }))));
        return { row, box };
    }

    #moveByKey(event, entry, button) {
        if (event.key in kSteps) {
            event.preventDefault();
            this.#move(entry, kSteps[event.key], button);
        }
    }

    #queueEdit(edit) {
        const generation = this.#generation;
        this.#edits = this.#edits.then(async () => {
            if (generation !== this.#generation) {
                return;
            }
            try {
                await edit();
            } catch (error) {
                this.#generation += 1;
                await this.#reload();
                this.app.fail(error);
            }
        });
    }

    // Moves an entry of this page to the position that `target(position, last)` gives; the button of that
    // selector in its row gets the focus.
    #move(entry, target, button) {
        this.#queueEdit(async () => {
            const from = this.#first + this.#entries.indexOf(entry);
            const last = this.#total - 1;
            const to = Math.min(Math.max(0, target(from, last)), last);
            if (from < this.#first || to === from) {
                return;
            }
            await change('playlist-move', { id: this.#query.id, from, to, total: this.#total });
            await this.#showMoved(entry, from, to);
            this.#tbody.rows[to - this.#first]?.querySelector(button)?.focus();
            this.app.notices.say(`${titleOf(entry)} moved to position ${to + 1} of ${this.#total}`);
        });
    }

    async #showMoved(entry, from, to) {
        const index = to - this.#first;
        if (index >= 0 && index < this.#entries.length) {
            this.#entries.splice(from - this.#first, 1);
            this.#entries.splice(index, 0, entry);
            this.#showRows();
            return;
        }
        this.#query = { ...this.#query, page: Math.floor(to / pageSize()) + 1 };
        await this.#reload();
        this.app.go('playlist', this.#query, { replace: true, show: false });
    }

    #remove(positions) {
        this.#queueEdit(async () => {
            const removed = positions.length === 1 ? titleOf(this.#entries[positions[0] - this.#first]) : count(positions.length, 'song');
            await change('playlist-remove', { id: this.#query.id, positions: positions.join(), total: this.#total });
            await this.#reload();
            const buttons = this.#tbody.querySelectorAll('.remove');
            (buttons[Math.min(positions[0] - this.#first, buttons.length - 1)] ?? this.heading).focus();
            this.app.notices.say(`${removed} removed from “${this.title}”`);
        });
    }

    async #delete() {
        if (await deletePlaylist(this.app, this.#query.id, this.title)) {
            await this.app.go('playlists', {}, { replace: true });
            this.app.notices.say(`Playlist “${this.title}” deleted`);
        }
    }

    #play(index) {
        const { id } = this.#query;
        let next = this.#first + this.#entries.length;
        const more = async () => {
            const { entries } = await ask('playlist', { id, offset: next, limit: 50 });
            next += entries.length;
            return entries;
        };
        this.app.player.start(this.#entries, index, next < this.#total ? more : null);
    }
}
