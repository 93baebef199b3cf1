# SPDX-License-Identifier: Apache-2.0
"""A small HTTP/1.1 server that speaks TLS and plain HTTP on the same port."""

import base64
import functools
import itertools
import json
import socket
import ssl
import threading
import time
import urllib.parse
import zlib
from dataclasses import dataclass, field
from http import HTTPStatus

TLS_HANDSHAKE = 0x16
HANDSHAKE_SECONDS = 10
_numbers = itertools.count(1)


class Closed(Exception):
    """The connection is over."""


@dataclass
class Request:
    """One request as it was read."""
    method: str
    scheme: str
    path: str
    raw_query: str
    headers: dict
    body: bytes
    client_certificate: str | None
    connection: int
    query: dict = field(default_factory=dict)
    keep_alive: bool = True

    def json(self):
        """The body as a JSON object; empty when it is none."""
        try:
            value = json.loads(self.body)
        except ValueError:
            return {}
        return value if isinstance(value, dict) else {}


@dataclass
class Response:
    """One answer; the length is filled in on sending."""
    status: int = 200
    body: bytes = b""
    headers: dict = field(default_factory=lambda: {"Content-Type": "application/json; charset=utf-8"})

    @classmethod
    def of_json(cls, value, status=200, **headers):
        """An answer with a JSON body; underscores in header names stand for dashes."""
        response = cls(status, json.dumps(value, ensure_ascii=False).encode())
        response.headers.update((name.replace("_", "-"), str(text)) for name, text in headers.items())
        return response

    def encode(self):
        """Head and body as one piece, so that it leaves in one write."""
        try:
            phrase = HTTPStatus(self.status).phrase
        except ValueError:
            phrase = "Unknown"
        lines = [f"HTTP/1.1 {self.status} {phrase}"]
        lines += [f"{name}: {value}" for name, value in self.headers.items()]
        lines.append(f"Content-Length: {len(self.body)}")
        return ("\r\n".join(lines) + "\r\n\r\n").encode("utf-8") + self.body


class Connection:
    """Reads requests from and writes answers to one client."""

    def __init__(self, sock):
        self.number = next(_numbers)
        self.socket = sock
        self.scheme = "http"
        self.certificate = None
        self._buffer = b""

    def start_tls(self, context):
        """Does the handshake when the client's first byte asks for one; raises ssl.SSLError when it fails."""
        self.socket.settimeout(HANDSHAKE_SECONDS)
        first = self.socket.recv(1, socket.MSG_PEEK)
        if first and first[0] == TLS_HANDSHAKE:
            self.socket = context.wrap_socket(self.socket, server_side=True)
            self.scheme = "https"
            subject = (self.socket.getpeercert() or {}).get("subject")
            if subject is not None:
                self.certificate = ",".join(f"{key}={value}" for part in subject for key, value in part)
        self.socket.settimeout(None)

    def _fill(self):
        piece = self.socket.recv(65536)
        if not piece:
            raise Closed
        self._buffer += piece

    def _take(self, length):
        while len(self._buffer) < length:
            self._fill()
        piece, self._buffer = self._buffer[:length], self._buffer[length:]
        return piece

    def _take_until(self, mark):
        while mark not in self._buffer:
            self._fill()
        piece, _, self._buffer = self._buffer.partition(mark)
        return piece

    def read(self):
        """The next request; raises Closed at the end and ValueError for what is no HTTP."""
        head = self._take_until(b"\r\n\r\n").decode("utf-8", "surrogateescape")
        first, *lines = head.split("\r\n")
        method, rest = first.split(" ", 1)
        target, version = rest.rsplit(" ", 1)
        headers = {}
        for line in lines:
            name, value = line.split(":", 1)
            headers[name.strip().lower()] = value.strip()
        path, _, raw_query = target.partition("?")
        body = self._read_body(headers)
        wish = headers.get("connection", "").lower()
        return Request(method, self.scheme, urllib.parse.unquote(path), raw_query, headers, body, self.certificate,
                       self.number, dict(urllib.parse.parse_qsl(raw_query, keep_blank_values=True)),
                       wish == "keep-alive" if version == "HTTP/1.0" else wish != "close")

    def _read_body(self, headers):
        if headers.get("expect", "").lower() == "100-continue":
            self.socket.sendall(b"HTTP/1.1 100 Continue\r\n\r\n")
        if headers.get("transfer-encoding", "").lower() == "chunked":
            body = b""
            while length := int(self._take_until(b"\r\n").split(b";")[0], 16):
                body += self._take(length)
                self._take(2)
            self._take_until(b"\r\n")
            return body
        return self._take(int(headers.get("content-length", "0")))

    def wait_for_end(self):
        """Blocks until the client gives up."""
        while self.socket.recv(65536):
            pass
        raise Closed

    def close(self):
        """Ends the connection; a thread that blocks in it notices at once."""
        try:
            self.socket.shutdown(socket.SHUT_RDWR)
        except OSError:
            pass
        self.socket.close()


