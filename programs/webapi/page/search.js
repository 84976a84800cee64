const kDelayMs = 200;

// The search in the head of the page: what is typed is shown once the typing rests.
export class SearchBox {
    #field = document.getElementById('search');
    #category = document.getElementById('category');
    #timer = null;
    #app;

    constructor(app) {
        this.#app = app;
        document.getElementById('search-form').addEventListener('submit', (event) => {
            event.preventDefault();
            this.#search();
        });
        this.#field.addEventListener('input', () => {
            clearTimeout(this.#timer);
            this.#timer = setTimeout(() => this.#search(), kDelayMs);
        });
        this.#category.addEventListener('change', () => this.#field.value && this.#search());
    }

    // One search is one step of the history, however many letters it took.
    #search() {
        clearTimeout(this.#timer);
        this.#timer = null;
        const { name, query } = this.#app.route;
        const text = this.#field.value.trim();
        const searching = name === 'songs' && query.q !== undefined;
        if (text === '' && !searching) {
            return;
        }
        const order = searching ? { sort: query.sort, dir: query.dir } : {};
        const category = this.#category.value === 'any' ? undefined : this.#category.value;
        this.#app.go('songs', text ? { q: text, in: category, ...order } : order, { replace: searching, focus: false });
    }

    // Shows the search of a view that was come to in another way.
    show({ name, query }) {
        if (this.#timer !== null) {
            return;
        }
        const text = (name === 'songs' && query.q) || '';
        if (text !== this.#field.value.trim()) {
            this.#field.value = text;
        }
        if (text) {
            const known = [...this.#category.options].some(({ value }) => value === query.in);
            this.#category.value = known ? query.in : 'any';
        }
    }
}
