'use strict';
// A recipient's browser: the page without script, on small screens, in the dark, in every language; both downloads.

const assert = require('node:assert/strict');
const { execFileSync } = require('node:child_process');
const crypto = require('node:crypto');
const fs = require('node:fs');
const path = require('node:path');
const { contextOptions, launchBrowser, packages, runCases, sha256 } = require('./support.js');
const { endTime, files, makeLink, memo, pageKinds } = require('./page_kinds.js');

const locales = path.join(__dirname, '..', '..', 'service', 'server', 'pages', 'locale');
const languages = ['en', ...fs.readdirSync(locales).filter((name) => name.endsWith('.po'))
  .map((name) => name.slice(0, -3).replace('_', '-'))];
const withoutBlanks = /^(ja|ko|th|zh)/;
const axe = fs.readFileSync(packages.resolve('axe-core/axe.min.js'), 'utf8');
/** What the browser itself writes of answers that are refusals. */
const refusal = /the server responded with a status of (404|410|500)/;

/** Opens a context in the one browser; what its pages complain of is a failure. */
async function withPage(browser, options, work) {
  const context = await browser.newContext({ ...contextOptions, ...options });
  try {
    const page = await context.newPage();
    const complaints = [];
    page.on('console', (message) => complaints.push(message.text()));
    page.on('pageerror', (error) => complaints.push(error.message));
    await work(page);
    assert.deepEqual(complaints.filter((text) => !refusal.test(text)), []);
  } finally {
    await context.close();
  }
}

async function download(page, server, text) {
  const [started] = await Promise.all([
    page.waitForEvent('download'), page.getByText(text).first().click()]);
  const target = path.join(server.directory, `download-${crypto.randomUUID()}`);
  await started.saveAs(target);
  return { name: started.suggestedFilename(), target };
}

/** No part of the page may stand out at the side. */
async function assertFits(page, where) {
  const out = await page.evaluate(() => [...document.querySelectorAll('html, body *')]
    .filter((part) => {
      const box = part.getBoundingClientRect();
      return part.scrollWidth > part.clientWidth + 1 && getComputedStyle(part).display !== 'inline' ||
        box.width > 0 && (box.left < -0.5 || box.right > innerWidth + 0.5);
    })
    .map((part) => `${part.tagName} ${part.className} ${part.textContent.slice(0, 60)}`));
  assert.deepEqual(out, [], where);
}

/** Words of the page's own sentences are never broken; names and texts of others may be. */
async function assertWholeWords(page, where) {
  const broken = await page.evaluate(() => {
    const range = document.createRange();
    return [...document.querySelectorAll('h1, p, .button span, .kind, .lost .size')].flatMap((part) => {
      const walker = document.createTreeWalker(part, NodeFilter.SHOW_TEXT);
      const words = [];
      for (let node = walker.nextNode(); node; node = walker.nextNode()) {
        for (const word of node.data.matchAll(/[^\s\u2066-\u2069-]+/g)) {
          range.setStart(node, word.index);
          range.setEnd(node, word.index + word[0].length);
          const lines = new Set([...range.getClientRects()].map((box) => Math.round(box.top)));
          if (lines.size > 1) words.push(word[0]);
        }
      }
      return words;
    });
  });
  assert.deepEqual(broken, [], where);
}

/** What axe-core finds wrong, each with the place. */
async function violations(page) {
  const found = await page.evaluate(() => globalThis.axe.run(
    { runOnly: ['wcag2a', 'wcag2aa', 'wcag21a', 'wcag21aa', 'wcag22aa', 'best-practice'],
      resultTypes: ['violations'] }));
  assert.ok(found.passes.length > 10, 'the rules were looked at');
  return found.violations.flatMap((rule) => rule.nodes.map((node) => `${rule.id}: ${node.html}`));
}

const style = (locator, property) =>
  locator.evaluate((part, name) => getComputedStyle(part)[name], property);

