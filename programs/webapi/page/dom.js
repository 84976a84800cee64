const kSvg = 'http://www.w3.org/2000/svg';

// Makes an element. Children are elements or texts; a text stays a text, so nothing that comes from
// a tag of a music file is ever read as HTML. A property `onclick` and the like is a listener.
export function h(tag, properties = {}, ...children) {
    const element = document.createElement(tag);
    for (const [name, value] of Object.entries(properties)) {
        if (name.startsWith('on')) {
            element.addEventListener(name.slice(2), value);
        } else if (value !== false && value !== null && value !== undefined) {
            element.setAttribute(name, value === true ? '' : value);
        }
    }
    element.append(...children.flat().filter((child) => child !== null && child !== undefined));
    return element;
}

export function icon(name) {
    const svg = document.createElementNS(kSvg, 'svg');
    svg.setAttribute('class', 'icon');
    svg.setAttribute('aria-hidden', 'true');
    svg.append(document.createElementNS(kSvg, 'use'));
    setIcon(svg, name);
    return svg;
}

export function setIcon(svg, name) {
    svg.firstElementChild.setAttribute('href', `icons.svg#${name}`);
}

// A button that shows an icon alone; `label` is its accessible name and its tooltip.
export function iconButton(name, label, properties = {}) {
    return h('button', { type: 'button', class: 'icon-button', 'aria-label': label, title: label, ...properties },
        icon(name));
}

// A button with an icon and words.
export function wordButton(name, words, onclick, className = '') {
    return h('button', { type: 'button', class: `button ${className}`, onclick }, icon(name), words);
}

// A button that cannot be used now stays where the keyboard finds it.
export function setUsable(button, usable) {
    button.setAttribute('aria-disabled', String(!usable));
}

export function isUsable(button) {
    return button.getAttribute('aria-disabled') !== 'true';
}
