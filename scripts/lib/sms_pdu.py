"""Takes apart the message units (PDUs) that a phone hands to the network, and puts long messages together."""

GSM7 = ("@£$¥èéùìòÇ\nØø\rÅåΔ_ΦΓΛΩΠΨΣΘΞ\x1bÆæßÉ !\"#¤%&'()*+,-./0123456789:;<=>?"
        "¡ABCDEFGHIJKLMNOPQRSTUVWXYZÄÖÑÜ§¿abcdefghijklmnopqrstuvwxyzäöñüà")
GSM7_EXTENSION = {0x0A: "\f", 0x14: "^", 0x28: "{", 0x29: "}", 0x2F: "\\", 0x3C: "[", 0x3D: "~", 0x3E: "]",
                  0x40: "|", 0x65: "€"}
ESCAPE = 0x1B


def unpack_septets(data, count, skip_bits=0):
    """`count` 7-bit values that lie packed in `data`, after `skip_bits` bits."""
    bits = int.from_bytes(data, "little") >> skip_bits
    return [(bits >> (7 * i)) & 0x7F for i in range(count)]


def gsm7_text(septets):
    text, escaped = "", False
    for value in septets:
        if escaped:
            text += GSM7_EXTENSION.get(value, GSM7[value])
            escaped = False
        elif value == ESCAPE:
            escaped = True
        else:
            text += GSM7[value]
    return text


def _address(pdu, at):
    """The address that begins at `at`, and where it ends. A leading "+" tells an international number."""
    digits, kind = pdu[at], pdu[at + 1]
    length = (digits + 1) // 2
    number = "".join(f"{byte & 0xF:x}{byte >> 4:x}" for byte in pdu[at + 2:at + 2 + length])[:digits]
    number = number.translate(str.maketrans("abc", "*#a"))
    return ("+" if kind & 0x70 == 0x10 else "") + number, at + 2 + length


def _concatenation(header):
    """(reference, parts, number of this part) from a user data header; (None, 1, 1) when it has none."""
    at = 1
    while at + 1 < len(header):
        element, length = header[at], header[at + 1]
        value = header[at + 2:at + 2 + length]
        if element == 0x00:
            return value[0], value[1], value[2]
        if element == 0x08:
            return value[0] << 8 | value[1], value[2], value[3]
        at += 2 + length
    return None, 1, 1


def decode_submit(pdu):
    """One SMS-SUBMIT without the service centre's address: a dictionary of to, text, reference, parts, part."""
    first = pdu[0]
    if first & 0x03 != 0x01:
        raise ValueError("not a message to be sent")
    to, at = _address(pdu, 2)
    coding = pdu[at + 1]
    at += 2 + {0: 0, 2: 1, 1: 7, 3: 7}[(first >> 3) & 0x03]
    length, data = pdu[at], pdu[at + 1:]
    header = data[:data[0] + 1] if first & 0x40 else b""
    reference, parts, part = _concatenation(header)
    alphabet = (coding >> 2) & 0x03
    if alphabet == 2:
        # Halves of a character beyond the first plane may lie in different parts.
        body = data[len(header):length]
    elif alphabet == 0:
        filled = (len(header) * 8 + 6) // 7
        body = unpack_septets(data, length - filled, filled * 7)
    else:
        raise ValueError("a message of bytes, not of text")
    return {"to": to, "alphabet": "ucs2" if alphabet == 2 else "gsm7", "body": body, "reference": reference,
            "parts": parts, "part": part}


def text_of(units):
    """The text of a message from all of its units in order."""
    text, septets, halves = "", [], b""
    for unit in units:
        if unit["alphabet"] == "ucs2":
            halves += bytes(unit["body"])
        else:
            septets += unit["body"]
    if septets:
        text += gsm7_text(septets)
    return text + halves.decode("utf-16-be", "replace")


class Assembler:
    """Gives out a message when its last unit has come."""

    def __init__(self):
        self.waiting = {}

    def add(self, unit):
        """(to, text) of the message that `unit` completes, else None."""
        if unit["parts"] == 1:
            return unit["to"], text_of([unit])
        key = (unit["to"], unit["reference"], unit["parts"])
        units = self.waiting.setdefault(key, {})
        units[unit["part"]] = unit
        if len(units) < unit["parts"]:
            return None
        del self.waiting[key]
        return unit["to"], text_of([units[number] for number in sorted(units)])
