import { h } from './dom.js';
import { hueOf, initialOf } from './format.js';

// A coloured square with an initial, in the place of a cover.
export function tile(text, className = '') {
    const element = h('span', { class: `tile ${className}`, 'aria-hidden': 'true' }, initialOf(text));
    element.style.setProperty('--hue', hueOf(text));
    return element;
}
