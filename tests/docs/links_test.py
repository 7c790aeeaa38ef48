# SPDX-License-Identifier: Apache-2.0
"""Links and paths in README.md, CONTRIBUTING.md and docs/ lead somewhere, and the rooms that
docs/architecture.md draws are those of the service."""

import pathlib
import re
import unittest

from documents import PROJECT, documents

SERVICE = PROJECT / "hal-server" / "vibrator" / "aidl" / "default"


def anchors(path):
    """The anchors that a page's headings have."""
    heads = re.findall(r"(?m)^#+ (.*)$", path.read_text("utf-8"))
    return {re.sub(r"[^\w\- ]", "", head.lower()).replace(" ", "-") for head in heads}


class Links(unittest.TestCase):
    def test_lead_to_files_and_headings_that_exist(self):
        seen = 0
        for page in [*documents(), PROJECT / "CONTRIBUTING.md"]:
            for target in re.findall(r"\]\(([^)\s]+)\)", page.read_text("utf-8")):
                if re.match(r"[a-z]+:", target):
                    continue
                seen += 1
                name, _, anchor = target.partition("#")
                path = (page.parent / name).resolve() if name else page
                self.assertTrue(path.exists(), f"{page.name}: {target}")
                if anchor:
                    self.assertIn(anchor, anchors(path), f"{page.name}: {target}")
        self.assertGreater(seen, 10)

    def test_the_readme_leads_to_the_paths_that_it_names(self):
        readme = re.sub(r"(?ms)^```.*?^```$", "", (PROJECT / "README.md").read_text("utf-8"))
        linked = set(re.findall(r"\]\(([^)#\s]+)", readme))
        for span in re.findall(r"`([^`\n]+)`", readme):
            path = span.split()[0].removeprefix("./").rstrip("/")
            if path.split("/")[0] == "build":
                continue  # is there, or is not, by what was run before
            if re.match(r"[^/].*/", span) and (PROJECT / path).exists():
                self.assertIn(path, linked, f"README.md names {path} and does not link it")

    def test_the_readme_names_every_page(self):
        readme = (PROJECT / "README.md").read_text("utf-8")
        for path in (PROJECT / "docs").glob("*.md"):
            self.assertIn(f"docs/{path.name}", readme)


class Tests(unittest.TestCase):
    def test_that_the_security_page_names_exist(self):
        sources = "".join(path.read_text("utf-8") for suite in ("tests", "platform", "hal-server")
                          for path in (PROJECT / suite).rglob("*_test.*"))
        page = (PROJECT / "docs" / "security.md").read_text("utf-8")
        named = re.findall(r"`([A-Z]\w+)\.([\w*]+)`", page)
        self.assertGreater(len(named), 15)
        for suite, test in named:
            last = r"\w+" if test == "*" else test
            self.assertRegex(sources, rf"\bTEST(_[FP])?\({suite}, {last}\)", f"{suite}.{test}")
        for name in re.findall(r"`(test_\w+)`", page):
            self.assertIn(f"def {name}(", sources)


class Rooms(unittest.TestCase):
    def test_files_that_the_architecture_names_exist_and_none_is_forgotten(self):
        page = (PROJECT / "docs" / "architecture.md").read_text("utf-8")
        rooms = page.split("## The rooms of the service\n")[1].split("\n## ")[0]
        named = set(re.findall(r"`((?:hwapi|standard|extension|driver)/\w+\.cpp)`", rooms))
        sources = {str(path.relative_to(SERVICE)) for path in SERVICE.rglob("*.cpp")
                   if path.parent != SERVICE and path.parent.name != "driver"}
        self.assertEqual(named, sources)


if __name__ == "__main__":
    unittest.main()
