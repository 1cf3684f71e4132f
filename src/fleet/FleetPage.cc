#include "fleet/FleetPage.h"

namespace fleet {

const std::string_view kFleetHtml = R"(<!DOCTYPE html>
<html lang="en">
<head>
<meta charset="utf-8">
<meta name="viewport" content="width=device-width, initial-scale=1">
<title>Fleet</title>
<link rel="icon" href="/assets/icon.svg">
<link rel="stylesheet" href="/fleet/fleet.css">
<script src="/assets/poll.js" defer></script>
<script src="/fleet/fleet.js" defer></script>
</head>
<body>
<header><h1>Fleet <span id="prefix"></span></h1>
<input id="filter" type="search" placeholder="Filter" aria-label="Filter the devices">
<span id="count"></span></header>
<table id="fleet">
<thead><tr>
<th data-key="device">Device</th><th data-key="status">Status</th>
<th data-key="technology">Technology</th><th data-key="network">Network</th>
<th data-key="cell">Serving cell</th><th data-key="band">Band</th>
<th data-key="levels">Levels</th><th data-key="age_ms">Last metric</th>
<th data-key="metrics">Metrics</th><th data-key="refused">Refused</th>
</tr></thead>
<tbody></tbody>
</table>
</body>
</html>
)";

const std::string_view kFleetScript =
    R"(// The fleet page: one row per device, read from /api/fleet every second.
'use strict';

const columns = ['device', 'status', 'technology', 'network', 'cell', 'band', 'levels', 'age_ms',
                 'metrics', 'refused'];
let devices = [];
let sortKey = 'device';
let ascending = true;

function age(ms) {
  if (ms === null) return 'never';
  if (ms < 1000) return 'now';
  const seconds = Math.floor(ms / 1000);
  if (seconds < 120) return seconds + ' s ago';
  return Math.floor(seconds / 60) + ' min ago';
}

function compare(a, b) {
  const x = a[sortKey], y = b[sortKey];
  if (x === y) return a.device < b.device ? -1 : 1;
  if (x === null) return 1;
  if (y === null) return -1;
  const order = typeof x === 'number' ? x - y : String(x).localeCompare(String(y));
  return ascending ? order : -order;
}

function show() {
  const filter = document.getElementById('filter').value.trim().toLowerCase();
  const shown = devices.filter(d => !filter || columns.some(
      key => key !== 'age_ms' && String(d[key]).toLowerCase().includes(filter)));
  shown.sort(compare);
  const body = document.createElement('tbody');
  for (const device of shown) {
    const row = body.insertRow();
    row.className = device.silent ? 'silent' : '';
    row.dataset.device = device.device;
    for (const key of columns) {
      const cell = row.insertCell();
      if (key === 'device') {
        const link = document.createElement('a');
        link.href = '/fleet/open/' + encodeURIComponent(device.device);
        link.target = '_blank';
        link.textContent = device.device;
        cell.append(link);
      } else {
        cell.textContent = key === 'age_ms' ? age(device.age_ms) : device[key];
      }
    }
  }
  document.querySelector('#fleet tbody').replaceWith(body);
  document.getElementById('count').textContent =
      shown.length + ' of ' + devices.length + ' devices';
  for (const th of document.querySelectorAll('th')) {
    th.className = th.dataset.key === sortKey ? (ascending ? 'up' : 'down') : '';
  }
}

async function refresh() {
  try {
    const response = await fetch('/api/fleet', {cache: 'no-store'});
    const fleet = await response.json();
    devices = fleet.devices;
    document.getElementById('prefix').textContent = fleet.prefix;
    show();
    document.body.classList.remove('unreachable');
  } catch (error) {
    document.body.classList.add('unreachable');
  }
}

for (const th of document.querySelectorAll('th')) {
  th.addEventListener('click', () => {
    ascending = th.dataset.key === sortKey ? !ascending : true;
    sortKey = th.dataset.key;
    show();
  });
}
document.getElementById('filter').addEventListener('input', show);
norvoPoll(refresh, 1000);
)";

const std::string_view kFleetStyle = R"(/* The fleet page: a header and one table. */
:root { color-scheme: light dark; font-family: system-ui, sans-serif; }
body { margin: 0; }
header { position: sticky; top: 0; display: flex; gap: 16px; align-items: center;
         padding: 8px 16px; background: Canvas; border-bottom: 1px solid GrayText; }
h1 { font-size: 20px; margin: 0; }
#prefix { color: GrayText; font-weight: normal; }
table { border-collapse: collapse; width: 100%; font-size: 14px; }
th, td { padding: 4px 8px; text-align: left; white-space: nowrap; }
th { cursor: pointer; user-select: none; position: sticky; top: 45px; background: Canvas; }
th.up::after { content: ' \25B2'; }
th.down::after { content: ' \25BC'; }
tbody tr:nth-child(even) { background: color-mix(in srgb, CanvasText 5%, Canvas); }
tr.silent td { color: GrayText; }
body.unreachable header { background: color-mix(in srgb, red 20%, Canvas); }
)";

}  // namespace fleet
