# SPDX-License-Identifier: Apache-2.0
"""The files of a managed terminal, written into the upper layers of the room's overlays."""

import json
import os
import secrets

HOST_NAME = "terminal-017"
SUDO_GID = 27
PLATFORM_GID = 2001


def write(path, text, mode=0o644):
    """Writes a text file with its parent directories."""
    os.makedirs(os.path.dirname(path), exist_ok=True)
    with open(path, "w", encoding="utf-8") as stream:
        stream.write(text)
    os.chmod(path, mode)


def _entries(path, clashes):
    """The lines of a passwd-like file that do not clash with what the room adds."""
    try:
        with open(path, encoding="utf-8", errors="surrogateescape") as stream:
            lines = stream.read().splitlines()
    except OSError:
        lines = ["root:x:0:0:root:/root:/bin/bash"] if path.endswith("passwd") else ["root:x:0:"]
    kept = []
    for line in lines:
        fields = line.split(":")
        if len(fields) > 2 and not clashes(fields[0], fields[2]):
            kept.append(line)
    return kept


def write_accounts(etc, user, uid):
    """passwd, group and nsswitch.conf: the outside accounts but those with the name or number of the room's user."""
    accounts = _entries("/etc/passwd", lambda name, number: name == user or number == str(uid))
    accounts.insert(0, f"{user}:x:{uid}:{uid}:张三,研发楼 A 座 3 层,,A10023:/home/{user}:/bin/bash")
    taken_names = {user, "sudo", "zent-users"}
    taken_numbers = {str(uid), str(SUDO_GID), str(PLATFORM_GID)}
    groups = _entries("/etc/group", lambda name, number: name in taken_names or number in taken_numbers)
    groups += [f"{user}:x:{uid}:", f"sudo:x:{SUDO_GID}:{user}", f"zent-users:x:{PLATFORM_GID}:{user}"]
    for name, lines in (("passwd", accounts), ("group", groups)):
        with open(f"{etc}/{name}", "w", encoding="utf-8", errors="surrogateescape") as stream:
            stream.write("\n".join(lines) + "\n")
    write(f"{etc}/nsswitch.conf", "passwd: files\ngroup: files\nshadow: files\nhosts: files dns\n")


def write_etc(etc, token):
    """Identity, names and the terminal's own settings below /etc."""
    write(f"{etc}/hostname", HOST_NAME + "\n")
    write(f"{etc}/hosts", f"127.0.0.1 localhost\n::1 localhost\n127.0.1.1 {HOST_NAME}\n"
                          "127.0.0.1 server.zent.test domain.zent.test\n")
    write(f"{etc}/resolv.conf", "nameserver 127.0.0.53\n")
    write(f"{etc}/os-version", "[Version]\nSystemName=Lumo\nProductType=Desktop\nMajorVersion=20\n"
                               "MinorVersion=1020\nOsBuild=11018.102\n")
    write(f"{etc}/machine-id", secrets.token_hex(16) + "\n")
    write(f"{etc}/zent/userinfo.json", json.dumps({
        "is_Domain": True,
        "server_host": "server.zent.test",
        "server_port": 443,
        "domain_host": "domain.zent.test",
        "domain_port": "443",
        "protocol": "https",
        "terminal_name": "研发中心-终端-017",
        "token": token,
    }, ensure_ascii=False, indent=4) + "\n")
    write(f"{etc}/zent/config.ini", "[config]\nControlCenterList=accounts, network, update, power\n")


def write_share(share, machine_id):
    """The machine identifier and the password rule of the start scene below /usr/share."""
    write(f"{share}/zent/machine.txt", machine_id + "\n")
    write(f"{share}/lumo/intranet-scene/pc_config.json",
          json.dumps({"pam_cracklib": {"minlen": 8, "retry": 3}}, indent=4) + "\n")


def write_home(home, user):
    """The user's home with the platform's cache directory, still without a current scene."""
    os.makedirs(f"{home}/{user}/.cache/vantor")
    os.makedirs(f"{home}/{user}/.config")
