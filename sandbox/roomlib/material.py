# SPDX-License-Identifier: Apache-2.0
"""What a room makes anew on opening: TLS material, compiled schemas and bus configurations."""

import glob
import os

from roomlib.terminal import write

CONTROL_CENTER_SCHEMA = """<?xml version="1.0" encoding="UTF-8"?>
<schemalist>
  <schema id="com.vantor.oxa.control-center" path="/com/vantor/oxa/control-center/">
    <key name="auto-login-visable" type="b"><default>true</default></key>
    <key name="nopasswd-login-visable" type="b"><default>true</default></key>
    <key name="hide-module" type="as"><default>[]</default></key>
  </schema>
</schemalist>
"""

BUS_CONFIGURATION = """<!DOCTYPE busconfig PUBLIC "-//freedesktop//DTD D-Bus Bus Configuration 1.0//EN"
 "http://www.freedesktop.org/standards/dbus/1.0/busconfig.dtd">
<busconfig>
  <type>{kind}</type>
  <listen>unix:path={socket}</listen>
  <auth>EXTERNAL</auth>
  <servicedir>/run/room/dbus/{kind}-services</servicedir>
  <policy context="default">
    <allow send_destination="*" eavesdrop="true"/>
    <allow eavesdrop="true"/>
    <allow own="*"/>
  </policy>
</busconfig>
"""

# One configuration for every certificate: the extensions are told apart by section.
OPENSSL_CONFIGURATION = """[req]
distinguished_name = name
prompt = no
[name]
[authority]
basicConstraints = critical, CA:true
keyUsage = critical, keyCertSign, cRLSign
subjectKeyIdentifier = hash
[server]
basicConstraints = critical, CA:false
extendedKeyUsage = serverAuth
subjectAltName = DNS:server.zent.test, DNS:domain.zent.test
[wrong_host]
basicConstraints = critical, CA:false
extendedKeyUsage = serverAuth
subjectAltName = DNS:elsewhere.zent.test
[client]
basicConstraints = critical, CA:false
extendedKeyUsage = clientAuth
[ca]
default_ca = past
[past]
database = {directory}/index.txt
rand_serial = yes
default_md = sha256
policy = anything
new_certs_dir = {directory}
x509_extensions = server
unique_subject = no
[anything]
commonName = supplied
"""

_NEW_KEY = ["-newkey", "ec", "-pkeyopt", "ec_paramgen_curve:P-256", "-nodes"]


def _certificate(tls, name, subject, section, authority=None):
    command = ["openssl", "req", "-x509", *_NEW_KEY, "-config", f"{tls}/openssl.cnf", "-extensions", section,
               "-subj", subject, "-days", "30", "-keyout", f"{tls}/{name}.key", "-out", f"{tls}/{name}.crt"]
    if authority:
        command += ["-CA", f"{tls}/{authority}.crt", "-CAkey", f"{tls}/{authority}.key"]
    return command


def tls_steps(tls, user):
    """The openssl commands for all material, as steps: the commands within one step do not depend on each other."""
    os.makedirs(tls)
    write(f"{tls}/openssl.cnf", OPENSSL_CONFIGURATION.format(directory=tls))
    write(f"{tls}/index.txt", "")
    return [
        [_certificate(tls, "ca", "/CN=Zent Room Authority", "authority"),
         _certificate(tls, "unknown_ca", "/CN=Unknown Authority", "authority"),
         ["openssl", "req", "-new", *_NEW_KEY, "-config", f"{tls}/openssl.cnf", "-subj", "/CN=server.zent.test",
          "-keyout", f"{tls}/expired.key", "-out", f"{tls}/expired.csr"]],
        [_certificate(tls, "server", "/CN=server.zent.test", "server", "ca"),
         _certificate(tls, "wrong_host", "/CN=elsewhere.zent.test", "wrong_host", "ca"),
         _certificate(tls, "client", f"/CN={user}", "client", "ca"),
         _certificate(tls, "other_ca", "/CN=server.zent.test", "server", "unknown_ca"),
         _certificate(tls, "other_client", f"/CN={user}", "client", "unknown_ca"),
         # Only "openssl ca" takes both dates of a certificate.
         ["openssl", "ca", "-batch", "-notext", "-config", f"{tls}/openssl.cnf", "-in", f"{tls}/expired.csr",
          "-cert", f"{tls}/ca.crt", "-keyfile", f"{tls}/ca.key", "-startdate", "20200101000000Z",
          "-enddate", "20210101000000Z", "-out", f"{tls}/expired.crt"]],
    ]


def install_client_material(tls, zent):
    """Puts the authority, the client certificate and its key where the client looks for them."""
    for source, target, mode in (("ca.crt", "clientapi_ca.crt", 0o644), ("client.crt", "QEL_Zent.pem", 0o644),
                                 ("client.key", ".QEL_Zent.key", 0o600)):
        with open(f"{tls}/{source}", encoding="ascii") as stream:
            write(f"{zent}/{target}", stream.read(), mode)


def schema_command(directory, tree):
    """Writes the control center's schema and those the tree ships; returns the command that compiles them."""
    write(f"{directory}/com.vantor.oxa.control-center.gschema.xml", CONTROL_CENTER_SCHEMA)
    for path in glob.glob(f"{tree}/data/**/*.gschema.xml", recursive=True):
        os.symlink(path, f"{directory}/{os.path.basename(path)}")
    compilers = glob.glob("/usr/bin/glib-compile-schemas") + glob.glob("/usr/lib/*/glib-2.0/glib-compile-schemas")
    if not compilers:
        raise FileNotFoundError("glib-compile-schemas is not installed (package libglib2.0-bin)")
    return [compilers[0], directory]


def bus_command(room, kind, socket_path):
    """Writes a bus configuration; returns the command that runs the bus (its address goes to descriptor 3)."""
    os.makedirs(f"{room}/dbus/{kind}-services")
    write(f"{room}/dbus/{kind}.conf", BUS_CONFIGURATION.format(kind=kind, socket=socket_path))
    return ["dbus-daemon", f"--config-file={room}/dbus/{kind}.conf", "--nofork", "--nopidfile", "--nosyslog",
            "--print-address=3"]
