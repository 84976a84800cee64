// The view and its parameters stand in the fragment (`#/songs?q=bj%C3%B6rk&page=2`), so that the back
// button and bookmarks work.

export function parse(fragment) {
    const [path, query = ''] = fragment.replace(/^#\/?/, '').split(/\?(.*)/s);
    return { name: path, query: Object.fromEntries(new URLSearchParams(query)) };
}

export function link(name, query = {}) {
    const known = Object.entries(query).filter(([, value]) => value !== undefined && value !== null);
    const text = new URLSearchParams(known).toString();
    return `#/${name}${text && `?${text}`}`;
}

export function pageNumber(query) {
    return /^[1-9]\d{0,8}$/.test(query.page ?? '') ? Number(query.page) : 1;
}
