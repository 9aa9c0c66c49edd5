#!/usr/bin/env python3
"""The Markdown pages: the index has each page of docs/, each says for whom it is, and no link leads nowhere.

    documents.py        exits 1 and prints what is wrong
"""
import pathlib
import re
import subprocess
import sys

ROOT = pathlib.Path(__file__).resolve().parent.parent
LINK = re.compile(r"\[[^\]]*\]\(([^)\s]+)\)")


def pages():
    listed = subprocess.run(["git", "ls-files", "--cached", "--others", "--exclude-standard", "*.md"], cwd=ROOT, check=True,
                            capture_output=True, text=True)
    return [ROOT / name for name in listed.stdout.split() if (ROOT / name).is_file()]


def without_code(text):
    """A link in a block of code, or between backticks, is none."""
    text = re.sub(r"^```.*?^```", "", text, flags=re.MULTILINE | re.DOTALL)
    return re.sub(r"`[^`\n]*`", "", text)


def anchors(page):
    """The names that a heading gets: lower case, blanks as hyphens, without other punctuation."""
    text = re.sub(r"^```.*?^```", "", page.read_text(encoding="utf-8"), flags=re.MULTILINE | re.DOTALL)
    headings = re.findall(r"^#+ (.*)$", text, flags=re.MULTILINE)
    return {re.sub(r"[^\w\- ]", "", heading.lower()).replace(" ", "-") for heading in headings}


def wrong_links(page):
    for link in LINK.findall(without_code(page.read_text(encoding="utf-8"))):
        if re.match(r"[a-z]+:", link):
            continue
        name, _, anchor = link.partition("#")
        target = (page.parent / name).resolve() if name else page
        if not target.exists():
            yield f"{link}: there is no such file"
        elif anchor and anchor not in anchors(target):
            yield f"{link}: there is no such heading"


def problems():
    index = {(ROOT / "docs" / link).resolve() for link in LINK.findall((ROOT / "docs/README.md").read_text(encoding="utf-8"))}
    for page in pages():
        name = page.relative_to(ROOT)
        for wrong in wrong_links(page):
            yield f"{name}: {wrong}"
        if name.parent != pathlib.Path("docs"):
            continue
        if name.name != "README.md" and page not in index:
            yield f"{name}: docs/README.md does not list it"
        if not re.match(r"# .+\n\nFor ", page.read_text(encoding="utf-8")):
            yield f"{name}: its first line does not say for whom it is"


def main():
    found = list(problems())
    for each in found:
        print(each)
    return 1 if found else 0


if __name__ == "__main__":
    sys.exit(main())
