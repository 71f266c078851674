"""HTML pages: one for each family, a first page with all names, and the indexes."""
import collections
import html
import re

import headers
import page as pages

_STYLE = """
:root { color-scheme: light dark; --line: #8884; --soft: #8881; --link: #0b63b0; }
@media (prefers-color-scheme: dark) { :root { --link: #7ab8f5; } }
body { font: 16px/1.5 system-ui, sans-serif; margin: 0; display: grid; grid-template-columns: 13rem minmax(0, 66rem); }
nav { border-right: 1px solid var(--line); padding: 1.5rem 1rem; position: sticky; top: 0; height: 100vh;
      overflow: auto; box-sizing: border-box; }
nav a { display: block; padding: .1rem 0; } nav a[aria-current] { font-weight: 600; color: inherit; }
main { padding: 1.5rem 2rem 6rem; }
a { color: var(--link); text-decoration: none; } a:hover { text-decoration: underline; }
h1 { font-size: 1.6rem; } h2 { margin-top: 2.5rem; padding-top: 1rem; border-top: 1px solid var(--line); font-size: 1.2rem; }
h3 { margin: 1rem 0 .2rem; font-size: .8rem; text-transform: uppercase; letter-spacing: .06em; opacity: .7; }
pre, code { font: 13px/1.45 ui-monospace, monospace; } pre { margin: .5rem 0; overflow-x: auto; }
pre.synopsis { background: var(--soft); padding: .7rem 1rem; border-radius: 6px; }
p { margin: .5rem 0; } table { border-collapse: collapse; } td, th { padding: .2rem .8rem .2rem 0; text-align: left;
      vertical-align: top; }
p, h1 { max-width: 48rem; }
.names { columns: 16rem; padding: 0; list-style: none; font-size: .9rem; }
h2 a, tr:target code, div:target pre { color: inherit; } :target { background: var(--soft); scroll-margin-top: 1rem; }
.part { margin-top: 3rem; font-size: 1.4rem; font-weight: 600; color: var(--link); }
.part + h2 { border-top: 0; margin-top: .5rem; padding-top: 0; }
.section { margin-top: 3rem; padding: .4rem 1rem; background: var(--soft); border-left: 3px solid var(--link); }
@media (max-width: 50rem) { body { display: block; } nav { position: static; height: auto; border: 0; padding-bottom: 0; }
      nav a { display: inline-block; margin-right: .8rem; } main { padding: 0 1rem 3rem; } }
"""

_INDEXES = (("errors", "Codes", "by code"), ("files", "Files", "by file"), ("runs", "Programs", "by program"),
            ("locks", "Locks", "by lock"))


def _frame(page, title, body, families):
    def link(name, label):
        return f'<a href="{name}.html"{" aria-current=page" if name == page else ""}>{label}</a>'

    links = "".join(link(family.name, family.name) for family in families)
    indexes = "".join(link(f"index-{name}", label) for name, label, _ in _INDEXES)
    return (f'<!DOCTYPE html>\n<html lang="en"><head><meta charset="utf-8">'
            f'<meta name="viewport" content="width=device-width"><title>{html.escape(title)}</title>'
            f'<link rel="stylesheet" href="style.css"></head><body><nav><a href="index.html"><b>tavosdk</b></a>'
            f'<h3>Families</h3>{links}<h3>Indexes</h3>{indexes}</nav><main>{body}</main></body></html>\n')


class _Linker:
    """Turns text into HTML in which every name of a function, type, constant or code leads to its description."""

    def __init__(self, families):
        self.places = {}
        for family in families:
            for name in ([constant for constant, *_ in family.constants] + [record.name for record in family.records] +
                         [entry.name for entry in family.names]):
                self.places[name] = f"{family.name}.html#{name}"

    def __call__(self, text, here=None):
        def link(found):
            name = found.group()
            if name not in self.places or name == here:
                return name
            return f'<a href="{self.places[name]}">{name}</a>'
        return re.sub(r"\b[A-Za-z]\w{4,}\b", link, html.escape(text, quote=False))


def _prose(text, link, here=None):
    """Paragraphs filled, indented lines as they are written."""
    out = []
    for block in re.split(r"\n\s*\n", text):
        for indented, lines in _runs_of(block.split("\n")):
            joined = link("\n".join(lines), here)
            if indented:
                out.append(f"<pre>{joined}</pre>")
            else:
                joined = re.sub(r"`([^`\n]+)`", r"<code>\1</code>", joined)
                out.append(f"<p>{joined}</p>")
    return "".join(out)


