"""The sample host: what lies in the private root before its first boot."""

import os
import pathlib
import subprocess

EXAMPLES = pathlib.Path(__file__).resolve().parent.parent
INCLUDE = EXAMPLES.parent / "include"
PLUGINS = "/usr/libexec/vantor/plugins"
STATE = "/var/run/sample-host"
SERVICES = "/var/log/services"
PID_FILE = "/var/run/nuvex/nvsyslogd.pid"
SETTINGS = "/etc/sample-host/settings"
JOURNAL = "/var/lib/sample-host/journal"
# Where each file of command descriptions goes; the framework looks into all four folders.
DESCRIPTIONS = {
    "/usr/lib/nuvex/nvcli": ["system.json"],
    "/usr/lib/nuvex/nvcli/int": [],
    "/usr/lib/nuvex/nvcli/int/ext": [],
    "/usr/lib/nuvex/nvcli/ext": ["network.json"],
}

# Which plugins of examples/ a barrier puts before which others.
ORDERS = """
boot-note -> datastore identity disk-probe network folders
storage -> datastore identity disk-probe folders
nics -> network
network -> firewall clock links-before-firewall routes
folders -> settings routes
settings -> first-boot
datastore disk-probe firewall links-before-firewall identity -> management
management sensors -> inventory
"""

LOG_DAEMON = f"""\
if [ "$1" = -i ]; then
    echo "nvsyslogd: started with '$*'" >> {SERVICES}
    "$0" --in-background < /dev/null > /dev/null 2>&1 &
    while [ ! -s {PID_FILE} ]; do sleep 0.01; done
    exit 0
fi
trap 'echo "nvsyslogd: configuration read again" >> {SERVICES}' USR1
echo $$ > {PID_FILE}
while :; do
    sleep 1 &
    wait $!
done
"""


def orders():
    """ORDERS as a set of pairs (earlier, later)."""
    return {
        (earlier, later)
        for line in ORDERS.split("\n") if line
        for earlier in line.split(" -> ")[0].split()
        for later in line.split(" -> ")[1].split()
    }


def compile_plugins(folder):
    """Compiles every example plugin as examples/README.md tells to; the files by plugin name."""
    os.makedirs(folder, exist_ok=True)
    plugins = {}
    for source in sorted((EXAMPLES / "native").glob("[!.]*.c*")):
        target = os.path.join(folder, f"lib{source.stem}.so")
        compiler = "cc" if source.suffix == ".c" else "c++"
        subprocess.run([compiler, "-shared", "-fPIC", "-Wall", "-Wextra", "-Werror",
                        "-I", INCLUDE, "-o", target, source], check=True)
        plugins[source.stem] = pathlib.Path(target).read_bytes()
    return plugins


def lay_out(root, plugins):
    """Fills the root: plugins good and bad, debug entries, and scripts in the daemons' places."""
    for name, content in plugins.items():
        root.write(f"{PLUGINS}/lib{name}.so", content, 0o755)
    root.write(f"{PLUGINS}/libbroken.so", plugins["storage"][:4096], 0o755)
    root.write(f"{PLUGINS}/README", "Plugins of the sample host.\n")
    root.write("/etc/nuvex/vantor/debug.conf",
               (EXAMPLES / "debug" / "debug.conf").read_text(encoding="utf-8"))
    lay_out_json(root)
    root.write("/etc/syslog.conf", "*.* /var/log/messages\n")
    root.folder_at(STATE)
    root.script("/usr/lib/nuvex/nvsyslog/bin/nvsyslogd", LOG_DAEMON)
    root.script("/usr/lib/nuvex/nvsyslog/bin/upgrade-syslog.conf.sh",
                f'echo "upgrade-syslog.conf.sh: run" >> {SERVICES}')
    root.script("/etc/init.d/nvevtd", f'echo "nvevtd: called with \'$*\'" >> {SERVICES}')


def lay_out_json(root):
    """The plugin documents, and what makes their commands work."""
    source = EXAMPLES / "json"
    for document in sorted(source.glob("plugins/*.json")):
        root.write(f"{PLUGINS}/{document.name}", document.read_bytes())
    for folder, names in DESCRIPTIONS.items():
        os.makedirs(root.path(folder), exist_ok=True)
        for name in names:
            root.write(f"{folder}/{name}", (source / "commands" / name).read_bytes())
    for table in source.glob("tables/*"):
        root.write(f"/etc/sample-host/tables/{table.name}", table.read_bytes())
    root.write("/usr/libexec/sample-host/load-routes", (source / "load-routes").read_bytes(), 0o755)
