"""The changes that tools/mutate makes of a C++ source: where one can be made, and what comes of it.

Our sources are formatted by one tool and written by one guide, so no grammar is needed: brackets,
statements and operators with spaces around them are enough. What is found wrongly does not compile.
"""

import bisect
import collections
import dataclasses
import re

LITERAL_OR_COMMENT = (r'R"(\w*)\(.*?\)\1"|"(?:\\.|[^"\\\n])*"|(?<!\w)\'(?:\\[^\']+|[^\'\\])\''
                      r'|//[^\n]*|/\*.*?\*/')
OPERATOR = r"(?<= )(==|!=|<=?|>=?|&&|\|\||\+=?|-=?)(?=\s)"
OTHER_OPERATOR = {"==": "!=", "!=": "==", "<": "<=", "<=": "<", ">": ">=", ">=": ">", "&&": "||",
                  "||": "&&", "+": "-", "-": "+", "+=": "-=", "-=": "+="}
NO_STATEMENT = r"(constexpr|static|static_assert|using|typedef|template|friend|extern|else|if|for|while)\b"
# Without which a test sees the same: room for what comes, and memory given back, for which the build
# with the sanitizers looks.
UNSEEN = r"(\w+(\.|->))*reserve\(|(\w+::|::operator )*(delete|destroy(_n|_at)?)\b|\w+->~"
EXPRESSION = r"return\b(?!;)|[*+\-(]*[\w:]+(\(|\.|->|\[|\+\+|--| [-+|&*/]?= )"


@dataclasses.dataclass(frozen=True)
class Region:
    """Text of which one of several can be chosen at run time: a condition, the value that a variable
    gets, or statements."""
    kind: str
    start: int
    end: int

    def holds(self, other: "Region") -> bool:
        return self != other and self.start <= other.start and other.end <= self.end

    def overlaps(self, other: "Region") -> bool:
        """Whether they have something in common and neither holds the other."""
        return (self.start < other.start < self.end < other.end or
                other.start < self.start < other.end < self.end)


@dataclasses.dataclass
class Mutant:
    path: str
    line: int
    region: Region
    text: str  # of the whole region, changed
    before: str
    after: str
    original: str  # of the whole region
    number: int = 0

    def name(self) -> str:
        """One line, the same wherever in its source the change stands."""
        return f"{self.path}: {self.original} -> {self.text}"


def blank(match: re.Match) -> str:
    return re.sub(r"[^\n]", " ", match[0])


def flat(text: str) -> str:
    return re.sub(r"\s+", " ", text).strip()


