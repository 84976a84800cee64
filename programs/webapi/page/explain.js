const kRights = {
    streaming: 'listen to music',
    playlist: 'use playlists',
    editsong: 'edit songs',
    upnp: 'use players in the network',
    usb: 'use the USB output',
};

export function missingRight(user, right) {
    return `The account “${user}” may not ${kRights[right] ?? right} here. ` +
        `Ask whoever looks after the device for the right “${right}”, then reload the page.`;
}

export const rightNames = {
    streaming: 'Listen', playlist: 'Playlists', editsong: 'Edit songs', upnp: 'Network players', usb: 'USB output',
};

// The first row that fits tells what happened and what to do; `*` fits all.
const kTexts = [
    [0, '*', 'The server does not answer. See that it still runs and that you are connected, then try again.'],
    ['*', 'answer', 'The server’s answer could not be read. Reload the page; if that does not help, see the server’s log.'],
    ['*', 'service', 'The audio service is switched off. Whoever looks after the device can switch it on; then reload the page.'],
    [401, '*', 'The server does not know who you are. Reload the page and sign in.'],
    [403, 'origin', 'The server took this for a request from another site. Open the page by its own address, then try again.'],
    [404, 'id', 'This playlist is not there any more. Choose another one.'],
    [404, 'song', 'The file of this song is gone. Choose another song, or have the music scanned again.'],
    [404, 'file', 'The file of this song is gone. Choose another song, or have the music scanned again.'],
    [409, 'total', 'The playlist was changed elsewhere. You now see it as it is; please make your change again.'],
    [409, 'busy', 'Another program is changing this playlist. Try again in a moment.'],
    [400, 'title', 'A playlist cannot have this title. Choose a shorter one, without slashes.'],
    [400, 'keyword', 'The search is too long. Use fewer words.'],
    [400, 'songs', 'These songs could not be added; some may be gone. Reload the page and choose them again.'],
    [413, '*', 'That is too much at once. Choose fewer songs.'],
    [404, '*', 'This is not there any more. Reload the page.'],
    [500, '*', 'The server could not do this. Try again; if it stays so, the server’s log tells why.'],
    ['*', '*', 'The server refused this. Reload the page, then try again.'],
];

const fits = (pattern, value) => pattern === '*' || pattern === value;

// In plain words, what went wrong and what to do.
export function explain(failure, user) {
    if (failure.status === 403 && failure.key in kRights) {
        return missingRight(user, failure.key);
    }
    return kTexts.find(([status, key]) => fits(status, failure.status) && fits(key, failure.key))[2];
}
