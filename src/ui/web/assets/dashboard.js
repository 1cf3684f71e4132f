// The dashboard: the serving cell's card, the graphs of the levels over time, the carriers and the
// subscriber. Once a second, while the page is visible, it asks /api/dashboard for the card and
// /api/series for the samples that came since it last asked. All graphs share one time axis:
// live, they show the last few minutes; dragging across one zooms all of them to that time,
// and the time shown is kept in the address, so a refresh or a bookmark shows it again.
'use strict';

(() => {
  const period = 1000;
  const hourMs = 3600000;
  // Samples further apart than this are drawn with a gap between them.
  const gapMs = 10000;
  const graphTitles = {
    level: 'Serving level',
    quality: 'Serving quality',
    power: 'Transmit power',
    carriers: 'Secondary carriers, RSRP',
    'carrier-quality': 'Secondary carriers, SINR',
    neighbours: 'Strongest neighbours',
  };
  const palette = ['#0a84ff', '#ff9f0a', '#30b0c7', '#bf5af2', '#34c759', '#ff375f'];

  const graphsElement = document.getElementById('graphs');
  const samples = new Map(); // series name -> {times, values}
  const graphs = []; // {id, series: [definition], plot, element}
  let serverOffset = 0; // server time - browser time, ms
  let view = readView();

  // What the address says to show: {window} live, or {from, to} zoomed.
  function readView() {
    const parameters = new URLSearchParams(location.hash.slice(1));
    const from = Number(parameters.get('from'));
    const to = Number(parameters.get('to'));
    const windowMs = Number(parameters.get('window'));
    const live = { window: [60000, 300000, 900000, hourMs].includes(windowMs) ? windowMs : 300000 };
    if (Number.isFinite(from) && Number.isFinite(to) && from > 0 && to > from) {
      return { ...live, from, to };
    }
    return live;
  }

  function writeView() {
    const parameters = new URLSearchParams();
    parameters.set('window', String(view.window));
    if (view.from !== undefined) {
      parameters.set('from', String(Math.round(view.from)));
      parameters.set('to', String(Math.round(view.to)));
    }
    history.replaceState(null, '', '#' + parameters.toString());
  }

  function visibleRange() {
    if (view.from !== undefined) return [view.from, view.to];
    const now = Date.now() + serverOffset;
    return [now - view.window, now];
  }

  function cssColour(name) {
    return getComputedStyle(document.documentElement).getPropertyValue(name).trim() || '#888';
  }

  function formatValue(value, unit) {
    if (value === null || value === undefined) return '–';
    return `${Number.isInteger(value) ? value : value.toFixed(1)} ${unit}`;
  }

  async function getJson(address) {
    const response = await fetch(address, { cache: 'no-store', headers: { Accept: 'application/json' } });
    if (!response.ok) throw new Error(`${address}: ${response.status}`);
    return response.json();
  }

  // ---- Graphs ----

  // One graph's data: the times of all its series, then each series' values at those times,
  // with null where a series pauses.
  function graphData(graph) {
    const tables = graph.series.map((definition) => {
      const held = samples.get(definition.name) ?? { times: [], values: [] };
      const times = [];
      const values = [];
      for (let i = 0; i < held.times.length; i++) {
        if (i > 0 && held.times[i] - held.times[i - 1] > gapMs) {
          times.push(held.times[i - 1] + 1);
          values.push(null);
        }
        times.push(held.times[i]);
        values.push(held.values[i]);
      }
      return [times, values];
    });
    return uPlot.join(tables);
  }

  function plotWidth(element) {
    return Math.max(200, Math.floor(element.clientWidth));
  }

  function makePlot(graph) {
    const axis = {
      stroke: cssColour('--secondary'),
      grid: { stroke: cssColour('--separator'), width: 1 },
      ticks: { stroke: cssColour('--separator'), width: 1 },
    };
    const options = {
      width: plotWidth(graph.element),
      height: 180,
      ms: 1,
      scales: { x: { time: true } },
      series: [
        {},
        ...graph.series.map((definition, index) => ({
          label: definition.label,
          stroke: palette[index % palette.length],
          width: 1.5,
          spanGaps: false,
          points: { show: false },
          value: (plot, value) => formatValue(value, definition.unit),
        })),
      ],
      axes: [axis, { ...axis, size: 44 }],
      cursor: {
        sync: { key: 'norvo-time' },
        drag: { x: true, y: false, setScale: false },
      },
      legend: { live: true },
      hooks: {
        setSelect: [
          (plot) => {
            if (plot.select.width < 4) return;
            const from = plot.posToVal(plot.select.left, 'x');
            const to = plot.posToVal(plot.select.left + plot.select.width, 'x');
            plot.setSelect({ left: 0, width: 0, top: 0, height: 0 }, false);
            zoomTo(from, to);
          },
        ],
      },
    };
    return new uPlot(options, graphData(graph), graph.element.querySelector('.plot'));
  }

  function buildGraphs(definitions) {
    graphsElement.textContent = '';
    graphs.length = 0;
    const byGraph = new Map();
    for (const definition of definitions) {
      if (!byGraph.has(definition.graph)) byGraph.set(definition.graph, []);
      byGraph.get(definition.graph).push(definition);
    }
    for (const [id, series] of byGraph) {
      const element = document.createElement('figure');
      element.className = 'graph';
      element.dataset.graph = id;
      const title = element.appendChild(document.createElement('h3'));
      title.textContent = `${graphTitles[id] ?? id} (${series[0].unit})`;
      element.appendChild(document.createElement('div')).className = 'plot';
      graphsElement.appendChild(element);
      const graph = { id, series, element, plot: null };
      graph.plot = makePlot(graph);
      graphs.push(graph);
    }
    drawGraphs();
  }

  function drawGraphs() {
    const [min, max] = visibleRange();
    for (const graph of graphs) {
      const data = graphData(graph);
      graph.plot.batch(() => {
        graph.plot.setData(data, false);
        graph.plot.setScale('x', { min, max });
      });
      // How many samples the graph holds, for whoever reads the page.
      graph.element.dataset.points = String(
        data.slice(1).reduce((count, values) => count + values.filter((v) => v != null).length, 0),
      );
    }
    graphsElement.dataset.from = String(Math.round(min));
    graphsElement.dataset.to = String(Math.round(max));
    updateButtons();
  }

  function rebuildPlots() {
    for (const graph of graphs) {
      graph.plot.destroy();
      graph.plot = makePlot(graph);
    }
    drawGraphs();
  }

  function zoomTo(from, to) {
    view = { window: view.window, from, to };
    writeView();
    drawGraphs();
  }

  function goLive(windowMs) {
    view = { window: windowMs ?? view.window };
    writeView();
    drawGraphs();
  }

  function pan(direction) {
    const [min, max] = visibleRange();
    const shift = ((max - min) / 2) * direction;
    const now = Date.now() + serverOffset;
    if (direction > 0 && max + shift >= now) {
      goLive();
      return;
    }
    zoomTo(min + shift, max + shift);
  }

  function updateButtons() {
    for (const button of document.querySelectorAll('[data-window]')) {
      const pressed = view.from === undefined && Number(button.dataset.window) === view.window;
      button.setAttribute('aria-pressed', String(pressed));
    }
    document.getElementById('live').setAttribute('aria-pressed', String(view.from === undefined));
  }

  // ---- Samples ----

  function keep(name, times, values) {
    let held = samples.get(name);
    if (!held) {
      held = { times: [], values: [] };
      samples.set(name, held);
    }
    const last = held.times.length ? held.times[held.times.length - 1] : -Infinity;
    for (let i = 0; i < times.length; i++) {
      if (times[i] < last) continue;
      held.times.push(times[i]);
      held.values.push(values[i]);
    }
    // An hour is all the server keeps, and all the graphs show.
    const oldest = held.times[held.times.length - 1] - hourMs;
    let drop = 0;
    while (drop < held.times.length && held.times[drop] < oldest) drop++;
    if (drop > 0) {
      held.times.splice(0, drop);
      held.values.splice(0, drop);
    }
  }

  async function refreshSeries() {
    const listing = await getJson('/api/series');
    serverOffset = listing.now - Date.now();
    if (graphs.length === 0) buildGraphs(listing.series);
    const asks = [];
    for (const definition of listing.series) {
      if (!definition.latest) continue;
      const held = samples.get(definition.name);
      const last = held && held.times.length ? held.times[held.times.length - 1] : null;
      if (last !== null && definition.latest[0] <= last) continue;
      const since = last === null ? listing.now - hourMs : last + 1;
      asks.push(
        getJson(`/api/series?name=${encodeURIComponent(definition.name)}&since=${since}`).then(
          (columns) => keep(definition.name, columns.times, columns.values),
        ),
      );
    }
    await Promise.all(asks);
    drawGraphs();
  }

  // ---- Card, carriers, subscriber ----

  function setText(element, text) {
    if (element.textContent !== text) element.textContent = text;
  }

  function fillFacts(list, rows) {
    const wanted = rows.length * 2;
    while (list.children.length > wanted) list.lastElementChild.remove();
    while (list.children.length < wanted) {
      list.appendChild(document.createElement(list.children.length % 2 === 0 ? 'dt' : 'dd'));
    }
    rows.forEach((row, index) => {
      setText(list.children[index * 2], row.label);
      const value = list.children[index * 2 + 1];
      if (Array.isArray(row.value)) {
        value.className = 'digits';
        value.replaceChildren(
          ...row.value.map((part) => {
            const span = document.createElement('span');
            span.textContent = part.text;
            span.title = part.title;
            return span;
          }),
        );
      } else {
        value.className = '';
        setText(value, row.value);
      }
    });
  }

  function fillLevels(levels) {
    const list = document.getElementById('levels');
    while (list.children.length > levels.length) list.lastElementChild.remove();
    levels.forEach((level, index) => {
      let item = list.children[index];
      if (!item) {
        item = list.appendChild(document.createElement('li'));
        for (const kind of ['name', 'value', 'unit']) {
          item.appendChild(document.createElement('span')).className = kind;
        }
      }
      item.className = level.quality ?? '';
      item.dataset.series = level.name;
      setText(item.querySelector('.name'), level.label);
      setText(item.querySelector('.value'), formatValue(level.value, '').trim());
      setText(item.querySelector('.unit'), level.unit);
    });
  }

  function fillCarriers(carriers) {
    const table = document.getElementById('carriers');
    const body = table.tBodies[0];
    table.hidden = carriers.length === 0;
    document.getElementById('carriers-waiting').hidden = carriers.length !== 0;
    while (body.rows.length > carriers.length) body.lastElementChild.remove();
    const columns = ['index', 'state', 'pci', 'earfcn', 'band', 'downlink', 'bandwidth', 'rsrp', 'rsrq'];
    carriers.forEach((carrier, index) => {
      const row = body.rows[index] ?? body.insertRow();
      while (row.cells.length < columns.length) row.insertCell();
      columns.forEach((column, cell) => {
        const value = carrier[column];
        setText(row.cells[cell], value === null || value === undefined ? '–' : String(value));
      });
    });
  }

  function fillSubscriber(subscriber) {
    document.getElementById('subscriber-waiting').hidden = subscriber !== null;
    const rows = [];
    if (subscriber?.imsi) {
      rows.push({
        label: 'IMSI',
        value: subscriber.mcc
          ? [
              { text: subscriber.mcc, title: 'MCC' },
              { text: subscriber.mnc, title: 'MNC' },
              { text: subscriber.msin, title: 'MSIN' },
            ]
          : subscriber.imsi,
      });
      if (subscriber.mcc) rows.push({ label: 'Home network', value: `${subscriber.mcc}-${subscriber.mnc}` });
    }
    if (subscriber?.iccid) rows.push({ label: 'ICCID', value: subscriber.iccid });
    fillFacts(document.getElementById('subscriber'), rows);
  }

  async function refreshCard() {
    const card = await getJson('/api/dashboard');
    document.getElementById('serving-waiting').hidden = card.technology !== null;
    setText(
      document.getElementById('serving-title'),
      card.technology ? `Serving cell, ${card.technology}` : 'Serving cell',
    );
    fillLevels(card.levels);
    fillFacts(document.getElementById('cell'), card.rows);
    fillCarriers(card.carriers);
    fillSubscriber(card.subscriber);
  }

  // ---- Controls, and reading once a second ----

  for (const button of document.querySelectorAll('[data-window]')) {
    button.addEventListener('click', () => goLive(Number(button.dataset.window)));
  }
  document.getElementById('live').addEventListener('click', () => goLive());
  document.getElementById('earlier').addEventListener('click', () => pan(-1));
  document.getElementById('later').addEventListener('click', () => pan(1));
  window.addEventListener('hashchange', () => {
    view = readView();
    drawGraphs();
  });
  new ResizeObserver(() => {
    for (const graph of graphs) graph.plot.setSize({ width: plotWidth(graph.element), height: 180 });
  }).observe(graphsElement);
  matchMedia('(prefers-color-scheme: dark)').addEventListener('change', rebuildPlots);
  updateButtons();
  norvoPoll(() => Promise.all([refreshCard(), refreshSeries()]), period);
})();
