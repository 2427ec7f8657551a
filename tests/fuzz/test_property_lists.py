#!/usr/bin/python3
# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Property lists made by chance are read here as Python's plistlib reads them: the same verdict and the same value.

usage: test_property_lists.py PROGRAM [COUNT [SEED]]

What may differ stands below; anything else is a failure.
"""

import base64
import calendar
import json
import math
import plistlib
import random
import re
import subprocess
import sys
import xml.parsers.expat

# What is refused here and not there, by the beginning of the reason.
STRICTER = {
    "an integer of 64 bits": "integers of any size, and digits with underscores between them, are numbers there",
    "a real number": "reals have them too",
    "a date like": "what follows a date is passed over there, and its end may be left out",
    "data in base 64": "what is no digit of it is passed over there",
    "a property list value": "an unknown element is passed over there",
    "a key that has not occurred": "the last of two counts there",
    "a key": "an unknown element between keys is passed over there",
    "no text here": "text between elements is passed over there",
    "text": "an element within a text is passed over there",
    "an empty element": "what is in a boolean is passed over there",
    "one value in the property list": "the last of several counts there",
    "a value in the property list": "an empty list is a value there, none",
    "a document type without": "one that declares no entity is taken there",
    "a reference that XML": "where a document type names a file, it might define any entity there",
    "the encoding": "the text of a document is of one encoding there: that of its first bytes or of its declaration",
}
# What is refused there and not here, by a pattern on the reason there.
LAXER = {
    r"base 10: '\s*[-+]?\s*0[xX]": "hexadecimal digits have no sign and no white space before them there",
    "invalid token|second declaration|not at start of entity": "names, comments and declarations in wrong places are passed over",
    "syntax error|illegal character.s. in public id": "a document type line is passed over",
    "duplicate attribute|undefined entity|invalid character number|reserved prefix": "attributes are passed over",
    "XML declaration not well-formed": "of a declaration the encoding counts alone",
    "encoding specified in XML|unknown encoding": "a byte order mark tells the encoding before a declaration",
}

WORDS = ["", "a", "A b", "é€😀", " x ", "\t", "a\nb", "a\r\nb\rc", "&", "<", ">", "]", "'\"", "\u0085\u2028\ufffd", "x" * 70]
PIECES = ["<", ">", "&", "/", "'", '"', "=", " ", "0", "Z", "-", "+", "key", "<!--", "-->", "<![CDATA[", "]]>", "&#0;", "&#x41;",
          "&lt;", "&none;", "<a/>", "<true/>", "\0", "\x1b", "é", "[", "]", "?>", "<?x ?>", "_1", "0x"]


class Maker:
    def __init__(self, seed):
        self.chance = random.Random(seed)

    def text(self, value):
        written = ""
        for character in value:
            kind = self.chance.random()
            if character in "&<\r" or kind < 0.1:
                written += self.chance.choice([f"&#{ord(character)};", f"&#x{ord(character):x};"])
            elif kind < 0.2 and character not in "]>":
                written += f"<![CDATA[{character}]]>"
            elif character == ">":
                written += "&gt;"
            else:
                written += character
        return written

    def integer(self):
        number = self.chance.choice([0, 1, -1, 2**63 - 1, -2**63, self.chance.getrandbits(62), 2**63, -2**64])
        return self.chance.choice([str(number), f"0x{abs(number):X}", f" {number}\n", f"+{abs(number)}", f"-0x{abs(number):x}"])

    def real(self):
        return self.chance.choice(["0", "-0.0", "1.5", "1e308", "5e-324", "inf", "-Infinity", "nan", ".5", "1.", " 2 ", "+3",
                                   "1e999", "0x1p3", repr(self.chance.uniform(-1e9, 1e9))])

    def date(self):
        return "%04d-%02d-%02dT%02d:%02d:%02dZ" % tuple(self.chance.randint(*limits) for limits in
                                                     [(0, 9999), (1, 12), (1, 31), (0, 24), (0, 60), (0, 60)])

    def element(self, name, content):
        attributes = self.chance.choice(["", "", "", " ", " a='b'", ' a="&amp;" b=">"'])
        return f"<{name}{attributes}>{content}</{name}>" if content or self.chance.random() < 0.5 else f"<{name}{attributes}/>"

    def blank(self):
        return self.chance.choice(["", "", "", "\n\t", " ", "<!-- c -->", "<?p i?>"])

    def value(self, depth=0):
        kind = self.chance.randrange(9 if depth < 5 else 7)
        if kind == 7:
            return self.element("array", "".join(self.blank() + self.value(depth + 1) for _ in range(self.chance.randrange(5))))
        if kind == 8:
            keys = self.chance.sample(WORDS, self.chance.randrange(12))
            return self.element("dict", "".join(self.blank() + self.element("key", self.text(key)) + self.blank() +
                                                self.value(depth + 1) for key in keys))
        octets = base64.b64encode(self.chance.randbytes(self.chance.randrange(20))).decode()
        return [lambda: self.element("string", self.text(self.chance.choice(WORDS))),
                lambda: self.element("integer", self.integer()), lambda: self.element("real", self.real()),
                lambda: self.element("true", ""), lambda: self.element("false", ""),
                lambda: self.element("date", self.date()), lambda: self.element("data", " ".join([octets[:4], octets[4:]]))][kind]()

    def document(self):
        text = self.value() if self.chance.random() < 0.2 else self.element("plist", self.blank() + self.value() + self.blank())
        for beginnings in (["", "", '<!DOCTYPE plist PUBLIC "-//a//b" "http://x/y.dtd">\n', "<!DOCTYPE plist [<!ELEMENT a ANY>]>"],
                           ["", '<?xml version="1.0"?>\n', '<?xml version="1.0" encoding="UTF-8"?>\n']):
            text = self.chance.choice(beginnings) + text
        while self.chance.random() < 0.3:
            place = self.chance.randrange(len(text) + 1)
            text = text[:place] + self.chance.choice(PIECES) + text[place + self.chance.choice([0, 0, 1, 5]):]
        return text.encode(self.chance.choice(["utf-8"] * 6 + ["utf-16"]), "surrogatepass")


def plain(value):
    """A value of plistlib's as the program tells it."""
    if isinstance(value, bool):
        return ["boolean", "1" if value else "0"]
    if isinstance(value, dict):
        return ["dictionary", *([key, plain(content)] for key, content in value.items())]
    if isinstance(value, list):
        return ["array", *map(plain, value)]
    if isinstance(value, bytes):
        return ["data", list(value)]
    if isinstance(value, float):
        return ["real", value]
    if hasattr(value, "utctimetuple"):
        return ["date", calendar.timegm(value.utctimetuple())]
    return ["integer" if isinstance(value, int) else "string", value]


