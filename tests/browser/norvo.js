// Starts Norvo on a free loopback port and Debian's Chromium, for the browser tests.
'use strict';

const { spawn } = require('node:child_process');
const fs = require('node:fs');
const os = require('node:os');
const path = require('node:path');
const { chromium } = require('playwright-core');

const repository = path.resolve(__dirname, '..', '..');
const program = process.env.NORVO ?? path.join(repository, 'build', 'src', 'app', 'norvo');
const browserPath = process.env.CHROMIUM ?? '/usr/bin/chromium';
const artifacts = process.env.ARTIFACTS ?? path.join(repository, 'test-artifacts');

// Resolves with Norvo's address once it has printed it. `args` go after the address.
function startNorvo(args = []) {
  const child = spawn(program, ['--listen', '127.0.0.1:0', ...args], {
    stdio: ['ignore', 'pipe', 'inherit'],
  });
  const exited = new Promise((resolve) => child.on('exit', (code, signal) => resolve({ code, signal })));
  const address = new Promise((resolve, reject) => {
    let output = '';
    child.stdout.on('data', (chunk) => {
      output += chunk;
      const found = /Open (http:\/\/127\.0\.0\.1:\d+)\/ in a browser/.exec(output);
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

async function screenshot(page, name) {
  fs.mkdirSync(artifacts, { recursive: true });
  await page.screenshot({ path: path.join(artifacts, `${name}.png`) });
}

module.exports = { program, startNorvo, startBrowser, screenshot };
