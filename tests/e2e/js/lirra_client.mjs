// A client of the agent, written from docs/wire-protocol.md on the public package "flatbuffers".

import net from 'node:net';
import flexbuffers from 'flatbuffers/js/flexbuffers.js';

const HEADER_SIZE = 16;
const VERSION = 1;
const Kind = { message: 0, messageExpectingReply: 1, reply: 2, barrier: 3, barrierPassed: 4 };

/** A value of a request with its type said aloud: JavaScript's own numbers would leave it open. */
export const string = (value) => ({ type: 'string', value });
export const int64 = (value) => ({ type: 'int64', value });
export const uint64 = (value) => ({ type: 'uint64', value });
export const double = (value) => ({ type: 'double', value });
export const dictionary = (value) => ({ type: 'dictionary', value });
export const coded = (value) => ({ type: 'coded', value });

function addNumber(builder, { type, value }) {
  if (type === 'int64') builder.addInt(value);
  else if (type === 'uint64') builder.addUInt(value);
  else builder.addFloat(value);
}

function scalarBuffer(number) {
  const builder = flexbuffers.builder();
  addNumber(builder, number);
  return builder.finish();
}

function encode(request) {
  const builder = flexbuffers.builder();
  builder.startMap();
  for (const [key, field] of Object.entries(request)) {
    builder.addKey(key);
    if (field.type === 'coded') builder.add(scalarBuffer(field.value));
    else if (field.type === 'string' || field.type === 'dictionary') builder.add(field.value);
    else addNumber(builder, field);
  }
  builder.end();
  return builder.finish();
}

function frame(kind, cookie, payload = new Uint8Array(0)) {
  const bytes = Buffer.alloc(HEADER_SIZE + Math.ceil(payload.length / 8) * 8);
  bytes.writeUInt32LE(payload.length, 0);
  bytes.writeUInt16LE(VERSION, 4);
  bytes.writeUInt16LE(kind, 6);
  bytes.writeBigUInt64LE(cookie, 8);
  bytes.set(payload, HEADER_SIZE);
  return bytes;
}

export class LirraClient {
  #socket;
  #received = Buffer.alloc(0);
  #lastCookie = 0n;
  #waiting = new Map(); // cookie -> { resolve, reject }

  static connect(path) {
    return new Promise((resolve, reject) => {
      const socket = net.createConnection(path);
      socket.once('error', reject);
      socket.once('connect', () => resolve(new LirraClient(socket)));
    });
  }

  constructor(socket) {
    this.#socket = socket;
    socket.on('data', (bytes) => this.#take(bytes));
    socket.on('close', () => {
      for (const { reject } of this.#waiting.values()) reject(new Error('the agent closed the connection'));
      this.#waiting.clear();
    });
  }

  /** Sends a request, an object of typed values, and expects nothing. */
  send(request) {
    this.#socket.write(frame(Kind.message, 0n, encode(request)));
  }

  /** Sends a request and gives its reply as a plain object. */
  ask(request) {
    return this.#sendAndWait(Kind.messageExpectingReply, encode(request));
  }

  /** Resolves once everything sent before has been handled. */
  barrier() {
    return this.#sendAndWait(Kind.barrier);
  }

  close() {
    this.#socket.end();
  }

  #sendAndWait(kind, payload) {
    const cookie = ++this.#lastCookie;
    return new Promise((resolve, reject) => {
      this.#waiting.set(cookie, { resolve, reject });
      this.#socket.write(frame(kind, cookie, payload));
    });
  }

  #take(bytes) {
    this.#received = Buffer.concat([this.#received, bytes]);
    while (this.#received.length >= HEADER_SIZE) {
      const length = this.#received.readUInt32LE(0);
      const size = HEADER_SIZE + Math.ceil(length / 8) * 8;
      if (this.#received.length < size) return;
      const kind = this.#received.readUInt16LE(6);
      const cookie = this.#received.readBigUInt64LE(8);
      const payload = this.#received.subarray(HEADER_SIZE, HEADER_SIZE + length);
      this.#received = this.#received.subarray(size);
      const waiting = this.#waiting.get(cookie);
      this.#waiting.delete(cookie);
      if (kind === Kind.barrierPassed) waiting?.resolve();
      else if (kind === Kind.reply) waiting?.resolve(flexbuffers.toObject(new Uint8Array(payload).buffer));
    }
  }
}
