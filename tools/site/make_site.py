# SPDX-License-Identifier: Apache-2.0
"""Makes the manual as HTML with search: make_site.py ROOT OUT

ROOT is the tree, OUT/manual/index.html the result. OUT/pages has the Markdown pages, the files of the
tree that they link to, at the same places relative to each other as in the tree, and the reference of
the public headers: a link that leads somewhere in the tree leads to the same thing on the site.
"""
import os
import pathlib
import re
import shutil
import subprocess
import sys

LINK = re.compile(r"\]\(([^)\s#]+)(?:#[^)\s]*)?\)")
FENCE = re.compile(r"^```.*?^```", re.MULTILINE | re.DOTALL)


def pages_of(root):
    """The Markdown pages of the manual, relative to the tree."""
    found = [root / name for name in ("README.md", "HACKING.md", "CHANGELOG.md")]
    found += [root / "examples/README.md", *root.glob("docs/**/*.md")]
    return sorted(page.relative_to(root) for page in found if page.exists())


def linked_files(root, page):
    """What a page links to in the tree, relative to the tree. What does not exist is left out here, and
    found as a dead link on the site."""
    text = FENCE.sub("", (root / page).read_text(encoding="utf-8"))
    for target in LINK.findall(text):
        if ":" in target:
            continue  # of another site
        file = pathlib.Path(os.path.normpath(page.parent / target))
        if ".." not in file.parts and (root / file).is_file():
            yield file


def copy_pages(root, pages_folder):
    pages = pages_of(root)
    wanted = set(pages).union(*(linked_files(root, page) for page in pages))
    for file in sorted(wanted):
        place = pages_folder / file
        place.parent.mkdir(parents=True, exist_ok=True)
        shutil.copyfile(root / file, place)


def main(root, out):
    root, out = pathlib.Path(root).resolve(), pathlib.Path(out).resolve()
    pages, manual, reference = out / "pages", out / "manual", out / "pages/reference"
    for folder in (pages, manual):
        shutil.rmtree(folder, ignore_errors=True)
    reference.mkdir(parents=True)
    copy_pages(root, pages)
    subprocess.run(["doxygen", "docs/Doxyfile"], cwd=root, check=True,
                   env=dict(os.environ, TARN_DOCS=str(reference)))
    subprocess.run(["mkdocs", "build", "--strict", "-f", str(root / "mkdocs.yml"), "-d",
                    str(manual)], check=True, env=dict(os.environ, TARN_PAGES=str(pages)))


if __name__ == "__main__":
    try:
        main(*sys.argv[1:])
    except subprocess.CalledProcessError as error:
        sys.exit(f"make_site: {error.cmd[0]} ended with {error.returncode}")
