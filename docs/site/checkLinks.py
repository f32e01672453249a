"""Fails where a page of a site links to a file or a place of it that is not there.

    checkLinks.py FOLDER
"""
import html.parser
import pathlib
import sys
import urllib.parse


class Page(html.parser.HTMLParser):
    def __init__(self, path):
        super().__init__()
        self.places, self.links = set(), []
        self.feed(path.read_text(encoding="utf-8"))

    def handle_starttag(self, tag, attributes):
        attributes = dict(attributes)
        self.places |= {attributes.get("id"), attributes.get("name")}
        for name in ("href", "src", "srcset", "data"):
            if attributes.get(name):
                self.links.append(attributes[name])


folder = pathlib.Path(sys.argv[1])
pages = {path.name: Page(path) for path in folder.glob("*.html")}
broken = []
for name, page in pages.items():
    for link in page.links:
        target = urllib.parse.urlsplit(link)
        if target.scheme or target.netloc:
            continue
        file, place = urllib.parse.unquote(target.path) or name, target.fragment
        if not (folder / file).is_file():
            broken.append(f"{name}: {link}: no such file")
        elif place and file in pages and place not in pages[file].places:
            broken.append(f"{name}: {link}: no such place")
print("\n".join(broken) or f"{len(pages)} pages, no broken link")
sys.exit(bool(broken))
