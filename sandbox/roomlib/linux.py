# SPDX-License-Identifier: Apache-2.0
"""The Linux system calls that a room needs and that Python 3.11 does not offer."""

import ctypes
import fcntl
import os
import socket
import struct

CLONE_NEWNS = 0x00020000
CLONE_NEWUTS = 0x04000000
CLONE_NEWIPC = 0x08000000
CLONE_NEWUSER = 0x10000000
CLONE_NEWPID = 0x20000000
CLONE_NEWNET = 0x40000000

MS_NOSUID = 0x2
MS_NODEV = 0x4
MS_NOEXEC = 0x8
MS_BIND = 0x1000
MS_REC = 0x4000
MS_PRIVATE = 0x40000

_MOUNT_SETATTR = 442
_AT_RECURSIVE = 0x8000
_AT_FDCWD = -100
_MOUNT_ATTR_RDONLY = 1
_PR_SET_PDEATHSIG = 1
_PR_SET_SECUREBITS = 28
_SECURE_NOROOT_LOCKED = 0x3
_CAPABILITY_VERSION_3 = 0x20080522

_libc = ctypes.CDLL(None, use_errno=True)


def _check(result, what):
    if result < 0:
        number = ctypes.get_errno()
        raise OSError(number, os.strerror(number), what)
    return result


def _bytes(text):
    return None if text is None else os.fsencode(text)


def unshare(flags):
    """Moves this process into new namespaces; raises OSError where the kernel forbids it."""
    _check(_libc.unshare(ctypes.c_int(flags)), "unshare")


def mount(source, target, kind=None, flags=0, data=None):
    """mount(2); raises OSError naming the target."""
    _check(_libc.mount(_bytes(source), _bytes(target), _bytes(kind), ctypes.c_ulong(flags), _bytes(data)), target)


def set_read_only(target, read_only):
    """Makes every mount at and below the target read-only, or takes that away."""
    set_bits, clear_bits = (_MOUNT_ATTR_RDONLY, 0) if read_only else (0, _MOUNT_ATTR_RDONLY)
    attributes = ctypes.create_string_buffer(struct.pack("QQQQ", set_bits, clear_bits, 0, 0), 32)
    _check(_libc.syscall(ctypes.c_long(_MOUNT_SETATTR), ctypes.c_int(_AT_FDCWD), ctypes.c_char_p(_bytes(target)),
                         ctypes.c_uint(_AT_RECURSIVE), attributes, ctypes.c_size_t(32)), target)


def die_with_parent(signal_number):
    """Has the kernel send this process a signal when its parent ends."""
    _check(_libc.prctl(_PR_SET_PDEATHSIG, ctypes.c_ulong(signal_number), 0, 0, 0), "prctl")


def map_ids(inside_uid, outside_uid, inside_gid, outside_gid):
    """Maps one user and one group into the user namespace that was just made."""
    for name, text in (("setgroups", "deny"), ("uid_map", f"{inside_uid} {outside_uid} 1"),
                       ("gid_map", f"{inside_gid} {outside_gid} 1")):
        with open(f"/proc/self/{name}", "w", encoding="ascii") as stream:
            stream.write(text)


def drop_capabilities():
    """Gives up every capability, also the ones that user id 0 would get back on exec."""
    _check(_libc.prctl(_PR_SET_SECUREBITS, ctypes.c_ulong(_SECURE_NOROOT_LOCKED), 0, 0, 0), "prctl")
    header = ctypes.create_string_buffer(struct.pack("Ii", _CAPABILITY_VERSION_3, 0), 8)
    _check(_libc.capset(header, ctypes.create_string_buffer(24)), "capset")


def bring_loopback_up():
    """Sets the loopback interface of this network namespace up."""
    siocgifflags, siocsifflags, iff_up = 0x8913, 0x8914, 0x1
    with socket.socket(socket.AF_INET, socket.SOCK_DGRAM) as control:
        answer = fcntl.ioctl(control, siocgifflags, struct.pack("16sh22x", b"lo", 0))
        flags = struct.unpack_from("h", answer, 16)[0]
        fcntl.ioctl(control, siocsifflags, struct.pack("16sh22x", b"lo", flags | iff_up))
