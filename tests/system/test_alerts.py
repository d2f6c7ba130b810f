"""System alerts: what an operator finds in the host's file of them."""

import re
import time
from datetime import datetime, timezone

from harness.messages import starting

ALERTS = "/var/run/nuvex/system-alerts"


def unprovided(barrier, *plugins):
    names = ", ".join(f'"{plugin}"' for plugin in plugins)
    return (f'Vantor dependency error: Initialization barrier "{barrier}" is not provided by any '
            f"plugin but the following plugins require it: {names}")


def test_an_alert_is_a_line_with_its_utc_time(root, vantor):
    root.native("taker", requires=["ready"])
    before = int(time.time())
    vantor(environment={"TZ": "EAST-11:30"})
    [line] = root.read(ALERTS).splitlines()
    stamp, text = line.split(" ", 1)
    assert text == unprovided("ready", "taker")
    assert re.fullmatch(r"\d{4}-\d\d-\d\dT\d\d:\d\d:\d\dZ", stamp)
    told = datetime.strptime(stamp, "%Y-%m-%dT%H:%M:%SZ").replace(tzinfo=timezone.utc)
    assert before <= told.timestamp() <= time.time()
    assert root.read(ALERTS).endswith("\n")


def test_a_barrier_without_a_provider_is_alerted_and_its_plugins_run(root, vantor):
    for name in ("c", "a", "b"):
        root.native(name, requires=["ready"])
    result = vantor("--plugin=libc.so,liba.so,libb.so")
    # Named in the order of their construction; nothing of it goes to the system log.
    assert root.alerts() == [unprovided("ready", "c", "a", "b")]
    assert (result.status, result.messages) == (0, starting("c", "a", "b"))


def test_each_missing_barrier_is_alerted_once(root, vantor):
    root.native("a", requires=["one", "two"])
    root.native("b", requires=["two"])
    vantor("--plugin=liba.so,libb.so")
    assert sorted(root.alerts()) == [unprovided("one", "a"), unprovided("two", "a", "b")]


def test_a_barrier_required_twice_by_one_plugin_names_it_twice(root, vantor):
    root.native("a", requires=["ready", "ready"])
    result = vantor()
    assert root.alerts() == [unprovided("ready", "a", "a")]
    assert result.messages == starting("a")


def test_a_disabled_plugin_that_waits_alone_raises_no_alert(root, vantor):
    root.native("off", requires=["ready"])
    vantor("--disable-plugins=off")
    assert root.alerts() == []


def test_a_disabled_plugin_is_named_among_those_that_wait(root, vantor):
    root.native("off", requires=["ready"])
    root.native("on", requires=["ready"])
    vantor("--plugin=liboff.so,libon.so", "--disable-plugins=off")
    assert root.alerts() == [unprovided("ready", "off", "on")]


def test_a_barrier_that_is_only_provided_raises_no_alert(root, vantor):
    root.native("giver", provides=["ready"])
    vantor()
    assert root.alerts() == []


def test_alerts_of_later_runs_are_appended(root, vantor):
    root.native("taker", requires=["ready"])
    vantor()
    vantor()
    assert root.alerts() == [unprovided("ready", "taker")] * 2


def test_the_folder_of_the_alerts_is_made_when_it_is_missing(root, vantor):
    root.native("taker", requires=["ready"])
    root.remove("/var/run")
    assert vantor().status == 0
    assert root.alerts() == [unprovided("ready", "taker")]
