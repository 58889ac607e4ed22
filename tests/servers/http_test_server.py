#!/usr/bin/python3
"""A scriptable HTTP server for the download tests, on 127.0.0.1 only; the path says what to answer.

Bodies are a fixed pattern (byte i is (7 i + i // 251) mod 256). Paths: /body/N, /range/N (206 only for
"Range: bytes=0-"), /status/CODE, /auth/N (Basic vt / secret), /cut/N/SENT, /nolength/N, /length/TEXT/N,
/slow/N/MS[/PIECE], /stall/MS, /noanswer, /trickle/N/MS, /endless, /twolengths/A/B, /vt/NAME (an update
server) and /do/KIND,ARG,.../NAME/vt/FILE (the update server answering FILE NAME as /KIND/ARG/... would).
With --tls CERT KEY it speaks https. The port, chosen by the system, is written to --port-file.
"""
import argparse
import base64
import os
import socket
import sys
import time
from http.server import BaseHTTPRequestHandler, ThreadingHTTPServer


_cache = {}


def body(size):
    if size not in _cache:
        unit = bytes(((i * 7 + i // 251) & 0xFF) for i in range(min(size, 1 << 20)))
        _cache[size] = (unit * (size // len(unit) + 1))[:size] if unit else b""
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
            elif kind in ("cut", "length"):  # announces N (or TEXT), sends SENT (or N) bytes and closes
                announced, n = (args[0], int(args[1])) if kind == "length" else (args[0], int(args[0]))
                self.send_response(200)
                self.send_header("Content-Length", announced)
                self.end_headers()
                self.wfile.write(body(n)[:int(args[1])])
                self.cut()
            elif kind == "nolength":
                self.answer(200, body(int(args[0])), length=False, close=True)
            elif kind == "slow":
                n, pause = int(args[0]), int(args[1]) / 1000.0
                piece = int(args[2]) if len(args) > 2 else 1024
                self.send_response(200)
                self.send_header("Content-Length", str(n))
                self.end_headers()
                for start in range(0, n, piece):
                    time.sleep(pause)
                    self.wfile.write(body(n)[start:start + piece])
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
