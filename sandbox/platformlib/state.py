# SPDX-License-Identifier: Apache-2.0
"""What the simulated platform knows: served data, switches, faults and the record of the room."""

import base64
import copy
import fnmatch
import json
import os
import threading
import time

RECORD = "/run/room/record.jsonl"
USERINFO = "/etc/zent/userinfo.json"


def _messages():
    texts = [
        ("系统维护通知", "今晚 22:00 至 24:00 将进行域管平台升级，请提前保存工作内容。", "2026-11-24T08:30:00Z", ""),
        ("安全检查提醒", "请于本周五前完成终端安全基线检查。", "2026-11-23T02:15:00Z", ""),
        ("密码到期提醒", "您的域密码将在 7 天后到期，请及时修改。", "2026-11-22T16:05:00Z", ""),
        ("策略更新", "终端外设管控策略已更新。", "2026-11-20T01:00:00Z", "2026-11-20T03:12:00Z"),
        ("欢迎使用", "欢迎使用域管平台。", "2026-11-02T09:45:00Z", "2026-11-02T09:50:00Z"),
    ]
    return [{"uuid": f"6f0c2a9e-51b7-4d3a-9c44-00000000000{index}", "uid": "zhangsan", "send_uid": "admin",
             "title": title, "content": content, "created_at": created, "read_at": read}
            for index, (title, content, created, read) in enumerate(texts, 1)]


def _token():
    """The terminal's token as the terminal info file holds it."""
    try:
        with open(USERINFO, encoding="utf-8") as stream:
            return json.load(stream).get("token", "")
    except (OSError, ValueError):
        return ""


def default_state():
    """The state that the platform starts with."""
    person = {
        "gecos": "张三,研发楼 A 座 3 层,,A10023", "supplementtary_groups": [{"name": "研发一部"}], "id": 10023,
        "client_name": "研发中心-终端-017", "permissions": ["login", "change_password"], "password": "Zent@2026",
    }
    return {
        "users": {name: copy.deepcopy(person) for name in {"zhangsan", os.environ.get("USER", "").replace("@", "")}
                  if name},
        "administrator": {"password": "Admin@2026"},
        "organisation": {"name": "示例科技集团有限公司"},
        "joined": True,
        "taken_names": ["研发中心-终端-001"],
        "pc_name_rules": {"regular_expression": "/^[一-龥A-Za-z0-9-]{2,30}$/"},
        "scenes": [{"scene_name": "内网场景", "scene_code": "intranet-scene"},
                   {"scene_name": "外网场景", "scene_code": "internet-scene"},
                   {"scene_name": "研发场景", "scene_code": "develop-scene"}],
        "token": _token(),
        "messages": _messages(),
        "connections": [{
            "IsPrimaryConnection": True, "ConnectionType": "wired", "Device": "eth0",
            "HwAddress": "5C:3A:45:1E:7B:90", "Speed": "1000 Mb/s",
            "Ip4": {"Address": "10.20.30.117", "Mask": "255.255.255.0", "Gateways": ["10.20.30.1"],
                    "Dnses": ["10.20.1.53", "10.20.2.53"]},
        }],
        "iam": {"enable": True, "read_only": False, "min_length": 8},
        "zentg": {"result": 0},
        "tls": {"certificate": "server", "demand_client_certificate": False, "newest": ""},
        "listening": True,
        "black_hole": False,
        "services": {"network": True, "iam": True, "zentg": True, "login1": True},
    }


def merge_patch(target, patch):
    """RFC 7396: the target with the patch applied; neither argument is changed."""
    if not isinstance(patch, dict):
        return patch
    result = dict(target) if isinstance(target, dict) else {}
    for key, value in patch.items():
        if value is None:
            result.pop(key, None)
        else:
            result[key] = merge_patch(result.get(key), value)
    return result


class Store:
    """The state, guarded by one lock, and the listeners to its changes."""

    def __init__(self):
        self.lock = threading.RLock()
        self.state = default_state()
        self._listeners = []

    def on_change(self, listener):
        """Calls listener(old, new) after every patch, before the patch is answered."""
        self._listeners.append(listener)

    def patch(self, changes):
        """Merges changes into the state and tells the listeners."""
        with self.lock:
            old, self.state = self.state, merge_patch(self.state, changes)
            new = copy.deepcopy(self.state)
        for listener in self._listeners:
            listener(old, new)


class Record:
    """The room's record file, shared with the stand-ins: every line is written at once."""

    def __init__(self, path=RECORD):
        self._path = path
        self._stream = open(path, "ab", buffering=0)

    def add(self, kind, **fields):
        """Appends one entry."""
        entry = {"kind": kind, "time": round(time.time(), 6), **fields}
        self._stream.write((json.dumps(entry, ensure_ascii=False) + "\n").encode("utf-8", "surrogateescape"))

    def entries(self):
        """Everything recorded since the last clear, in order."""
        with open(self._path, encoding="utf-8", errors="replace") as stream:
            return [json.loads(line) for line in stream if line.endswith("\n")]

    def clear(self):
        """Empties the record. Writers append, so they go on at its start."""
        os.truncate(self._path, 0)


class Faults:
    """The faults in force."""

    def __init__(self):
        self._lock = threading.Lock()
        self._faults = []

    def add(self, fault):
        """Puts a fault in force; raises ValueError when it could never apply."""
        match = fault.get("match")
        if not isinstance(match, dict) or not ("path" in match or "dbus" in match):
            raise ValueError("a fault's match needs path or dbus")
        if not isinstance(fault.get("action"), dict):
            raise ValueError("a fault needs an action")
        if "body_base64" in fault["action"]:
            base64.b64decode(fault["action"]["body_base64"], validate=True)
        with self._lock:
            self._faults.append({"match": match, "action": fault["action"], "times": fault.get("times")})

    def clear(self):
        """Ends all faults."""
        with self._lock:
            self._faults.clear()

    def take(self, **event):
        """The action of the newest fault that matches the event, counted as used once; None without one."""
        with self._lock:
            for fault in reversed(self._faults):
                match = fault["match"]
                if all(key in event and fnmatch.fnmatchcase(event[key], match[key]) for key in match):
                    if fault["times"] is not None:
                        fault["times"] -= 1
                        if fault["times"] <= 0:
                            self._faults.remove(fault)
                    return fault["action"]
        return None
