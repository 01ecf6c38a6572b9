"""Fails if a page links to a file or a heading that does not exist, or names a script that does not: links.py FOLDER"""

import pathlib
import re
import sys


def without_code(text):
    return re.sub(r"^```.*?^```$", "", text, flags=re.DOTALL | re.MULTILINE)


def anchors(page):
    """The anchors of the page's headings, as sites that render Markdown form them."""
    headings = re.findall(r"^#+ (.*)$", without_code(page.read_text(encoding="utf-8")), re.MULTILINE)
    return {re.sub(r"[^\w\- ]", "", heading.lower()).replace(" ", "-") for heading in headings}


def wrong(root, page):
    text = page.read_text(encoding="utf-8")
    for target in re.findall(r"\]\(([^)\s]+)\)", without_code(text)):
        if re.match(r"[a-z]+:", target):
            continue
        path, _, anchor = target.partition("#")
        file = page.parent / path if path else page
        if not file.exists() or (anchor and anchor not in anchors(file)):
            yield f"the link {target}"
    for script in re.findall(r"(?<![\w/])scripts/[\w/-]*\w", text):
        if not (root / script).exists():
            yield script


def main():
    root = pathlib.Path(sys.argv[1])
    pages = [page for page in root.rglob("*.md") if "build" not in page.relative_to(root).parts]
    if not pages:
        sys.exit(f"no page in {root}")
    found = [f"{page.relative_to(root)}: {what} does not exist" for page in pages for what in wrong(root, page)]
    sys.exit("\n".join(found) or 0)


if __name__ == "__main__":
    main()
