'use strict';

const assert = require('node:assert/strict');
const { test } = require('node:test');
const { norvoForTheseTests, openPage, screenshot, testOnPage } = require('./norvo.js');

const suite = norvoForTheseTests();

const rowTexts = (page) => page.locator('main .row .text').allTextContents();
const title = (page) => page.locator('.bar h1').textContent();

testOnPage(suite, 'browses Device Info, LTE, UMTS and GSM from the launch screen', async (page) => {
  await page.goto(suite.address + '/');
  assert.equal(await title(page), 'Norvo');
  assert.deepEqual(await rowTexts(page), ['Device Info', 'LTE', 'UMTS', 'GSM']);

  const expected = {
    'Device Info': ['IMSI', 'IMEISV', 'SIM Files'],
    LTE: 14,
    UMTS: 15,
    GSM: 11,
  };
  for (const [item, rows] of Object.entries(expected)) {
    await page.getByRole('link', { name: item, exact: true }).click();
    await page.waitForURL(suite.address + '/' + encodeURIComponent(item));
    assert.equal(await title(page), item);
    const texts = await rowTexts(page);
    if (Array.isArray(rows)) assert.deepEqual(texts, rows);
    else assert.equal(texts.length, rows);
    await page.locator('.bar .back').click();
    await page.waitForURL(suite.address + '/');
  }

  await page.goto(suite.address + '/Device%20Info/IMSI');
  assert.deepEqual(await page.locator('main .row').first().innerText(), 'Come back later\nCome back later');
  await screenshot(page, 'device-info-imsi');
});

testOnPage(suite, 'opens LTE and CA Status, refreshes it in place and goes back', async (page) => {
  await page.goto(suite.address + '/');
  await page.getByRole('link', { name: 'LTE', exact: true }).click();
  await page.getByRole('link', { name: 'CA Status', exact: true }).click();
  await page.waitForURL(suite.address + '/LTE/CA%20Status');
  assert.equal(await title(page), 'CA Status');
  await page.getByRole('heading', { name: 'Component Carrier 0' }).waitFor();

  // The simulated phone needs a moment to aggregate carriers.
  await page.waitForFunction(() => document.querySelectorAll('main .row').length > 2, null, {
    timeout: 30000,
  });
  await screenshot(page, 'lte-ca-status');

  const values = () => page.locator('main .detail').allTextContents();
  const before = await values();
  await page.evaluate(() => {
    window.scrollTo(0, 120);
    window.firstRow = document.querySelector('main .row');
  });
  const scrolled = await page.evaluate(() => window.scrollY);
  await page.waitForFunction(
    (old) => [...document.querySelectorAll('main .detail')].some((cell, i) => cell.textContent !== old[i]),
    before,
    { timeout: 20000 },
  );
  assert.notDeepEqual(await values(), before);
  assert.equal(await page.evaluate(() => document.contains(window.firstRow)), true, 'rows were rebuilt');
  assert.equal(await page.evaluate(() => window.scrollY), scrolled, 'the scroll position moved');

  await page.locator('.bar .back').click();
  await page.waitForURL(suite.address + '/LTE');
  assert.equal(await title(page), 'LTE');
});

testOnPage(suite, 'follows the dark mode of the system and fits a desktop window', async (page) => {
  await page.emulateMedia({ colorScheme: 'dark' });
  await page.setViewportSize({ width: 1280, height: 800 });
  await page.goto(suite.address + '/LTE/Serving%20Cell%20Meas');
  const background = await page.evaluate(() => getComputedStyle(document.body).backgroundColor);
  assert.equal(background, 'rgb(0, 0, 0)');
  const width = await page.evaluate(() => document.querySelector('main').getBoundingClientRect().width);
  assert.ok(width <= 760, `the table is ${width}px wide`);
  await screenshot(page, 'lte-serving-cell-meas-desktop-dark');
});

test('answers an unknown address with a page that leads home', async () => {
  const { page } = await openPage(suite.browser);
  const response = await page.goto(suite.address + '/LTE/No%20Such%20Thing');
  assert.equal(response.status(), 404);
  assert.equal(await title(page), 'Not Found');
  await page.locator('.bar .back').click();
  await page.waitForURL(suite.address + '/');
  await page.close();
});
