// A whole device: connects, is let in, sets a camera's strobe and hears the event that tells of it.
//   node set-strobe.js [HOST] [CAMERA] [STROBE]
'use strict';
const net = require('node:net');
const [host = '127.0.0.1', camera = '1', strobe = '0.75'] = process.argv.slice(2);

const entities = { lt: '<', gt: '>', apos: "'", quot: '"', amp: '&' };
const encode = (text) => text.replace(/&/g, '&amp;').replace(/</g, '&lt;').replace(/>/g, '&gt;');
const decode = (text = '') => text.replace(/&(lt|gt|apos|quot|amp);/g, (all, name) => entities[name]);
const textOf = (xml, name) => decode((xml.match(`<${name}>([^<]*)</${name}>`) || [])[1]);
const parametersOf = (xml) => Object.fromEntries(
  [...xml.matchAll(/<Parameter><Name>([^<]*)<\/Name><Value(?:\/>|>([^<]*)<\/Value>)/g)]
    .map(([, name, value]) => [decode(name), decode(value)]));
const fail = (reason) => { console.error(`set-strobe: ${reason}`); process.exit(1); };

const socket = net.connect({ host, port: 803, noDelay: true });
const waiting = []; // each takes a message and tells whether it is the one it waits for
let bytes = Buffer.alloc(0);
let correlations = 0;
socket.on('error', (error) => fail(error.message));
socket.on('close', () => fail('the host closed the connection'));
socket.on('data', (arrived) => {
  bytes = Buffer.concat([bytes, arrived]);
  while (bytes.length >= 4 && bytes.length >= 4 + bytes.readUInt32LE(0)) {
    const end = 4 + bytes.readUInt32LE(0);
    const xml = bytes.toString('utf8', 4, end).replace(/^<\?.*?\?>/, ''); // it says UTF-16
    bytes = bytes.subarray(end);
    const index = waiting.findIndex((takes) => takes(xml));
    if (index >= 0) waiting.splice(index, 1);
  }
});

const wait = (what, isIt, seconds) => new Promise((resolve) => {
  const timer = setTimeout(() => fail(`waited ${seconds} s for ${what}`), 1000 * seconds);
  waiting.push((xml) => isIt(xml) && (clearTimeout(timer), resolve(xml), true));
});
const event = (name, isIt, seconds) => wait(name, (xml) =>
  xml.startsWith('<Event>') && textOf(xml, 'Name') === name && isIt(parametersOf(xml)), seconds);

async function run(name, parameters) {
  const correlation = String(++correlations);
  const list = Object.entries(parameters).map(([key, value]) =>
    `<Parameter><Name>${key}</Name><Value>${encode(value)}</Value></Parameter>`).join('');
  const text = Buffer.from(`<ExecuteCommand><Name>${name}</Name><Correlation>${correlation}` +
    `</Correlation><Parameters>${list}</Parameters></ExecuteCommand>`);
  const length = Buffer.alloc(4);
  length.writeUInt32LE(text.length);
  socket.write(Buffer.concat([length, text])); // in one piece
  const reply = await wait(`the reply to ${name}`, (xml) =>
    xml.startsWith('<CommandReply>') && textOf(xml, 'Correlation') === correlation, 5);
  if (textOf(reply, 'Result') !== 'OK') fail(`${name}: ${textOf(reply, 'Result')}`);
  return parametersOf(reply);
}

(async () => {
  const decided = event('Event.Authorize', () => true, 60); // it may come before the reply
  let { Status } = await run('System.Authorize', { DeviceId: 'strobe-1', DeviceName: 'Strobe' });
  if (Status === 'Pending') ({ Status } = parametersOf(await decided));
  if (Status !== 'Authorized') fail(`not let in: ${Status}`);
  setInterval(() => run('System.Heartbeat', { BeatId: String(Date.now()) }), 1000);
  const done = (now) => { console.log(`strobe of camera ${camera}: ${now}`); process.exit(0); };
  event('Event.Cameras.SettingChanged', (told) =>
    told.CameraId === camera && told.SettingName === 'StrobeIntensity', 5)
    .then((xml) => done(parametersOf(xml).SettingValue));
  const identity = { Param_CameraDeviceId: camera };
  await run('CameraSettings_SetStrobeIntensity', { ...identity, Param_StrobeIntensity: strobe });
  setTimeout(async () => { // a value that was there already brings no event
    done((await run('CameraSettings_GetStrobeIntensity', identity)).Param_StrobeIntensity);
  }, 1000);
})();
