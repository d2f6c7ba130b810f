"""What must be true of the demo's runs. Each fact is a sentence and whether it holds."""

from harness.syslog_recorder import DEBUG, ERR, INFO, WARNING

import sample_host

BROKEN = ("exception occurred whilst loading plugin libbroken.so: "
          f"plugin `{sample_host.PLUGINS}/libbroken.so' is invalid: ")
SETTING_FILES = [f"{sample_host.SETTINGS}/{name}" for name in ("motd", "swap")]
MISSING_TABLE = ('"/usr/libexec/sample-host/load-routes" ended with exit status 2: '
                 'there is no table "guests"')
ROUTES = """\
default via 192.0.2.1 dev nic0
192.0.2.0/24 dev nic0
198.51.100.0/24 via 192.0.2.7 metric 20
"""
UNPROVIDED = ('Vantor dependency error: Initialization barrier "licence" is not provided by any '
              'plugin but the following plugins require it: "telemetry"')


def in_order(boot, without=()):
    """Whether every plugin started only after all that a barrier puts before it had ended.

    `without` are the plugins that this boot leaves out, which have no times.
    """
    times = boot.times()
    return all(times[earlier][1] <= times[later][0] for earlier, later in sample_host.orders()
               if earlier not in without and later not in without)


def of_first_boot(boot, graph, root):
    names = [plugin.name for plugin in graph.plugins]
    once = {(what, name): 1 for what in ("starting", "completed") for name in names}
    yield "the boot ends with status 0 and nothing on standard error", (
        boot.status == 0 and boot.errors == "")
    yield f"each of the {len(names)} plugins of the graph is run once", (
        len(names) > 10 and boot.traced() == once and sorted(boot.times()) == sorted(names))
    yield f"plugins ran in dependency order: all {len(sample_host.orders())} pairs", in_order(boot)
    yield "the failing plugins are logged, the others found all that they waited for", (
        sorted(boot.texts(ERR)) == [
            "execution failure in context 'sensors', returncode 5",
            "execution of 'network route load --table=guests' failed in context routes[start]': "
            + MISSING_TABLE,
            "unhandled exception whilst processing inventory: no sensor answers"])
    yield "the failing debug command is logged with its status", (
        "debug injection 'disk-probe' returned 0x000300" in boot.texts(INFO))
    yield "the files that are not run are logged", (
        sorted(text for text in boot.texts(WARNING) if not text.startswith(BROKEN)) == [
            "ignoring plugin 'README' of unspecified type...",
            "ignoring plugin 'kernel-debug', disabled due to missing required boot flags: debug ",
            "ignoring plugin 'usb-debug', disabled due to missing required boot flags: usb "])
    yield "the broken plugin and the barrier without a provider raise alerts, nothing else does", (
        len(boot.alerts) == 2 and boot.alerts[0].startswith(BROKEN)
        and boot.alerts[1] == UNPROVIDED)
    yield "the run-once record names the plugins that are not to run again", (
        boot.record == "vantor.run-once=first-boot2.0,identity1.2,\n")
    yield "the services are launched, upgraded and reloaded in order", (
        boot.services == [
            "nvsyslogd: started with '-i'", "nvevtd: called with 'start'",
            "upgrade-syslog.conf.sh: run", "nvsyslogd: configuration read again"])
    yield "the debug commands did their work at their places", (
        root.read("/var/log/boot-note") == "the boot begins\n"
        and root.read("/var/log/links-before-firewall") == "nic0 up, nic1 up\n")


def of_commands(boot, root):
    yield "commands of JSON plugins made the folders, with the permissions asked for", (
        root.mode(sample_host.SETTINGS) == 0o755
        and root.mode("/var/lib/sample-host") == 0o750)
    yield "commands of JSON plugins wrote the settings and the journal", (
        [root.read(name) for name in SETTING_FILES] == ["Welcome to the sample host\n", "512\n"]
        and root.read(sample_host.JOURNAL) == "the host was set up\n")
    yield "the command after the one that failed ran too: all routes are loaded", (
        root.read(f"{sample_host.STATE}/routes") == ROUTES)
    yield "what needs the boot flag \"debug\" was not done without it", (
        not root.exists(f"{sample_host.SETTINGS}/kernel-debug")
        and ("starting", "kernel-debug") not in boot.traced())


def of_graph(boot, graph):
    yield "the dump ends with status 0 and runs no plugin", (
        boot.status == 0 and not boot.traced() and "executing" not in "".join(boot.texts(INFO)))
    yield "the drawn graph has the pairs that the plugins declare, no more and no fewer", (
        set(graph.orders()) == sample_host.orders())


def of_second_boot(boot, root):
    yield "the second boot ends with status 0, in dependency order", (
        boot.status == 0 and boot.errors == ""
        and in_order(boot, without={"identity", "first-boot", "routes"}))
    yield "the run-once plugins are not run again", (
        not {("starting", "identity"), ("starting", "first-boot")} & boot.traced().keys()
        and sorted(boot.texts(DEBUG)) == [
            "ignoring plugin 'first-boot' because version '2.0' has already been run",
            "ignoring plugin 'identity' because version '1.2' has already been run"])
    yield "the host profile is applied by the plugins that can", (
        {text for text in boot.texts(INFO) if text.startswith("executing host profile plugin")} == {
            "executing host profile plugin: firewall", "executing host profile plugin: settings"}
        and root.read(f"{sample_host.STATE}/firewall") == "rules of the host profile\n")


def of_next_commands(boot, first, root):
    yield "the host profile's command wrote one setting and left the other", (
        [root.read(name) for name in SETTING_FILES]
        == ["This host follows its host profile\n", "512\n"])
    yield "the run-once plugin's command was not executed again, and its record stays", (
        root.read(sample_host.JOURNAL) == "the host was set up\n"
        and boot.record == first.record)
    yield "the boot flag kept the routes plugin out: nothing was loaded twice, nothing failed", (
        "ignoring plugin 'routes', disabled due to boot flags: noroutes " in boot.texts(WARNING)
        and root.read(f"{sample_host.STATE}/routes") == ROUTES
        and not [text for text in boot.texts(ERR) if text.startswith("execution of")])


def of_nvcli(listed, helped, settings, failed, mistyped, root):
    yield "nvcli lists the commands of all description files", (
        listed.status == 0 and listed.stderr == ""
        and all(f"\n  {word} " in listed.stdout for word in ("create", "list", "set", "load"))
        and "\nnetwork route:\n" in listed.stdout and "\nsystem setting:\n" in listed.stdout)
    yield "nvcli shows one command with each of its options", (
        helped.status == 0 and helped.stdout.startswith(
            "Usage: nvcli network route load --table=TEXT [OPTION]...\n")
        and all(f"--{name}" in helped.stdout for name in ("table", "metric", "family", "replace")))
    yield "nvcli by hand does what a plugin's command does", (
        root.read(SETTING_FILES[0]) == "Set by hand\n"
        and (settings.status, settings.stdout) == (0, "motd: Set by hand\nswap: 512\n"))
    yield "nvcli tells of a command that failed, with status 1", (
        (failed.status, failed.stdout, failed.stderr) == (1, "", f"nvcli: {MISSING_TABLE}\n"))
    yield "nvcli tells of a mistyped command, with status 2 and the nearest one", (
        (mistyped.status, mistyped.stdout) == (2, "")
        and mistyped.stderr == 'nvcli: unknown command "network route lode"; the nearest known '
                               'one is "network route load"\n')
