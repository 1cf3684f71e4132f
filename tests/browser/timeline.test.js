'use strict';

// The timeline, the alert banner and the replay's player bar, over a recorded simulator drive
// that passes the underpass.
const assert = require('node:assert/strict');
const { spawnSync } = require('node:child_process');
const fs = require('node:fs');
const path = require('node:path');
const { program, norvoForTheseTests, screenshot, testOnPage } = require('./norvo.js');

// A replay at full speed may hold the line that names its address in its output: given a port,
// it is found by asking.
const suite = norvoForTheseTests((folder) => {
  const drive = path.join(folder, 'drive.jsonl');
  // Three minutes of the drive: out of the city centre and through the underpass.
  const recorded = spawnSync(program, ['record', drive, '--seconds', '3', '--speed', '60'], {
    stdio: ['ignore', 'ignore', 'inherit'],
  });
  assert.equal(recorded.status, 0, 'norvo record failed');
  const alerts = path.join(folder, 'alerts.toml');
  // An alert that any LTE level sets off at once, so that the banner shows while on LTE.
  fs.writeFileSync(alerts, '[[alert]]\nname = "On LTE"\nseries = "lte.rsrp"\nabove = -1000\n');
  return ['--replay', drive, '--speed', 'max', '--alerts', alerts];
}, { port: true });

// The answer of GET `address` on the page's Norvo.
const api = (page, address) => page.evaluate(async (url) => (await fetch(url)).json(), address);
const replayState = (page) => api(page, '/api/replay');

testOnPage(suite, 'lists what happened, failures first to the eye, and shows the metric behind one', async (page) => {
  await page.goto(suite.address + '/');
  assert.deepEqual(await page.locator('main .row .text').allTextContents(), ['Device Info', 'LTE', 'UMTS', 'GSM']);
  await page.locator('.bar .links').getByRole('link', { name: 'Timeline' }).click();
  await page.waitForURL(suite.address + '/timeline');

  const failure = page.locator('.event.failure', { hasText: 'radio link failure' }).first();
  await failure.waitFor({ timeout: 20000 });
  for (const kind of ['handover', 'carrier', 'registration', 'bearer']) {
    assert.ok(await page.locator('.event .kind', { hasText: kind }).count() > 0, `no ${kind} event`);
  }
  const [failureEdge, infoEdge] = await Promise.all([
    failure.evaluate((item) => getComputedStyle(item).borderLeftColor),
    page.locator('.event.info').first().evaluate((item) => getComputedStyle(item).borderLeftColor),
  ]);
  assert.notEqual(failureEdge, infoEdge, 'a failure looks like any other event');

  await failure.click();
  await page.locator('#metric', { hasText: 'Metric 0x3C4E04' }).waitFor();
  assert.match(await page.locator('#metric').textContent(), /KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP/);
  await screenshot(page, 'timeline');

  await page.selectOption('select[name="severity"]', 'failure');
  await page.waitForFunction(() => {
    const items = [...document.querySelectorAll('.event')];
    return items.length > 0 && items.every((item) => item.classList.contains('failure'));
  });
});

testOnPage(suite, 'puts a player bar beside the tables that plays, pauses and seeks', async (page) => {
  await page.goto(suite.address + '/LTE');
  const player = page.locator('.player');
  await player.waitFor();
  assert.equal(await page.locator('main .row').count(), 14, 'the table changed');
  await page.waitForFunction(() => document.querySelectorAll('.player .marker.failure').length > 0);

  const ended = await replayState(page);
  assert.equal(ended.playing, false);
  assert.equal(ended.position_ms, ended.duration_ms);
  const eventCount = async () => (await api(page, '/api/events?limit=5000')).events.length;
  const eventsAtEnd = await eventCount();

  const middle = Math.round(ended.duration_ms / 200) * 100;
  await page.locator('.player input.position').fill(String(middle));
  await page.waitForFunction((wanted) => document.querySelector('.player').dataset.position === String(wanted), middle);
  const seeked = await replayState(page);
  assert.equal(seeked.position_ms, middle);
  const eventsAtMiddle = await eventCount();
  assert.ok(eventsAtMiddle < eventsAtEnd, `${eventsAtMiddle} events at the middle, ${eventsAtEnd} at the end`);

  await page.locator('.player select.speed').selectOption('1');
  await page.locator('.player button.play').click();
  await page.locator('.player button.play', { hasText: 'Pause' }).waitFor();
  assert.equal((await replayState(page)).playing, true);
  assert.equal((await replayState(page)).speed, 1);
  await page.locator('.player button.play').click();
  await page.locator('.player button.play', { hasText: 'Play' }).waitFor();
  await screenshot(page, 'lte-with-player');
});

testOnPage(suite, 'shows active alerts as a banner above the tables, and their events', async (page) => {
  await page.goto(suite.address + '/LTE');
  // A moment on LTE, before the underpass.
  await page.evaluate(async () => {
    const state = await (await fetch('/api/replay')).json();
    await fetch('/api/replay', {
      method: 'POST',
      headers: { 'Content-Type': 'application/json' },
      body: JSON.stringify({ action: 'seek', position_ms: Math.round(state.duration_ms / 8) }),
    });
  });
  const banner = page.locator('.alert-banner');
  await banner.waitFor();
  assert.match(await banner.textContent(), /On LTE: lte.rsrp above -1000.0/);
  assert.equal(await page.locator('main .row').count(), 14, 'the table changed');
  const bannerBottom = await banner.evaluate((element) => element.getBoundingClientRect().bottom);
  const tableTop = await page.locator('main').evaluate((element) => element.getBoundingClientRect().top);
  assert.ok(bannerBottom <= tableTop + 1, 'the banner covers the table');
  await screenshot(page, 'lte-with-alert-banner');

  const alerts = (await api(page, '/api/events?kind=alert')).events;
  assert.ok(alerts.some((event) => event.severity === 'warning' && event.text.startsWith('On LTE')));
});
