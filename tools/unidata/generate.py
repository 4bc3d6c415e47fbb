#!/usr/bin/env python3
"""Builds src/codepage/lxunicode_tables.inc from the Unicode character database.

A maintainer runs it when the library moves to another version of Unicode:

    generate.py [DIRECTORY]          writes the tables (default: /usr/share/unicode, Debian's unicode-data)
    generate.py --check [DIRECTORY]  writes nothing; exits 1 and says where when the file is not up to date

The output holds nothing but the data and the version and SHA-256 of each input, so that it is the same bytes
every time. The ranges and their fixed words are rules of src/codepage/lxunicode.cpp; this program fills the
tables behind them.
"""

import argparse
import hashlib
import re
import sys
from pathlib import Path

OUTPUT = Path(__file__).resolve().parents[2] / "src" / "codepage" / "lxunicode_tables.inc"

# The three fields of a type word and where they stand in it.
ALPHA, UPPER, LOWER, DIGIT, XDIGIT, PUNCT, SPACE, BLANK, CNTRL, ASCII = (1 << n for n in range(10))
(NONE, LEFT_TO_RIGHT, RIGHT_TO_LEFT, EUROPEAN_NUMBER, EUROPEAN_SEPARATOR, EUROPEAN_TERMINATOR, ARABIC_NUMBER,
 COMMON_SEPARATOR, BLOCK_SEPARATOR, SEGMENT_SEPARATOR, WHITE_SPACE, OTHER_NEUTRAL) = (1 << n for n in range(12))
(NON_SPACING, DIACRITIC, VOWEL_MARK, SYMBOL, KATAKANA, HIRAGANA, HALF_WIDTH, FULL_WIDTH, IDEOGRAPH,
 KASHIDA) = (1 << n for n in range(10))
BIDI_SHIFT = 10
TEXT_SHIFT = 22

TYPE_RANGES = [(0x0000, 0x06F9), (0x0901, 0x0EDD), (0x10A0, 0x11F9), (0x1E00, 0x21FF),
               (0x22F2, 0x27BE), (0x3000, 0x33FE), (0xFB00, 0xFBD2), (0xFD3E, 0xFFFF)]

# Tables of 16-bit values: the value of the first entry and the last value.
LOWER_RANGES = [(0x0100, 0x01FE), (0x0200, 0x0275), (0x0380, 0x03EE), (0x0400, 0x04F8), (0x1E00, 0x1EF8),
                (0x1F00, 0x1FFC)]
UPPER_RANGES = [(0x0100, 0x01FF), (0x0200, 0x0292), (0x03A0, 0x03F1), (0x0430, 0x04F9), (0x1E00, 0x1EF9),
                (0x1F00, 0x1FF3)]
HALF_TO_FULL_RANGES = [(0x00A0, 0x00AF), (0xFF60, 0xFFEE)]
FULL_TO_HALF_RANGES = [(0x2500, 0x25CB), (0x3000, 0x30FC), (0x3130, 0x3164), (0xFFE0, 0xFFE6)]

DIGIT_COUNT = 179

# The bidirectional category of each class of the database. European separators and terminators follow the
# assignment that programs were written against: plus and hyphen-minus, with their superscript, subscript,
# small and full-width forms, U+2212 and U+FB29 (everything that the database calls ES today), are terminators,
# and the solidus is a separator (see bidi_category). The field has no bit for three kinds of class:
# - Marks (NSM) take their direction from what stands around them, as neutrals do: other neutral.
# - Isolates count as neutrals in the bidirectional algorithm: other neutral.
# - Embeddings, overrides and boundary neutrals (most controls) are removed by it: none.
BIDI_CATEGORY = {
    "L": LEFT_TO_RIGHT, "R": RIGHT_TO_LEFT, "AL": RIGHT_TO_LEFT, "EN": EUROPEAN_NUMBER,
    "ES": EUROPEAN_TERMINATOR, "ET": EUROPEAN_TERMINATOR, "AN": ARABIC_NUMBER, "CS": COMMON_SEPARATOR,
    "B": BLOCK_SEPARATOR, "S": SEGMENT_SEPARATOR, "WS": WHITE_SPACE, "ON": OTHER_NEUTRAL,
    "NSM": OTHER_NEUTRAL, "LRI": OTHER_NEUTRAL, "RLI": OTHER_NEUTRAL, "FSI": OTHER_NEUTRAL,
    "PDI": OTHER_NEUTRAL, "LRE": NONE, "RLE": NONE, "LRO": NONE, "RLO": NONE, "PDF": NONE, "BN": NONE,
}
SOLIDI = (0x002F, 0xFF0F)

