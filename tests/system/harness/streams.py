"""What a program writes on a pipe, without waiting for its children to close their copies."""

import os
import threading
import uuid

from harness.waiting import LIMIT_SECONDS


class PipeRecorder:
    """Give `write_end` to a program; take() returns all that was written until then."""

    def __init__(self):
        self._read_end, self.write_end = os.pipe()
        self._data, self._arrived = bytearray(), threading.Condition()
        self._thread = threading.Thread(target=self._drain, daemon=True)
        self._thread.start()

    def _drain(self):
        while True:
            data = os.read(self._read_end, 1 << 16)
            if not data:
                os.close(self._read_end)
                return
            with self._arrived:
                self._data += data
                self._arrived.notify_all()

    def so_far(self):
        """What has arrived, none of it taken."""
        with self._arrived:
            return self._data.decode("utf-8", "surrogateescape")

    def take(self):
        """The text written so far: a mark of our own behind it shows where it ends."""
        mark = uuid.uuid4().bytes
        os.write(self.write_end, mark)
        with self._arrived:
            if not self._arrived.wait_for(lambda: mark in self._data, LIMIT_SECONDS):
                raise AssertionError("the pipe does not drain")
            text, _, rest = bytes(self._data).partition(mark)
            self._data[:] = rest
        return text.decode("utf-8", "surrogateescape")

    def close(self):
        """The thread ends with the last writer, which may be a process that outlives the run."""
        os.close(self.write_end)
