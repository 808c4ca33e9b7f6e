# SPDX-License-Identifier: Apache-2.0
"""Finds dead links of a folder of HTML pages: check_site.py FOLDER [TREE]

Every href and src that stays on the site must lead to a file of the folder, and its anchor to an id or
a name of that page. Nothing is asked of the network: links to other sites are counted. Where the site
stands at readers, the TREE that it was made of means nothing: no file may have a path below it. Ends
with 1 when a link is dead or such a path is there, and when there was nothing to check.
"""
import html.parser
import pathlib
import re
import sys
import urllib.parse


class Page(html.parser.HTMLParser):
    """The anchors and the links of one page."""

    def __init__(self, file):
        super().__init__()
        self.anchors, self.links = {"", "top"}, set()
        self.feed(file.read_text(encoding="utf-8"))

    def handle_starttag(self, tag, attrs):
        for name, value in attrs:
            if name == "id" or (name == "name" and tag == "a"):
                self.anchors.add(value)
            elif name in ("href", "src") and value is not None:
                self.links.add(value)


def fault(pages, file, link):
    """What is wrong with a link of a page, or None."""
    place, anchor = urllib.parse.urldefrag(link)
    place = urllib.parse.unquote(urllib.parse.urlsplit(place).path)
    if place.startswith("/"):
        return "leads to the root of the server"
    target = (file.parent / place).resolve() if place else file
    if not target.is_file():
        return "leads to no file"
    # An anchor in a file that is no page, a picture's view for instance, is not looked at.
    if target in pages and urllib.parse.unquote(anchor) not in pages[target].anchors:
        return "leads to no anchor of that page"
    return None


def files_with_paths_of(tree, folder):
    """The files of the folder that name something below the tree by its absolute path. A path that is
    only the end of a longer one, as /b in a/b/c, is another."""
    path = re.compile(rb"(?<![\w.-])" + re.escape(bytes(pathlib.Path(tree).resolve())) + rb"/")
    return [file for file in sorted(folder.rglob("*")) if file.is_file() and path.search(file.read_bytes())]


def main(folder, tree=None):
    folder = pathlib.Path(folder).resolve()
    # The page for addresses that do not exist is shown at any depth, so its links cannot be relative.
    files = [file for file in folder.rglob("*.html") if file != folder / "404.html"]
    pages = {file: Page(file) for file in files}
    links = [(file, link) for file in files for link in sorted(pages[file].links)]
    ours = [(file, link) for file, link in links if not urllib.parse.urlsplit(link).scheme]
    dead = 0
    for file, link in ours:
        wrong = fault(pages, file, link)
        if wrong:
            dead += 1
            print(f"{file.relative_to(folder)}: {link} {wrong}", file=sys.stderr)
    print(f"{len(files)} pages, {len(ours)} links, {dead} of them dead; "
          f"{len(links) - len(ours)} links to other sites not followed")
    bound = files_with_paths_of(tree, folder) if tree else []
    for file in bound:
        print(f"{file.relative_to(folder)}: has a path of {tree}", file=sys.stderr)
    return 1 if dead or bound or not ours else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