def answer_with_fault(connection, action, respond):
    """Answers one request as a fault says; respond makes the regular answer."""
    time.sleep(action.get("delay_ms", 0) / 1000)
    if action.get("hang"):
        connection.wait_for_end()
    if action.get("drop") == "before":
        raise Closed
    if "gzip_mib" in action:
        action = {**action, "body_base64": base64.b64encode(compressed(action["gzip_mib"])),
                  "headers": {"Content-Encoding": "gzip"}}
    if "body_base64" in action:
        body = base64.b64decode(action["body_base64"])
    elif "body_bytes" in action:
        body = b"x" * action["body_bytes"]
    else:
        body = action.get("body", "").encode()
    replaced = any(key in action for key in ("status", "body", "body_base64", "body_bytes"))
    response = Response(action.get("status", 200), body) if replaced else respond()
    response.headers.update(action.get("headers", {}))
    if action.get("endless"):
        send_endless(connection)
    data = response.encode()
    if "drip_ms" in action:
        drip(connection, data, action["drip_ms"] / 1000)
    if action.get("drop") == "mid":
        # Half of the body, or of the head where there is no body: never a complete answer.
        connection.socket.sendall(data[:len(data) - (len(response.body) + 1) // 2 if response.body else len(data) // 2])
        raise Closed
    connection.socket.sendall(data)


@functools.lru_cache
def compressed(mebibytes):
    """That many MiB of blanks, about a thousandth of it when compressed."""
    packer = zlib.compressobj(wbits=zlib.MAX_WBITS | 16)
    return b"".join([packer.compress(b" " * 2**20) for _ in range(mebibytes)] + [packer.flush()])


def send_endless(connection):
    """Sends a body until the client has had enough of it."""
    connection.socket.sendall(b"HTTP/1.1 200 OK\r\nConnection: close\r\n\r\n")
    while True:
        connection.socket.sendall(b"x" * 65536)


def drip(connection, data, seconds):
    """Sends the data one byte at a time, until the client has had enough of it."""
    for index in range(len(data)):
        connection.socket.sendall(data[index:index + 1])
        time.sleep(seconds)
    raise Closed


class Server:
    """Listens on some ports and runs a thread for each connection."""

    def __init__(self, ports, handler, host="0.0.0.0", on_tls_error=None):
        """handler(connection, request) answers; on_tls_error(connection, text) hears of failed handshakes."""
        self._address = [(host, port) for port in ports]
        self._handler = handler
        self._on_tls_error = on_tls_error
        self._context = None
        self._lock = threading.Lock()
        self._listeners = []
        self._connections = set()

    def use_tls(self, certificate, key, authority, demand, newest=None):
        """Serves TLS with this material from now on; connections made with other material end. newest: the last version
        of TLS that is served."""
        context = ssl.SSLContext(ssl.PROTOCOL_TLS_SERVER)
        if newest:
            context.set_ciphers("ALL:@SECLEVEL=0")
            context.minimum_version = ssl.TLSVersion.TLSv1
            context.maximum_version = ssl.TLSVersion[newest]
        context.load_cert_chain(certificate, key)
        context.load_verify_locations(authority)
        context.verify_mode = ssl.CERT_REQUIRED if demand else ssl.CERT_OPTIONAL
        self._context = context
        self._close_connections(lambda connection: connection.scheme == "https")

    def listen(self):
        """Starts accepting; does nothing when it does already."""
        if self._listeners:
            return
        for address in self._address:
            listener = socket.create_server(address, backlog=128)
            self._listeners.append(listener)
            threading.Thread(target=self._accept, args=(listener,), daemon=True).start()

    def refuse(self):
        """Stops listening and ends every connection."""
        for listener in self._listeners:
            listener.shutdown(socket.SHUT_RDWR)
            listener.close()
        self._listeners = []
        self._close_connections(lambda connection: True)

    def _close_connections(self, chosen):
        with self._lock:
            connections = [connection for connection in self._connections if chosen(connection)]
        for connection in connections:
            connection.close()

    def _accept(self, listener):
        while True:
            try:
                sock, _ = listener.accept()
            except OSError:
                return
            sock.setsockopt(socket.IPPROTO_TCP, socket.TCP_NODELAY, 1)
            connection = Connection(sock)
            with self._lock:
                self._connections.add(connection)
            threading.Thread(target=self._serve, args=(connection,), daemon=True).start()

    def _serve(self, connection):
        try:
            connection.start_tls(self._context)
            while True:
                request = connection.read()
                self._handler(connection, request)
                if not request.keep_alive:
                    break
        except ssl.SSLError as error:
            if self._on_tls_error:
                self._on_tls_error(connection, error.reason or str(error))
        except (Closed, OSError, ValueError):
            pass
        finally:
            with self._lock:
                self._connections.discard(connection)
            connection.close()
