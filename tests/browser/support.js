'use strict';
// A real server for one test, and the calls that every test needs.

const assert = require('node:assert/strict');
const { spawn, execFileSync } = require('node:child_process');
const crypto = require('node:crypto');
const fs = require('node:fs');
const { createRequire } = require('node:module');
const os = require('node:os');
const path = require('node:path');
const readline = require('node:readline');

/** Loads a package that `run` installed outside the sources. */
const packages = createRequire(path.join(process.env.PELLIKO_NODE_MODULES, 'package.json'));

const sha256 = (bytes) => crypto.createHash('sha256').update(bytes).digest('hex');

const browserOptions = {
  executablePath: '/usr/bin/chromium',
  args: ['--no-sandbox', '--disable-gpu', '--disable-quic', '--no-first-run',
    '--disable-background-networking', '--disable-component-update', '--disable-sync'],
};

/** As most recipients' browsers are, and without script. */
const contextOptions = {
  acceptDownloads: true,
  javaScriptEnabled: false,
  viewport: { width: 480, height: 800 },
};

/** Opens a fresh browser that keeps what it needs in `profile`. */
function openBrowser(profile, options = {}) {
  return packages('playwright-core').chromium.launchPersistentContext(
    profile, { ...browserOptions, ...contextOptions, ...options });
}

/** One browser for many tests; each opens a context of its own in it. */
function launchBrowser() {
  return packages('playwright-core').chromium.launch(browserOptions);
}

class Server {
  static async start(build) {
    const server = new Server();
    server.program = path.join(build, 'bin', 'pelliko-server');
    server.directory = fs.mkdtempSync(path.join(os.tmpdir(), 'pelliko-browser-'));
    const data = server.data = path.join(server.directory, 'data');
    server.token = execFileSync(server.program,
      ['account', 'add', '--data', data, '--number', '+4915112345678'], { encoding: 'utf8' }).trim();
    server.process = spawn(server.program,
      ['serve', '--data', data, '--listen', '127.0.0.1:0', '--ready-fd', '3'],
      { stdio: ['ignore', 'ignore', 'inherit', 'pipe'] });
    const lines = readline.createInterface({ input: server.process.stdio[3] });
    server.url = await new Promise((resolve, reject) => {
      lines.once('line', resolve);
      lines.once('close', () => reject(new Error('the server did not start')));
    });
    return server;
  }

  async stop() {
    const ended = new Promise((resolve) => this.process.once('exit', resolve));
    this.process.kill('SIGTERM');
    const code = await ended;
    fs.rmSync(this.directory, { recursive: true });
    assert.equal(code, 0);
  }

  get headers() {
    return { Authorization: `Bearer ${this.token}` };
  }

  async call(method, address, body, headers = {}) {
    const response = await fetch(this.url + address,
      { method, body, headers: { ...this.headers, ...headers } });
    assert.ok(response.ok, `${method} ${address}: ${response.status}`);
    return response.status === 204 ? null : response.json();
  }

  makeShare(files) {
    return this.call('POST', '/api/v1/shares',
      JSON.stringify({ files, recipients: [{ number: '+491511111' }] }),
      { 'Idempotency-Key': crypto.randomUUID() });
  }

  upload(address, bytes) {
    return this.call('PATCH', address, bytes, {
      'Tus-Resumable': '1.0.0', 'Upload-Offset': '0',
      'Content-Type': 'application/offset+octet-stream',
    });
  }

  finish(share) {
    return this.call('POST', `/api/v1/shares/${share}/finish`);
  }
}

/** Runs the cases one after another, each with a server of its own; the exit code tells. */
async function runCases(cases, ...more) {
  const build = process.argv[2];
  let failed = 0;
  for (const [name, work] of Object.entries(cases)) {
    const server = await Server.start(build);
    const begun = Date.now();
    try {
      await work(server, build, ...more);
      console.log(`ok      ${name} (${((Date.now() - begun) / 1000).toFixed(1)} s)`);
    } catch (error) {
      failed += 1;
      console.log(`FAILED  ${name}\n${error.stack}`);
    } finally {
      await server.stop();
    }
  }
  console.log(`${Object.keys(cases).length - failed} passed, ${failed} failed`);
  process.exitCode = failed === 0 ? 0 : 1;
}

module.exports = { Server, contextOptions, launchBrowser, openBrowser, packages, runCases, sha256 };
