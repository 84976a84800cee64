import { streamFailure, streamOf } from './api.js';
import { titleOf } from './format.js';

const kFailuresInARow = 3;
const kRestartSeconds = 3;

// The queue and the audio element that plays it. Says `change` when the queue or what plays of it
// changes, `song` when another song begins, and `failure` with why a song did not play.
export class Player extends EventTarget {
    audio = new Audio();
    queue = [];
    index = -1;
    #more = null;
    #failures = 0;

    constructor() {
        super();
        this.audio.id = 'audio';
        for (const name of ['play', 'pause', 'ended', 'durationchange', 'emptied']) {
            this.audio.addEventListener(name, () => this.#tell('change'));
        }
        this.audio.addEventListener('playing', () => { this.#failures = 0; });
        this.audio.addEventListener('ended', () => this.next());
        this.audio.addEventListener('error', () => this.audio.hasAttribute('src') && this.#failed());
        this.#listenToKeysOfTheDevice();
    }

    get current() {
        return this.queue[this.index] ?? null;
    }

    get playing() {
        return this.current !== null && !this.audio.paused;
    }

    // Plays `songs` from the one at `index` on. `more` gives the songs that follow them when they are
    // through, none at the end of all.
    start(songs, index = 0, more = null) {
        this.queue = songs.filter((song) => song.stream);
        this.#more = more;
        this.#failures = 0;
        this.jump(Math.max(0, this.queue.indexOf(songs[index])));
    }

    add(songs) {
        this.queue = [...this.queue, ...songs.filter((song) => song.stream)];
        this.#tell('change');
        if (this.index < 0 && this.queue.length > 0) {
            this.jump(0);
        }
    }

    remove(index) {
        this.queue = this.queue.filter((_, other) => other !== index);
        if (index < this.index) {
            this.index -= 1;
        } else if (index === this.index) {
            this.#reload();
        }
        this.#tell('change');
    }

    // After the current song was taken out: what follows it plays on, nothing else begins by itself.
    #reload() {
        if (this.playing && this.index < this.queue.length) {
            this.jump(this.index);
            return;
        }
        this.audio.pause();
        this.index = Math.min(this.index, this.queue.length - 1);
        this.current ? this.#load() : this.#unload();
    }

    jump(index) {
        this.index = index;
        if (this.current) {
            this.#load();
            this.#play();
            this.#tell('song');
        }
        this.#tell('change');
    }

    #load() {
        this.audio.src = streamOf(this.current);
    }

    #unload() {
        this.audio.removeAttribute('src');
        this.audio.load();
    }

    // What keeps a song from playing arrives as the element's `error`; a promise that is broken because
    // another song was chosen is none.
    #play() {
        this.audio.play().catch((error) => error.name === 'NotAllowedError' && this.#tell('change'));
    }

    toggle() {
        if (this.playing) {
            this.audio.pause();
        } else if (this.current) {
            this.#play();
        }
    }

    async next() {
        if (this.index + 1 >= this.queue.length && this.#more) {
            await this.#fetchMore();
        }
        if (this.index + 1 < this.queue.length) {
            this.jump(this.index + 1);
        }
    }

    async #fetchMore() {
        const more = this.#more;
        const songs = await more().catch((error) => {
            this.#tell('failure', { failure: error });
            return [];
        });
        if (this.#more === more) {
            this.#more = songs.length > 0 ? more : null;
            this.queue = [...this.queue, ...songs.filter((song) => song.stream)];
        }
    }

    previous() {
        if (this.audio.currentTime > kRestartSeconds || this.index <= 0) {
            this.audio.currentTime = 0;
        } else {
            this.jump(this.index - 1);
        }
    }

    get hasNext() {
        return this.index + 1 < this.queue.length || this.#more !== null;
    }

    async #failed() {
        const song = this.current;
        this.#failures += 1;
        const failure = await streamFailure(song);
        if (song !== this.current) {
            return;
        }
        const goesOn = this.#failures < kFailuresInARow && this.hasNext;
        this.#tell('failure', { song, failure, goesOn });
        if (goesOn) {
            this.next();
        }
    }

    #tell(name, detail = {}) {
        this.dispatchEvent(new CustomEvent(name, { detail }));
    }

    #listenToKeysOfTheDevice() {
        const session = navigator.mediaSession;
        if (!session) {
            return;
        }
        const actions = {
            play: () => this.toggle(), pause: () => this.toggle(),
            previoustrack: () => this.previous(), nexttrack: () => this.next(),
        };
        Object.entries(actions).forEach(([name, action]) => session.setActionHandler(name, action));
        this.addEventListener('song', () => {
            const { artist, album } = this.current;
            session.metadata = new MediaMetadata({ title: titleOf(this.current), artist, album });
        });
    }
}