def is_same(ours, theirs):
    if isinstance(theirs, list):
        return len(ours) == len(theirs) and all(map(is_same, ours, theirs))
    if isinstance(theirs, float):
        return float(ours) == theirs or (math.isnan(theirs) and math.isnan(float(ours)))
    return type(ours) is type(theirs) and ours == theirs


def read(document):
    """The value, or the error."""
    try:
        return plain(plistlib.loads(document, fmt=plistlib.FMT_XML)), None
    except xml.parsers.expat.ExpatError as error:
        return None, xml.parsers.expat.errors.messages[error.code]
    except Exception as error:  # whatever a text makes of the library
        return None, repr(error)


def difference(document, answer):
    """What differs and may not; None: there is nothing."""
    theirs, error = read(document)
    if answer.startswith("-"):
        reason = re.sub(r"^-(offset -?\d+: expected )?", "", answer)
        return None if error or reason.startswith(tuple(STRICTER)) else reason
    if not error:
        return None if is_same(json.loads(answer), theirs) else f"{answer} is {theirs} there"
    return None if re.search("|".join(LAXER), error) else error


def main(program, count="10000", seed="1"):
    maker = Maker(int(seed))
    documents = [maker.document() for _ in range(int(count))]
    asked = b"".join(b"%d\n%b" % (len(document), document) for document in documents)
    answers = subprocess.run([program], input=asked, stdout=subprocess.PIPE, check=True).stdout.decode().split("\n")[:-1]
    found = [(document, difference(document, answer)) for document, answer in zip(documents, answers, strict=True)]
    wrong = [f"{document!r}: {what}" for document, what in found if what]
    taken = sum(not answer.startswith("-") for answer in answers)
    print(*wrong, f"{len(documents)} property lists, {taken} of them taken; {len(wrong)} read otherwise than by plistlib", sep="\n")
    assert taken > len(documents) / 4, "enough of them are sound"
    return 1 if wrong else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
