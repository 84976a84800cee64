import { h, icon, iconButton } from './dom.js';

const kToastMs = 6000;

// `said` is read out and shown for a moment; `wrong` stays until it is dismissed or a load succeeds.
export class Notices {
    #status = document.getElementById('status');
    #alert = document.getElementById('alert');
    #timer;

    say(text) {
        clearTimeout(this.#timer);
        this.#status.textContent = text;
        this.#status.classList.add('shown');
        this.#timer = setTimeout(() => this.#status.classList.remove('shown'), kToastMs);
    }

    // Read out, not shown: what the eye sees anyway.
    whisper(text) {
        clearTimeout(this.#timer);
        this.#status.classList.remove('shown');
        this.#status.textContent = text;
    }

    complain(text, retry) {
        const again = retry && h('button', { type: 'button', class: 'button', onclick: () => { this.clear(); retry(); } },
            'Try again');
        this.#alert.replaceChildren(h('div', { class: 'complaint' }, icon('warning'), h('p', {}, text), again,
            iconButton('close', 'Dismiss message', { onclick: () => this.dismiss() })));
    }

    clear() {
        this.#alert.replaceChildren();
    }

    dismiss() {
        this.clear();
        document.getElementById('main').focus();
    }
}
