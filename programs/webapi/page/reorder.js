const kEdge = 72;
const kScrollStep = 12;

// Lets the rows of a table's body be dragged by their `.handle`, with a mouse, a pen or a finger.
// `onMove(from, to)` is called with row numbers when a row was dropped elsewhere; `to` counts without
// the row itself. Escape ends a drag without a change.
export class Reorder {
    #tbody;
    #onMove;
    #drag = null;

    constructor(tbody, onMove) {
        this.#tbody = tbody;
        this.#onMove = onMove;
        tbody.addEventListener('pointerdown', (event) => this.#begin(event));
        tbody.addEventListener('pointermove', (event) => this.#follow(event));
        tbody.addEventListener('pointerup', () => this.#end(true));
        tbody.addEventListener('pointercancel', () => this.#end(false));
    }

    #onKey = (event) => event.key === 'Escape' && this.#end(false);

    #begin(event) {
        const handle = event.button === 0 && event.target.closest('.handle');
        if (!handle) {
            return;
        }
        event.preventDefault();
        handle.setPointerCapture(event.pointerId);
        const row = handle.closest('tr');
        const from = [...this.#tbody.rows].indexOf(row);
        this.#drag = { row, from, to: from, y: event.clientY };
        row.classList.add('dragged');
        document.addEventListener('keydown', this.#onKey);
        this.#scroll();
    }

    #follow(event) {
        if (this.#drag) {
            this.#drag.y = event.clientY;
            this.#aim();
        }
    }

    // The row lands before the first of the others whose middle is below the pointer.
    #aim() {
        const others = [...this.#tbody.rows].filter((row) => row !== this.#drag.row);
        const after = others.findIndex((row) => {
            const { top, height } = row.getBoundingClientRect();
            return this.#drag.y < top + height / 2;
        });
        this.#drag.to = after < 0 ? others.length : after;
        this.#unmark();
        if (this.#drag.to !== this.#drag.from) {
            after < 0 ? others.at(-1)?.classList.add('drop-after') : others[after].classList.add('drop-before');
        }
    }

    // A list that is longer than the screen moves on while the pointer is held at an edge.
    #scroll() {
        if (!this.#drag?.row.isConnected) {
            this.#end(false);
            return;
        }
        const { y } = this.#drag;
        const direction = y < kEdge ? -1 : y > window.innerHeight - kEdge ? 1 : 0;
        if (direction) {
            window.scrollBy(0, direction * kScrollStep);
            this.#aim();
        }
        requestAnimationFrame(() => this.#scroll());
    }

    #unmark() {
        this.#tbody.querySelectorAll('.drop-before, .drop-after')
            .forEach((row) => row.classList.remove('drop-before', 'drop-after'));
    }

    #end(dropped) {
        const drag = this.#drag;
        this.#drag = null;
        document.removeEventListener('keydown', this.#onKey);
        if (!drag) {
            return;
        }
        this.#unmark();
        drag.row.classList.remove('dragged');
        if (dropped && drag.to !== drag.from) {
            this.#onMove(drag.from, drag.to);
        }
    }
}
