// A JavaScript language-server client's round trips, timed for comparison with vexil's: an
// editor's usual JSON-RPC stack (vscode-jsonrpc, replies read with JSON.parse) over the pipes
// of the fake server, answering every request with the JSON of a result file.
//
// Usage: node client.js FAKE_SERVER RESULT_FILE REQUEST ROUND_TRIPS
//   REQUEST is the request message as vexil writes it; its method and params are sent as they are.
// Prints one line of JSON: the median, fastest and slowest of ROUND_TRIPS timed round trips in
// microseconds, and the versions used. On failure prints why on stderr and exits non-zero.
'use strict';

const { spawn } = require('child_process');
const path = require('path');

// Untimed round trips first, for as long as a benchmark of the C++ side runs its first
// repetition: until then node is still compiling the reading path, and the figure would be
// the compiler's, not the client's as it is once an editor has run a while.
const WARM_UP_MS = 500;
// Far beyond any round trip here: only tells a stuck server from a slow one.
const REPLY_TIMEOUT_MS = 60000;

// The fake server, ended with the client whatever the failure.
let server = null;

function fail(message) {
  if (server) server.kill();
  process.stderr.write(`${message}\n`);
  process.exit(1);
}

function loadJsonRpc() {
  try {
    return { rpc: require('vscode-jsonrpc/node'), version: require('vscode-jsonrpc/package.json').version };
  } catch (error) {
    fail(`vscode-jsonrpc is not installed in ${__dirname} (scripts/install-bench-js.sh installs it)`);
  }
}

function withTimeout(promise, failure) {
  let timer;
  const timeout = new Promise((_, reject) => {
    timer = setTimeout(() => reject(new Error(`${failure} in ${REPLY_TIMEOUT_MS} ms`)), REPLY_TIMEOUT_MS);
  });
  return Promise.race([promise, timeout]).finally(() => clearTimeout(timer));
}

function median(sorted) {
  const middle = sorted.length >> 1;
  return sorted.length % 2 ? sorted[middle] : (sorted[middle - 1] + sorted[middle]) / 2;
}

async function main([serverPath, resultFile, requestText, roundTripsText]) {
  const roundTrips = Number(roundTripsText);
  if (!serverPath || !resultFile || !requestText || !(roundTrips > 0)) {
    fail(`usage: node ${path.basename(__filename)} FAKE_SERVER RESULT_FILE REQUEST ROUND_TRIPS`);
  }
  const { method, params } = JSON.parse(requestText);
  const { rpc, version } = loadJsonRpc();

  server = spawn(serverPath, [`result-file=${resultFile}`], { stdio: ['pipe', 'pipe', 'ignore'] });
  const exited = new Promise((resolve) => server.on('exit', resolve));
  server.on('error', (error) => fail(`the fake server did not start: ${error.message}`));
  const connection = rpc.createMessageConnection(
    new rpc.StreamMessageReader(server.stdout), new rpc.StreamMessageWriter(server.stdin));
  const closing = connection.onClose(() => fail('the fake server closed the connection'));
  connection.listen();

  const check = (result) => {
    if (result === null || typeof result !== 'object') fail(`${method} answered ${JSON.stringify(result)}`);
  };
  const roundTrip = () => withTimeout(connection.sendRequest(method, params), `no reply to ${method}`);
  for (const warmUpEnd = Date.now() + WARM_UP_MS; Date.now() < warmUpEnd;) check(await roundTrip());
  const micros = [];
  while (micros.length < roundTrips) {
    const start = process.hrtime.bigint();
    const result = await roundTrip();
    micros.push(Number(process.hrtime.bigint() - start) / 1e3);
    check(result);
  }

  // The server ends on "exit"; its closing the pipes is then no failure.
  closing.dispose();
  await connection.sendNotification('exit');
  connection.dispose();
  server.stdin.end();
  await withTimeout(exited, 'the fake server did not end after "exit"');

  micros.sort((a, b) => a - b);
  process.stdout.write(JSON.stringify({
    method, round_trips: roundTrips, median_us: median(micros), min_us: micros[0], max_us: micros[micros.length - 1],
    node: process.version, vscode_jsonrpc: version,
  }) + '\n');
}

// A server that ended early shows first as a failed write or read: say that it ended.
main(process.argv.slice(2)).catch((error) => {
  const ended = server && (server.exitCode !== null || server.signalCode !== null);
  fail(ended ? `the fake server ended (${server.signalCode || `exit code ${server.exitCode}`}): ${error.message}` : error.message);
});
