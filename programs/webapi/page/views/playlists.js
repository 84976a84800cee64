import { ask, change } from '../api.js';
import { confirmDeletion } from '../dialogs.js';
import { h, iconButton } from '../dom.js';
import { count } from '../format.js';
import { PageBar } from '../pagebar.js';
import { link, pageNumber } from '../route.js';
import { tile } from '../tile.js';
import { View, emptyNote, pageOf } from './view.js';

export class Playlists extends View {
    static needs = 'playlist';
    title = 'Playlists';
    #query = {};

    constructor(app) {
        super(app);
        this.heading.textContent = this.title;
        this.field = h('input', { id: 'title', type: 'text', required: true, autocomplete: 'off' });
        this.form = h('form', { class: 'new-playlist' }, h('div', { class: 'field' }, h('label', { for: 'title' }, 'New playlist'), this.field),
            h('button', { type: 'submit', class: 'button strong' }, 'Create'));
        this.form.addEventListener('submit', (event) => {
            event.preventDefault();
            this.#create(this.field.value.trim());
        });
        this.list = h('ul', { class: 'names' });
        this.empty = h('div');
        this.pages = new PageBar('playlists', (page) => app.go('playlists', { page }, { focus: false }));
        this.body.append(this.form, this.list, this.empty, this.pages.element);
    }

    async update(query) {
        this.#query = query;
        await this.load((signal) => ask('playlists', pageOf(query), signal), (answer) => this.#show(answer));
    }

    #show({ playlists, total }) {
        if (this.leaveMissingPage('playlists', this.#query, playlists.length, total)) {
            return;
        }
        this.list.replaceChildren(...playlists.map((playlist) => this.#item(playlist)));
        this.list.hidden = playlists.length === 0;
        this.pages.update(pageNumber(this.#query), playlists.length, total);
        this.empty.replaceChildren(...(playlists.length ? [] : [emptyNote('No playlists yet',
            'Give one a title above, or choose songs in a list and add them to a new one.')]));
        this.app.notices.whisper(count(total, 'playlist'));
    }

    #item({ id, title }) {
        const shown = title || 'Untitled';
        return h('li', {}, h('a', { class: 'name', href: link('playlist', { id }) }, tile(shown),
            h('span', { class: 'clamped' }, shown)),
        iconButton('delete', `Delete playlist ${shown}`, { onclick: () => this.#delete(id, shown) }));
    }

    async #create(title) {
        try {
            await change('playlist-create', { title });
        } catch (error) {
            this.app.fail(error);
            return;
        }
        this.field.value = '';
        await this.update(this.#query);
        this.app.notices.say(`Playlist “${title}” created`);
        this.field.focus();
    }

    async #delete(id, title) {
        if (await deletePlaylist(this.app, id, title)) {
            await this.update(this.#query);
            this.app.notices.say(`Playlist “${title}” deleted`);
            this.heading.focus();
        }
    }
}

// True when the user said yes and the playlist is gone.
export async function deletePlaylist(app, id, title) {
    if (!await confirmDeletion(title)) {
        return false;
    }
    try {
        await change('playlist-delete', { id });
        return true;
    } catch (error) {
        app.fail(error);
        return false;
    }
}
