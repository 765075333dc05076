"""The changes that tools/mutate.py makes: one number, operator, character of a string, or statement at a time."""

import collections
import hashlib
import pathlib
import re

ROOT = pathlib.Path(__file__).resolve().parent.parent
FOLDERS = ("values", "plugin", "reports")
EQUIVALENT = ROOT / "tests" / "equivalent-mutants.txt"

TOKEN = re.compile(r'''
    (?P<comment>//[^\n]*|/\*.*?\*/)
  | (?P<preprocessor>^[ \t]*\#(?:\\\n|[^\n])*)
  | (?P<assertion>static_assert\((?:[^;"]|"(?:\\.|[^"\\])*")*;)
  | (?P<string>"(?:\\.|[^"\\\n])*")
  | (?P<character>'(?:\\.|[^'\\\n])')
  | (?P<number>(?<![\w.])(?:0[xX][0-9a-fA-F'p]+|\d[\d']*(?:\.\d+)?(?:e-?\d+)?)[uUlLfF]*)
  | (?P<word>[A-Za-z_]\w*)
  | (?P<operator>\+\+|--|<<|>>|==|!=|<=|>=|&&|\|\||\+=|-=|\*=|/=|%=|\|=|&=|\^=|<<=|>>=|->|::|[-+*/%<>!&|^~?])
''', re.VERBOSE | re.MULTILINE | re.DOTALL)

BINARY = {"==": "!=", "!=": "==", "<": "<=", ">": ">=", "<=": "<", ">=": ">", "+": "-", "-": "+", "*": "+", "/": "*",
          "%": "/", "<<": ">>", ">>": "<<", "&&": "||", "||": "&&", "&": "|", "|": "&", "^": "|", "+=": "-=", "-=": "+=",
          "*=": "+=", "/=": "*=", "%=": "/=", "|=": "&=", "&=": "|=", "^=": "|=", "<<=": ">>=", ">>=": "<<="}
WORDS = {"true": "false", "false": "true", "min": "max", "max": "min"}


class Mutant:
    def __init__(self, path, text, begin, end, replacement):
        self.path, self.begin, self.end, self.replacement = path, begin, end, replacement
        self.text = text[:begin] + replacement + text[end:]
        first = text.rfind("\n", 0, begin) + 1
        last = text.find("\n", max(end - 1, begin))
        self.line = text.count("\n", 0, begin) + 1
        self.before = " ".join(text[first:last].split())
        self.after = " ".join((text[first:begin] + replacement + text[end:last]).split())

    @property
    def key(self):
        return f"{self.path}: {self.before} ==> {self.after}"

    def __str__(self):
        return f"{self.path}:{self.line}: {self.before} ==> {self.after}"


def number_replacements(token):
    match = re.fullmatch(r"(0[xX][0-9a-fA-F']+|[\d']+)([uUlL]*)", token)
    if not match:
        return [token.replace("e-", "e-1", 1) if "e-" in token else "1" + token]
    digits, suffix = match.group(1).replace("'", ""), match.group(2)
    value = int(digits, 0)
    if digits.lower().startswith("0x"):
        return [f"0x{value + 1:X}{suffix}"]
    return [f"{value + 1}{suffix}"]


def changed_character(character):
    return {"%": "5", "\\": "/"}.get(character, chr(ord(character) ^ 1) if character not in "!#" else "x")


def string_replacements(token, every):
    body = token[1:-1]
    if not body:
        return ['"x"']
    pieces = re.findall(r"\\.|[^\\]", body)
    positions = range(len(pieces))
    if not every:
        positions = [int(hashlib.sha256(body.encode()).hexdigest(), 16) % len(pieces)]
    results = []
    for i in positions:
        piece = changed_character(pieces[i]) if len(pieces[i]) == 1 else "x"
        results.append('"' + "".join(pieces[:i] + [piece] + pieces[i + 1:]) + '"')
    return results


def operator_replacements(text, match):
    token = match.group()
    if token in ("++", "--"):
        return ["--" if token == "++" else "++"]
    if token == "!":
        return [""]
    # clang-format has blanks around binary operators, and none behind references, pointers and template brackets.
    around = text[match.start() - 1:match.start()] + text[match.end():match.end() + 1]
    return [BINARY[token]] if token in BINARY and around.strip() == "" else []


NO_STATEMENT = re.compile(r"(return|using|static_assert|template|struct|class|enum|friend|namespace|extern|typedef|case|"
                          r"default|public|private|else|const|constexpr|inline|static|explicit|virtual|for|while|if|do|"
                          r"throw|break|continue|requires|operator|auto|char|unsigned|float|double|bool|int|std::\w+ \w)\b")


def statement_spans(text, skipped):
    """Statements that are calls or assignments, from their first character to the semicolon."""
    body = r"([A-Za-z_*+-](?:[^;{}#]|\{[^;{}]*\})*;)"
    for match in [*re.finditer(r"(?<=[;{}:\n])\s*" + body, text), *re.finditer(r"\b(?:if \([^;{}]*\)|else)\s+" + body, text)]:
        begin, statement = match.start(1), match.group(1)
        if any(a <= begin < b for a, b in skipped) or NO_STATEMENT.match(statement):
            continue
        if statement.count("(") == statement.count(")") and re.search(r"\(|=|\+\+|--", statement):
            yield begin, match.end(1)


def mutants_of(path, every):
    text = (ROOT / path).read_text()
    skipped, found = [], []
    for match in TOKEN.finditer(text):
        kind, token = match.lastgroup, match.group()
        if kind in ("comment", "preprocessor", "assertion"):
            skipped.append(match.span())
            continue
        replacements = []
        if kind == "string":
            replacements = string_replacements(token, every)
        elif kind == "character":
            replacements = ["'x'" if token != "'x'" else "'y'"]
        elif kind == "number":
            replacements = number_replacements(token)
        elif kind == "word" and token in WORDS:
            replacements = [WORDS[token]]
        elif kind == "operator":
            replacements = operator_replacements(text, match)
        found += [Mutant(path, text, *match.span(), replacement) for replacement in replacements]
    for begin, end in sorted(set(statement_spans(text, skipped))):
        found.append(Mutant(path, text, begin, end, ";"))
    same = collections.Counter()
    for mutant in found:  # the same line may stand in a file more than once
        same[mutant.key] += 1
        mutant.id = f"{mutant.key} #{same[mutant.key]}"
    return found


def core_files():
    return [str(p.relative_to(ROOT)) for folder in FOLDERS for p in sorted((ROOT / folder).rglob("*"))
            if p.suffix in (".h", ".cpp")]


def chosen_mutants(files, every_character, sample):
    mutants = [mutant for file in files or core_files() for mutant in mutants_of(file, every_character)]
    if sample:
        mutants.sort(key=lambda mutant: hashlib.sha256(f"{mutant}{mutant.begin}".encode()).hexdigest())
        mutants = mutants[:sample]
    return mutants


def known_equivalents():
    """A test for keys that are listed, as they stand or, behind a tilde, as a regular expression."""
    lines = [line.strip() for line in EQUIVALENT.read_text().splitlines() if " ==> " in line] if EQUIVALENT.exists() else []
    literal = {line for line in lines if not line.startswith("~ ")}
    patterns = [re.compile(line[2:]) for line in lines if line.startswith("~ ")]
    return lambda key: key in literal or any(pattern.fullmatch(key) for pattern in patterns)
