#!/usr/bin/env python3
"""Writes the manual pages brimvault(1) and BrimvaultService(1) from the README's own tables (command line,
where data and settings live, game packages), so that options, files, variables and exit codes are
written once. Usage: make-manpages.py README.md OUTPUT_FOLDER VERSION"""
import re
import sys

DATE = "November 2026"


def sections(text):
    found, name = {}, None
    for line in text.splitlines():
        heading = re.match(r"^(#{2,3}) (.*)$", line)
        if heading:
            name = heading.group(2).strip()
            found[name] = []
        elif name:
            found[name].append(line)
    return found


def table(lines):
    rows = [line for line in lines if line.startswith("|")]
    cells = [[cell.strip() for cell in row.strip().strip("|").split("|")] for row in rows]
    return [row for row in cells[1:] if not set("".join(row)) <= set("-: ")]


def paragraphs(lines):
    """The prose after the first table, up to the next code block."""
    text, seen_table = [], False
    for line in lines:
        if line.startswith("|"):
            seen_table = True
            continue
        if line.startswith("```"):
            break
        if seen_table:
            text.append(line)
    return [" ".join(p.split()) for p in "\n".join(text).split("\n\n") if p.strip()]


def roff(text):
    text = text.replace("\\", "\\e").replace("-", "\\-")
    text = re.sub(r"`([^`]*)`", r"\\fB\1\\fR", text)
    text = re.sub(r"\*\*([^*]*)\*\*", r"\\fB\1\\fR", text)
    return "\n".join(("\\&" + line) if line.startswith((".", "'")) else line for line in text.split("\n"))


def page(name, version, summary, synopsis, parts):
    out = [f'.TH {name.upper()} 1 "{DATE}" "Brimvault {version}" "User Commands"', ".SH NAME",
           f"{name} \\- {summary}", ".SH SYNOPSIS"]
    out += [f"\\fB{name}\\fR {s}\n.br" for s in synopsis]
    for title, body in parts:
        out.append(f".SH {title}")
        out += body
    return "\n".join(out) + "\n"


def tagged(rows, key=0, value=1, extra=None):
    body = []
    for row in rows:
        body += [".TP", roff(row[key]), roff(row[value] + (f". Exit status: {row[extra]}." if extra else ""))]
    return body


def main():
    readme, out_dir, version = sys.argv[1:4]
    parts = sections(open(readme, encoding="utf-8").read())
    first = open(readme, encoding="utf-8").read().split("\n\n")[1]
    description = [roff(" ".join(first.split()))]

    commands = table(parts["Command line"])
    options = [row for row in commands if row[0] != "`brimvault`"]
    places = table(parts["Where data and settings live"])
    variables = {}
    for what, linux, _windows, override in places:
        for variable in re.findall(r"`([A-Za-z_]+)`", override):
            variables.setdefault(variable, []).append(f"{what} (by default {linux})")
    environment = [line for variable, uses in variables.items()
                   for line in (".TP", f"\\fB{variable}\\fR", roff("; ".join(uses)))]
    files = [item for row in places if row[1].startswith(("`~", "`/")) for item in (".TP", roff(row[1]), roff(row[0]))]
    program = page("brimvault", version, "gather the games of this computer in one window and start them",
                   ["", "\\fB\\-\\-list\\fR [\\fB\\-\\-json\\fR]", "\\fB\\-\\-extract\\-icon\\fR \\fIFILE OUT.ico\\fR",
                    "\\fB\\-\\-version\\-info\\fR \\fIFILE\\fR", "\\fB\\-\\-help\\fR | \\fB\\-\\-version\\fR"],
                   [("DESCRIPTION", description + [".PP", roff(commands[0][1])]),
                    ("OPTIONS", tagged(options)),
                    ("EXIT STATUS", [roff(p.removeprefix("Exit status: ")) for p in paragraphs(parts["Command line"])
                                     if p.startswith("Exit status: ")]),
                    ("ENVIRONMENT", environment), ("FILES", files),
                    ("SEE ALSO", ["\\fBBrimvaultService\\fR(1), \\fBwine\\fR(1)"])])

    service_rows = table(parts["Game packages"])
    service = page("BrimvaultService", version, "install Brimvault game packages",
                   ["\\fB\\-I\\fR \\fIpackage.bvxpak\\fR", "\\fB\\-U\\fR | \\fB\\-R\\fR",
                    "\\fB\\-\\-pack\\fR \\fIFOLDER package.bvxpak\\fR"],
                   [("DESCRIPTION", [roff(re.sub(r",? see above", "", " ".join(" ".join(parts["Game packages"][:4]).split())))]),
                    ("OPTIONS", tagged(service_rows, extra=2)),
                    ("NOTES", [roff(p) + "\n.PP" for p in paragraphs(parts["Game packages"])]),
                    ("ENVIRONMENT", environment), ("SEE ALSO", ["\\fBbrimvault\\fR(1)"])])
    for name, text in (("brimvault.1", program), ("BrimvaultService.1", service)):
        with open(f"{out_dir}/{name}", "w", encoding="utf-8") as f:
            f.write(text)


if __name__ == "__main__":
    main()
