#!/usr/bin/python3
"""A scriptable HTTP server for the download tests, on 127.0.0.1 only; the path says what to answer.

Bodies are a fixed pattern (byte i is (7 i + i // 251) mod 256). Paths: /body/N, /range/N (206 only for
"Range: bytes=0-"), /status/CODE (401 asks for Basic credentials), /cut/N/SENT, /nolength/N, /length/TEXT/N,
/slow/N/MS[/PIECE], /noanswer, /trickle/N/MS, /endless, /twolengths/A/B, /vt/NAME (an update
server) and /do/KIND,ARG,.../NAME/vt/FILE (the update server answering FILE NAME as /KIND/ARG/... would).
With --tls CERT KEY it speaks https. The port, chosen by the system, is written to --port-file.
"""
import argparse
import functools
import os
import socket
import time
from http.server import BaseHTTPRequestHandler, ThreadingHTTPServer

UNIT = bytes(((i * 7 + i // 251) & 0xFF) for i in range(251 * 256))  # the pattern repeats after this


def piece(start, size):
    """The pattern's `size` bytes from byte `start` on."""
    offset = start % len(UNIT)
    return (UNIT * ((offset + size) // len(UNIT) + 1))[offset:offset + size]


@functools.lru_cache(maxsize=8)
def body(size):
    return piece(0, size)


class Handler(BaseHTTPRequestHandler):
    protocol_version = "HTTP/1.1"

    def answer(self, status, data, lengths=None, extra=()):
        """`data` with a Content-Length of each of `lengths` (its own size by default, none for [])."""
        self.send_response(status)
        for length in [str(len(data))] if lengths is None else lengths:
            self.send_header("Content-Length", length)
        for name, value in extra:
            self.send_header(name, value)
        self.end_headers()
        self.wfile.write(data)

    def do_GET(self):
        parts = self.path.split("?")[0].strip("/").split("/")
        kind, args = parts[0], parts[1:]
        if kind == "do":  # an update server with one file misbehaving
            action, target, name = args[0].split(","), args[1], args[-1]
            kind, args = (action[0], action[1:] or ["2000", "1000"]) if name == target else ("vt", [name])
        try:
            if kind == "noanswer":
                time.sleep(3600)
            elif kind in ("slow", "trickle", "endless"):  # N bytes in pieces (1024, 1, 64 KiB), MS apart
                n, pause = (int(args[0]), int(args[1])) if kind != "endless" else (10 ** 12, 0)
                size = int(args[2]) if len(args) > 2 else {"slow": 1024, "trickle": 1, "endless": 1 << 16}[kind]
                self.answer(200, b"", [str(n)])
                for start in range(0, n, size):
                    time.sleep(pause / 1000.0)
                    self.wfile.write(piece(start, min(size, n - start)))
            elif kind == "vt":
                files = {"defver": b"99\n", "mainver": b"0\n", "sw2.def": b"-939524086\r\n33554559\r\n"}
                self.answer(200 if args[0] in files else 404, files.get(args[0], b"not found"))
            elif kind == "body":
                self.answer(200, body(int(args[0])))
            elif kind == "range":
                n = int(args[0])
                if self.headers.get("Range") == "bytes=0-":
                    self.answer(206, body(n), extra=[("Content-Range", "bytes 0-%d/%d" % (n - 1, n))])
                else:
                    self.answer(400, b"expected Range: bytes=0-")
            elif kind == "status":
                code = int(args[0])
                challenge = [("WWW-Authenticate", 'Basic realm="vt"')] if code == 401 else []
                self.answer(code, b"" if code == 204 else b"status %d" % code, [] if code == 204 else None, challenge)
            elif kind in ("cut", "length"):  # announces N (or TEXT), sends SENT (or N) bytes and closes
                self.answer(200, body(int(args[1])), [args[0]])
                self.close_connection = True
                self.connection.shutdown(socket.SHUT_RDWR)
            elif kind == "nolength":
                self.answer(200, body(int(args[0])), [], extra=[("Connection", "close")])
                self.close_connection = True
            elif kind == "twolengths":
                self.answer(200, body(int(args[0])), args[:2])
            else:
                self.answer(404, b"not found")
        except OSError:  # the client went away
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
