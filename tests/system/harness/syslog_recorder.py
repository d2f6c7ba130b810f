"""The host's system log: a real datagram socket at /dev/log that keeps what is sent to it."""

import os
import re
import socket
import threading
import uuid
from dataclasses import dataclass

from harness.waiting import LIMIT_SECONDS

# Facility user is 1, and the priority's number is facility * 8 + severity.
ERR, WARNING, INFO, DEBUG = 8 + 3, 8 + 4, 8 + 6, 8 + 7

_FORMAT = re.compile(rb"<(\d+)>\w{3} [ \d]\d \d\d:\d\d:\d\d ([^:]*): (.*)", re.DOTALL)


@dataclass
class SyslogMessage:
    """One message: the priority's number, who sent it, the text."""

    priority: int
    ident: str
    text: str


class SyslogRecorder:
    """Bound as FOLDER/log until closed; a thread drains it, so that no sender ever blocks."""

    def __init__(self, folder):
        self._received, self._arrived = [], threading.Condition()
        self._folder = os.open(folder, os.O_PATH | os.O_DIRECTORY)
        # Through the descriptor, the length of the folder's own name does not matter.
        self._name = f"/proc/self/fd/{self._folder}/log"
        self._socket = socket.socket(socket.AF_UNIX, socket.SOCK_DGRAM)
        self._socket.bind(self._name)
        os.chmod(self._name, 0o666)
        self._thread = threading.Thread(target=self._drain, daemon=True)
        self._thread.start()

    def _drain(self):
        while True:
            datagram = self._socket.recv(1 << 18)
            if not datagram:
                return
            with self._arrived:
                self._received.append(datagram)
                self._arrived.notify_all()

    def _send(self, datagram):
        with socket.socket(socket.AF_UNIX, socket.SOCK_DGRAM) as sender:
            sender.connect(self._name)
            sender.send(datagram)

    def hide(self):
        """Takes the socket away from /dev/log; messages of other senders no longer arrive."""
        os.rename(self._name, self._name + ".hidden")
        self._name += ".hidden"

    def take(self):
        """All messages sent until now, each handed out once."""
        mark = uuid.uuid4().bytes
        self._send(mark)
        with self._arrived:
            if not self._arrived.wait_for(lambda: mark in self._received, LIMIT_SECONDS):
                raise AssertionError("the system log does not drain")
            position = self._received.index(mark)
            datagrams = self._received[:position]
            del self._received[: position + 1]
        return [self._parse(datagram) for datagram in datagrams]

    @staticmethod
    def _parse(datagram):
        found = _FORMAT.fullmatch(datagram)
        if not found:
            raise AssertionError(f"not a syslog message: {datagram!r}")
        text = found[3].decode("utf-8", "surrogateescape")
        return SyslogMessage(int(found[1]), found[2].decode(), text)

    def close(self):
        self._send(b"")
        self._thread.join()
        self._socket.close()
        os.close(self._folder)
