'use strict';

const assert = require('node:assert/strict');
const { norvoForTheseTests, screenshot, testOnPage } = require('./norvo.js');

const suite = norvoForTheseTests();

// The card's rows as label to value.
const cardRows = (page) =>
  page.evaluate(() => {
    const rows = {};
    const items = document.querySelectorAll('#cell > *');
    for (let i = 0; i + 1 < items.length; i += 2) rows[items[i].textContent] = items[i + 1].textContent;
    return rows;
  });

testOnPage(suite, 'opens from the launch screen, whose rows stay as they are, and fills the card and the graphs', async (page) => {
  await page.goto(suite.address + '/');
  assert.deepEqual(await page.locator('main .row .text').allTextContents(), ['Device Info', 'LTE', 'UMTS', 'GSM']);
  await page.locator('.bar .links').getByRole('link', { name: 'Dashboard' }).click();
  await page.waitForURL(suite.address + '/dashboard');
  assert.equal(await page.locator('.bar h1').textContent(), 'Dashboard');
  await page.waitForFunction(
    () => [...document.querySelectorAll('#cell dt')].some((term) => term.textContent === 'Downlink'),
    null,
    { timeout: 30000 },
  );
  const rows = await cardRows(page);
  assert.equal(rows.Technology, 'LTE');
  assert.match(rows.Operator, /^\d{3}-\d{2,3}$/);
  assert.match(rows.Band, /^\d+$/);
  assert.match(rows.Downlink, /^\d+\.\d+ MHz$/);
  assert.match(rows.Uplink, /^\d+\.\d+ MHz$/);
  assert.match(rows.EARFCN, /^\d+$/);
  assert.ok('eNB' in rows && 'Sector' in rows && 'PCI' in rows && 'TAC' in rows, JSON.stringify(rows));

  // A graph with points, and the levels with their quality.
  await page.waitForFunction(
    () => Number(document.querySelector('.graph[data-graph="level"]')?.dataset.points) >= 3,
    null,
    { timeout: 30000 },
  );
  assert.ok(await page.locator('.graph canvas').count() >= 1);
  const level = page.locator('#levels li[data-series="lte.rsrp"]');
  assert.match(await level.locator('.value').textContent(), /^-\d+$/);
  assert.match((await level.getAttribute('class')) ?? '', /^(excellent|good|fair|poor)$/);

  // The subscriber, as digits split into MCC, MNC and MSIN.
  await page.locator('#subscriber dd.digits').waitFor({ timeout: 30000 });
  const imsi = await page.locator('#subscriber dd.digits span').allTextContents();
  assert.equal(imsi.length, 3);
  assert.match(imsi.join(''), /^\d{15}$/);
  await screenshot(page, 'dashboard-phone');
  await page.locator('.bar .back').click();
  await page.waitForURL(suite.address + '/');
});

testOnPage(suite, 'keeps a graph\'s zoom across a refresh', async (page) => {
  await page.setViewportSize({ width: 1280, height: 900 });
  await page.goto(suite.address + '/dashboard');
  await page.waitForFunction(
    () => Number(document.querySelector('.graph[data-graph="level"]')?.dataset.points) >= 3,
    null,
    { timeout: 30000 },
  );
  // Drag across the middle of the serving level graph.
  const area = await page.locator('.graph[data-graph="level"] .u-over').boundingBox();
  const y = area.y + area.height / 2;
  await page.mouse.move(area.x + area.width * 0.3, y);
  await page.mouse.down();
  await page.mouse.move(area.x + area.width * 0.5, y, { steps: 5 });
  await page.mouse.move(area.x + area.width * 0.7, y, { steps: 5 });
  await page.mouse.up();
  await page.waitForFunction(() => location.hash.includes('from='));
  const zoomed = await page.evaluate(() => ({ ...document.getElementById('graphs').dataset }));
  assert.equal(await page.locator('#live').getAttribute('aria-pressed'), 'false');

  await page.reload();
  await page.waitForFunction(() => document.querySelectorAll('.graph').length > 0, null, { timeout: 30000 });
  // Live, the shown time would move on; zoomed, it stays.
  await page.waitForTimeout(1500);
  const after = await page.evaluate(() => ({ ...document.getElementById('graphs').dataset }));
  assert.equal(after.from, zoomed.from);
  assert.equal(after.to, zoomed.to);
  assert.equal(await page.locator('#live').getAttribute('aria-pressed'), 'false');

  await page.locator('#live').click();
  await page.waitForFunction(() => !location.hash.includes('from='));
  await screenshot(page, 'dashboard-desktop');
});