# Canonical combining classes of the Hebrew points sheva to qubuts, and of the Arabic fathatan to kasra, sukun
# and superscript alef. Dagesh, rafe, the shin and sin dots and shadda mark consonants.
VOWEL_CLASSES = {*range(10, 21), *range(27, 33), 34, 35}

ASCII_ACCENTS = (0x005E, 0x0060, 0xFF3E, 0xFF40)
SOFT_HYPHEN = 0x00AD
TATWEEL = 0x0640


class Character:
    """One line of UnicodeData.txt."""

    def __init__(self, fields):
        self.category = fields[2]
        self.combining_class = int(fields[3])
        self.bidi = fields[4]
        self.decomposition_tag, self.decomposition = self.parse_decomposition(fields[5])
        self.digit_value = int(fields[7]) if fields[7] else None
        self.upper = int(fields[12], 16) if fields[12] else None
        self.lower = int(fields[13], 16) if fields[13] else None

    @staticmethod
    def parse_decomposition(text):
        parts = text.split()
        tag = parts.pop(0) if parts and parts[0].startswith("<") else None
        return tag, [int(part, 16) for part in parts]

    @property
    def is_mark(self):
        return self.category in ("Mn", "Me")


class Database:
    """The properties that the tables need, of the values of the Basic Multilingual Plane."""

    def __init__(self, directory):
        self.directory = directory
        self.hashes = {}
        self.version = None
        self.characters = self.read_characters()
        core = self.read_property("DerivedCoreProperties.txt")
        self.alphabetic = core["Alphabetic"].keys()
        self.uppercase = core["Uppercase"].keys()
        self.lowercase = core["Lowercase"].keys()
        props = self.read_property("PropList.txt")
        self.white_space = props["White_Space"].keys()
        self.hex_digit = props["Hex_Digit"].keys()
        self.diacritic = props["Diacritic"].keys()
        self.ideographic = props["Ideographic"].keys()
        self.visible_format = props["Prepended_Concatenation_Mark"].keys()
        scripts = self.read_property("Scripts.txt")
        shared_kana = self.read_property("ScriptExtensions.txt")["Hira Kana"].keys()
        self.hiragana = scripts["Hiragana"].keys() | shared_kana
        self.katakana = scripts["Katakana"].keys() | shared_kana
        widths = self.read_property("EastAsianWidth.txt")
        self.half_width = widths["Na"].keys() | widths["H"].keys()
        self.full_width = widths["F"].keys()
        self.vowel_signs = self.read_property("IndicSyllabicCategory.txt")["Vowel_Dependent"].keys()
        ages = self.read_property("DerivedAge.txt")
        self.age = {u: tuple(map(int, age.split("."))) for age in ages for u in ages[age]}
        self.digits = self.find_digits()

    def read_lines(self, name):
        data = (self.directory / name).read_bytes()
        self.hashes[name] = hashlib.sha256(data).hexdigest()
        text = data.decode("utf-8")
        header = re.match(r"# [A-Za-z]+-(\d+\.\d+\.\d+)\.txt", text)
        if header:
            if self.version not in (None, header[1]):
                sys.exit(f"{name}: version {header[1]}, but other files have {self.version}")
            self.version = header[1]
        return [line for line in (line.split("#", 1)[0].strip() for line in text.splitlines()) if line]

    def read_characters(self):
        characters = {}
        first = None
        for line in self.read_lines("UnicodeData.txt"):
            fields = line.split(";")
            u = int(fields[0], 16)
            if u > 0xFFFF:
                break
            if fields[1].endswith(", First>"):
                first = u
                continue
            for value in range(u if first is None else first, u + 1):
                characters[value] = Character(fields)
            first = None
        return characters

    def read_property(self, name):
        """{property value: {value: None}} of a file of lines "range ; property value"."""
        properties = {}
        for line in self.read_lines(name):
            span, value = (part.strip() for part in line.split(";")[:2])
            first, _, last = span.partition("..")
            members = properties.setdefault(value, {})
            members.update(dict.fromkeys(range(int(first, 16), min(int(last or first, 16), 0xFFFF) + 1)))
        return properties

    def find_digits(self):
        """The digits that can be mapped to ASCII: the decimal digits of the scripts of Unicode 2.0, and all
        superscripts and subscripts. The set stays what it is when scripts are added to Unicode."""
        digits = {}
        for u, character in self.characters.items():
            if character.digit_value is None:
                continue
            decimal = character.category == "Nd" and self.age[u] <= (2, 0)
            if decimal or character.decomposition_tag in ("<super>", "<sub>"):
                digits[u] = ord("0") + character.digit_value
        if len(digits) != DIGIT_COUNT:
            sys.exit(f"{len(digits)} digits instead of {DIGIT_COUNT}")
        return digits

    def full_decomposition(self, u):
        """The canonical decomposition, taken to the end."""
        character = self.characters.get(u)
        if character is None or character.decomposition_tag or not character.decomposition:
            return [u]
        return [part for value in character.decomposition for part in self.full_decomposition(value)]

    def is_punctuation(self, u):
        """Every visible character that is no letter, digit or mark: punctuation, symbols, fractions and numbers
        that have no ASCII digit. The soft hyphen and the Arabic number signs are visible, other format
        characters are not."""
        category = self.characters[u].category
        if u in self.alphabetic or u in self.digits:
            return False
        return category[0] in "PSN" or u == SOFT_HYPHEN or u in self.visible_format

    def classification(self, u):
        category = self.characters[u].category
        bits = 0
        if u < 0x80:
            bits |= ASCII
        if u in self.alphabetic:
            bits |= ALPHA
        if u in self.uppercase:
            bits |= UPPER
        if u in self.lowercase:
            bits |= LOWER
        if u in self.digits:
            bits |= DIGIT
        # The full-width forms count as well: their digits are digits, and mapping them to half width gives a
        # number that can be read.
        if u in self.hex_digit:
            bits |= XDIGIT
        if u in self.white_space:
            bits |= SPACE
        if category == "Zs" or u == ord("\t"):
            bits |= BLANK
        if self.is_punctuation(u):
            bits |= PUNCT
        elif category in ("Cc", "Cf", "Zl", "Zp"):
            bits |= CNTRL
        return bits

    def bidi_category(self, u):
        return EUROPEAN_SEPARATOR if u in SOLIDI else BIDI_CATEGORY[self.characters[u].bidi]

    def text_properties(self, u):
        character = self.characters[u]
        bits = 0
        # A letter with its mark in one character counts as what it decomposes into.
        accented_letter = character.category[0] == "L" and any(
            self.characters[part].is_mark for part in self.full_decomposition(u))
        if character.is_mark or accented_letter:
            bits |= NON_SPACING | DIACRITIC
        # "^" and "`" are plain ASCII punctuation, and so are their full-width forms.
        if u in self.diacritic and u not in ASCII_ACCENTS:
            bits |= DIACRITIC
        if u in self.vowel_signs or character.combining_class in VOWEL_CLASSES:
            bits |= VOWEL_MARK
        if self.is_punctuation(u) or character.category == "Zs":
            bits |= SYMBOL
        if u in self.katakana:
            bits |= KATAKANA
        if u in self.hiragana:
            bits |= HIRAGANA
        if u in self.half_width:
            bits |= HALF_WIDTH
        if u in self.full_width:
            bits |= FULL_WIDTH
        if u in self.ideographic:
            bits |= IDEOGRAPH
        if u == TATWEEL:
            bits |= KASHIDA
        return bits

    def type_word(self, u):
        if u not in self.characters:
            return NONE << BIDI_SHIFT
        return (self.classification(u) | self.bidi_category(u) << BIDI_SHIFT |
                self.text_properties(u) << TEXT_SHIFT)

    def lower(self, u):
        return self.simple_mapping(u, "lower")

    def upper(self, u):
        return self.simple_mapping(u, "upper")

    def simple_mapping(self, u, direction):
        target = getattr(self.characters[u], direction) if u in self.characters else None
        return u if target is None or target > 0xFFFF else target

    def width_pairs(self):
        """(half-width value, full-width value) of the <wide> and <narrow> compatibility decompositions."""
        for u, character in self.characters.items():
            if character.decomposition_tag == "<wide>":
                yield character.decomposition[0], u
            elif character.decomposition_tag == "<narrow>":
                yield u, character.decomposition[0]


