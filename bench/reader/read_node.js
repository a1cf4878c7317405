// SPDX-License-Identifier: Apache-2.0
// node-serialport with its delimiter parser. Command line and report: see ReaderReport.h.
'use strict';
const fs = require('fs');
const { createRequire } = require('module');
const load = createRequire(process.env.LOKA_BENCH_NODE + '/');
const { SerialPort, DelimiterParser } = load('serialport');

const [device, stampFile] = process.argv.slice(2);
const isStamping = stampFile !== '-';
const stamps = [];
let tokens = 0;
let bytes = 0;
let start;

function finish() {
  const cpu = process.cpuUsage(start.cpu);
  const usage = process.resourceUsage();
  console.log(JSON.stringify({
    tokens, bytes, cpu_ns: (cpu.user + cpu.system) * 1000,
    voluntary: usage.voluntaryContextSwitches - start.usage.voluntaryContextSwitches,
    involuntary: usage.involuntaryContextSwitches - start.usage.involuntaryContextSwitches,
    rss_kib: Math.round(process.memoryUsage().rss / 1024),
  }));
  if (isStamping) {
    const data = Buffer.alloc(stamps.length * 8);
    stamps.forEach((value, index) => data.writeBigUInt64LE(value, index * 8));
    fs.writeFileSync(stampFile, data);
  }
  process.exit(0);
}

const port = new SerialPort({ path: device, baudRate: 115200 }, (error) => {
  if (error) {
    console.error(error.message);
    process.exit(5);
  }
  console.log('ready');
  start = { cpu: process.cpuUsage(), usage: process.resourceUsage() };
});
port.pipe(new DelimiterParser({ delimiter: Buffer.from([3]) })).on('data', (frame) => {
  const token = frame.subarray(1);
  if (token[0] === 0x5a) {
    finish();
  }
  ++tokens;
  bytes += token.length;
  if (isStamping) {
    stamps.push(BigInt('0x' + token.toString('latin1', 0, 8)), process.hrtime.bigint());
  }
});
