// The timeline: events newest first, filtered by kind and severity, refreshed once a second
// with only what is new. Clicking an event shows the decoded metric behind it.
'use strict';

(() => {
  const list = document.getElementById('events');
  const filters = document.getElementById('filters');
  const metric = document.getElementById('metric');
  if (!list || !filters) return;
  const period = 1000;
  const shown = 500;
  let epoch = null;
  let lastId = 0;

  const timeFormat = new Intl.DateTimeFormat(undefined, {
    year: 'numeric', month: '2-digit', day: '2-digit',
    hour: '2-digit', minute: '2-digit', second: '2-digit', fractionalSecondDigits: 3,
  });

  function query() {
    const parameters = new URLSearchParams();
    for (const name of ['kind', 'severity']) {
      const value = filters.elements[name].value;
      if (value) parameters.set(name, value);
    }
    if (lastId > 0) parameters.set('after', String(lastId));
    parameters.set('limit', String(shown));
    return parameters.toString();
  }

  function makeItem(event) {
    const item = document.createElement('li');
    item.className = `event ${event.severity}`;
    item.dataset.id = String(event.id);
    const when = item.appendChild(document.createElement('span'));
    when.className = 'when';
    when.textContent = timeFormat.format(new Date(event.time_ms));
    const kind = item.appendChild(document.createElement('span'));
    kind.className = 'kind';
    kind.textContent = event.kind;
    const what = item.appendChild(document.createElement('span'));
    what.className = 'what';
    what.textContent = event.text;
    return item;
  }

  function showEmpty() {
    if (list.children.length > 0) return;
    const item = list.appendChild(document.createElement('li'));
    item.className = 'empty';
    item.textContent = 'No events yet.';
  }

  function startOver() {
    lastId = 0;
    list.replaceChildren();
    metric.hidden = true;
  }

  async function read() {
    const response = await fetch(`/api/events?${query()}`, { cache: 'no-store' });
    if (!response.ok) return;
    const answer = await response.json();
    if (epoch !== null && answer.epoch !== epoch) {
      // The events were found again from the start (a seek in a replay).
      epoch = answer.epoch;
      startOver();
      return read();
    }
    epoch = answer.epoch;
    if (answer.events.length > 0) {
      list.querySelector('.empty')?.remove();
      const fresh = document.createDocumentFragment();
      for (const event of answer.events) fresh.appendChild(makeItem(event));
      list.insertBefore(fresh, list.firstChild);
      lastId = Math.max(lastId, answer.events[0].id);
      while (list.children.length > shown) list.lastElementChild.remove();
    }
    showEmpty();
  }

  async function showMetric(item) {
    list.querySelector('.selected')?.classList.remove('selected');
    item.classList.add('selected');
    metric.hidden = false;
    metric.textContent = 'Loading…';
    try {
      const response = await fetch(`/api/events/metric?id=${item.dataset.id}`, { cache: 'no-store' });
      const answer = await response.json();
      metric.textContent = response.ok
        ? `Metric 0x${answer.metric_id_hex}\n${JSON.stringify(answer.decoded, null, 2)}`
        : answer.error;
    } catch (error) {
      metric.textContent = 'The metric could not be read.';
    }
  }

  list.addEventListener('click', (click) => {
    const item = click.target.closest('.event');
    if (item) showMetric(item);
  });
  filters.addEventListener('change', () => {
    startOver();
    refresh();
  });
  const refresh = norvoPoll(read, period);
})();