const cases = {
  async 'shows sender, files, sizes and end'(server, _build, browser) {
    const link = await makeLink(server, files);
    await withPage(browser, {}, async (page) => {
      await page.goto(link.url);
      assert.equal(await page.locator('h1').innerText(), '3 files from +4915112345678');
      assert.equal(await page.locator('time').getAttribute('datetime'),
        new Date(link.expires * 1000).toISOString().replace('.000', ''));
      assert.match(await page.locator('main').innerText(), /4[78] hours left/);
      assert.deepEqual(await page.locator('.name').allInnerTexts(), files.map((file) => file.name));
      assert.deepEqual(await page.locator('.kind').allInnerTexts(), ['Picture', 'Document', 'Video']);
      assert.deepEqual(await page.locator('.size').allInnerTexts(), ['2.4 MB', '180 kB', '5 bytes']);
      assert.match(await page.locator('.button').innerText(), /^Download all \(2\.6 MB\)$/);
      assert.equal(await page.title(), 'Shared with you');
    });
  },

  async 'downloads one file with its own name and bytes'(server, _build, browser) {
    const link = await makeLink(server, files);
    await withPage(browser, {}, async (page) => {
      await page.goto(link.url);
      const { name, target } = await download(page, server, files[0].name);
      assert.equal(name, files[0].name);
      assert.equal(sha256(fs.readFileSync(target)), sha256(files[0].bytes));
    });
  },

  async 'downloads everything as a zip'(server, _build, browser) {
    const link = await makeLink(server, files);
    await withPage(browser, {}, async (page) => {
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

  async 'shows a text as it was written'(server, _build, browser) {
    const link = await makeLink(server, memo);
    await withPage(browser, { viewport: { width: 320, height: 568 } }, async (page) => {
      await page.goto(link.url);
      assert.equal(await page.locator('h1').innerText(), 'Text from +4915112345678');
      assert.equal(await page.locator('.text').innerText(), memo[0].bytes.toString());
      const { target } = await download(page, server, 'Download (');
      assert.deepEqual(fs.readFileSync(target), memo[0].bytes);
    });
  },

  async 'tells that a link has ended or is unknown'(server, _build, browser) {
    const [expired, withdrawn] = [await makeLink(server, memo), await makeLink(server, memo)];
    await withPage(browser, {}, async (page) => {
      const heading = async (url, status) => {
        assert.equal((await page.goto(url)).status(), status);
        return page.locator('h1').innerText();
      };
      assert.equal(await heading(expired.url, 200), 'Text from +4915112345678');
      endTime(server, expired.share);
      await server.call('DELETE', `/api/v1/shares/${withdrawn.share}`);
      assert.equal(await heading(expired.url, 410), 'The time is over');
      assert.equal(await heading(withdrawn.url, 410), 'No longer shared');
      assert.equal(await heading(`${server.url}/s/${'A'.repeat(22)}`, 404), 'Nothing here');
    });
  },

  async 'fits screens, letters, colours and paper as their owner wants them'(server, _build, browser) {
    const link = await makeLink(server, files);
    await withPage(browser, {}, async (page) => {
      await page.goto(link.url);
      const paper = (colorScheme) => page.emulateMedia({ colorScheme })
        .then(() => style(page.locator('body'), 'backgroundColor'));
      assert.equal(await paper('dark'), 'rgb(18, 22, 31)');
      assert.equal(await paper('light'), 'rgb(243, 245, 250)');
      for (const width of [320, 412, 640, 1280]) {
        await page.setViewportSize({ width, height: 640 });
        await assertFits(page, width);
      }
      const button = page.locator('.button');
      const height = async () => (await button.boundingBox()).height;
      assert.ok(await height() >= 48);
      assert.equal(await style(button, 'transitionDuration'), '0.15s');
      await page.emulateMedia({ reducedMotion: 'reduce' });
      assert.equal(await style(button, 'transitionDuration'), '0s');
      assert.equal(await style(button, 'borderTopColor'), 'rgba(0, 0, 0, 0)');
      await page.emulateMedia({ forcedColors: 'active' });
      assert.notEqual(await style(button, 'borderTopColor'), 'rgba(0, 0, 0, 0)');
      await page.emulateMedia({ forcedColors: 'none', colorScheme: 'dark', media: 'print' });
      assert.equal(await button.isVisible(), false);
      assert.equal(await style(page.locator('body'), 'backgroundColor'), 'rgb(255, 255, 255)');
      assert.equal(await style(page.locator('h1'), 'color'), 'rgb(0, 0, 0)');
    });
  },

  async 'is read from the right where the language is'(server, _build, browser) {
    const link = await makeLink(server, files);
    await withPage(browser, { locale: 'ar' }, async (page) => {
      await page.goto(link.url);
      const [disc, name, size] = await Promise.all(['.disc', '.name', '.size'].map(
        (part) => page.locator(part).first().boundingBox()));
      assert.ok(disc.x > name.x + name.width - 1, 'the icon is on the right of the name');
      assert.ok(size.x > 240, 'the line under the name begins at the right');
    });
  },

  async 'has room for every language and for large letters'(server, _build, browser) {
    assert.equal(languages.length, 22);
    const kinds = await pageKinds(server);
    const look = (wanted, large) => withPage(browser, { viewport: { width: 320, height: 568 } }, async (page) => {
      if (large) {
        const protocol = await page.context().newCDPSession(page);
        await protocol.send('Page.setFontSizes', { fontSizes: { standard: 32 } });
      }
      for (const language of languages) {
        await page.setExtraHTTPHeaders({ 'Accept-Language': language });
        for (const kind of wanted) {
          const answer = await page.goto(kinds[kind].url);
          assert.equal(answer.status(), kinds[kind].status, kind);
          assert.equal(answer.headers()['content-language'], language);
          const where = `${kind} ${language}${large ? ' large' : ''}`;
          await assertFits(page, where);
          if (!large && !withoutBlanks.test(language)) await assertWholeWords(page, where);
        }
      }
      assert.equal(await style(page.locator('body'), 'fontSize'), large ? '34px' : '17px');
    });
    await Promise.all([
      look(['files', 'lossy', 'lost', 'expired', 'withdrawn', 'unknown', 'home'], false),
      look(['files', 'lossy'], true)]);
  },

  async 'keeps the rules of accessibility'(server, _build, browser) {
    const kinds = await pageKinds(server);
    // The rules run as a script in the page, which the page's own policy would not allow.
    // Without motion a colour is at once what it is going to be.
    const options = { javaScriptEnabled: true, bypassCSP: true, reducedMotion: 'reduce',
      viewport: { width: 320, height: 568 } };
    const open = async (page, url, language) => {
      await page.setExtraHTTPHeaders({ 'Accept-Language': language });
      await page.goto(url);
      await page.evaluate(axe);
    };
    const look = (kind, { url }) => withPage(browser, options, async (page) => {
      for (const [language, schemes] of [['en', ['light', 'dark']], ['ar', ['light']], ['ja', ['dark']]]) {
        await open(page, url, language);
        for (const colorScheme of schemes) {
          await page.emulateMedia({ colorScheme });
          assert.deepEqual(await violations(page), [], `${kind} ${language} ${colorScheme}`);
        }
      }
    });
    for (const [kind, page] of Object.entries(kinds)) await look(kind, page);
    await withPage(browser, options, async (page) => {
      await open(page, kinds.files.url, 'en');
      await page.addStyleTag({ content: ':root{--soft:#8a93a5}' });
      const found = await violations(page);
      assert.ok(found.length > 0 && found.every((text) => text.startsWith('color-contrast')), found.join());
    });
  },
};

async function main() {
  const browser = await launchBrowser();
  try {
    await runCases(cases, browser);
  } finally {
    await browser.close();
  }
}

main();