def _runs_of(lines):
    run, kind = [], None
    for line in lines:
        indented = line.startswith("  ")
        if run and indented != kind:
            yield kind, run
            run = []
        kind = indented
        run.append(line)
    if run:
        yield kind, run


def _entry(group, link):
    first = group[0]
    page_name = first.family.name
    heading = ", ".join(f'<a id="{entry.name}" href="{page_name}.html#{entry.name}">{entry.name}</a>' for entry in group)
    synopsis = "\n".join(link(line, entry.name) for entry in group for line in entry.declaration(width=110))
    out = [f"<h2>{heading}</h2><pre class=synopsis>{synopsis}</pre>"]
    out += [_prose(text, link, first.name) for text in pages.split(first) if text]
    return "".join(out) + _fixed(first.comment, link)


def _fixed(comment, link):
    return "".join(f"<h3>{label}</h3><p>{', '.join(link(item) for item in comment.fixed[kind])}</p>"
                   for kind, label in (("Files", "Files"), ("Runs", "Programs"), ("Errors", "Errors"), ("Locks", "Locks"))
                   if kind in comment.fixed)


def _section(text, link):
    """A word or two are a heading; more is a note about what follows."""
    if not text:
        return ""
    if len(text) < 40 and "\n" not in text:
        return f'<p class="part">{html.escape(text[0].upper() + text[1:].rstrip("."))}</p>'
    return f'<div class="section">{_prose(text, link)}</div>'


def _records(family, link):
    if not family.records:
        return ""
    return "<h2>Types</h2>" + "".join(
        f"<div id=\"{record.name}\">{_prose(record.comment.text, link)}"
        f"<pre class=synopsis>{link(record.code, record.name)}</pre></div>"
        for record in family.records)


def _constants(family):
    if not family.constants:
        return ""
    rows = "".join(f"<tr id=\"{name}\"><td><code>{name}</code><td><code>{html.escape(value or '')}</code>"
                   f"<td>{html.escape(remark)}" for name, value, remark in family.constants)
    return f"<h2>Constants</h2><table>{rows}</table>"


def _names(entries):
    items = "".join(f'<li><a href="{entry.family.name}.html#{entry.name}">{entry.name}</a>' for entry in entries)
    return f"<ul class=names>{items}</ul>"


def _index(kind, everything):
    index = collections.defaultdict(list)
    for entry, page in everything:
        for item in getattr(page, kind):
            key = item[0] if isinstance(item, tuple) else item.split(" ")[0]
            index[key].append(entry)
    return index


def write(folder, version):
    folder.mkdir(parents=True, exist_ok=True)
    families, names = headers.families(), headers.names()
    everything = pages.pages()
    link = _Linker(families)
    (folder / "style.css").write_text(_STYLE)

    rows = "".join(f'<tr><td><a href="{family.name}.html">{family.name}</a><td>{link(family.title)}'
                   f"<td>{len(family.names)}" for family in families)
    listed = _names(names[name] for name in sorted(names, key=str.lower))
    (folder / "index.html").write_text(_frame("index", "tavosdk", (
        f"<h1>tavosdk {version}</h1><p>The system programming interface of a network-attached-storage appliance: "
        f"{len(names)} names in {len(families)} families.</p><table><tr><th>Family<th><th>Names</tr>{rows}</table>"
        f"<h2>All names</h2>{listed}"), families))

    for family in families:
        body = [f"<h1>{link(family.title.rstrip('.'))}</h1><pre class=synopsis>#include &lt;{family.header}&gt;</pre>",
                _prose(family.intro.text, link), _fixed(family.intro, link), _names(family.names)]
        done, section = set(), None
        for entry in family.names:
            if entry.section.text != section:
                section = entry.section.text
                body.append(_section(section, link))
            if entry.name not in done:
                group = [other for other in family.names if other.name in entry.group] or [entry]
                done |= {other.name for other in group}
                body.append(_entry(group, link))
        body += [_records(family, link), _constants(family)]
        (folder / f"{family.name}.html").write_text(_frame(family.name, f"tavosdk: {family.name}", "".join(body), families))

    for kind, label, how in _INDEXES:
        index = _index(kind, everything)
        rows = "".join(f"<tr><td><code>{link(key)}</code><td>" + ", ".join(
            f'<a href="{entry.family.name}.html#{entry.name}">{entry.name}</a>' for entry in index[key])
            for key in sorted(index))
        body = f"<h1>{label}</h1><p>Functions {how}.</p><table>{rows}</table>"
        (folder / f"index-{kind}.html").write_text(_frame(f"index-{kind}", f"tavosdk: {label}", body, families))
