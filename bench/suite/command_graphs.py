"""Graphs of shell commands, written down for vantor, for ninja and for make."""

LAYER = 20


class CommandGraph:
    """Numbered commands; `groups` holds, in order, the commands that may run side by side."""

    def __init__(self, shape, count):
        self.shape, self.count = shape, count
        size = {"independent": count, "layered": LAYER, "chain": 1}[shape]
        self.groups = [range(first, min(first + size, count)) for first in range(0, count, size)]

    def debug_configuration(self, command):
        """A barrier stands between each group and the next one."""
        lines = []
        for index, group in enumerate(self.groups):
            needs = f"b{index - 1}" if index > 0 else " "
            gives = f"b{index}" if index + 1 < len(self.groups) else " "
            lines += [f"p{number}:{needs}:{gives}:{command}\n" for number in group]
        return "".join(lines)

    def ninja(self, command):
        lines = [f"rule run\n  command = {command}\n"]
        for index, group in enumerate(self.groups):
            needs = f" | b{index - 1}" if index > 0 else ""
            lines += [f"build p{number}: run{needs}\n" for number in group]
            lines.append(f"build b{index}: phony {_names(group)}\n")
        lines.append(f"default b{len(self.groups) - 1}\n")
        return "".join(lines)

    def make(self, command):
        """The ";" makes make use a shell, as the others do; without it, it starts programs itself.
        """
        lines = [f"all: b{len(self.groups) - 1}\n"]
        for index, group in enumerate(self.groups):
            needs = f" b{index - 1}" if index > 0 else ""
            lines += [f"p{number}:{needs}\n\t{command};\n" for number in group]
            lines.append(f"b{index}: {_names(group)}\n")
            lines.append(f".PHONY: b{index} {_names(group)}\n")
        return "".join(lines)


def _names(group):
    return " ".join(f"p{number}" for number in group)
