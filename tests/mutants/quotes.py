"""Finds in the sources what rules.txt and harmless.txt quote. As a program: fails if something is not there."""

import functools
import pathlib
import re
import sys

HERE = pathlib.Path(__file__).resolve().parent
ROOT = HERE.parent.parent

TOKEN = re.compile(r"""//[^\n]*|/\*.*?\*/|"(?:\\.|[^"\\])*"|'(?:\\.|[^'\\])*'|\w+|[^\w\s]""", re.DOTALL)


class Code:
    """C++ as tokens without comments, so that its layout does not count."""

    def __init__(self, text):
        self.text = text
        self.tokens = [token for token in TOKEN.finditer(text) if not token[0].startswith(("//", "/*"))]
        self.words = [token[0] for token in self.tokens]

    def only(self, quoted, within):
        """Where the quoted code stands among these tokens. Throws ValueError unless it does so exactly once."""
        words = Code(quoted).words
        last = within.stop - len(words)
        found = [at for at in within if at <= last and self.words[at : at + len(words)] == words]
        if len(found) != 1 or not words:
            raise ValueError(f"stands there {len(found)} times, not once: {quoted}")
        return range(found[0], found[0] + len(words))

    def scope(self, head):
        """From `head`, a part of a declaration, to its semicolon or the end of its body."""
        start = self.only(head, range(len(self.words))).start
        depth = 0
        for at in range(start, len(self.words)):
            word = self.words[at]
            depth += (word in "([{") - (word in ")]}")
            # After the braces of a member's initialiser comes the next one, or the body.
            if depth == 0 and (word == ";" or word == "}" and self.words[at + 1 : at + 2] not in ([","], ["{"])):
                return range(start, at + 1)
        raise ValueError(f"never ends: {head}")

    def statement(self, at):
        """The tokens around this one, up to a semicolon or a brace on either side."""
        first, last = at, at + 1
        while first > 0 and not {self.words[first - 1], self.words[at]} & {";", "{", "}"}:
            first -= 1
        while last < len(self.words) and not {self.words[last], self.words[at]} & {";", "{", "}"}:
            last += 1
        return range(first, last)

    def at(self, line, column):
        """The number of the token at this place."""
        offset = [0, *(end.end() for end in re.finditer("\n", self.text))][line - 1] + max(column, 1) - 1
        return next(at for at, token in enumerate(self.tokens) if token.end() > offset)

    def quote(self, tokens):
        """The code in one line, without comments."""
        spaced = [self.tokens[at].start() > self.tokens[at - 1].end() for at in tokens]
        return "".join(" " * space + self.words[at] for at, space in zip(tokens, spaced)).strip()

    def replaced(self, tokens, new):
        return self.text[: self.tokens[tokens.start].start()] + new + self.text[self.tokens[tokens.stop - 1].end() :]


@functools.lru_cache(maxsize=None)
def code(file):
    return Code((ROOT / file).read_text())


def entries(name, keys):
    """The blocks of rules.txt or harmless.txt, each with the tokens of its function and of what it quotes from it."""
    found = []
    stale = []
    for block in re.split(r"\n\s*\n", (HERE / name).read_text()):
        lines = [line for line in block.splitlines() if line and not line.startswith("#")]
        fields = [line.partition(":")[::2] for line in re.sub(r"\n\s+", " ", "\n".join(lines)).splitlines()]
        entry = {key: value.strip() for key, value in fields}
        try:
            if not fields:
                continue
            if [key for key, _ in fields] not in keys:
                raise ValueError(f"a block has the lines {', '.join(keys[0])}")
            entry["file"], _, function = entry["in"].partition(": ")
            here = code(entry["file"])
            entry["scope"] = here.scope(function)
            quoted = entry["old" if "old" in entry else "statement"]
            entry["quoted"] = here.only(quoted, entry["scope"])
            if "statement" in entry and here.statement(entry["quoted"].start) != entry["quoted"]:
                raise ValueError(f"not a whole statement: {quoted}")
            if "old" in entry and Code(entry["new"]).words == Code(quoted).words:
                raise ValueError("changes nothing")
            found.append(entry)
        except (OSError, ValueError) as error:
            stale.append("\n".join([f"mutants: {name}: {error}", *lines]))
    if stale:
        sys.exit("\n\n".join(stale))
    return found


def rules():
    return entries("rules.txt", [["rule", "in", "old", "new"]])


def harmless():
    return entries("harmless.txt", [["in", "statement", "branch", "why"], ["in", "for", "statement", "branch", "why"]])


if __name__ == "__main__":
    status = 0
    for part in (rules, harmless):
        try:
            print(f"{len(part())} {part.__name__}")
        except SystemExit as stale:
            print(stale, file=sys.stderr)
            status = 1
    sys.exit(status)
