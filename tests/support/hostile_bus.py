#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""A bus that misbehaves, for the tests of all who must live with one.

    hostile_bus.py SOCKET SCRIPT

It listens at SOCKET, prints "ready" and meets every client by the script:

    mute      accepts and never speaks
    silent    authenticates, and answers nothing behind that, not even Hello
    endless   answers the authentication with a line that does not end
    garbage   authenticates, then sends bytes that are no message
    vanish    authenticates, then closes at the first message

It ends with its standard input.
"""
import os
import socket
import sys
import threading

WELCOME = b"OK 0123456789abcdef0123456789abcdef\r\n"


def authenticate(client):
    """As far as a client needs it that asks for EXTERNAL, with its identity or without; False when it left."""
    for line in client.makefile("rb", buffering=0):
        words = line.lstrip(b"\0").split()
        if words[0] == b"BEGIN":
            return True
        if words == [b"AUTH", b"EXTERNAL"]:
            client.sendall(b"DATA\r\n")
        else:
            client.sendall({b"AUTH": WELCOME, b"DATA": WELCOME,
                            b"NEGOTIATE_UNIX_FD": b"AGREE_UNIX_FD\r\n"}.get(words[0], b"ERROR\r\n"))
    return False


def hold(client):
    while client.recv(65536):
        pass


def endless(client):
    while True:
        client.sendall(b"DATA" + b"0" * 65536)


def garbage(client):
    if authenticate(client):
        client.recv(1)
        client.sendall(os.urandom(1 << 20))
        hold(client)


SCRIPTS = {
    "mute": hold,
    "silent": lambda client: authenticate(client) and hold(client),
    "endless": endless,
    "garbage": garbage,
    "vanish": lambda client: authenticate(client) and client.recv(1),
}


def meet(client, script):
    with client:
        try:
            script(client)
        except OSError:
            pass  # it has enough of us


def main():
    path, script = sys.argv[1], SCRIPTS[sys.argv[2]]
    listener = socket.socket(socket.AF_UNIX)
    listener.bind(path)
    listener.listen(64)

    def serve():
        while True:
            threading.Thread(target=meet, args=(listener.accept()[0], script), daemon=True).start()

    threading.Thread(target=serve, daemon=True).start()
    os.write(1, b"ready\n")  # in one piece: nobody reads on
    sys.stdin.read()


if __name__ == "__main__":
    main()
