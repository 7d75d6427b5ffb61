#!/usr/bin/python3
"""Prints the cards of a vCard file as JSON, read by an implementation that is not ours."""
import hashlib
import json
import sys

import vobject


def number_of(tel):
    return {"number": tel.value, "types": sorted(t.upper() for t in tel.params.get("TYPE", []))}


def card_of(card):
    photo = card.photo if hasattr(card, "photo") else None
    return {
        "version": card.version.value,
        "name": card.fn.value,
        "given": card.n.value.given,
        "uid": card.uid.value if hasattr(card, "uid") else None,
        "numbers": [number_of(tel) for tel in card.contents.get("tel", [])],
        "picture": hashlib.sha256(photo.value).hexdigest() if photo else None,
        "picture_type": photo.params["TYPE"][0] if photo else None,
    }


with open(sys.argv[1], encoding="utf-8", newline="") as file:
    print(json.dumps([card_of(card) for card in vobject.readComponents(file.read())]))
