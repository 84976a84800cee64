import { h } from './dom.js';

let made = 0;

// Shows a dialog and gives what `accept()` returns once it is accepted, or null. While `accept()`
// throws, the dialog stays and shows what it threw.
function open({ title, body, action, className = '', accept, firstFocus }) {
    return new Promise((resolve) => {
        const id = `dialog-${(made += 1)}`;
        const problem = h('p', { class: 'problem', role: 'alert' });
        const cancel = h('button', { type: 'button', class: 'button plain', onclick: () => dialog.close() }, 'Cancel');
        const form = h('form', { method: 'dialog' }, h('h2', { id }, title), ...body, problem,
            h('div', { class: 'dialog-buttons' }, cancel,
                h('button', { type: 'submit', class: `button strong ${className}` }, action)));
        const dialog = h('dialog', { 'aria-labelledby': id }, form);
        let result = null;
        form.addEventListener('submit', async (event) => {
            event.preventDefault();
            try {
                result = await accept();
                dialog.close();
            } catch (error) {
                problem.textContent = error.message;
            }
        });
        dialog.addEventListener('close', () => {
            dialog.remove();
            resolve(result);
        });
        document.body.append(dialog);
        dialog.showModal();
        (firstFocus ?? cancel).focus();
    });
}

export function confirmDeletion(title) {
    return open({
        title: 'Delete playlist?', action: 'Delete', className: 'danger', accept: async () => true,
        body: [h('p', {}, `“${title}” is deleted for everybody who uses this device. The songs themselves stay.`)],
    });
}

// Asks which of `playlists` to add to, or for the title of a new one. `add({ id, title })` does it, with
// id null for a new one.
export function choosePlaylist(playlists, add, what) {
    const select = h('select', { id: 'which' }, h('option', { value: '' }, 'New playlist…'),
        playlists.map(({ id, title }) => h('option', { value: id }, title || 'Untitled')));
    const title = h('input', { id: 'new-title', type: 'text', autocomplete: 'off' });
    const field = (label, control) => h('div', { class: 'field' }, h('label', { for: control.id }, label), control);
    const titleRow = field('Title of the new playlist', title);
    if (playlists.length > 0) {
        select.selectedIndex = 1;
    }
    const sync = () => {
        titleRow.hidden = select.value !== '';
        title.required = select.value === '';
    };
    select.addEventListener('change', sync);
    sync();
    return open({
        title: `Add ${what} to a playlist`, action: 'Add', firstFocus: playlists.length ? select : title,
        body: [field('Playlist', select), titleRow],
        accept: () => add(select.value
            ? { id: Number(select.value), title: select.selectedOptions[0].textContent }
            : { id: null, title: title.value.trim() }),
    });
}
