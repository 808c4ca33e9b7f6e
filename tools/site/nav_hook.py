# SPDX-License-Identifier: Apache-2.0
"""A hook of MkDocs: in the navigation of mkdocs.yml `folder/*` stands for the pages of a folder, its
README first, so that a page for an engine or a distribution needs no line there."""
import pathlib


def pages_below(root, pattern):
    pages = sorted(root.glob(pattern + ".md"), key=lambda page: (page.stem != "README", page.stem))
    return [str(page.relative_to(root)) for page in pages]


def on_config(config):
    root = pathlib.Path(config["docs_dir"])
    for section in config["nav"]:
        for title, value in section.items():
            if isinstance(value, str) and value.endswith("/*"):
                section[title] = pages_below(root, value)
    return config
