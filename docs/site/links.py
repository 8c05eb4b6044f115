"""What a finished site links to: each page, anchor and file must be there, and nothing may be loaded from elsewhere."""

import html.parser
import urllib.parse

LOADED = {"script", "img", "link", "iframe", "source"}


class Page(html.parser.HTMLParser):
    def __init__(self, path):
        super().__init__()
        self.anchors, self.targets = set(), []
        self.feed(path.read_text())

    def handle_starttag(self, tag, attributes):
        values = dict(attributes)
        self.anchors.update(values[name] for name in ("id", "name") if values.get(name))
        self.targets += [(tag, values[name]) for name in ("href", "src") if values.get(name)]


def faults(site):
    """A line for each link that leads nowhere."""
    pages = {path.resolve(): Page(path) for path in site.rglob("*.html") if path.name != "404.html"}
    for path, page in pages.items():
        for tag, target in page.targets:
            url = urllib.parse.urlsplit(target)
            where = f"{path.relative_to(site)}: {target}"
            if url.scheme or url.netloc:
                if tag in LOADED and url.scheme != "data":
                    yield f"{where} is loaded from a network"
                continue
            file = (path.parent / urllib.parse.unquote(url.path)).resolve() if url.path else path
            if file.is_dir():
                file /= "index.html"
            if not file.exists():
                yield f"{where} is not there"
            elif url.fragment and file in pages and urllib.parse.unquote(url.fragment) not in pages[file].anchors:
                yield f"{where}: no such place"
