'use strict';
// Every kind of page that the server shows to people, each made by what leads to it.

const { execFileSync } = require('node:child_process');
const crypto = require('node:crypto');
const fs = require('node:fs');
const path = require('node:path');

const files = [
  { name: 'Sunset over the harbour.jpg', bytes: crypto.randomBytes(2400000) },
  { name: 'Übersicht "neu" <b>写真.pdf', bytes: crypto.randomBytes(180000) },
  { name: `${'a-name-without-any-place-to-break-'.repeat(4)}.mp4`, bytes: Buffer.from('hello') },
];
const variety = [...files,
  { name: 'لقاء العائلة.mp3', bytes: crypto.randomBytes(1000) },
  { name: 'Ann Example.vcf', bytes: crypto.randomBytes(400) },
  { name: '旅行の写真.zip', bytes: crypto.randomBytes(52000) },
  { name: 'notes.txt', bytes: Buffer.from('hello') },
  { name: 'firmware.bin', bytes: crypto.randomBytes(10) }];
const memo = [{
  name: 'memo_2026.txt',
  bytes: Buffer.from('Bus 42 leaves at 18:05 from platform 7.\n\nBring the <keys> & https://example.org/' +
    'a-very-long-address-without-a-place-to-break-it'.repeat(2) + '\n\nشكرا، إلى اللقاء!\n'),
}];

/** Shares files; returns the share's id, its link and its end. */
async function makeLink(server, chosen) {
  const share = await server.makeShare(
    chosen.map((file) => ({ name: file.name, size: file.bytes.length })));
  for (const [index, file] of chosen.entries()) {
    await server.upload(share.files[index].upload, file.bytes);
  }
  return { share: share.share, ...(await server.finish(share.share)) };
}

/** Lets a share's time be over, as after two days. */
function endTime(server, share) {
  execFileSync('/usr/bin/python3', ['-c', 'import sqlite3, sys\n' +
    'with sqlite3.connect(sys.argv[1]) as db:\n' +
    '    changed = db.execute("UPDATE shares SET deadline = 1 WHERE key = ?", [sys.argv[2]]).rowcount\n' +
    'sys.exit(changed != 1)', path.join(server.data, 'metadata.db'), share]);
}

const blobs = (server) => fs.readdirSync(path.join(server.data, 'blobs'), { recursive: true })
  .map((name) => path.join(server.data, 'blobs', name)).filter((file) => fs.statSync(file).isFile());

function loseBytes(server) {
  blobs(server).forEach((file) => fs.rmSync(file));
}

/** Shares files and then loses some of them, which the operator has noted. */
async function makeLossy(server, lost, kept) {
  const link = await makeLink(server, [...lost, ...kept]);
  blobs(server).filter((name) => lost.some((file) => file.bytes.equals(fs.readFileSync(name))))
    .forEach((name) => fs.rmSync(name));
  execFileSync(server.program, ['check', '--data', server.data, '--mend']);
  return link;
}

/** The address and the status of a page of each kind, by the kind's name. */
async function pageKinds(server) {
  const lossy = await makeLossy(server, variety.slice(0, 2), variety.slice(2, 6));
  const lost = await makeLossy(server, variety.slice(0, 2), []);
  const failing = await makeLink(server, files.slice(2));
  loseBytes(server);
  const withdrawn = await makeLink(server, files.slice(2));
  await server.call('DELETE', `/api/v1/shares/${withdrawn.share}`);
  const expired = await makeLink(server, files.slice(2));
  endTime(server, expired.share);
  return {
    files: { url: (await makeLink(server, variety)).url, status: 200 },
    text: { url: (await makeLink(server, memo)).url, status: 200 },
    contact: { url: (await makeLink(server, variety.slice(4, 5))).url, status: 200 },
    lossy: { url: lossy.url, status: 200 },
    lost: { url: lost.url, status: 410 },
    expired: { url: expired.url, status: 410 },
    withdrawn: { url: withdrawn.url, status: 410 },
    unknown: { url: `${server.url}/s/${'A'.repeat(22)}`, status: 404 },
    failed: { url: `${failing.url}/0`, status: 500 },
    home: { url: `${server.url}/`, status: 200 },
  };
}

module.exports = { endTime, files, makeLink, memo, pageKinds };
