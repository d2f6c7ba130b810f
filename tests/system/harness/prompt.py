"""The interactive prompt's own texts, byte for byte."""

HIDE, SHOW, ERASE = "\033[?25l", "\033[?25h", "\033[2K"
WORDS = {"c": "(c)ontinue", "e": "(e)xecute", "t": "(t)roubleshoot", "s": "(s)kip"}
COLOURS = {"c": 5, "e": 2, "t": 3, "s": 1}
UNCHOSEN, NAME = 7, 6


def coloured(colour, text):
    return f"\033[{30 + colour}m{text}\033[0m"


def question(name):
    """What is written before a key is read."""
    choices = "\t".join(coloured(COLOURS[key], word) for key, word in WORDS.items())
    return f"current plugin: \033[{30 + NAME}m{name}\n{choices}{HIDE}"


def redrawn(key):
    """The choice line drawn again after the key."""
    words = (coloured(COLOURS[one] if one == key else UNCHOSEN, word)
             for one, word in WORDS.items())
    return "\r" + "\t".join(words) + "\n"


def prompt(name, key):
    """One whole prompt."""
    return question(name) + SHOW + redrawn(key)