class Source:
    """A source without its comments, with the regions in which it may be changed."""

    def __init__(self, path: str, text: str):
        self.path = path
        self.text = re.sub(LITERAL_OR_COMMENT, lambda each: blank(each) if each[0][0] == "/" else each[0],
                           text, flags=re.S)
        # As long as the text, but nothing within a literal or a directive can be taken for code.
        self.code = re.sub(LITERAL_OR_COMMENT, lambda each: each[0][0] + "_" * (len(each[0]) - 2) + each[0][-1],
                           self.text, flags=re.S)
        self.code = re.sub(r"^#[^\n]*", lambda each: ";" + " " * (len(each[0]) - 1), self.code, flags=re.M)
        self.line_ends = [match.end() for match in re.finditer("\n", self.text)]
        self.partner: dict[int, int] = {}
        self.blocks: list[tuple[int, int]] = []
        self.regions: list[Region] = []
        self.pairs: list[tuple[Region, Region]] = []
        self.match_brackets()
        self.find_regions()

    def match_brackets(self) -> None:
        open_brackets = []
        for match in re.finditer(r"[(){}\[\]]", self.code):
            if match[0] in "({[":
                open_brackets.append(match.start())
            else:
                self.partner[open_brackets[-1]] = match.start()
                self.partner[match.start()] = open_brackets.pop()

    def kind_of_brace(self, begin: int, brace: int) -> str:
        """Whether a brace begins a lambda's body, another block, or a value; `begin` is where the
        statement begins."""
        before = re.sub(r"\s*->[\w:<>,\s*&]+$|\s*\b(mutable|noexcept|const|override)\s*$", "",
                        self.code[begin:brace].rstrip()).rstrip()
        head = before
        if before.endswith(")"):
            head = self.code[begin:self.partner[begin + len(before) - 1]].rstrip()
        if head.endswith("]"):
            capture = self.partner[begin + len(head) - 1]
            if not re.search(r"[\w)\]]$", self.code[:capture].rstrip()):
                return "lambda"
        is_block = before.endswith(")") or not before or re.match(
            r"(template\s*<.*>\s*)?(namespace|class|struct|enum|else|do|try)\b(?!.*=)", before, re.S)
        return "block" if is_block else "value"

    def find_regions(self) -> None:
        begin, previous = 0, None
        outer: list[tuple[str, int]] = []
        for match in re.finditer(r"[(){}\[\];]", self.code):
            at, character = match.start(), match[0]
            if character in "([":
                outer.append((character, begin))
            elif character in ")]":
                outer.pop()
            elif character == "{":
                kind = self.kind_of_brace(begin, at)
                outer.append((kind, begin))
                if kind == "block":
                    self.add_condition(begin, at)
                if kind != "value":
                    self.blocks.append((at, self.partner[at]))
                    begin, previous = at + 1, None
            elif character == "}":
                kind, begin_outside = outer.pop()
                if kind != "value":
                    begin, previous = (begin_outside if kind == "lambda" else at + 1), None
            elif not outer or outer[-1][0] in ("block", "lambda"):
                region = self.add_statement(begin, at + 1)
                if region and previous:
                    self.pairs.append((previous, region))
                begin, previous = at + 1, region

    def add_condition(self, begin: int, end: int) -> None:
        head = re.match(r"\s*(?:else\s+)?(if|while|for)\s*(?=\()", self.code[begin:end])
        if not head:
            return
        opening = begin + head.end()
        parts = self.split(opening + 1, self.partner[opening], ";")
        if head[1] != "for" or len(parts) > 1:
            start, stop = parts[1] if head[1] == "for" else parts[-1]
            if stop > start and " = " not in self.code[start:stop]:
                self.regions.append(Region("condition", start, stop))

    def add_statement(self, begin: int, end: int) -> Region | None:
        """Adds what of a statement can be changed; gives the statement if it can be swapped."""
        label = re.match(r"\s*((case\b[^;]*?|default|public|private|protected)(?<!:):(?!:)\s*)*",
                         self.code[begin:end])
        begin += label.end()
        code = self.code[begin:end]
        if 'R"' in code or re.match(NO_STATEMENT, code):
            return None
        if re.match(EXPRESSION, code):
            region = Region("return" if code.startswith("return") else "statement", begin, end)
            self.regions.append(region)
            return region if region.kind == "statement" else None
        value = re.match(r"[^({]*? = (?![{\[])", code)
        if value and "constexpr" not in value[0] and "operator" not in value[0]:
            self.regions.append(Region("value", begin + value.end(), end - 1))
        return None

    def is_unseen(self, region: Region) -> bool:
        return bool(re.match(UNSEEN, self.code[region.start:region.end]))

    @staticmethod
    def are_independent(first: str, second: str) -> bool:
        """Whether two statements set or empty something each, call nothing else, and neither names what
        the other one changes, so that their order is the same to everybody."""
        changed = [re.fullmatch(r"(\w+(?:(?:\.|->)\w+)*)(?: = [\w.+\- ]*|\.(?:clear|reset|resize)\(\w*\));", each)
                   for each in (first, second)]
        return all(changed) and changed[0][1] not in second and changed[1][1] not in first

    def split(self, start: int, end: int, separator: str) -> list[tuple[int, int]]:
        """The parts between separators that are within no brackets."""
        parts, at, begin = [], start, start
        while at < end:
            if self.code[at] in "({[":
                at = self.partner[at]
            elif self.code[at] == separator:
                parts.append((begin, at))
                begin = at + 1
            at += 1
        return parts + [(begin, end)]

    def mutants(self) -> list[Mutant]:
        found = []
        for region in self.regions:
            inner = [each for each in self.blocks if region.start < each[0] and each[1] < region.end]
            for start, end, new in self.changes(region):
                # Another operator in the size of the room may still ask for more than there is.
                is_unseen = self.is_unseen(region) and new not in OTHER_OPERATOR
                if not is_unseen and not any(first <= start <= last or start <= first < end
                                             for first, last in inner):
                    found.append(self.mutant(region, start, end, new))
            if region.kind == "statement" and not self.is_unseen(region):
                found.append(self.mutant(region, region.start, region.end, ";"))
        for first, second in self.pairs:
            texts = [self.text[each.start:each.end] for each in (second, first)]
            if not (self.is_unseen(first) or self.is_unseen(second) or texts[0] == texts[1] or
                    self.are_independent(*texts)):
                both = Region("statement", first.start, second.end)
                found.append(self.mutant(both, both.start, both.end, " ".join(texts)))
        return found

    def mutant(self, region: Region, start: int, end: int, new: str) -> Mutant:
        left, right = max(region.start, start - 40), min(region.end, end + 40)
        text = self.text
        return Mutant(self.path, bisect.bisect_right(self.line_ends, start) + 1, region,
                      flat(text[region.start:start] + new + text[end:region.end]),
                      flat(text[left:right]), flat(text[left:start] + new + text[end:right]),
                      flat(text[region.start:region.end]))

    def changes(self, region: Region) -> list[tuple[int, int, str]]:
        """Where a region can be changed, and the text to put there."""
        result = []

        def find(pattern: str, replacement) -> None:
            for match in re.finditer(pattern, self.code[region.start:region.end]):
                result.append((region.start + match.start(), region.start + match.end(), replacement(match)))

        find(OPERATOR, lambda match: OTHER_OPERATOR[match[0]])
        find(r"!(?=[\w(*])", lambda match: "")
        if region.kind == "condition" and not result:
            find(r"(?s)^.*$", lambda match: f"!({self.text[region.start:region.end]})")
        find(r"(?<![\w.'])(0x[0-9A-Fa-f]+|\d+)(?=[uUlL]*\b)(?![.'])", lambda match: str(int(match[0], 0) + 1))
        find(r"\b(true|false)\b", lambda match: "false" if match[0] == "true" else "true")
        find(r'"(_+)"', lambda match: self.text[region.start + match.start():region.start + match.end() - 1] + 'x"')
        for match in re.finditer(r"(?!if|while|switch|return|min|max)\b\w+(<[\w:]+>)?\(", self.code[region.start:region.end]):
            opening = region.start + match.end() - 1
            arguments = self.split(opening + 1, self.partner[opening], ",")
            texts = [self.text[start:end].strip() for start, end in arguments]
            if len(texts) > 1 and texts[0] != texts[1]:
                result.append((arguments[0][0], arguments[1][1], f"{texts[1]}, {texts[0]}"))
        return result

    def with_switches(self, mutants: list[Mutant], header: str) -> str:
        """The source with mutants behind their switches, each on a line that ends by its number."""
        variants = collections.defaultdict(list)
        for each in mutants:
            variants[each.region].append(each)

        def render(start: int, end: int, regions: list[Region]) -> str:
            text, at = "", start
            outermost = [each for each in regions if not any(other.holds(each) for other in regions)]
            for region in sorted(outermost, key=lambda each: each.start):
                inner = render(region.start, region.end, [each for each in regions if region.holds(each)])
                text += self.text[at:region.start]
                is_value = region.kind in ("condition", "value")
                cast = "static_cast<bool>" if region.kind == "condition" else ""
                text += "(" if is_value else ""
                for each in variants[region]:
                    switch = f"mutant({each.number})"
                    text += (f"\n{switch} ? {cast}({each.text}) :" if is_value else
                             f"\nif ({switch}) {{ {each.text} }} else") + f" //@{each.number}"
                text += f"\n{cast}({inner}))" if is_value else f"\n{{ {inner} }}"
                at = region.end
            return text + self.text[at:end]

        return f'#include "{header}"\n' + render(0, len(self.text), list(variants))
