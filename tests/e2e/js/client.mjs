// Sends one request of each kind, waits behind a barrier, asks for a reply and prints what came back.
//
//   node client.mjs SOCKET

import { LirraClient, string, int64, uint64, double, dictionary, coded } from './lirra_client.mjs';

const client = await LirraClient.connect(process.argv[2]);
const code = (number) => ({ __ipc__event_code__: int64(number) });
const sender = { sender: string('js') };
const session = { session: string('Vistel'), ...sender };

client.send({ ...code(0), sessionType: string('Vistel'), ...sender, beginSessionFlags: int64(4), endSessionFlags: int64(-1) });
client.send({ ...code(1), sessionType: string('Vistel'), ...sender });
client.send({ ...code(2), checkpoint: string('Grüße €𝄞'), ...session, time: double(1700000000.25) });
client.send({ ...code(3), description: string('two lines'), logString: string('first\nsecond'), sessionType: string('Vistel'), ...sender, time: double(100.5) });
client.send({ ...code(4), category: string('Codec'), callInfo: string('x'.repeat(70000)), ...session });
client.send({ ...code(5), description: string('q'), logString: string('good'), ...session });
client.send({ ...code(6), description: string('rtt'), number: coded(double(4.5)), ...session });
client.send({ ...code(6), description: string('lost'), number: coded(uint64(7)), ...session });
client.send({ ...code(6), description: string('drift'), number: coded(int64(-3)), ...session });
client.send({ ...code(7), ...session });
client.send({ ...code(8), action: int64(3), ...session });
client.send({
  ...code(9), action: int64(15), ...session,
  userInfo: dictionary({ useWifi: true, title: 'T', retries: 3, ratio: 0.5, none: null, names: ['a', 'b'], mixed: [1, 'b'], inner: { deep: 'x' } }),
});
client.send({ ...code(10), event: int64(1), ...session });
client.send({ ...code(11), initiator: string('alice'), ...session });
client.send({ ...code(12), receiver: string('bob'), ...session });
client.send({ ...code(13), failureReason: string('busy'), ...session });
client.send({ ...code(14), ...session, category: string('Codec'), path: string('/tmp/a.log') });
client.send({ ...code(15), logString: string('a record'), level: int64(6), time: uint64(18446744073709551615n), category: string('c'), ...sender, type: string('Js') });
client.send({ ...code(16), eventString: string('an event'), level: int64(-7), time: uint64(0), category: string(''), ...sender, type: string('Js') });
await client.barrier();
console.log('barrier passed');

const reply = await client.ask({ ...code(8), action: int64(14), ...session });
console.log(JSON.stringify(reply, Object.keys(reply).concat(Object.keys(reply.replyResult ?? {})).sort()));
client.close();
