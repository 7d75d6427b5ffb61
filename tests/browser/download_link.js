'use strict';
// What a recipient does with the link of a message: download_link.js BUILD LINK FOLDER opens it in a real browser, fetches
// every file into the folder, takes a picture of the page (FOLDER.png) and prints the page's heading.

const fs = require('node:fs');
const path = require('node:path');
const { openBrowser } = require('./support.js');

async function main(link, folder) {
  fs.mkdirSync(folder, { recursive: true });
  const browser = await openBrowser(`${folder}.profile`);
  try {
    const page = browser.pages()[0] ?? await browser.newPage();
    const answer = await page.goto(link);
    if (!answer.ok()) throw new Error(`${link} answered ${answer.status()}`);
    await page.screenshot({ path: `${folder}.png`, fullPage: true });
    for (const name of await page.locator('.name').all()) {
      const [download] = await Promise.all([page.waitForEvent('download'), name.click()]);
      await download.saveAs(path.join(folder, download.suggestedFilename()));
    }
    console.log(await page.locator('h1').innerText());
  } finally {
    await browser.close();
  }
}

main(process.argv[3], process.argv[4]).catch((error) => {
  console.error(error.message);
  process.exitCode = 1;
});
