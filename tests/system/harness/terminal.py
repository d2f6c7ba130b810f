"""A pseudo-terminal for interactive runs, driven with pexpect."""

import errno
import io
import os
import pty
import termios
import uuid

import pexpect.fdpexpect

from harness.waiting import LIMIT_SECONDS

LOCAL_MODES = 3  # the index of these flags in what tcgetattr() returns


def written_on(master):
    """Closes the operator's end and returns all that was written, once no other end is open.

    One read() may return a part of it: the kernel passes on what is written piece by piece.
    """
    written = b""
    with open(master, "rb", buffering=0) as operator:
        while True:
            try:
                piece = operator.read(1 << 16)
            except OSError as error:
                if error.errno != errno.EIO:  # what Linux says when no other end is open
                    raise
                return written
            if not piece:
                return written
            written += piece


class Terminal:
    """Give `slave` to a run as its standard input and output.

    The terminal passes output on as it is, so that transcripts hold the program's own bytes; in
    all else it behaves as a console does. It is no process's controlling terminal to begin with.
    """

    def __init__(self):
        self._master, self.slave = pty.openpty()
        attributes = self.attributes()
        attributes[1] &= ~termios.OPOST
        self.set_attributes(attributes)
        self._record = io.BytesIO()
        self._child = pexpect.fdpexpect.fdspawn(self._master, timeout=LIMIT_SECONDS)
        self._child.logfile_read = self._record

    def attributes(self):
        return termios.tcgetattr(self.slave)

    def set_attributes(self, attributes):
        termios.tcsetattr(self.slave, termios.TCSANOW, attributes)

    def modes(self, *flags):
        """Whether each of the local modes is set."""
        return [bool(self.attributes()[LOCAL_MODES] & flag) for flag in flags]

    def takes_keys(self):
        """Whether keys reach the program one by one and unseen: it is in a prompt."""
        return self.modes(termios.ICANON, termios.ECHO) == [False, False]

    def expect(self, text):
        """Waits until the text has been written."""
        self._child.expect_exact(text)

    def type(self, text):
        self._child.send(text)

    def answer(self, run, keys, redrawn):
        """Waits for a prompt, types the keys and waits for the line drawn in answer.

        The line is written after the modes are set back, so the next prompt is not mistaken.
        """
        run.wait_until(self.takes_keys, "a prompt takes keys")
        self.type(keys)
        self.expect(redrawn)

    def transcript(self):
        """All that was written on the terminal until now."""
        mark = f"<{uuid.uuid4()}>"
        os.write(self.slave, mark.encode())
        self.expect(mark)
        return self._record.getvalue().decode().replace(mark, "")

    def close(self):
        os.close(self.slave)
        self._child.close()
