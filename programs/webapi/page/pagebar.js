import { h, iconButton, isUsable, setUsable } from './dom.js';

const kSizes = [10, 25, 50, 100, 250];
const kStored = 'vorelix.rowsPerPage';

export function pageSize() {
    try {
        const stored = Number(localStorage.getItem(kStored));
        return kSizes.includes(stored) ? stored : 50;
    } catch {
        return 50;
    }
}

function storePageSize(size) {
    try {
        localStorage.setItem(kStored, size);
    } catch {
        // A browser that stores nothing shows 50 rows.
    }
}

// The range that is shown, the total, and the way to other pages. `onPage(number)` is called for a
// page that exists, and with 1 after another number of rows was chosen.
export class PageBar {
    #range = h('p', { class: 'range' });
    #field = h('input', { type: 'number', min: 1, inputmode: 'numeric', 'aria-label': 'Page' });
    #pages = h('span');
    #page = 1;
    #last = 1;
    #onPage;
    #steps;

    constructor(things, onPage) {
        this.things = things;
        this.#onPage = onPage;
        const step = (name, label, target) => iconButton(name, label,
            { onclick: (event) => isUsable(event.currentTarget) && onPage(target()) });
        this.#steps = [
            step('first', 'First page', () => 1),
            step('previous-page', 'Previous page', () => this.#page - 1),
            step('next-page', 'Next page', () => this.#page + 1),
            step('last', 'Last page', () => this.#last),
        ];
        this.#field.addEventListener('change', () => this.#jump());
        const [first, previous, next, last] = this.#steps;
        this.steps = h('div', { class: 'steps' }, first, previous,
            h('span', { class: 'page' }, 'Page ', this.#field, this.#pages), next, last);
        this.element = h('nav', { class: 'page-bar', 'aria-label': `Pages of ${things}` },
            this.#range, this.steps, this.#sizes());
    }

    #sizes() {
        const select = h('select', { id: 'rows' }, kSizes.map((size) => h('option', { value: size }, String(size))));
        select.value = pageSize();
        select.addEventListener('change', () => {
            storePageSize(select.value);
            this.#onPage(1);
        });
        return h('div', { class: 'sizes' }, h('label', { for: 'rows' }, 'Rows'), ' ', select);
    }

    #jump() {
        const wanted = Math.min(Math.max(1, Math.trunc(Number(this.#field.value)) || 1), this.#last);
        this.#field.value = wanted;
        if (wanted !== this.#page) {
            this.#onPage(wanted);
        }
    }

    update(page, shown, total) {
        this.#page = page;
        this.#last = Math.max(1, Math.ceil(total / pageSize()));
        const first = (page - 1) * pageSize();
        const number = (value) => value.toLocaleString('en');
        this.text = shown ? `${number(first + 1)}–${number(first + shown)} of ${number(total)}` : `0 of ${number(total)}`;
        this.#range.textContent = this.text;
        this.#field.max = this.#last;
        this.#field.value = page;
        this.#pages.textContent = ` of ${number(this.#last)}`;
        this.#steps.forEach((button, index) => setUsable(button, index < 2 ? page > 1 : page < this.#last));
        this.steps.hidden = this.#last === 1 && page === 1;
        this.element.hidden = total === 0;
    }
}
