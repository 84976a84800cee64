import { ask } from '../api.js';
import { h, icon } from '../dom.js';
import { count, nameOf } from '../format.js';
import { PageBar } from '../pagebar.js';
import { link, pageNumber } from '../route.js';
import { tile } from '../tile.js';
import { View, emptyNote, pageOf } from './view.js';

// All artists, albums or genres; each leads to its songs.
class Names extends View {
    static needs = 'streaming';
    #query = {};

    constructor(app, kind, title) {
        super(app);
        Object.assign(this, { kind, title, name: `${kind}s` });
        this.heading.textContent = title;
        this.order = h('button', { type: 'button', class: 'button', onclick: () => this.#reverse() });
        this.tools.append(this.order);
        this.list = h('ul', { class: 'names' });
        this.empty = h('div');
        this.pages = new PageBar(this.name, (page) => app.go(this.name, { ...this.#query, page }, { focus: false }));
        this.body.append(this.list, this.empty, this.pages.element);
    }

    get #descending() {
        return this.#query.dir === 'desc';
    }

    #reverse() {
        this.app.go(this.name, { dir: this.#descending ? undefined : 'desc' }, { focus: false });
    }

    async update(query) {
        this.#query = query;
        this.order.replaceChildren(icon(this.#descending ? 'down' : 'up'), this.#descending ? 'Z to A' : 'A to Z');
        this.order.setAttribute('aria-label', `Order ${this.#descending ? 'Z to A' : 'A to Z'}, reverse it`);
        const direction = this.#descending ? 'desc' : 'asc';
        await this.load((signal) => ask('browse', { by: this.kind, direction, ...pageOf(query) }, signal),
            (answer) => this.#show(answer));
    }

    #show({ names, total }) {
        if (this.leaveMissingPage(this.name, this.#query, names.length, total)) {
            return;
        }
        this.list.replaceChildren(...names.map((name) => h('li', {},
            h('a', { class: 'name', href: link('songs', { [this.kind]: name }) },
                tile(name, this.kind), h('span', { class: name ? 'clamped' : 'clamped quiet' }, nameOf(this.kind, name))))));
        this.list.hidden = names.length === 0;
        this.pages.update(pageNumber(this.#query), names.length, total);
        this.empty.replaceChildren(...(names.length ? [] : [emptyNote(`No ${this.name} yet`,
            'Music that is put into the music folder appears here once it is scanned.')]));
        this.app.notices.whisper(`${count(total, this.kind)}, ${this.pages.text}`);
    }
}

export class Artists extends Names {
    constructor(app) { super(app, 'artist', 'Artists'); }
}

export class Albums extends Names {
    constructor(app) { super(app, 'album', 'Albums'); }
}

export class Genres extends Names {
    constructor(app) { super(app, 'genre', 'Genres'); }
}
