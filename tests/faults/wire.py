# SPDX-License-Identifier: Apache-2.0
"""Requests as the tool sends them, and counting what comes back, without knowing the messages."""

import os
import socket
import struct
import tempfile
import threading

import host as hosts


def recorded_request(box, *words):
    """The bytes of the first request that a command of the tool sends to its daemon."""
    with tempfile.TemporaryDirectory(prefix="tovi-faults-") as root:
        os.mkdir(f"{root}/run")
        listener = socket.socket(socket.AF_UNIX)
        listener.bind(f"{root}/run/lumod.sock")
        listener.listen()
        recorded = []

        def record():
            while True:
                try:
                    peer, _ = listener.accept()
                except OSError:
                    return
                with peer:
                    data = peer.recv(1 << 20)
                    if data:
                        recorded.append(data)

        recorder = threading.Thread(target=record)
        recorder.start()
        box.run(hosts.programs() / "tovicli", "storage", "internal", "lumo", *words, TOVI_ROOT=root)
        listener.shutdown(socket.SHUT_RDWR)
        recorder.join()
        listener.close()
    assert len(recorded[0]) == message_size(recorded[0]), "the request did not come in one piece"
    return recorded[0]


def message_size(data):
    """The size of the message that data begins with, by the table of segments at its head; None: not enough data."""
    if len(data) < 4:
        return None
    segments = struct.unpack_from("<I", data)[0] + 1
    head = (4 + 4 * segments + 7) // 8 * 8
    if len(data) < head:
        return None
    return head + 8 * sum(struct.unpack_from(f"<{segments}I", data, 4))


class Client:
    """One connection to the daemon."""

    def __init__(self, box, timeout=60):
        self.socket = socket.socket(socket.AF_UNIX)  # closed by close()
        self.socket.settimeout(timeout)
        self.socket.connect(str(box.root / "run/lumod.sock"))
        self.data = b""

    def send(self, data):
        self.socket.sendall(data)

    def fill(self, data):
        """Sends for as long as the kernel takes it at once. @return how many bytes that were"""
        self.socket.setblocking(False)
        sent = 0
        try:
            while sent < 64 << 20:
                sent += self.socket.send(data)
        except BlockingIOError:
            return sent
        finally:
            self.socket.setblocking(True)
        return sent

    def messages(self, count):
        """Takes that many messages."""
        taken = []
        while len(taken) < count:
            size = message_size(self.data)
            if size is not None and len(self.data) >= size:
                taken.append(self.data[:size])
                self.data = self.data[size:]
                continue
            more = self.socket.recv(1 << 20)
            assert more, "the daemon closed the connection"
            self.data += more
        return taken

    def close(self):
        self.socket.close()
