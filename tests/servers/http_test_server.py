#!/usr/bin/python3
"""A scriptable HTTP server for the download tests, on 127.0.0.1 only.

The path says what to answer; bodies are a fixed byte pattern (byte i is (7 i + i // 251) mod 256)
so a test can check every byte it received:

  /body/N            200, Content-Length N
  /range/N           206 with the whole body when the request carries "Range: bytes=0-", else 400
  /status/CODE       that status with a short body
  /auth/N            401 unless Basic credentials vt / secret come along, then 200 with N bytes
  /cut/N/SENT        announces N bytes, sends SENT, then closes the connection
  /nolength/N        N bytes without a Content-Length, ended by closing the connection
  /length/TEXT/N     Content-Length: TEXT (any text), then N bytes and a close
  /slow/N/MS[/PIECE] N bytes in pieces of PIECE (1024) bytes with a pause of MS milliseconds before each
  /stall/MS          answers 200 with 10 bytes only after MS milliseconds
  /noanswer          accepts the request and never answers
  /trickle/N/MS      announces N bytes and sends one byte every MS milliseconds
  /endless           announces 1,000,000,000 bytes and sends as fast as it is read
  /twolengths/A/B    Content-Length: A and Content-Length: B, then A bytes
  /vt/NAME           an update server: "defver" 99, "mainver" 0, "sw2.def" a list of keys
  /do/KIND,ARG,.../NAME/vt/FILE  the update server, answering FILE NAME as /KIND/ARG/... would
                     (a bare "trickle" sends 2000 bytes at one a second)

With --tls CERT KEY it speaks https instead. The listening port is chosen by the system and written to --port-file once the server listens.
"""
import argparse
import base64
import os
import socket
import sys
import time
from http.server import BaseHTTPRequestHandler, ThreadingHTTPServer


def pattern(size):
    return bytes(((i * 7 + i // 251) & 0xFF) for i in range(size))


_cache = {}


def body(size):
    if size not in _cache:
        _cache[size] = pattern(size) if size <= 1 << 20 else (pattern(1 << 20) * (size // (1 << 20) + 1))[:size]
    return _cache[size]


class Handler(BaseHTTPRequestHandler):
    protocol_version = "HTTP/1.1"

    def log_message(self, fmt, *args):
        sys.stderr.write("%s %s\n" % (self.requestline, fmt % args))

    def answer(self, status, data, length=None, close=False, extra=()):
        self.send_response(status)
        if length is not False:
            self.send_header("Content-Length", str(len(data)) if length is None else length)
        for name, value in extra:
            self.send_header(name, value)
        if close:
            self.send_header("Connection", "close")
            self.close_connection = True
        self.end_headers()
        self.wfile.write(data)
        self.wfile.flush()

    def cut(self):
        self.wfile.flush()
        self.close_connection = True
        try:
            self.connection.shutdown(socket.SHUT_RDWR)
        except OSError:
            pass

    def do_GET(self):
        parts = self.path.split("?")[0].strip("/").split("/")
        kind, args = parts[0], parts[1:]
        if kind == "do":  # an update server with one file misbehaving
            action, target, name = args[0].split(","), args[1], args[-1]
            kind, args = (action[0], action[1:] or ["2000", "1000"]) if name == target else ("vt", [name])
        try:
            if kind == "noanswer":
                time.sleep(3600)
            elif kind == "trickle" or kind == "endless":
                n, pause = (int(args[0]), int(args[1]) / 1000.0) if kind == "trickle" else (10 ** 9, 0)
                self.send_response(200)
                self.send_header("Content-Length", str(n))
                self.end_headers()
                piece = b"7" if kind == "trickle" else body(1 << 16)
                for start in range(0, n, len(piece)):
                    self.wfile.write(piece[:n - start])
                    self.wfile.flush()
                    time.sleep(pause)
            elif kind == "twolengths":
                self.answer(200, body(int(args[0])), length=args[0], extra=[("Content-Length", args[1])])
            elif kind == "vt":
                files = {"defver": b"99\n", "mainver": b"0\n", "sw2.def": b"-939524086\r\n33554559\r\n"}
                if args[0] in files:
                    self.answer(200, files[args[0]])
                else:
                    self.answer(404, b"not found")
            elif kind == "body":
                self.answer(200, body(int(args[0])))
            elif kind == "range":
                if self.headers.get("Range") == "bytes=0-":
                    n = int(args[0])
                    self.answer(206, body(n), extra=[("Content-Range", "bytes 0-%d/%d" % (n - 1, n))])
                else:
                    self.answer(400, b"expected Range: bytes=0-")
            elif kind == "status":
                code = int(args[0])
                self.answer(code, b"" if code in (204, 304) else ("status %d" % code).encode(),
                            length=False if code == 204 else None)
            elif kind == "auth":
                expected = "Basic " + base64.b64encode(b"vt:secret").decode()
                if self.headers.get("Authorization") == expected:
                    self.answer(200, body(int(args[0])))
                else:
                    self.answer(401, b"who are you?", extra=[("WWW-Authenticate", 'Basic realm="vt"')])
            elif kind == "cut":
                n, sent = int(args[0]), int(args[1])
                self.send_response(200)
                self.send_header("Content-Length", str(n))
                self.end_headers()
                self.wfile.write(body(n)[:sent])
                self.cut()
            elif kind == "nolength":
                self.answer(200, body(int(args[0])), length=False, close=True)
            elif kind == "length":
                self.send_response(200)
                self.send_header("Content-Length", args[0])
                self.end_headers()
                self.wfile.write(body(int(args[1])))
                self.cut()
            elif kind == "slow":
                n, pause = int(args[0]), int(args[1]) / 1000.0
                piece = int(args[2]) if len(args) > 2 else 1024
                self.send_response(200)
                self.send_header("Content-Length", str(n))
                self.end_headers()
                data = body(n)
                for start in range(0, n, piece):
                    time.sleep(pause)
                    self.wfile.write(data[start:start + piece])
                    self.wfile.flush()
            elif kind == "stall":
                time.sleep(int(args[0]) / 1000.0)
                self.answer(200, body(10))
            else:
                self.answer(404, b"not found")
        except (BrokenPipeError, ConnectionResetError):
            self.close_connection = True


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("--port-file", required=True)
    parser.add_argument("--tls", nargs=2, metavar=("CERT", "KEY"), help="serve https with this certificate")
    options = parser.parse_args()
    server = ThreadingHTTPServer(("127.0.0.1", 0), Handler)
    if options.tls:
        import ssl
        context = ssl.SSLContext(ssl.PROTOCOL_TLS_SERVER)
        context.load_cert_chain(*options.tls)
        server.socket = context.wrap_socket(server.socket, server_side=True)
    server.daemon_threads = True
    temporary = options.port_file + ".tmp"
    with open(temporary, "w") as f:
        f.write(str(server.server_address[1]))
    os.replace(temporary, options.port_file)
    server.serve_forever()


if __name__ == "__main__":
    main()
