"""What must be true of the demo's three runs. Each fact is a sentence and whether it holds."""

from harness.syslog_recorder import DEBUG, ERR, INFO, WARNING

import sample_host

BROKEN = ("exception occurred whilst loading plugin libbroken.so: "
          f"plugin `{sample_host.PLUGINS}/libbroken.so' is invalid: ")
UNPROVIDED = ('Vantor dependency error: Initialization barrier "licence" is not provided by any '
              'plugin but the following plugins require it: "telemetry"')


def in_order(boot):
    """Whether every plugin started only after all that a barrier puts before it had ended."""
    times = boot.times()
    return all(times[earlier][1] <= times[later][0] for earlier, later in sample_host.orders())


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
            "unhandled exception whilst processing inventory: no sensor answers"])
    yield "the failing debug command is logged with its status", (
        "debug injection 'disk-probe' returned 0x000300" in boot.texts(INFO))
    yield "the files that are not run are logged", (
        sorted(text for text in boot.texts(WARNING) if not text.startswith(BROKEN)) == [
            "ignoring plugin 'README' of unspecified type...",
            "ignoring plugin 'usb-debug', disabled due to missing required boot flags: usb "])
    yield "the broken plugin and the barrier without a provider raise alerts, nothing else does", (
        len(boot.alerts) == 2 and boot.alerts[0].startswith(BROKEN)
        and boot.alerts[1] == UNPROVIDED)
    yield "the run-once record names the plugin that is not to run again", (
        boot.record == "vantor.run-once=identity1.2,\n")
    yield "the services are launched, upgraded and reloaded in order", (
        boot.services == [
            "nvsyslogd: started with '-i'", "nvevtd: called with 'start'",
            "upgrade-syslog.conf.sh: run", "nvsyslogd: configuration read again"])
    yield "the debug commands did their work at their places", (
        root.read("/var/log/boot-note") == "the boot begins\n"
        and root.read("/var/log/links-before-firewall") == "nic0 up, nic1 up\n")


def of_graph(boot, graph):
    yield "the dump ends with status 0 and runs no plugin", (
        boot.status == 0 and not boot.traced() and "executing" not in "".join(boot.texts(INFO)))
    yield "the drawn graph has the pairs that the plugins declare, no more and no fewer", (
        set(graph.orders()) == sample_host.orders())


def of_second_boot(boot, root):
    yield "the second boot ends with status 0, in dependency order", (
        boot.status == 0 and boot.errors == ""
        and in_order_without(boot, "identity"))
    yield "the run-once plugin is not run again", (
        ("starting", "identity") not in boot.traced()
        and "ignoring plugin 'identity' because version '1.2' has already been run"
        in boot.texts(DEBUG))
    yield "the host profile is applied by the plugin that can", (
        "executing host profile plugin: firewall" in boot.texts(INFO)
        and root.read(f"{sample_host.STATE}/firewall") == "rules of the host profile\n")


def in_order_without(boot, skipped):
    """in_order() where one plugin has not run and has no times."""
    times = boot.times()
    return all(times[earlier][1] <= times[later][0] for earlier, later in sample_host.orders()
               if skipped not in (earlier, later))
