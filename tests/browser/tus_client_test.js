'use strict';
// The protocol's reference client uploads, is interrupted, and goes on.

const assert = require('node:assert/strict');
const crypto = require('node:crypto');
const net = require('node:net');
const { packages, runCases, sha256 } = require('./support.js');

const tus = packages('tus-js-client');
const MIB = 1024 * 1024;

/** Uploads with the given options; resolves with the upload when it succeeded. */
function upload(server, content, options) {
  return new Promise((resolve, reject) => {
    const running = new tus.Upload(content, {
      endpoint: `${server.url}/api/v1/uploads`,
      headers: server.headers,
      retryDelays: null,
      ...options,
      onError: reject,
      onSuccess: () => resolve(running),
    });
    running.start();
  });
}

async function downloadedHash(server, share) {
  const { url } = await server.finish(share);
  const response = await fetch(`${url}/0`);
  assert.equal(response.status, 200);
  return sha256(Buffer.from(await response.arrayBuffer()));
}

/** Forwards to the server and cuts the connections that come to so many bytes from the client, one for each cut. */
function cuttingProxy(server, cuts) {
  const target = new URL(server.url);
  const proxy = net.createServer((client) => {
    // Whether a client sends its requests over one connection or several, every cut is made.
    const limit = cuts[0] ?? Infinity;
    const onward = net.connect(Number(target.port), target.hostname);
    let seen = 0;
    client.on('data', (part) => {
      seen += part.length;
      if (seen > limit) {
        cuts.shift();
        client.destroy();
        onward.end();
      } else if (!onward.write(part)) {
        client.pause();
        onward.once('drain', () => client.resume());
      }
    });
    onward.on('data', (part) => client.write(part));
    client.on('close', () => onward.end());
    onward.on('close', () => client.destroy());
    client.on('error', () => {});
    onward.on('error', () => {});
  });
  return new Promise((resolve) => {
    proxy.listen(0, '127.0.0.1', () => resolve(proxy));
  });
}

runCases({
  async 'uploads a file of an announced share'(server) {
    const content = crypto.randomBytes(3 * MIB);
    const share = await server.makeShare([{ name: 'a.bin', size: content.length }]);
    const done = await upload(server, content, { metadata: { share: share.share, index: '0' } });
    assert.equal(done.url, server.url + share.files[0].upload);
    assert.equal(await downloadedHash(server, share.share), sha256(content));
  },

  async 'uploads in chunks without announcing a share'(server) {
    const content = crypto.randomBytes(3 * MIB + 17);
    await upload(server, content, { metadata: { filename: 'ü.bin' }, chunkSize: MIB });
    const { shares } = await server.call('GET', '/api/v1/shares');
    assert.equal(shares[0].files[0].name, 'ü.bin');
    assert.equal(await downloadedHash(server, shares[0].share), sha256(content));
  },

  async 'is interrupted and resumes where it stopped'(server) {
    const content = crypto.randomBytes(40 * MIB);
    const share = await server.makeShare([{ name: 'a.bin', size: content.length }]);
    const uploadUrl = server.url + share.files[0].upload;
    const proxy = await cuttingProxy(server, [15 * MIB]);
    const throughProxy = uploadUrl.replace(server.url, `http://127.0.0.1:${proxy.address().port}`);
    await assert.rejects(upload(server, content, { uploadUrl: throughProxy }));
    proxy.close();
    const starts = [];
    await upload(server, content, {
      uploadUrl,
      // What the cut connection had sent may still come in behind the offset that was asked for: 409.
      retryDelays: [0, 0, 0],
      onProgress: (sent) => starts.push(sent),
    });
    assert.ok(starts[0] > 10 * MIB && starts[0] <= 15 * MIB, `it went on at ${starts[0]}`);
    assert.equal(await downloadedHash(server, share.share), sha256(content));
  },

  async 'retries by itself through a network that cuts connections'(server) {
    const content = crypto.randomBytes(12 * MIB);
    const cuts = [3 * MIB, 1000, 5 * MIB, 70 * 1024];
    const proxy = await cuttingProxy(server, cuts);
    const share = await server.makeShare([{ name: 'a.bin', size: content.length }]);
    await upload(server, content, {
      uploadUrl: `http://127.0.0.1:${proxy.address().port}${share.files[0].upload}`,
      retryDelays: [0, 0, 0, 0, 0, 0, 0, 0],
    });
    proxy.close();
    assert.deepEqual(cuts, [], 'every cut was made');
    assert.equal(await downloadedHash(server, share.share), sha256(content));
  },

  async 'is told that its token is wrong'(server) {
    await assert.rejects(
      upload(server, Buffer.from('x'), { headers: { Authorization: 'Bearer wrong' } }),
      (error) => error.originalResponse.getStatus() === 401);
  },

  async 'drops an upload'(server) {
    const share = await server.makeShare([{ name: 'a.bin', size: 5 }]);
    const done = await upload(server, Buffer.from('12345'),
      { uploadUrl: server.url + share.files[0].upload });
    await tus.Upload.terminate(done.url, { headers: server.headers });
    const record = await server.call('GET', `/api/v1/shares/${share.share}`);
    assert.equal(record.files[0].offset, 0);
  },
});
