"""A host that is ready to boot, and what a boot of it by the installed init script shows."""

import json
import os
from dataclasses import dataclass

from harness.waiting import wait_until

PLUGINS = "/usr/libexec/vantor/plugins"
NOTES = "/tmp/notes"


@dataclass
class Boot:
    """One boot: the init script's status and output, what was noted, what was logged."""

    status: int
    stdout: str
    stderr: str
    notes: list
    syslog: list

    def logged(self, text):
        return [message for message in self.syslog if message.text == text]


def lay_out_daemons(host):
    """Daemons that note that they were started, and how; the log daemon notes its reload too."""
    host.write("/usr/lib/nuvex/nvsyslog/bin/reload-noter", f"""#!/bin/sh
trap 'echo syslog reloaded >> {NOTES}; exit 0' USR1
echo $$ > /var/run/nuvex/nvsyslogd.pid
while :; do sleep 0.05; done
""", 0o755)
    host.script("/usr/lib/nuvex/nvsyslog/bin/nvsyslogd",
                f'echo "syslog daemon $*" >> {NOTES}',
                "mkdir -p /var/run/nuvex",
                "/usr/lib/nuvex/nvsyslog/bin/reload-noter </dev/null >/dev/null 2>&1 &",
                "until [ -s /var/run/nuvex/nvsyslogd.pid ]; do sleep 0.01; done")
    host.script("/etc/init.d/nvevtd", f'echo "event daemon $*" >> {NOTES}')


def describe_note(host):
    """The command "note add --text=...", which adds a line to the notes."""
    host.write("/usr/lib/nuvex/nvcli/note.json", json.dumps({"commands": [{
        "path": "note add", "summary": "Notes", "options": [
            {"name": "text", "kind": "string", "required": True}],
        "execute": ["/bin/sh", "-c", f"printf '%s\\n' \"$$1\" >> {NOTES}", "note", "${text}"],
    }]}))


def add_plugin(host, name, provides=(), requires=(), **metadata):
    """A JSON plugin that notes "plugin <name>"."""
    described = {"version": 3, "provides": list(provides), "requires": list(requires),
                 "run_once": False, "plugin_version": "1"}
    host.write(f"{PLUGINS}/{name}.json", json.dumps({
        "metadata": described | metadata,
        "operations": {"start": [f"note add --text='plugin {name}'"]}}))


def lay_out_host(host):
    """The daemons, the command and three plugins: first, then second; and once, a run-once one."""
    lay_out_daemons(host)
    describe_note(host)
    add_plugin(host, "second", requires=["ready"])
    add_plugin(host, "first", provides=["ready"])
    add_plugin(host, "once", requires=["ready"], run_once=True)


def boot(host):
    """Boots the host as its init does and waits until the log daemon was reloaded."""
    host.remove(NOTES)
    host.remove("/var/run/nuvex/nvsyslogd.pid")
    host.syslog.take()
    done = host.try_run("/etc/init.d/vantor", "start")
    wait_until(lambda: "syslog reloaded" in host.read(NOTES), "the log daemon is reloaded")
    return Boot(done.returncode, done.stdout, done.stderr, host.read(NOTES).splitlines(),
                host.syslog.take())


def links_of(host):
    """The links by which a SysV init finds the script, as "rc<level>.d/<S or K>"."""
    found = set()
    for level in "0123456S":
        folder = host.path(f"/etc/rc{level}.d")
        for name in os.listdir(folder) if os.path.isdir(folder) else []:
            if name.endswith("vantor"):
                found.add(f"rc{level}.d/{name[0]}")
    return found
