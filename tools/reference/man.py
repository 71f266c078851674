"""Manual pages of section 3, one for each exported name."""
import re

import headers
import page as pages


def _escape(text):
    text = text.replace("\\", "\\e").replace("-", "\\-").replace("`", "\\(ga").replace("'", "\\(aq")
    text = text.replace("^", "\\(ha").replace("~", "\\(ti")
    return "\n".join("\\&" + line if line.startswith((".", "'")) else line for line in text.split("\n"))


def _paragraphs(text):
    """Prose filled, indented lines as they are written."""
    out, fixed, begun = [], False, False
    for line in text.split("\n"):
        if not line.strip():
            if fixed:
                out.append(".fi")
                out.append(".RE")
                fixed = False
            if begun:
                out.append(".PP")
            begun = False
            continue
        indented = line.startswith("  ")
        if indented != fixed:
            out += [".RS 4", ".nf"] if indented else [".fi", ".RE"]
            fixed = indented
        out.append(_escape(line.strip() if not indented else line[2:]))
        begun = True
    if fixed:
        out += [".fi", ".RE"]
    while out and out[-1] == ".PP":
        out.pop()
    return out


def manual_page(entry, page, version):
    out = [f'.TH {entry.name} 3 "" "tavosdk {version}" "The appliance\\(aqs library"', ".nh", ".ad l",
           ".SH NAME", f"{entry.name} \\- {_escape(page.summary)}",
           ".SH SYNOPSIS", ".nf", f".B #include <{entry.family.header}>", ".PP"]
    group = [other for other in entry.family.names if other.name in entry.group] or [entry]
    for other in group:
        out += [f"\\fB{_escape(line)}\\fR" for line in other.declaration()]
    out += [".fi", ".PP", "Link with \\fI\\-ltavosdk\\fR."]
    out += [".SH DESCRIPTION"] + _paragraphs(pages.without_tables(page.description))
    if entry.kind == "function":
        out += [".SH RETURN VALUE"]
        out += _paragraphs(pages.without_tables(page.result)) if page.result else ["None."]
        out += [".SH ERRORS"]
        if page.errors:
            for code, said in page.errors:
                out += [".TP", f".B {code}", _escape(said)]
        else:
            out += ["This function names no code of its own; see DESCRIPTION."]
    records = headers.records_of(entry)
    if records:
        out += [".SH TYPES"]
        for record in records:
            out += _paragraphs(record.comment.text) + [".PP", ".nf", _escape(record.code), ".fi", ".PP"]
        out.pop()
    if page.runs:
        out += [".SH PROGRAMS"] + [part for item in page.runs for part in (_escape(item), ".br")]
    if page.locks:
        out += [".SH LOCKS"] + [part for item in page.locks for part in (_escape(item), ".br")]
    if page.files:
        out += [".SH FILES"] + [part for item in page.files for part in (f".I {_escape(item)}", ".br")]
    notes = entry.section.text if re.search(r"[.:;]\s", entry.section.text) else ""
    if notes or entry.family.intro.text:
        out += [".SH NOTES"]
    if notes:
        out += _paragraphs(notes)
    if notes and entry.family.intro.text:
        out += [".PP"]
    if entry.family.intro.text:
        out += [f"Of all functions of \\fI<{entry.family.header}>\\fR:", ".PP"]
        out += _paragraphs(entry.family.intro.text)
    out += [".SH SEE ALSO", ",\n".join(f".BR {name} (3)" for name in page.see_also).replace(",\n", " ,\n")]
    return "\n".join(out) + "\n"


def write(folder, version):
    folder.mkdir(parents=True, exist_ok=True)
    for entry, page in pages.pages():
        (folder / f"{entry.name}.3").write_text(manual_page(entry, page, version))
    return sorted(headers.names())
