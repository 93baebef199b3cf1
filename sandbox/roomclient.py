# SPDX-License-Identifier: Apache-2.0
"""What tests and the demo use within a room to steer the platform and to look at what happened."""

import json
import os
import time
import urllib.error
import urllib.request

ROOM = os.environ.get("ROOM", "/run/room")
CONTROL = "http://127.0.0.1:9900"
POLL_SECONDS = 0.01
_opener = urllib.request.build_opener(urllib.request.ProxyHandler({}))


def _call(method, path, value=None):
    data = None if value is None else json.dumps(value).encode()
    request = urllib.request.Request(CONTROL + path, data, {"Content-Type": "application/json"}, method=method)
    try:
        with _opener.open(request, timeout=15) as reply:
            return json.load(reply)
    except urllib.error.HTTPError as error:
        raise RuntimeError(f"{method} {path}: {error.read().decode()}") from error


def state():
    """The platform's whole state."""
    return _call("GET", "/state")


def patch_state(changes):
    """Merges changes (RFC 7396) into the state; has taken effect on return."""
    _call("PATCH", "/state", changes)


def record(kind=None, **match):
    """The recorded entries in order; only those of the kind whose fields have the given values."""
    def fits(entry):
        return kind in (None, entry["kind"]) and all(entry.get(key) == value for key, value in match.items())
    with open(f"{ROOM}/record.jsonl", encoding="utf-8", errors="replace") as stream:
        return [entry for entry in (json.loads(line) for line in stream if line.endswith("\n")) if fits(entry)]


def clear_record():
    """Empties the record."""
    os.truncate(f"{ROOM}/record.jsonl", 0)


def add_fault(match, action, times=None):
    """Puts a fault in force, for a number of times or until clear_faults."""
    _call("POST", "/faults", {"match": match, "action": action, "times": times})


def clear_faults():
    """Ends all faults."""
    _call("DELETE", "/faults")


def wait_for(condition, timeout=10, what="the condition"):
    """Polls until condition() is true and returns its value; raises TimeoutError after timeout seconds."""
    deadline = time.monotonic() + timeout
    while True:
        value = condition()
        if value:
            return value
        if time.monotonic() > deadline:
            raise TimeoutError(f"{what} did not come about within {timeout} s")
        time.sleep(POLL_SECONDS)


def wait_record(predicate, timeout=10):
    """Waits for an entry for which predicate(entry) is true and returns the first one."""
    return wait_for(lambda: next((entry for entry in record() if predicate(entry)), None), timeout, "the record entry")


def syslog_lines():
    """What was logged, a datagram's lines each, as they came."""
    with open(f"{ROOM}/syslog", encoding="utf-8", errors="replace") as stream:
        return stream.read().splitlines()


def wait_syslog(substring, timeout=10):
    """Waits for a log line that contains the text and returns the first one."""
    return wait_for(lambda: next((line for line in syslog_lines() if substring in line), None), timeout,
                    f"a log line with {substring!r}")


def set_standin(name, stdout=None, rc=None, sleep=None, hook=None):
    """Says what a stand-in does from now on; what is None goes back to its default."""
    for suffix, value in (("stdout", stdout), ("rc", rc), ("sleep", sleep), ("hook", hook)):
        path = f"{ROOM}/standin/{name}.{suffix}"
        if value is None:
            if os.path.exists(path):
                os.remove(path)
            continue
        with open(path + ".new", "w", encoding="utf-8") as stream:
            stream.write(str(value))
        os.rename(path + ".new", path)
