// Starts Norvo on a free loopback port and Debian's Chromium, for the browser tests.
'use strict';

const assert = require('node:assert/strict');
const { spawn } = require('node:child_process');
const fs = require('node:fs');
const net = require('node:net');
const os = require('node:os');
const path = require('node:path');
const { after, before, test } = require('node:test');
const { chromium } = require('playwright-core');

const repository = path.resolve(__dirname, '..', '..');
const program = process.env.NORVO ?? path.join(repository, 'build', 'src', 'app', 'norvo');
const browserPath = process.env.CHROMIUM ?? '/usr/bin/chromium';
const artifacts = process.env.ARTIFACTS ?? path.join(repository, 'test-artifacts');

// A loopback port that is free now.
function freePort() {
  return new Promise((resolve, reject) => {
    const server = net.createServer();
    server.on('error', reject);
    server.listen(0, '127.0.0.1', () => {
      const { port } = server.address();
      server.close(() => resolve(port));
    });
  });
}

// Resolves with the address once Norvo answers there: a Norvo that soon falls quiet (a replay)
// may hold the line that names its address in its output's buffer.
async function answering(address, exited) {
  const deadline = Date.now() + 30000;
  let gone = false;
  exited.then(() => {
    gone = true;
  });
  while (!gone && Date.now() < deadline) {
    try {
      if ((await fetch(address + '/api/chrome')).ok) return address;
    } catch (error) {
      // Not listening yet.
    }
    await new Promise((resolve) => setTimeout(resolve, 100));
  }
  throw new Error(gone ? 'norvo exited early' : `norvo did not answer at ${address} within 30 s`);
}

// Resolves with Norvo's address once it has printed it, or, given a port, once it answers
// there. `args` go after the address.
function startNorvo(args = [], { port } = {}) {
  if (!port) {
    return startProgram(['--listen', '127.0.0.1:0', ...args],
                        /Open (http:\/\/127\.0\.0\.1:\d+)\/ in a browser/);
  }
  const child = spawn(program, ['--listen', `127.0.0.1:${port}`, ...args], {
    stdio: ['ignore', 'ignore', 'inherit'],
  });
  const exited = new Promise((resolve) => child.on('exit', (code, signal) => resolve({ code, signal })));
  return {
    address: answering(`http://127.0.0.1:${port}`, exited),
    async stop() {
      child.kill('SIGINT');
      return exited;
    },
  };
}

// Runs Norvo with `args`; `addressLine` finds the address it prints.
function startProgram(args, addressLine) {
  const child = spawn(program, args, { stdio: ['ignore', 'pipe', 'inherit'] });
  const exited = new Promise((resolve) => child.on('exit', (code, signal) => resolve({ code, signal })));
  const address = new Promise((resolve, reject) => {
    let output = '';
    child.stdout.on('data', (chunk) => {
      output += chunk;
      const found = addressLine.exec(output);
      if (found) resolve(found[1]);
      // Keep only the tail: the log goes on for as long as Norvo runs.
      if (output.length > 65536) output = output.slice(-1024);
    });
    child.on('exit', (code) => reject(new Error(`norvo exited early with ${code}`)));
    setTimeout(() => reject(new Error('norvo printed no address within 30 s')), 30000).unref();
  });
  return {
    address,
    // Stops Norvo as Ctrl-C would and answers how it exited.
    async stop() {
      child.kill('SIGINT');
      return exited;
    },
  };
}

// Stops Norvo as Ctrl-C would and checks that it ended cleanly.
async function stopCleanly(norvo, name = 'norvo') {
  const { code, signal } = await norvo.stop();
  assert.equal(signal, null, `${name} was killed instead of stopping`);
  assert.equal(code, 0, `${name} did not stop cleanly`);
}

async function startBrowser() {
  const profile = fs.mkdtempSync(path.join(os.tmpdir(), 'norvo-chromium-'));
  const context = await chromium.launchPersistentContext(profile, {
    executablePath: browserPath,
    headless: true,
    args: [
      '--no-sandbox',
      '--disable-gpu',
      '--disable-quic',
      '--no-first-run',
      '--disable-background-networking',
      '--disable-component-update',
      '--disable-sync',
    ],
    viewport: { width: 390, height: 844 },
    deviceScaleFactor: 2,
  });
  return {
    context,
    async close() {
      await context.close();
      fs.rmSync(profile, { recursive: true, force: true });
    },
  };
}

// A new page of `browser` whose script errors and console errors collect in `problems`.
async function openPage(browser) {
  const page = await browser.context.newPage();
  const problems = [];
  page.on('pageerror', (error) => problems.push(error.message));
  page.on('console', (message) => {
    if (message.type() === 'error') problems.push(message.text());
  });
  return { page, problems };
}

// A test of `name` on a new page of the suite's browser that fails on any script or console error
// the page meets, and closes the page after.
function testOnPage(suite, name, body) {
  test(name, async () => {
    const { page, problems } = await openPage(suite.browser);
    await body(page);
    assert.deepEqual(problems, []);
    await page.close();
  });
}

// A Norvo and a browser for the tests of one file, stopped cleanly after them; the answer holds
// `address` and `browser` once the tests run. `args` may be a function of a scratch folder,
// removed after the tests, that prepares what Norvo reads; `port` as startNorvo takes it.
function norvoForTheseTests(args = [], { port } = {}) {
  const suite = {};
  before(async () => {
    if (typeof args === 'function') {
      suite.folder = fs.mkdtempSync(path.join(os.tmpdir(), 'norvo-test-'));
      args = await args(suite.folder);
    }
    suite.norvo = startNorvo(args, { port: port && await freePort() });
    suite.address = await suite.norvo.address;
    suite.browser = await startBrowser();
  });
  after(async () => {
    await suite.browser?.close();
    if (suite.norvo) await stopCleanly(suite.norvo);
    if (suite.folder) fs.rmSync(suite.folder, { recursive: true, force: true });
  });
  return suite;
}

async function screenshot(page, name) {
  fs.mkdirSync(artifacts, { recursive: true });
  await page.screenshot({ path: path.join(artifacts, `${name}.png`) });
}

module.exports = {
  program,
  freePort,
  startNorvo,
  startProgram,
  stopCleanly,
  startBrowser,
  openPage,
  testOnPage,
  norvoForTheseTests,
  screenshot,
};
