export function time(seconds) {
    const whole = Math.max(0, Math.round(seconds || 0));
    const two = (number) => String(number).padStart(2, '0');
    const minutes = Math.floor(whole / 60);
    return minutes < 60
        ? `${minutes}:${two(whole % 60)}`
        : `${Math.floor(minutes / 60)}:${two(minutes % 60)}:${two(whole % 60)}`;
}

export function count(number, one, many = `${one}s`) {
    return `${number.toLocaleString('en')} ${number === 1 ? one : many}`;
}

// What stands for a song whose tags are empty.
export function titleOf(song) {
    return song.title || song.path?.split('/').pop() || song.url || 'Untitled';
}

export function nameOf(kind, name) {
    return name || `Unknown ${kind}`;
}

// The same number from 0 to 359 for the same text, for the colour of its tile.
export function hueOf(text) {
    let hash = 7;
    for (const character of text) {
        hash = (hash * 31 + character.codePointAt(0)) % 9973;
    }
    return (hash * 47) % 360;
}

export function initialOf(text) {
    return [...text].find((character) => /[\p{L}\p{N}]/u.test(character))?.toLocaleUpperCase() ?? '♪';
}