def array(c_type, name, values, width, per_line):
    lines = [f"constexpr {c_type} {name}[{len(values)}] = {{"]
    for start in range(0, len(values), per_line):
        lines.append("    " + " ".join(f"0x{value:0{width}X}," for value in values[start:start + per_line]))
    return lines + ["};"]


def range_arrays(c_type, name, ranges, value):
    """An array for each range, numbered from 1."""
    width, per_line = (8, 9) if c_type == "uint32_t" else (4, 12)
    return [array(c_type, f"LX_UNICODE_{name}{n}", [value(u) for u in range(first, last + 1)], width, per_line)
            for n, (first, last) in enumerate(ranges, 1)]


def digit_array(digits):
    pairs = sorted(digits.items())
    lines = [f"constexpr uint16_t LXDigits[{len(pairs)}][2] = {{"]
    for start in range(0, len(pairs), 6):
        lines.append("    " + " ".join(f"{{0x{u:04X}, 0x{d:04X}}}," for u, d in pairs[start:start + 6]))
    return lines + ["};"]


def generate(database):
    half_to_full = dict(database.width_pairs())
    full_to_half = {full: half for half, full in half_to_full.items()}
    arrays = range_arrays("uint32_t", "Ctype", TYPE_RANGES, database.type_word)
    arrays += range_arrays("uint16_t", "Lower", LOWER_RANGES, database.lower)
    arrays += range_arrays("uint16_t", "Upper", UPPER_RANGES, database.upper)
    arrays += range_arrays("uint16_t", "H2F", HALF_TO_FULL_RANGES, lambda u: half_to_full.get(u, u))
    arrays += range_arrays("uint16_t", "F2H", FULL_TO_HALF_RANGES, lambda u: full_to_half.get(u, u))
    arrays.append(digit_array(database.digits))
    lines = ["// Type words, case, width and digit mappings of Unicode values, read by lxunicode.cpp.",
             "// Generated by tools/unidata/generate.py; do not edit.",
             f"// Unicode {database.version}, from (SHA-256):"]
    lines += [f"//   {digest} {name}" for name, digest in sorted(database.hashes.items())]
    lines += ["// clang-format off", "", "namespace lx {", ""]
    for each in arrays:
        lines += each + [""]
    lines += ["}  // namespace lx", "// clang-format on"]
    return "\n".join(lines) + "\n"


