import { newest } from '../api.js';
import { h } from '../dom.js';
import { pageSize } from '../pagebar.js';
import { pageNumber } from '../route.js';

// What the views have in common: a heading, a body that is busy while it loads, and one load at a time.
export class View {
    #newest = newest();
    heading = h('h1', { tabindex: -1 });
    body = h('div', { class: 'body' });

    constructor(app) {
        this.app = app;
        this.tools = h('div', { class: 'tools' });
        this.element = h('div', { class: 'view' }, h('div', { class: 'head' }, this.heading, this.tools), this.body);
    }

    leave() {
        this.#newest.stop();
    }

    // Fetches with `work(signal)` and hands a result that is still wanted to `show`. A failure is told,
    // with a button to try again.
    async load(work, show) {
        this.body.setAttribute('aria-busy', 'true');
        try {
            const result = await this.#newest(work);
            if (result === undefined) {
                return;
            }
            this.app.notices.clear();
            show(result);
            this.body.removeAttribute('aria-busy');
        } catch (error) {
            this.body.removeAttribute('aria-busy');
            this.app.fail(error, () => this.load(work, show));
        }
    }

    // A page that is behind the last one is left for the last one.
    leaveMissingPage(name, query, shown, total) {
        if (shown > 0 || total === 0 || pageNumber(query) === 1) {
            return false;
        }
        this.app.go(name, { ...query, page: Math.ceil(total / pageSize()) }, { replace: true });
        return true;
    }
}

export function pageOf(query) {
    return { offset: (pageNumber(query) - 1) * pageSize(), limit: pageSize() };
}

export function emptyNote(title, advice) {
    return h('div', { class: 'empty' }, h('p', { class: 'empty-title' }, title), h('p', {}, advice));
}
