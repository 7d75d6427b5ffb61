'use strict';
// Uploads files with the protocol's reference client, as many at a time as the background service, and prints the
// seconds that it took. What to upload comes as JSON on standard input.

const fs = require('node:fs');
const { createRequire } = require('node:module');
const path = require('node:path');

const tus = createRequire(path.join(process.env.PELLIKO_NODE_MODULES, 'package.json'))('tus-js-client');
const AT_A_TIME = 4;

function upload(token, file) {
  return new Promise((resolve, reject) => {
    new tus.Upload(fs.createReadStream(file.path), {
      uploadUrl: file.url,
      headers: { Authorization: `Bearer ${token}` },
      retryDelays: null,
      onError: reject,
      onSuccess: resolve,
    }).start();
  });
}

async function main() {
  const { token, files } = JSON.parse(fs.readFileSync(0, 'utf8'));
  const begin = process.hrtime.bigint();
  const worker = async () => {
    for (let file = files.shift(); file; file = files.shift()) {
      await upload(token, file);
    }
  };
  await Promise.all(Array.from({ length: AT_A_TIME }, worker));
  console.log(Number(process.hrtime.bigint() - begin) / 1e9);
}

main();
