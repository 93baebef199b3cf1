# SPDX-License-Identifier: Apache-2.0
"""The control interface, by which tests and the demo steer the platform."""

import json

from platformlib.httpserver import Response


class Control:
    """Answers the calls of README.md's table."""

    def __init__(self, store, record, faults):
        self._store = store
        self._record = record
        self._faults = faults

    def handle(self, connection, request):
        """Answers one call; what cannot be done is 400 with the reason."""
        try:
            response = self._respond(request)
        except Exception as error:  # the caller is a test: it must hear what was wrong
            response = Response.of_json({"error": f"{type(error).__name__}: {error}"}, 400)
        connection.socket.sendall(response.encode())

    def _respond(self, request):
        call = (request.method, request.path)
        if call == ("GET", "/state"):
            with self._store.lock:
                return Response.of_json(self._store.state)
        if call == ("PATCH", "/state"):
            self._store.patch(json.loads(request.body))
        elif call == ("GET", "/record"):
            return Response.of_json(self._record.entries())
        elif call == ("DELETE", "/record"):
            self._record.clear()
        elif call == ("POST", "/faults"):
            self._faults.add(json.loads(request.body))
        elif call == ("DELETE", "/faults"):
            self._faults.clear()
        else:
            return Response.of_json({"error": f"no such call: {request.method} {request.path}"}, 404)
        return Response.of_json({})
