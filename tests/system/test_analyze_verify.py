"""vantor-analyze verify: what it reports of a plugin directory, in which words and order."""

import json
import os
import random
import re
import time

import pytest
from harness import json_plugin
from harness.analyze import analyze, run_analyze
from harness.native_plugin import PluginFactory
from harness.private_root import PLUGINS


def write_faulty_host(root, order):
    """A host with a fault of each kind, its files written in an order of the caller's."""
    truncated = PluginFactory.stamped(["name cut", "version 3", "start 0"])
    files = {
        # first -> [one] -> second -> [two] -> first
        "first.json": json.dumps(json_plugin.document(provides=["one"], requires=["two"])),
        "second.json": json.dumps(json_plugin.document(provides=["two"], requires=["one"])),
        # x -> [xy] -> y -> [yz] -> z -> [zx] -> x
        "x.json": json.dumps(json_plugin.document(provides=["xy"], requires=["zx"]), indent=1),
        "y.json": json.dumps(json_plugin.document(provides=["yz"], requires=["xy"])),
        "z.json": json.dumps(json_plugin.document(provides=["zx"], requires=["yz"])),
        "disks.json": json.dumps(json_plugin.document(provides=["storage"])),
        "store.json": json.dumps(json_plugin.document(requires=["storage", "storag"])),
        "rare.json": json.dumps(json_plugin.document(provides=["rarity"], required_flags=["rare"])),
        "user.json": json.dumps(json_plugin.document(requires=["rarity"])),
        "libcut.so": truncated[:len(truncated) // 2],
        "slash.json": '{"metadata": / }',
        "twin.json": json.dumps(json_plugin.document()),
        "libtwin.json": json.dumps(json_plugin.document()),
    }
    json_plugin.make_directories(root)
    for name in order(sorted(files)):
        root.write(f"{PLUGINS}/{name}", files[name])


def findings_of(result):
    return json.loads(result.stdout)["findings"]


def test_all_faults_of_a_directory_are_reported_in_one_run(root):
    write_faulty_host(root, list)
    result = analyze(root, "verify")
    assert (result.status, result.stderr) == (2, "")
    lines = result.stdout.splitlines()
    # What the reading of a file says of it is another test's matter.
    own = [line for line in lines if not re.search(r"\[(truncated|lone-slash)\]", line)]
    document = re.escape(PLUGINS) + "/"
    expected = [
        document + r"first\.json:1:\d+: error\[cycle\]: the boot never ends: dependency cycle of "
        r"2 plugins: 'first' provides \"one\", which 'second' requires; 'second' provides \"two\", "
        r"which 'first' requires",
        document + r"libtwin\.json: warning\[duplicate-name\]: 2 plugins of the name 'twin': "
        + document + r"libtwin\.json and " + document + r"twin\.json",
        document + r"store\.json:1:\d+: error\[no-provider\]: no plugin provides barrier "
        r"\"storag\", required by 'store'; did you mean \"storage\"\?",
        document + r"user\.json:1:\d+: warning\[filtered-provider\]: nothing that runs provides "
        r"barrier \"rarity\", required by 'user': ignoring plugin 'rare', disabled due to missing "
        r"required boot flags: rare",
        document + r"x\.json:\d+:\d+: error\[cycle\]: the boot never ends: dependency cycle of 3 "
        r"plugins: 'x' provides \"xy\", which 'y' requires; 'y' provides \"yz\", which 'z' "
        r"requires; 'z' provides \"zx\", which 'x' requires",
    ]
    assert len(own) == len(expected), result
    for line, pattern in zip(own, expected):
        assert re.fullmatch(pattern, line), f"{line}\n{pattern}"
    assert any(line.startswith(f"{PLUGINS}/libcut.so: error[truncated]: ")
               for line in lines), result
    assert any(re.match(re.escape(PLUGINS) + r"/slash\.json:1:14: error\[lone-slash\]: ", line)
               for line in lines), result


def test_the_report_is_the_same_a_hundred_times(root):
    write_faulty_host(root, list)
    first = analyze(root, "verify").stdout
    assert first
    assert {analyze(root, "verify").stdout for _ in range(100)} == {first}


def test_the_order_of_the_listing_does_not_matter(session):
    reports, listings = set(), set()
    for order in (list, lambda names: names[::-1], lambda names: random.Random(4).sample(
            names, len(names))):
        root = session.new_root()
        try:
            write_faulty_host(root, order)
            listings.add(tuple(root.listing()))
            reports.add(tuple(analyze(root, "verify", f"--format={form}").stdout
                              for form in ("text", "json", "sarif")))
        finally:
            root.remove_all()
    assert len(reports) == 1
    if len(listings) == 1:
        pytest.skip("this file system lists names in an order of its own")


def test_a_clean_directory_is_clean(root):
    json_plugin.make_directories(root)
    json_plugin.write_plugin(root, "disks", provides=["storage"])
    json_plugin.write_plugin(root, "store", requires=["storage"])
    result = analyze(root, "verify")
    assert (result.status, result.stdout, result.stderr) == (0, "", "")


def test_an_empty_directory_is_clean(root):
    json_plugin.make_directories(root)
    result = analyze(root, "verify")
    assert (result.status, result.stdout, result.stderr) == (0, "", "")


def test_notes_alone_are_clean_also_when_strict(root):
    json_plugin.make_directories(root)
    json_plugin.write_plugin(root, "disks", provides=["storage"])
    for strict in ([], ["--strict"]):
        result = analyze(root, "verify", *strict)
        assert result.status == 0
        assert re.fullmatch(
            re.escape(f"{PLUGINS}/disks.json") + r":1:\d+: note\[unused-barrier\]: no plugin "
            r"requires barrier \"storage\", provided by 'disks'\n", result.stdout), result


def test_warnings_end_with_1_and_strictly_with_2(root):
    json_plugin.make_directories(root)
    root.write(f"{PLUGINS}/README", "")
    text = f"{PLUGINS}/README: %s[ignored-file]: ignoring plugin 'README' of unspecified type...\n"
    result = analyze(root, "verify")
    assert (result.status, result.stdout) == (1, text % "warning")
    result = analyze(root, "verify", "--strict")
    assert (result.status, result.stdout) == (2, text % "error")


@pytest.mark.parametrize("options, reason", [
    (["--disable-plugins=other", "--disable-plugins=x,,disks"],
     "ignoring plugin 'disks' due to blacklist"),
    (["--plugin-flags=rescue"],
     "ignoring plugin 'disks', disabled due to boot flags: rescue"),
    (["--plugin-flags=a", "--plugin-flags=b,rescue,c"],
     "ignoring plugin 'disks', disabled due to boot flags: rescue"),
])
def test_filters_are_those_that_the_boot_is_told(root, options, reason):
    json_plugin.make_directories(root)
    json_plugin.write_plugin(root, "disks", provides=["storage"], disabling_flags=["rescue"])
    json_plugin.write_plugin(root, "store", requires=["storage"])
    result = analyze(root, "verify", *options)
    assert result.status == 1
    assert result.stdout.endswith(f": nothing that runs provides barrier \"storage\", required by "
                                  f"'store': {reason}\n"), result


@pytest.mark.parametrize("options", [
    ["--plugin-flags=rescue", "--plugin-flags=other"], ["--plugin-flags=rescue", "--plugin-flags="],
    ["--plugin-flags", "rescue ,RESCUE"], ["--disable-plugins=disks.json"],
])
def test_filters_that_do_not_hold_for_a_plugin(root, options):
    json_plugin.make_directories(root)
    json_plugin.write_plugin(root, "disks", provides=["storage"], disabling_flags=["rescue"])
    json_plugin.write_plugin(root, "store", requires=["storage"])
    result = analyze(root, "verify", *options)
    assert (result.status, result.stdout, result.stderr) == (0, "", "")


def test_a_plugin_that_has_already_run_is_done_from_the_start(root):
    json_plugin.make_directories(root)
    json_plugin.write_plugin(root, "a", provides=["x"], requires=["y"], run_once=True)
    json_plugin.write_plugin(root, "b", provides=["y"], requires=["x"])
    assert analyze(root, "verify").status == 2
    result = analyze(root, "verify", "--run-once=other", "--run-once=a1")
    assert result.status == 0
    assert "note[open-cycle]" in result.stdout


def test_another_directory_of_the_host(root):
    json_plugin.make_directories(root)
    root.write("/opt/plugins/README", "")
    result = analyze(root, "verify", "/opt/plugins")
    assert (result.status, result.stdout) == (
        1, "/opt/plugins/README: warning[ignored-file]: ignoring plugin 'README' of unspecified "
        "type...\n")


def test_a_directory_that_cannot_be_read(root):
    result = analyze(root, "verify", "/nowhere")
    assert (result.status, result.stdout) == (3, "")
    assert result.stderr == f"vantor-analyze: {root.folder}/nowhere: No such file or directory\n"


def test_a_directory_of_a_host_in_a_folder_is_a_path_of_that_host(root):
    result = analyze(root, "verify", "usr/libexec")
    assert (result.status, result.stdout, result.stderr) == (
        3, "", "vantor-analyze: usr/libexec: the directory of a host in a folder begins with "
        "\"/\"\n")


def test_a_root_without_a_name_is_refused(root):
    result = run_analyze(root, "verify", "--root=")
    assert (result.status, result.stdout) == (3, "")
    assert "the folder has no name" in result.stderr


@pytest.mark.parametrize("arguments, message", [
    (["verify", "--format=html"], "--format"),
    (["verify", "--no-such-option"], "--no-such-option"),
    (["verify", "/a", "/b"], "/b"),
    (["no-such-verb"], "unknown verb 'no-such-verb'; the verbs are: "),
    ([], "no verb; the verbs are: "),
    (["--strict"], "unknown option '--strict' before the verb"),
])
def test_a_line_that_cannot_be_understood(root, arguments, message):
    result = run_analyze(root, *arguments)
    assert (result.status, result.stdout) == (3, "")
    assert message in result.stderr
    assert result.stderr.endswith("usage: vantor-analyze --help for usage information\n")


def test_a_result_that_cannot_be_written(root):
    json_plugin.make_directories(root)
    root.write(f"{PLUGINS}/README", "")
    if not os.path.exists("/dev/full"):
        pytest.skip("there is no /dev/full here")
    with open("/dev/full", "wb", buffering=0) as full:
        result = run_analyze(root, "verify", "--root", root.folder, stdout=full)
    assert (result.status, result.stderr) == (
        3, "vantor-analyze: the result could not be written\n")


@pytest.mark.parametrize("arguments", [["--help"], ["--version"], ["verify", "--help"]])
def test_help_that_cannot_be_written(root, arguments):
    if not os.path.exists("/dev/full"):
        pytest.skip("there is no /dev/full here")
    with open("/dev/full", "wb", buffering=0) as full:
        result = run_analyze(root, *arguments, stdout=full)
    assert (result.status, result.stderr) == (
        3, "vantor-analyze: the result could not be written\n")


def test_run_once_plugins_of_several_names_with_one_key(root):
    json_plugin.make_directories(root)
    for name, version in (("a", "b1"), ("ab", "1"), ("abc", "1")):
        json_plugin.write_plugin(root, name, run_once=True, plugin_version=version)
    result = analyze(root, "verify")
    assert (result.status, result.stdout) == (
        2, f"{PLUGINS}/a.json: error[shared-key]: the run-once plugins 'a' and 'ab' have one key, "
        "\"ab1\", in the record of those that have run: the boot runs only the first that the "
        "directory lists\n")


@pytest.mark.parametrize("rejected, hint", [
    (["x"], f"{PLUGINS}/x.json, which the boot does not load, may provide it"),
    (["x", "y"], "one of the 2 plugin files that the boot does not load may provide it"),
])
def test_a_rejected_file_may_be_the_provider_that_is_missing(root, rejected, hint):
    json_plugin.make_directories(root)
    json_plugin.write_plugin(root, "user", requires=["disks"])
    for name in rejected:
        root.write(f"{PLUGINS}/{name}.json", "[]")
    [missing] = [one for one in findings_of(analyze(root, "verify", "--format=json"))
                 if one["code"] == "no-provider"]
    assert missing["text"] == (
        f"no plugin provides barrier \"disks\", required by 'user'; {hint}")


def test_help_and_version(root):
    assert re.fullmatch(r"vantor-analyze \d+\.\d+\.\d+\n", run_analyze(root, "--version").stdout)
    result = run_analyze(root, "--help")
    assert result.status == 0
    for verb in ("verify", "graph", "explain"):
        assert re.search(rf"^  {verb} ", result.stdout, re.MULTILINE)
        assert run_analyze(root, verb, "--help").status == 0


def test_sarif_holds_what_its_readers_require(root):
    write_faulty_host(root, list)
    result = analyze(root, "verify", "--format=sarif")
    assert result.status == 2
    report = json.loads(result.stdout)
    assert report["version"] == "2.1.0"
    (run,) = report["runs"]
    rules = run["tool"]["driver"]["rules"]
    assert run["tool"]["driver"]["name"] == "vantor-analyze"
    assert len(run["results"]) == len(findings_of(analyze(root, "verify", "--format=json")))
    for one in run["results"]:
        assert rules[one["ruleIndex"]]["id"] == one["ruleId"]
        assert rules[one["ruleIndex"]]["shortDescription"]["text"]
        assert one["level"] in ("error", "warning", "note")
        assert one["message"]["text"]
        (location,) = one["locations"]
        assert location["physicalLocation"]["artifactLocation"]["uri"].startswith("file:///")
        assert location["physicalLocation"].get("region", {"startLine": 1})["startLine"] >= 1


# Random graphs: the cycles that the program finds against those of a check written for this test.


def random_plugins(count, seed):
    """Names, with what each requires and provides; now and then a barrier of a later plugin.

    Barriers are required of near plugins and of far ones before them. A ring across all of them
    entangles many.
    """
    rng = random.Random(seed)
    plugins = {}
    for number in range(count):
        required = []
        if number and rng.random() < 0.6:
            required.append(max(0, number - rng.randint(1, 6)))
        if number and rng.random() < 0.2:
            required.append(rng.randrange(number))
        if rng.random() < 0.2:
            required.append(min(count - 1, number + rng.randrange(8)))
        if rng.random() < 0.02:
            required.append(count + number)
        plugins[f"p{number:05}"] = ([f"b{one}" for one in required], [f"b{number}"])
    ring = sorted(rng.sample(range(count), 20))
    for number, following in zip(ring, ring[1:] + ring[:1]):
        plugins[f"p{number:05}"][0].append(f"b{following}")
    return plugins


def waits_for(plugins):
    """For each plugin those that provide what it requires."""
    providers = {}
    for name, (_, provides) in plugins.items():
        for barrier in provides:
            providers.setdefault(barrier, []).append(name)
    return {name: [other for barrier in requires for other in providers.get(barrier, [])]
            for name, (requires, _) in plugins.items()}


def finishing_order(edges):
    """The nodes in the order in which a walk in depth leaves them."""
    order, seen = [], set()
    for root in edges:
        stack = [] if root in seen else [(root, iter(edges[root]))]
        seen.add(root)
        while stack:
            node, targets = stack[-1]
            target = next((one for one in targets if one not in seen), None)
            if target is None:
                order.append(node)
                stack.pop()
            else:
                seen.add(target)
                stack.append((target, iter(edges[target])))
    return order


def groups_on_cycles(edges):
    """Kosaraju's algorithm: the sets of nodes that reach each other over one edge at least."""
    reverse = {node: [] for node in edges}
    for node, targets in edges.items():
        for target in targets:
            reverse[target].append(node)
    left, groups = set(edges), []
    for root in reversed(finishing_order(edges)):
        group, open_nodes = set(), [root] if root in left else []
        left.discard(root)
        while open_nodes:
            node = open_nodes.pop()
            group.add(node)
            found = [one for one in reverse[node] if one in left]
            left.difference_update(found)
            open_nodes += found
        if len(group) > 1 or any(node in edges[node] for node in group):
            groups.append(group)
    return groups


def shortest_ring(edges, group):
    """The length of the shortest cycle within a group."""
    best = len(group)
    for root in group:
        distance, front, steps = {}, [root], 0
        while front and root not in distance and steps < best:
            steps += 1
            front = list({target for node in front for target in edges[node]
                          if target in group and target not in distance})
            distance.update(dict.fromkeys(front, steps))
        best = min(best, distance.get(root, best))
    return best


@pytest.mark.parametrize("count", [1000, 10000])
def test_the_cycles_of_a_random_graph_are_those_of_an_independent_check(root, count):
    plugins = random_plugins(count, seed=count)
    json_plugin.make_directories(root)
    for name, (requires, provides) in plugins.items():
        json_plugin.write_plugin(root, name, requires=requires, provides=provides)
    began = time.monotonic()
    result = analyze(root, "verify", "--format=json")
    print(f"verify of {count} plugins: {time.monotonic() - began:.3f} s")
    findings = findings_of(result)
    edges = waits_for(plugins)
    groups = groups_on_cycles(edges)
    sizes = sorted(map(len, groups))
    assert sizes[0] <= 2 and sizes[-1] >= 20 and len(sizes) > count / 100, sizes
    assert result.status == 2

    cycles = [one for one in findings if one["code"] == "cycle"]
    assert len(cycles) == len(groups)
    for cycle in cycles:
        text = cycle["text"]
        steps = re.findall(r"'(\w+)' provides \"(\w+)\", which (?:'(\w+)' requires|it requires "
                           r"itself)", text)
        ring = [provider for provider, _, _ in steps]
        for (provider, barrier, requirer), following in zip(steps, ring[1:] + ring[:1]):
            assert requirer in ("", following)
            assert barrier in plugins[provider][1] and barrier in plugins[following][0]
        (group,) = [one for one in groups if ring[0] in one]
        assert set(ring) <= group and ring[0] == min(ring)
        assert len(ring) == shortest_ring(edges, group)
        assert f"of {len(ring)} plugin" in text
        if len(group) > len(ring):
            assert f"a shortest of the cycles among {len(group)} plugins" in text
        groups.remove(group)

    provided = {barrier for _, provides in plugins.values() for barrier in provides}
    required = {barrier for requires, _ in plugins.values() for barrier in requires}
    missing = {re.search(r'barrier "(\w+)"', one["text"]).group(1)
               for one in findings if one["code"] == "no-provider"}
    unused = {re.search(r'barrier "(\w+)"', one["text"]).group(1)
              for one in findings if one["code"] == "unused-barrier"}
    assert (missing, unused) == (required - provided, provided - required)
