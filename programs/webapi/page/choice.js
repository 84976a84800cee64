import { h, setUsable } from './dom.js';
import { count, titleOf } from './format.js';

// The songs that are chosen by their boxes, under keys of the view's making, and the bar that tells
// how many they are and what can be done with them. An action is { label, run(songs, keys), why }: once run() is
// true nothing is chosen any more; with `why`, the text that tells why not, it cannot be used.
export class Choice {
    #songs = new Map();
    #number = h('strong');
    #why = h('p', { class: 'why', id: 'why-not' });
    #all;

    constructor(actions) {
        const button = ({ label, run, why, className = '' }) => {
            const made = h('button', { type: 'button', class: `button ${className}`, onclick: () => !why && this.#run(run) },
                label);
            if (why) {
                setUsable(made, false);
                made.setAttribute('aria-describedby', 'why-not');
                this.#why.textContent = why;
            }
            return made;
        };
        const clear = h('button', { type: 'button', class: 'button plain', onclick: () => this.clear() }, 'Clear');
        this.bar = h('section', { class: 'choice', 'aria-label': 'Chosen songs', hidden: true },
            h('div', { class: 'number' }, this.#number, clear), actions.map(button), this.#why);
        this.#all = h('input', { type: 'checkbox', 'aria-label': 'Choose all songs of this page' });
        this.#all.addEventListener('change', () => this.#chooseAll(this.#all.checked));
        this.allBox = this.#all;
    }

    async #run(run) {
        if (await run([...this.#songs.values()], [...this.#songs.keys()])) {
            this.clear();
        }
    }

    box(key, song) {
        const box = h('input', { type: 'checkbox', 'aria-label': `Choose ${titleOf(song)}` });
        box.checked = this.#songs.has(key);
        box.addEventListener('change', () => {
            box.checked ? this.#songs.set(key, song) : this.#songs.delete(key);
            this.#changed();
        });
        return box;
    }

    // Tells which boxes are on the page: a list of [key, song, box].
    show(rows) {
        this.rows = rows;
        this.#changed();
    }

    clear() {
        const had = this.bar.contains(document.activeElement);
        this.#songs.clear();
        this.#changed();
        if (had) {
            this.#all.focus();
        }
    }

    #chooseAll(chosen) {
        for (const [key, song] of this.rows) {
            chosen ? this.#songs.set(key, song) : this.#songs.delete(key);
        }
        this.#changed();
    }

    #changed() {
        for (const [key, , box] of this.rows ?? []) {
            box.checked = this.#songs.has(key);
            box.closest('tr')?.classList.toggle('chosen', box.checked);
        }
        const here = (this.rows ?? []).filter(([key]) => this.#songs.has(key)).length;
        this.#all.checked = here > 0 && here === this.rows.length;
        this.#all.indeterminate = here > 0 && here < this.rows.length;
        this.bar.hidden = this.#songs.size === 0;
        this.#number.textContent = `${count(this.#songs.size, 'song')} chosen`;
    }
}
