// Keeps the table of an open page up to date. Once a second, while the page is visible, it asks
// for the screen's table as JSON and changes only the rows whose text changed, so nothing
// flickers and the scroll position stays where it was.
'use strict';

(() => {
  const table = document.getElementById('table');
  if (!table) return;
  const source = table.dataset.source;
  const heading = document.querySelector('.bar h1');
  const period = 1000;

  function setText(element, text) {
    const wanted = text ?? '';
    if (element.textContent !== wanted) element.textContent = wanted;
  }

  function makeSpan(kind) {
    const span = document.createElement('span');
    span.className = kind;
    return span;
  }

  function makeRow(row) {
    const item = document.createElement('li');
    item.className = 'row';
    const holder = row.href ? item.appendChild(document.createElement('a')) : item;
    if (row.href) holder.href = row.href;
    holder.appendChild(makeSpan('text'));
    if (row.detail !== null) holder.appendChild(makeSpan('detail'));
    return item;
  }

  // Whether an existing row has the shape the new one needs: a link or not, a detail or not.
  function fits(item, row) {
    const link = item.querySelector(':scope > a');
    if (Boolean(link) !== Boolean(row.href)) return false;
    if (link && link.getAttribute('href') !== row.href) return false;
    return Boolean(item.querySelector('.detail')) === (row.detail !== null);
  }

  function patchRows(list, rows) {
    while (list.children.length > rows.length) list.lastElementChild.remove();
    rows.forEach((row, index) => {
      let item = list.children[index];
      if (!item || !fits(item, row)) {
        const fresh = makeRow(row);
        if (item) item.replaceWith(fresh);
        else list.appendChild(fresh);
        item = fresh;
      }
      setText(item.querySelector('.text'), row.text);
      if (row.detail !== null) setText(item.querySelector('.detail'), row.detail);
    });
  }

  function patchHeader(group, header) {
    let title = group.querySelector(':scope > h2');
    if (header === null) {
      if (title) title.remove();
      return;
    }
    if (!title) title = group.insertBefore(document.createElement('h2'), group.firstChild);
    setText(title, header);
  }

  function makeGroup() {
    const group = document.createElement('section');
    group.className = 'group';
    group.appendChild(document.createElement('ul'));
    return group;
  }

  function patch(screen) {
    if (heading) setText(heading, screen.title);
    const groups = table.children;
    while (groups.length > screen.sections.length) table.lastElementChild.remove();
    screen.sections.forEach((section, index) => {
      const group = groups[index] || table.appendChild(makeGroup());
      patchHeader(group, section.header);
      patchRows(group.querySelector(':scope > ul'), section.rows);
    });
  }

  norvoPoll(async () => {
    const response = await fetch(source, { cache: 'no-store', headers: { Accept: 'application/json' } });
    if (response.ok) patch(await response.json());
  }, period);
})();
