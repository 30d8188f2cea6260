#!/usr/bin/python3
"""vCards through an independent implementation (vobject).

  vcard_vobject.py write FILE  writes cards made with vobject to FILE and prints their fields
  vcard_vobject.py read FILE   prints the fields of every card vobject reads from FILE

The fields are printed as JSON, one object per card, in the shape the C++ test compares.
"""
import json
import sys

import vobject


def typed(child):
    return {
        "value": child.value,
        "types": [t.lower() for t in child.params.get("TYPE", [])],
    }


def split_name(child):
    # A property made with a group in its name ("item1.tel") keeps the group in the name.
    group, _, name = child.name.rpartition(".")
    return (child.group or group).upper(), name.upper()


def fields(card):
    labels = {}
    for child in card.getChildren():
        group, name = split_name(child)
        if name == "X-ABLABEL" and group:
            labels[group] = child.value
    out = {"fn": "", "n": ["", "", "", "", ""], "org": [], "title": "", "adr": [], "tel": [],
           "email": [], "url": [], "note": "", "categories": []}
    for child in card.getChildren():
        group, name = split_name(child)
        if name == "FN":
            out["fn"] = child.value
        elif name == "N":
            v = child.value
            out["n"] = [v.family, v.given, v.additional, v.prefix, v.suffix]
            out["n"] = [" ".join(x) if isinstance(x, list) else x for x in out["n"]]
        elif name == "ORG":
            out["org"] = child.value
        elif name == "TITLE":
            out["title"] = child.value
        elif name == "ADR":
            v = child.value
            parts = [v.box, v.extended, v.street, v.city, v.region, v.code, v.country]
            out["adr"].append({"types": [t.lower() for t in child.params.get("TYPE", [])],
                               "parts": [" ".join(x) if isinstance(x, list) else x for x in parts]})
        elif name in ("TEL", "EMAIL"):
            entry = typed(child)
            entry["label"] = labels.get(group, "") if group else ""
            out[name.lower()].append(entry)
        elif name == "URL":
            out["url"].append(child.value)
        elif name == "NOTE":
            out["note"] = child.value
        elif name == "CATEGORIES":
            out["categories"] = child.value
    return out


def write(path):
    cards = []

    c = vobject.vCard()
    c.add("fn").value = "Dr. Jürgen Müller, Jr."
    c.add("n").value = vobject.vcard.Name(family="Müller", given="Jürgen", additional="Karl",
                                          prefix="Dr.", suffix="Jr.")
    c.add("org").value = ["Müller; Söhne KG", "Vertrieb"]
    c.add("title").value = "Leiter, Einkauf"
    a = c.add("adr")
    a.value = vobject.vcard.Address(box="Postfach 12", extended="3. OG", street="Hauptstraße 1",
                                    city="Berlin", region="Berlin", code="10115", country="Deutschland")
    a.type_param = "WORK"
    t = c.add("tel")
    t.value = "+49 30 1234567"
    t.type_param = ["WORK", "VOICE"]
    t = c.add("item1.tel")
    t.value = "0171 7654321"
    t.type_param = "CELL"
    c.add("item1.x-ablabel").value = "Handy privat"
    e = c.add("email")
    e.value = "j.mueller@example.de"
    e.type_param = "INTERNET"
    c.add("email").value = "jm@example.org"
    c.add("url").value = "https://example.de/kontakt?a=1,b=2"
    c.add("note").value = ("Erste Zeile; mit Semikolon, Komma und \\ Rückstrich\n"
                           "zweite Zeile, lang genug zum Falten: " + "äöüß" * 20)
    c.add("categories").value = ["Kunden", "Lieferanten, Partner"]
    cards.append(c)

    c = vobject.vCard()
    c.add("fn").value = "Straßenbau AG"
    c.add("n").value = vobject.vcard.Name()
    c.add("org").value = ["Straßenbau AG"]
    t = c.add("tel")
    t.value = "0043 1 5551234"
    t.type_param = "FAX"
    cards.append(c)

    with open(path, "w", encoding="utf-8", newline="") as f:
        for card in cards:
            f.write(card.serialize())
    print(json.dumps([fields(card) for card in cards], ensure_ascii=False))


def read(path):
    with open(path, encoding="utf-8", newline="") as f:
        text = f.read()
    print(json.dumps([fields(card) for card in vobject.readComponents(text)], ensure_ascii=False))


if __name__ == "__main__":
    {"write": write, "read": read}[sys.argv[1]](sys.argv[2])
