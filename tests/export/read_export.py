#!/usr/bin/env python3
"""Reads an exported file with readers we did not write and prints its tables as JSON:
a list of tables (one per sheet), each a list of rows padded to the header's width.
Usage: read_export.py html|xls|xml|txt FILE"""
import csv
import json
import sys


def pad(rows):
    width = len(rows[0]) if rows else 0
    return [r + [""] * (width - len(r)) for r in rows]


def read_xls(path):
    import xlrd
    book = xlrd.open_workbook(path)
    tables = []
    for sheet in book.sheets():
        rows = []
        for r in range(sheet.nrows):
            row = []
            for c in range(sheet.ncols):
                cell = sheet.cell(r, c)
                if cell.ctype == xlrd.XL_CELL_DATE:
                    row.append(xlrd.xldate_as_datetime(cell.value, book.datemode).strftime("%d.%m.%Y"))
                elif cell.ctype == xlrd.XL_CELL_NUMBER:
                    row.append(str(int(cell.value)) if cell.value == int(cell.value) else repr(cell.value))
                else:
                    row.append(cell.value)
            rows.append(row)
        tables.append(pad(rows))
    return tables


def read_html(path):
    from lxml import etree
    data = open(path, "rb").read()
    if b'<meta charset="utf-8"' not in data or not data.startswith(b"<!DOCTYPE html>"):
        raise SystemExit("not an HTML5 document declaring UTF-8")
    root = etree.fromstring(data, etree.XMLParser(resolve_entities=False))  # strict
    rows = []
    for tr in root.iter("tr"):
        rows.append(["".join(cell.itertext()) for cell in tr if cell.tag in ("td", "th")])
    return [pad(rows)]


def read_xml(path):
    from lxml import etree
    root = etree.parse(path, etree.XMLParser(resolve_entities=False)).getroot()
    rows = [[c.text or "" for c in root.find("columns")]]
    for item in root.find("rows"):
        if item.tag == "group":
            rows.append([item.text or ""])
        else:
            rows.append([c.text or "" for c in item])
    return [pad(rows)]


def read_txt(path):
    with open(path, newline="", encoding="utf-8") as f:
        return [pad([row for row in csv.reader(f)])]


readers = {"html": read_html, "xls": read_xls, "xml": read_xml, "txt": read_txt}
json.dump(readers[sys.argv[1]](sys.argv[2]), sys.stdout, ensure_ascii=True)
