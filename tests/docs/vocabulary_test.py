# SPDX-License-Identifier: Apache-2.0
"""One vocabulary: CONTRIBUTING.md's glossary, and that no file uses a word which it rules out.

Exempt are what the service logs and what its tests expect of that, and the names and words of the
foldable phone."""

import os
import pathlib
import re
import unittest

PROJECT = pathlib.Path(__file__).resolve().parent.parent.parent
SUFFIXES = {".aidl", ".bp", ".c", ".cmake", ".cpp", ".h", ".j2", ".json", ".map", ".md", ".mk",
            ".py", ".rc", ".service", ".sh", ".te", ".txt", ".xml", ".1"}
OTHERS_WORDS = {"LICENSE", "vocabulary_test.py"}  # and the glossary's own rows

# Logged, or compared with what was logged: string literals of the service and its unit tests.
LOGGING = PROJECT / "hal-server"
LITERAL = re.compile(r'"(?:\\.|[^"\\\n])*"')
FOLDABLE = re.compile(r"\w*(?:FolderStatus|FolderTentMode|FOLDER_(?:OPEN|CLOSE|TENT|STATUS))\w*|"
                      r"\"FOLDER[^\"\n]*\"")

# Which form of a ruled-out word counts, where it is not the word itself or the word with more
# letters behind it.
FORMS = {
    "blank": r"\bblanks?\b(?! lines?\b)(?!_)",  # an empty line is a blank line
    "maker": r"\bmaker\b",
    "parted": r"\bparted\b",
    "road": r"\broads?\b",
    "imitated": r"imitat",
}


def glossary():
    """The rows of the glossary: (word, meaning, words that are not used for it)."""
    text = (PROJECT / "CONTRIBUTING.md").read_text("utf-8")
    rows = text.split("\n## Words\n")[1].split("\n## ")[0]
    cells = [[cell.strip() for cell in line.strip("|").split("|")]
             for line in rows.splitlines() if line.startswith("|")][2:]
    return [(word, meaning, [each.strip() for each in old.split(",") if each.strip()])
            for word, meaning, old in cells]


def form_of(word):
    return re.compile(FORMS.get(word, re.escape(word)), re.IGNORECASE)


def files():
    for place, directories, names in os.walk(PROJECT):
        directories[:] = [name for name in directories
                          if name != "build" and not name.startswith(".")
                          and not name.endswith("_corpus")]
        for name in names:
            path = pathlib.Path(place) / name
            if name not in OTHERS_WORDS and (path.suffix in SUFFIXES or not path.suffix):
                yield path


def looked_at(path):
    """The file's text as far as its words are this project's to choose."""
    text = path.read_text("utf-8", errors="replace")
    if path.name == "CONTRIBUTING.md":
        head, rest = text.split("\n## Words\n")
        text = head + "".join(rest.partition("\n## ")[1:])
    text = FOLDABLE.sub("", text)
    if path.is_relative_to(LOGGING) and path.suffix in (".cpp", ".h"):
        text = LITERAL.sub("", text)
    return text


class Vocabulary(unittest.TestCase):
    def test_glossary_is_short_and_says_what_each_word_means(self):
        rows = glossary()
        self.assertGreaterEqual(len(rows), 10)
        self.assertLessEqual(len(rows), 15)
        self.assertEqual([word for word, _, _ in rows], sorted(word for word, _, _ in rows))
        for word, meaning, _ in rows:
            self.assertGreater(len(meaning.split()), 3, word)

    def test_no_file_uses_a_word_that_the_glossary_rules_out(self):
        ruled_out = [(word, old, form_of(old)) for word, _, olds in glossary() for old in olds]
        self.assertGreater(len(ruled_out), 9)
        found = []
        for path in files():
            name = str(path.relative_to(PROJECT))
            text = looked_at(path)
            for word, old, form in ruled_out:
                for match in form.finditer(text):
                    line = text.count("\n", 0, match.start()) + 1
                    found.append(f"{name}:{line}: {old}; say {word}")
                if form.search(FOLDABLE.sub("", path.name)):
                    found.append(f"{name}: its name has {old}; say {word}")
        self.assertEqual(found, [], "\n".join(["", *found]))

    def test_the_names_of_the_foldable_phone_are_no_directories(self):
        self.assertEqual(FOLDABLE.sub("", 'setFolderStatus(ZelFolderStatus::OPEN) "FOLDER_CLOSE"'),
                         '(::OPEN) ')
        self.assertRegex(FOLDABLE.sub("", "kLedsFolder"), form_of("folder"))


if __name__ == "__main__":
    unittest.main()
