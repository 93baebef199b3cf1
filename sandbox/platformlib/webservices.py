# SPDX-License-Identifier: Apache-2.0
"""The platform's HTTP services: management API, scenes and notification service."""

import copy
import time

from platformlib.httpserver import Response, answer_with_fault

AUTHORITY = "/run/room/tls/ca.crt"
NOTIFICATION = "/notification/v2"
PROTECTED = ("/uim/v3/client/", "/apiauth/")


def _refusal(message, code=1):
    return Response.of_json({"code": code, "msg": message, "message": message})


def _number(text, fallback):
    try:
        return int(text)
    except (TypeError, ValueError):
        return fallback


class WebServices:
    """Answers requests from the state; records each one first and lets faults take their place."""

    def __init__(self, store, record, faults):
        self._store = store
        self._record = record
        self._faults = faults
        client = "/uim/v3/client"
        self._routes = {
            ("GET", f"{client}/account"): self._account,
            ("GET", f"{client}/uim_department/id"): self._organisation,
            ("GET", f"{client}/status"): self._status,
            ("POST", f"{client}/auth"): self._auth,
            ("POST", f"{client}/join"): self._join,
            ("POST", f"{client}/remove"): self._remove,
            ("POST", f"{client}/remove_status"): self._remove_status,
            ("GET", f"{client}/pc/verify/name"): self._verify_name,
            ("GET", f"{client}/config"): self._config,
            ("GET", "/apiauth/v1/client/ca_cert"): self._ca_cert,
            ("GET", "/api/client/area/scenes"): self._scenes,
            ("GET", f"{NOTIFICATION}/list"): self._list,
            ("PUT", f"{NOTIFICATION}/read"): self._read,
            ("PUT", f"{NOTIFICATION}/read_all"): self._read_all,
        }

    def handle(self, connection, request):
        """Records and answers one request."""
        self._record.add(
            "http", method=request.method, scheme=request.scheme, path=request.path, query=request.query,
            raw_query=request.raw_query, headers=request.headers, body=request.body.decode("utf-8", "replace"),
            client_certificate=request.client_certificate, connection=request.connection)
        action = self._faults.take(path=request.path, method=request.method)
        if action is None:
            connection.socket.sendall(self._respond(request).encode())
        else:
            answer_with_fault(connection, action, lambda: self._respond(request))

    def tls_failed(self, connection, reason):
        """Records a handshake that failed."""
        self._record.add("tls", error=reason, connection=connection.number)

    def _respond(self, request):
        if request.path.startswith(PROTECTED) and request.client_certificate is None:
            return Response.of_json({"code": 403, "msg": "client certificate required"}, 403)
        route = self._routes.get((request.method, request.path))
        if route is None:
            known = any(path == request.path for _, path in self._routes)
            return Response.of_json({"code": 405 if known else 404}, 405 if known else 404)
        with self._store.lock:
            state = self._store.state
            if request.path.startswith(NOTIFICATION) and request.headers.get("x-xsrf-token", "") != state["token"]:
                return Response.of_json({"code": 401, "msg": "invalid token"}, 401)
            return route(state, request)

    # Management API

    @staticmethod
    def _account(state, request):
        user = state["users"].get(request.json().get("username", ""))
        if user is None:
            return _refusal("用户不存在")
        shown = {key: value for key, value in user.items() if key != "password"}
        return Response.of_json({"code": 0, "data": {"user": shown}})

    @staticmethod
    def _organisation(state, request):
        if request.query.get("id") != "1":
            return _refusal("组织不存在")
        return Response.of_json({"code": 0, "data": state["organisation"]})

    @staticmethod
    def _status(state, request):
        return Response.of_json({"code": 0, "msg": "", "data": {
            "joined": state["joined"], "keyword": request.query.get("keyword", "")}})

    @staticmethod
    def _auth(state, request):
        body = request.json()
        user = state["users"].get(body.get("username", ""))
        if user is None or user["password"] != body.get("password"):
            return _refusal("用户名或密码错误")
        return Response.of_json({"code": 0, "msg": "", "data": {"token": state["token"]}})

    @staticmethod
    def _join(state, request):
        state["joined"] = True
        return Response.of_json({"code": 0, "msg": "", "data": {"name": request.json().get("name", "")}})

    @staticmethod
    def _remove(state, _request):
        state["joined"] = False
        return Response.of_json({"code": 0, "msg": "", "data": {}})

    @staticmethod
    def _remove_status(state, request):
        if request.json().get("password") != state["administrator"]["password"]:
            return _refusal("管理员账号或密码错误")
        return Response.of_json({"code": 0, "msg": "", "data": {"result": True}})

    @staticmethod
    def _verify_name(state, request):
        if request.query.get("pc_name", "") in ("", *state["taken_names"]):
            return _refusal("终端名称已存在")
        return Response.of_json({"code": 0, "msg": ""})

    @staticmethod
    def _config(state, request):
        if request.query.get("key") != "pc_name_rules":
            return _refusal("配置项不存在")
        # The rules travel as a JSON text within the JSON reply.
        rules = Response.of_json(state["pc_name_rules"]).body.decode()
        return Response.of_json({"code": 0, "message": rules})

    @staticmethod
    def _ca_cert(_state, _request):
        with open(AUTHORITY, encoding="ascii") as stream:
            return Response.of_json({"code": 0, "msg": "", "data": stream.read()})

    @staticmethod
    def _scenes(state, _request):
        return Response.of_json({"code": 0, "message": state["scenes"]})

    # Notification service

    @staticmethod
    def _list(state, request):
        query = request.query
        chosen = [message for message in state["messages"]
                  if message["uid"] == query.get("uid", "")
                  and (query.get("is_not_read") != "1" or not message["read_at"])]
        chosen.sort(key=lambda message: message["created_at"], reverse=query.get("desc", "1") != "0")
        limit, offset = _number(query.get("limit"), 10), _number(query.get("offset"), 0)
        return Response.of_json(chosen[offset:offset + limit], X_Total_Count=len(chosen), X_Total_Limit=limit,
                                X_Total_Offset=offset)

    @staticmethod
    def _mark(state, chosen):
        now = time.strftime("%Y-%m-%dT%H:%M:%SZ", time.gmtime())
        messages = copy.deepcopy(state["messages"])
        found = [message for message in messages if chosen(message)]
        for message in found:
            message["read_at"] = message["read_at"] or now
        state["messages"] = messages
        return len(found)

    def _read(self, state, request):
        uuid = request.json().get("uuid")
        if not self._mark(state, lambda message: message["uuid"] == uuid):
            return Response.of_json({"code": 404, "msg": "消息不存在"}, 404)
        return Response.of_json({"code": 0, "msg": ""})

    def _read_all(self, state, request):
        uid = request.json().get("uid")
        self._mark(state, lambda message: message["uid"] == uid)
        return Response.of_json({"code": 0, "msg": ""})
