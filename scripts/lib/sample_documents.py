"""Writes the sample report (one PDF page) and the sample contacts (vCard 3.0) into a folder."""

import base64
import pathlib
import sys

REPORT = [
    (24, "Lake survey, autumn"),
    (12, "Three places were visited between the boathouse and the old mill."),
    (12, "The water was clear to a depth of two metres at each of them."),
    (12, "Herons: 4.  Ducks: too many to count.  Lost umbrellas: 1."),
    (12, "The next visit is planned for the first weekend of spring."),
]

# (uid, family name, given name, shown name, numbers with types, picture)
CONTACTS = [
    ("mara-lindqvist", "Lindqvist", "Mara", "Mara Lindqvist",
     [("CELL", "07700 900101")], "contact-mara.jpg"),
    ("kofi-danso", "Danso", "Kofi", "Kofi Danso", [("CELL", "+1 202 555 0142")], "contact-kofi.jpg"),
    ("jonas-weber", "Weber", "Jonas", "Jonas Weber", [("CELL", "+49 171 3920012")], None),
    ("xiaoming", "王", "小明", "王小明", [("CELL", "+44 7700 900104")], None),
    ("long-name", "Featherstonehaugh-Cholmondeley",
     "Wilhelmina Alexandrina", "Professor Wilhelmina Alexandrina Bartholomea Featherstonehaugh-"
     "Cholmondeley of the Lower Northern Lakes", [("WORK", "+1 202 555 0175")], None),
    ("priya-raman", "Raman", "Priya", "Priya Raman",
     [("CELL,PREF", "+44 7700 900106"), ("HOME", "+44 1632 960106")], None),
]


def pdf_text(text):
    return text.replace("\\", "\\\\").replace("(", "\\(").replace(")", "\\)")


def page_content():
    lines, height = [], 760
    for size, text in REPORT:
        lines.append(f"BT /F1 {size} Tf 72 {height} Td ({pdf_text(text)}) Tj ET")
        height -= size + 14
    return "\n".join(lines).encode("ascii")


def pdf():
    content = page_content()
    objects = [
        b"<< /Type /Catalog /Pages 2 0 R >>",
        b"<< /Type /Pages /Kids [3 0 R] /Count 1 >>",
        b"<< /Type /Page /Parent 2 0 R /MediaBox [0 0 595 842] /Contents 4 0 R"
        b" /Resources << /Font << /F1 5 0 R >> >> >>",
        b"<< /Length %d >>\nstream\n%s\nendstream" % (len(content), content),
        b"<< /Type /Font /Subtype /Type1 /BaseFont /Helvetica >>",
    ]
    out, offsets = bytearray(b"%PDF-1.4\n"), []
    for number, body in enumerate(objects, 1):
        offsets.append(len(out))
        out += b"%d 0 obj\n%s\nendobj\n" % (number, body)
    table = len(out)
    out += b"xref\n0 %d\n0000000000 65535 f \n" % (len(objects) + 1)
    out += b"".join(b"%010d 00000 n \n" % offset for offset in offsets)
    out += b"trailer\n<< /Size %d /Root 1 0 R >>\nstartxref\n%d\n%%%%EOF\n" % (
        len(objects) + 1, table)
    return bytes(out)


def folded(line):
    """A line is at most 75 bytes; the rest follows on lines that begin with a space."""
    rest, parts, limit = line, [], 75
    while len(rest.encode()) > limit:
        cut = limit
        while len(rest[:cut].encode()) > limit:
            cut -= 1
        parts.append(rest[:cut])
        rest, limit = rest[cut:], 74
    return "\r\n ".join(parts + [rest])


def vcard(contact, directory):
    uid, family, given, shown, numbers, picture = contact
    lines = ["BEGIN:VCARD", "VERSION:3.0", f"UID:pelliko-sample-{uid}", f"FN:{shown}",
             f"N:{family};{given};;;"]
    lines += [f"TEL;TYPE={kind}:{number}" for kind, number in numbers]
    if picture:
        data = base64.b64encode((directory / picture).read_bytes()).decode()
        lines.append(f"PHOTO;ENCODING=b;TYPE=JPEG:{data}")
    return "\r\n".join(folded(line) for line in lines + ["END:VCARD"]) + "\r\n"


def main():
    directory = pathlib.Path(sys.argv[1])
    (directory / "sample-report.pdf").write_bytes(pdf())
    cards = "".join(vcard(contact, directory) for contact in CONTACTS)
    (directory / "contacts.vcf").write_bytes(cards.encode())


if __name__ == "__main__":
    main()