def first_difference(old, new):
    """"line N, in NAME" of the first line that differs."""
    old_lines, new_lines = old.splitlines(), new.splitlines()
    same = 0
    while same < min(len(old_lines), len(new_lines)) and old_lines[same] == new_lines[same]:
        same += 1
    names = re.findall(r"^constexpr \w+ (\w+)", "\n".join(new_lines[:same + 1]), re.MULTILINE)
    return f"line {same + 1}, in {names[-1] if names else 'the header'}"


def main():
    parser = argparse.ArgumentParser(description="Build the Unicode tables of the codepage room.")
    parser.add_argument("directory", nargs="?", type=Path, default=Path("/usr/share/unicode"),
                        help="text files of the Unicode character database (default: %(default)s)")
    parser.add_argument("--check", action="store_true", help="only compare with the file that is there")
    arguments = parser.parse_args()
    text = generate(Database(arguments.directory))
    if not arguments.check:
        OUTPUT.write_text(text, encoding="utf-8", newline="\n")
        return 0
    old = OUTPUT.read_bytes().decode("utf-8", "replace") if OUTPUT.exists() else ""
    if old != text:
        print(f"{OUTPUT}: not up to date from {first_difference(old, text)} on", file=sys.stderr)
        return 1
    return 0


if __name__ == "__main__":
    sys.exit(main())
