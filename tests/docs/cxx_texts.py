"""What the C++ sources say: the texts in their string literals, whole, as the program puts them
together.

A text is a list of pieces: a string where the words are fixed, ANY where a value comes in. Literals
side by side are one piece; "a" + b + "c", and the same with <<, are one text.
"""

import re
from pathlib import Path

ROOT = Path(__file__).resolve().parents[2]
ANY = object()

_TOKEN = re.compile(r"""
    (?P<comment> //[^\n]* | /\*.*?\*/ )
  | (?P<directive> ^[ \t]*\#(?:[^\n\\]|\\.|\\\n)* )
  | (?P<raw> \b(?:u8|u|U|L)?R" )
  | (?P<string> "(?:[^"\\\n]|\\.)*" )
  | (?P<char> '(?:[^'\\\n]|\\.)+' )
  | (?P<word> [A-Za-z_]\w* )
  | (?P<number> \.?\d(?:'?[\w.])* )
  | (?P<sign> :: | << | . )
""", re.VERBOSE | re.DOTALL | re.MULTILINE)

_ESCAPES = {"n": "\n", "b": "\b", "t": "\t", "r": "\r", "f": "\f", "v": "\v", "\\": "\\",
            '"': '"', "'": "'"}


class Token:
    """One token; of a literal, `text` is what it stands for. A group holds what is in brackets."""

    def __init__(self, kind, text, items=None):
        self.kind, self.text, self.items = kind, text, items


def _unescape(text):
    def one(found):
        code = found[1]
        if code in _ESCAPES:
            return _ESCAPES[code]
        assert re.fullmatch(r"[0-7]{1,3}", code), f"an escape this reader does not know: {found[0]}"
        return chr(int(code, 8))

    return re.sub(r"\\([0-7]{1,3}|.)", one, text)


def _tokens(path):
    for found in _TOKEN.finditer(path.read_text(encoding="utf-8")):
        kind, text = found.lastgroup, found[0]
        assert kind != "raw", f"{path}: this reader knows no raw strings"
        if kind in ("comment", "directive") or text.isspace():
            continue
        yield Token(kind, _unescape(text[1:-1]) if kind in ("string", "char") else text)


def _nest(tokens, closing=None):
    """The tokens up to `closing`, what stands in brackets of any kind folded into groups."""
    items = []
    for token in tokens:
        if token.kind == "sign" and token.text in "([{":
            closer = {"(": ")", "[": "]", "{": "}"}[token.text]
            items.append(Token("group", token.text, _nest(tokens, closer)))
        elif token.kind == "sign" and token.text == closing:
            return items
        else:
            items.append(token)
    assert closing is None, f"no {closing}"
    return items


def _split(items, separators):
    parts = [[]]
    for item in items:
        if item.kind == "sign" and item.text in separators:
            parts.append([])
        else:
            parts[-1].append(item)
    return [part for part in parts if part]


def _pieces(items):
    """The text that the items of one expression put together."""
    pieces, at = [], 0
    while at < len(items):
        item = items[at]
        wraps = (item.kind == "word" and item.text == "string" and at + 1 < len(items)
                 and items[at + 1].kind == "group" and items[at + 1].items
                 and all(inner.kind == "string" for inner in items[at + 1].items))
        if wraps:  # std::string("text"): the text
            while pieces and pieces[-1] is ANY:
                pieces.pop()
            if pieces:
                pieces.append(ANY)
            at += 1
            new = "".join(inner.text for inner in items[at].items)
        elif item.kind in ("string", "char"):
            new = item.text
        elif item.kind == "word" and item.text == "endl":
            new = "\n"
        else:
            new = None if item.kind == "sign" and item.text in ("+", "<<") else ANY
        if isinstance(new, str) and pieces and isinstance(pieces[-1], str):
            pieces[-1] += new
        elif new is not None and not (new is ANY and pieces and pieces[-1] is ANY):
            pieces.append(new)
        at += 1
    return pieces


def _lines(pieces):
    """A text, cut at its line ends."""
    line = []
    for piece in pieces:
        if piece is ANY:
            line.append(piece)
            continue
        first, *others = piece.split("\n")
        line.append(first)
        for other in others:
            yield line
            line = [other]
    yield line


class Source:
    """One file."""

    def __init__(self, path):
        self.path = path
        self.name = str(path.relative_to(ROOT))
        self.items = _nest(_tokens(path))

    def _walk(self, items):
        yield items
        before = None
        for item in items:
            # What a static_assert says is the compiler's to say.
            if item.kind == "group" and not (before and before.text == "static_assert"):
                yield from self._walk(item.items)
            before = item

    def literals(self):
        """Every string literal, one by one."""
        for items in self._walk(self.items):
            yield from (item.text for item in items if item.kind == "string")

    def words(self, pattern):
        """Every name that matches."""
        for items in self._walk(self.items):
            yield from (item.text for item in items
                        if item.kind == "word" and re.fullmatch(pattern, item.text))

    def calls(self, *names):
        """Of every call of these functions the arguments, each a list of tokens."""
        for items in self._walk(self.items):
            for word, group in zip(items, items[1:]):
                is_call = word.kind == "word" and word.text in names
                if is_call and group.kind == "group" and group.text == "(":
                    yield _split(group.items, ",")

    def texts(self):
        """Every text, line by line."""
        for items in self._walk(self.items):
            for part in _split(items, ",;?:"):
                yield from _lines(_pieces(part))


def text_of(argument):
    """The one text of a call's argument."""
    return _pieces(argument)


def format_pieces(pieces):
    """A text that is a format of printf(3)'s kind: every conversion is a value."""
    split = []
    for piece in pieces:
        parts = [piece] if piece is ANY else re.split(r"(%%|%[-#0 +]*\d*[a-z])", piece)
        for part in parts:
            is_value = part is ANY or (part.startswith("%") and len(part) > 1 and part != "%%")
            split.append(ANY if is_value else "%" if part == "%%" else part)
    return [part for part in split if part != ""]


def format_text(argument):
    """The text of a call's argument that is a format."""
    return format_pieces(_pieces(argument))


def is_literal(argument):
    """Whether an argument is made of literals alone."""
    return bool(argument) and all(item.kind == "string" for item in argument)


def spelling(argument):
    """An argument as it is written, literals aside."""
    return "".join(item.text if item.kind != "group" else "()" for item in argument)


def has_words(pieces):
    """Whether a text is made for people: two words with a blank between."""
    fixed = "".join(piece if piece is not ANY else "\0" for piece in pieces).strip()
    return re.search(r"[A-Za-z]", fixed) is not None and re.search(
        r"[^\s\0]\s+[^\s]|\S\s+[^\s\0]", fixed.strip("\0 ")) is not None


def sources(folder):
    """All sources below a folder of the project."""
    paths = sorted(path for path in (ROOT / folder).rglob("*") if path.suffix in (".cc", ".h"))
    assert paths, f"no sources in {folder}"
    return [Source(path) for path in paths]
