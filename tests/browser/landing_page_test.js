'use strict';
// A recipient's browser: the page without script, on small screens, in the dark; both downloads.

const assert = require('node:assert/strict');
const { execFileSync } = require('node:child_process');
const crypto = require('node:crypto');
const fs = require('node:fs');
const path = require('node:path');
const { openBrowser, runCases, sha256 } = require('./support.js');

const files = [
  { name: 'Sunset over the harbour.jpg', bytes: crypto.randomBytes(2400000) },
  { name: 'Übersicht "neu" <b>写真.pdf', bytes: crypto.randomBytes(180000) },
  { name: `${'a-name-without-any-place-to-break-'.repeat(4)}.txt`, bytes: Buffer.from('hello') },
];

async function makeLink(server, chosen) {
  const share = await server.makeShare(
    chosen.map((file) => ({ name: file.name, size: file.bytes.length })));
  for (const [index, file] of chosen.entries()) {
    await server.upload(share.files[index].upload, file.bytes);
  }
  return { share: share.share, ...(await server.finish(share.share)) };
}

async function withBrowser(server, options, work) {
  // The profile is gone with the server's directory.
  const browser = await openBrowser(fs.mkdtempSync(path.join(server.directory, 'profile-')), options);
  try {
    const page = browser.pages()[0] ?? await browser.newPage();
    const complaints = [];
    page.on('console', (message) => complaints.push(message.text()));
    await work(page);
    assert.deepEqual(complaints.filter((text) => !text.includes('404') && !text.includes('410')),
      []);
  } finally {
    await browser.close();
  }
}

async function download(page, server, text) {
  const [started] = await Promise.all([
    page.waitForEvent('download'), page.getByText(text).first().click()]);
  const target = path.join(server.directory, `download-${crypto.randomUUID()}`);
  await started.saveAs(target);
  return { name: started.suggestedFilename(), target };
}

function screenshotPath(build, name) {
  const directory = path.join(build, 'browser', 'screenshots');
  fs.mkdirSync(directory, { recursive: true });
  return path.join(directory, `${name}.png`);
}

/** No part of the page may stand out at the side. */
async function assertFits(page, width) {
  for (const element of await page.locator('body *').all()) {
    const box = await element.boundingBox();
    if (box) assert.ok(box.x >= 0 && box.x + box.width <= width, JSON.stringify(box));
  }
}

runCases({
  async 'shows sender, files, sizes and end'(server) {
    const link = await makeLink(server, files);
    await withBrowser(server, {}, async (page) => {
      await page.goto(link.url);
      assert.equal(await page.locator('h1').innerText(), '3 files from +4915112345678');
      assert.equal(await page.locator('time').getAttribute('datetime'),
        new Date(link.expires * 1000).toISOString().replace('.000', ''));
      assert.deepEqual(await page.locator('.name').allInnerTexts(), files.map((file) => file.name));
      assert.deepEqual(await page.locator('.size').allInnerTexts(), ['2.4 MB', '180 kB', '5 bytes']);
      assert.match(await page.locator('.button').innerText(), /^Download all \(2\.6 MB\)$/);
    });
  },

  async 'downloads one file with its own name and bytes'(server) {
    const link = await makeLink(server, files);
    await withBrowser(server, {}, async (page) => {
      await page.goto(link.url);
      const { name, target } = await download(page, server, files[0].name);
      assert.equal(name, files[0].name);
      assert.equal(sha256(fs.readFileSync(target)), sha256(files[0].bytes));
    });
  },

  async 'downloads everything as a zip'(server) {
    const link = await makeLink(server, files);
    await withBrowser(server, {}, async (page) => {
      await page.goto(link.url);
      const { name, target } = await download(page, server, 'Download all');
      assert.equal(name, 'pelliko.zip');
      const into = path.join(server.directory, 'unpacked');
      execFileSync('unzip', ['-q', target, '-d', into], { env: { ...process.env, LC_ALL: 'C.UTF-8' } });
      assert.equal(fs.readdirSync(into).length, files.length);
      for (const file of files) {
        assert.equal(sha256(fs.readFileSync(path.join(into, file.name))), sha256(file.bytes));
      }
    });
  },

  async 'fits narrow, usual and dark screens'(server, build) {
    const link = await makeLink(server, files);
    for (const [name, width, colorScheme] of [
      ['landing-320', 320, 'light'], ['landing-480', 480, 'light'], ['landing-dark', 480, 'dark'],
      ['landing-desktop', 1280, 'light']]) {
      await withBrowser(server, { viewport: { width, height: 640 }, colorScheme }, async (page) => {
        await page.goto(link.url);
        await page.screenshot({ path: screenshotPath(build, name), fullPage: true });
        await assertFits(page, width);
        const paper = await page.locator('body').evaluate((b) => getComputedStyle(b).backgroundColor);
        assert.equal(paper, colorScheme === 'dark' ? 'rgb(18, 22, 28)' : 'rgb(244, 245, 247)');
      });
    }
  },

  async 'tells that a link has ended or is unknown'(server, build) {
    const link = await makeLink(server, files.slice(0, 1));
    await withBrowser(server, { viewport: { width: 320, height: 480 } }, async (page) => {
      await page.goto(link.url);
      assert.equal(await page.locator('h1').innerText(), '1 file from +4915112345678');
      await server.call('DELETE', `/api/v1/shares/${link.share}`);
      const gone = await page.goto(link.url);
      assert.equal(gone.status(), 410);
      assert.equal(await page.locator('h1').innerText(), 'No longer available');
      await page.screenshot({ path: screenshotPath(build, 'landing-gone') });
      const unknown = await page.goto(`${server.url}/s/${'A'.repeat(22)}`);
      assert.equal(unknown.status(), 404);
      assert.equal(await page.locator('h1').innerText(), 'Nothing here');
    });
  },
});
