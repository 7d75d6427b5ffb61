'use strict';
// take_page_pictures.js BUILD FOLDER: pictures of every kind of page as FOLDER/SIZE-KIND-LANGUAGE-SCHEME.png.

const path = require('node:path');
const { Server, launchBrowser } = require('./support.js');
const { pageKinds } = require('./page_kinds.js');

const sizes = [[320, 568], [412, 915], [1280, 800]];

async function main(build, folder) {
  const server = await Server.start(build);
  const browser = await launchBrowser();
  try {
    for (const [kind, { url }] of Object.entries(await pageKinds(server))) {
      for (const language of ['en', 'ar', 'ja']) {
        const page = await browser.newPage(
          { javaScriptEnabled: false, locale: language, reducedMotion: 'reduce' });
        await page.goto(url);
        for (const [width, height] of sizes) {
          await page.setViewportSize({ width, height });
          for (const colorScheme of ['light', 'dark']) {
            await page.emulateMedia({ colorScheme });
            const name = `${width}x${height}-${kind}-${language}-${colorScheme}.png`;
            await page.screenshot({ path: path.join(folder, name) });
          }
        }
        await page.close();
      }
    }
  } finally {
    await browser.close();
    await server.stop();
  }
}

main(process.argv[2], process.argv[3]);
