const kEndpoint = new URL('webapi', document.baseURI);

// Why an action failed: `status` is 0 when no answer came, `key` as docs/web-api.md lists it.
export class Failure extends Error {
    constructor(action, status, key) {
        super(`${action}: ${status} ${key}`);
        Object.assign(this, { action, status, key });
    }
}

async function send(action, url, init) {
    let response;
    try {
        response = await fetch(url, { credentials: 'same-origin', ...init });
    } catch (error) {
        if (error.name === 'AbortError') {
            throw error;
        }
        throw new Failure(action, 0, 'network');
    }
    let answer;
    try {
        answer = JSON.parse(await response.text());
    } catch {
        throw new Failure(action, response.status, response.status === 401 ? 'user' : 'answer');
    }
    if (answer?.success !== true) {
        throw new Failure(action, response.status, answer?.errno?.key ?? 'service');
    }
    return answer;
}

function query(action, parameters) {
    const known = Object.entries(parameters).filter(([, value]) => value !== undefined && value !== null);
    return new URLSearchParams([['action', action], ...known]);
}

function urlOf(action, parameters) {
    return new URL(`?${query(action, parameters)}`, kEndpoint);
}

export function ask(action, parameters = {}, signal = undefined) {
    return send(action, urlOf(action, parameters), { signal });
}

export function change(action, parameters) {
    return send(action, urlOf(action, {}), { method: 'POST', body: query(action, parameters) });
}

export function streamOf(song) {
    return urlOf('stream', { song: song.stream }).href;
}

// Why a song did not play: null when the server gives the file and the browser cannot decode it.
export async function streamFailure(song) {
    try {
        const response = await fetch(streamOf(song), { method: 'HEAD', credentials: 'same-origin' });
        return response.ok ? null : new Failure('stream', response.status, response.status === 403 ? 'streaming' : 'song');
    } catch {
        return new Failure('stream', 0, 'network');
    }
}

// All pages of a list, for choices that have to be complete.
export async function askAll(action, member, parameters = {}) {
    const limit = 500;
    const all = [];
    for (;;) {
        const answer = await ask(action, { ...parameters, offset: all.length, limit });
        all.push(...answer[member]);
        if (answer[member].length < limit) {
            return all;
        }
    }
}

// Runs requests of which only the newest counts: an older one is aborted, and gives undefined.
export function newest() {
    let controller;
    const run = async (work) => {
        controller?.abort();
        const mine = new AbortController();
        controller = mine;
        try {
            const result = await work(mine.signal);
            return mine.signal.aborted ? undefined : result;
        } catch (error) {
            if (mine.signal.aborted) {
                return undefined;
            }
            throw error;
        }
    };
    run.stop = () => controller?.abort();
    return run;
}
