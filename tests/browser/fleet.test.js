'use strict';

// The fleet page with 50 simulated phones, each with its own seed, publishing through a
// Mosquitto broker of the test's own. The fleet asks for an access token, as it does when shown
// beyond this machine, and hands it to the devices' viewers.
const assert = require('node:assert/strict');
const { spawn } = require('node:child_process');
const fs = require('node:fs');
const net = require('node:net');
const os = require('node:os');
const path = require('node:path');
const { after, before, test } = require('node:test');
const { freePort, program, screenshot, startBrowser, startProgram, stopCleanly, testOnPage } =
  require('./norvo.js');

const fleetSim = process.env.NORVO_FLEET_SIM ??
    path.join(path.dirname(program), '..', '..', 'tools', 'fleetsim', 'norvo-fleet-sim');
const kDevices = 50;
const kToken = 'fleet-token_1.2~3';

let folder;
let broker;
let devices;
let fleet;
let address;
const suite = {};

async function waitForPort(port) {
  for (let attempt = 0; attempt < 100; ++attempt) {
    const open = await new Promise((resolve) => {
      const socket = net.connect(port, '127.0.0.1', () => { socket.destroy(); resolve(true); });
      socket.once('error', () => resolve(false));
    });
    if (open) return;
    await new Promise((resolve) => setTimeout(resolve, 50));
  }
  throw new Error(`nothing listens on port ${port}`);
}

before(async () => {
  folder = fs.mkdtempSync(path.join(os.tmpdir(), 'norvo-fleet-'));
  const port = await freePort();
  const configuration = path.join(folder, 'mosquitto.conf');
  fs.writeFileSync(configuration,
      `listener ${port} 127.0.0.1\nallow_anonymous true\npersistence false\n` +
      `user ${os.userInfo().username}\n`);
  broker = spawn('mosquitto', ['-c', configuration], { stdio: 'ignore' });
  await waitForPort(port);
  const url = `mqtt://127.0.0.1:${port}/fleet`;
  devices = spawn(fleetSim, ['--publish', url, '--devices', String(kDevices)],
                  { stdio: ['ignore', 'ignore', 'inherit'] });
  const tokenFile = path.join(folder, 'token');
  fs.writeFileSync(tokenFile, kToken + '\n');
  fleet = startProgram(['--fleet', url, '--listen', '127.0.0.1:0', '--token-file', tokenFile],
                       /Open (http:\/\/127\.0\.0\.1:\d+)\/fleet\?token=fleet-token_1\.2~3 in a browser/);
  address = await fleet.address;
  suite.browser = await startBrowser();
});

after(async () => {
  await suite.browser?.close();
  if (fleet) await stopCleanly(fleet, 'norvo --fleet');
  devices?.kill('SIGKILL');
  broker?.kill('SIGKILL');
  fs.rmSync(folder, { recursive: true, force: true });
});

const deviceNames = (page) => page.locator('#fleet tbody tr td:first-child').allTextContents();
const column = (page, index) =>
  page.locator(`#fleet tbody tr td:nth-child(${index})`).allTextContents();

testOnPage(suite, 'lists every device live, sorts, filters and opens a device\'s own screens', async (page) => {
  assert.equal((await fetch(address + '/fleet')).status, 401);
  await page.setViewportSize({ width: 1280, height: 900 });
  await page.goto(`${address}/fleet?token=${kToken}`);
  assert.equal(page.url(), address + '/fleet');

  await page.waitForFunction((count) =>
      document.querySelectorAll('#fleet tbody tr').length === count &&
      [...document.querySelectorAll('#fleet tbody tr td:nth-child(3)')].every((td) => td.textContent),
      kDevices, { timeout: 20000 });
  const names = await deviceNames(page);
  assert.deepEqual(names, Array.from({ length: kDevices },
                                     (_, n) => 'sim-' + String(n + 1).padStart(3, '0')));
  assert.ok((await column(page, 2)).every((status) => status === 'online'));
  assert.ok((await column(page, 3)).every((technology) => ['LTE', 'UMTS', 'GSM'].includes(technology)));
  assert.ok((await column(page, 7)).some((levels) => /(RSRP|RSCP|RxLev) -\d+/.test(levels)));
  assert.equal(await page.locator('#fleet tbody tr.silent').count(), 0);
  // Live: the metric counts go up.
  const before = (await column(page, 9)).map(Number);
  await page.waitForFunction((first) =>
      Number(document.querySelector('#fleet tbody tr td:nth-child(9)').textContent) > first,
      before[0], { timeout: 5000 });

  await page.locator('th[data-key="device"]').click();  // the second click turns the order
  assert.equal((await deviceNames(page))[0], 'sim-050');
  await page.locator('#filter').fill('sim-00');
  assert.deepEqual(await deviceNames(page),
                   ['sim-009', 'sim-008', 'sim-007', 'sim-006', 'sim-005', 'sim-004', 'sim-003',
                    'sim-002', 'sim-001']);
  await screenshot(page, 'fleet');

  const [screens] = await Promise.all([
    suite.browser.context.waitForEvent('page'),
    page.getByRole('link', { name: 'sim-007', exact: true }).click(),
  ]);
  await screens.waitForLoadState();
  assert.match(screens.url(), /^http:\/\/127\.0\.0\.1:\d+\/$/);
  assert.equal(await screens.locator('.bar h1').textContent(), 'Norvo');
  await screens.getByRole('link', { name: 'LTE', exact: true }).click();
  assert.equal(await screens.locator('.bar h1').textContent(), 'LTE');
  await screens.close();
});

test('shows the devices offline once they drop off the broker', async () => {
  const page = await suite.browser.context.newPage();
  await page.goto(address + '/fleet');
  devices.kill('SIGKILL');
  await page.waitForFunction((count) =>
      [...document.querySelectorAll('#fleet tbody tr td:nth-child(2)')]
          .filter((td) => td.textContent === 'offline').length === count,
      kDevices, { timeout: 20000 });
});
