import { ask, askAll, change } from './api.js';
import { choosePlaylist } from './dialogs.js';
import { h, icon } from './dom.js';
import { explain, missingRight, rightNames } from './explain.js';
import { count } from './format.js';
import { Notices } from './notices.js';
import { Player } from './player.js';
import { playerBar } from './playerbar.js';
import { link, parse } from './route.js';
import { SearchBox } from './search.js';
import { Albums, Artists, Genres } from './views/names.js';
import { Playlist } from './views/playlist.js';
import { Playlists } from './views/playlists.js';
import { Queue } from './views/queue.js';
import { Songs } from './views/songs.js';

const kViews = {
    songs: Songs, artists: Artists, albums: Albums, genres: Genres, playlists: Playlists, playlist: Playlist, queue: Queue,
};
// The entry of the navigation that stands for a view that has none of its own.
const kParents = { playlist: 'playlists' };
const kRandomSongs = 50;

// What the views share: the account, the player, the notices and the way from one view to another.
class App {
    notices = new Notices();
    player = new Player();
    #main = document.getElementById('main');
    #shown = null;
    #view = null;

    async start() {
        try {
            this.account = await ask('rights');
        } catch (error) {
            this.account = { user: '' };
            this.fail(error, () => this.start());
            return;
        }
        this.#showAccount();
        this.search = new SearchBox(this);
        document.getElementById('player').hidden = !this.may('streaming');
        playerBar(document.getElementById('player'), this.player, () => this.shuffle());
        this.player.addEventListener('failure', ({ detail }) => this.#playerFailed(detail));
        this.player.addEventListener('change', () => this.retitle());
        this.player.addEventListener('song', () => this.notices.whisper(`Playing ${this.#nowPlaying()}`));
        window.addEventListener('hashchange', () => this.#show({ focus: true }));
        document.querySelector('.skip').addEventListener('click', (event) => {
            event.preventDefault();
            this.#main.focus();
        });
        await this.#show({ focus: false });
    }

    may(right) {
        return this.account[right] === true;
    }

    // Why a control that needs the right cannot be used; undefined when it can.
    whyNot(right) {
        return this.may(right) ? undefined : missingRight(this.account.user, right);
    }

    fail(error, retry = null) {
        if (error.status === undefined) {
            throw error;
        }
        this.notices.complain(explain(error, this.account.user), error.status === 0 || error.status >= 409 ? retry : null);
    }

    // Shows a view, and puts it into the history; with `replace` in the place of the one that is shown.
    go(name, query = {}, { replace = false, focus = true, show = true } = {}) {
        history[replace ? 'replaceState' : 'pushState'](null, '', link(name, query));
        return show ? this.#show({ focus }) : undefined;
    }

    get route() {
        const { name, query } = parse(location.hash);
        return { name: Object.hasOwn(kViews, name) ? name : 'songs', query };
    }

    async #show({ focus }) {
        const { name, query } = this.route;
        document.querySelectorAll('dialog').forEach((dialog) => dialog.close());
        if (name !== this.#shown) {
            this.#view?.leave();
            this.#view = this.#make(name);
            this.#shown = name;
            this.#main.replaceChildren(this.#view.element);
        }
        const view = this.#view;
        this.#markNavigation(kParents[name] ?? name);
        this.search.show(this.route);
        if (focus) {
            window.scrollTo(0, 0);
        }
        await view.update?.(query);
        this.retitle();
        if (view === this.#view && focus) {
            view.heading.focus({ preventScroll: true });
        }
    }

    #make(name) {
        const right = kViews[name].needs;
        return this.may(right) ? new kViews[name](this) : this.#locked(right);
    }

    #locked(right) {
        const heading = h('h1', { tabindex: -1 }, 'Not allowed');
        return { heading, title: 'Not allowed', leave() {}, element: h('div', { class: 'view locked' }, icon('lock'), heading,
            h('p', {}, this.whyNot(right))) };
    }

    #markNavigation(name) {
        for (const entry of document.querySelectorAll('#navigation a')) {
            entry.getAttribute('href') === `#/${name}` ? entry.setAttribute('aria-current', 'page')
                : entry.removeAttribute('aria-current');
        }
    }

    retitle() {
        const playing = this.player.playing ? `▶ ${this.#nowPlaying()} – ` : '';
        document.title = `${playing}${this.#view?.title ?? 'Music'} – vorelix`;
    }

    #nowPlaying() {
        const { title, artist } = this.player.current;
        return [title || 'Untitled', artist].filter(Boolean).join(', ');
    }

    #showAccount() {
        document.getElementById('user').textContent = this.account.user;
        document.getElementById('rights').replaceChildren(...Object.entries(rightNames).map(([right, name]) =>
            h('li', { class: this.may(right) ? '' : 'quiet' }, `${name}: ${this.may(right) ? 'yes' : 'no'}`)));
        document.getElementById('account').hidden = false;
    }

    #playerFailed({ song, failure, goesOn }) {
        const what = song ? `“${song.title || 'Untitled'}” did not play. ` : 'The next songs could not be fetched. ';
        const why = failure ? explain(failure, this.account.user)
            : 'This browser cannot play its format; try another browser.';
        this.notices.complain(`${what}${why}${goesOn ? ' The next song follows.' : ''}`);
    }

    async shuffle() {
        const fetchSongs = async () => (await ask('random', { limit: kRandomSongs })).songs;
        try {
            const songs = await fetchSongs();
            songs.length ? this.player.start(songs, 0, fetchSongs) : this.notices.say('There are no songs yet.');
        } catch (error) {
            this.fail(error, () => this.shuffle());
        }
    }

    playAction() {
        return { label: 'Play', className: 'strong', run: (songs) => { this.player.start(songs); return true; },
            why: this.whyNot('streaming') };
    }

    queueAction() {
        const run = (songs) => {
            this.player.add(songs);
            this.notices.say(`${count(songs.length, 'song')} added to the queue`);
            return true;
        };
        return { label: 'Add to queue', run, why: this.whyNot('streaming') };
    }

    songActions() {
        return [this.playAction(), this.queueAction(),
            { label: 'Add to playlist…', run: (songs) => this.#addToPlaylist(songs), why: this.whyNot('playlist') }];
    }

    async #addToPlaylist(songs) {
        const what = count(songs.length, 'song');
        const ids = songs.map(({ id }) => id).join();
        const add = async (playlist) => {
            try {
                await (playlist.id === null ? change('playlist-create', { title: playlist.title, songs: ids })
                    : change('playlist-append', { id: playlist.id, songs: ids }));
                return playlist;
            } catch (error) {
                throw new Error(explain(error, this.account.user), { cause: error });
            }
        };
        try {
            const chosen = await choosePlaylist(await askAll('playlists', 'playlists'), add, what);
            if (chosen) {
                this.notices.say(`${what} added to “${chosen.title}”`);
            }
            return chosen !== null;
        } catch (error) {
            this.fail(error);
            return false;
        }
    }
}

new App().start();
