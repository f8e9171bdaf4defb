#!/usr/bin/env python3
# read_machine_format.py - Reads outputs of the "csv" or "xml" formatter with
# Python's own parsers and prints what they hold as JSON, for the formatter
# tests to compare with the result objects.
#
#   read_machine_format.py csv|xml < documents
#
# The input is a JSON array of documents (strings), so that one run reads
# many; the output is a JSON array with, for each document:
#   csv   its records: [["Name", ...], ...]
#   xml   the value under <output>, with booleans, integers, strings, arrays
#         and objects; null for <output/>
#
# Anything that does not follow the format (a bad record, an unknown element,
# a list whose items are not of its type) ends the program with status 1 and a
# message on standard error.
import csv
import io
import json
import sys
import xml.etree.ElementTree as ElementTree

SCALARS = {"boolean", "integer", "string"}


def fail(message):
    sys.stderr.write("read_machine_format: " + message + "\n")
    sys.exit(1)


def read_csv(data):
    text = io.TextIOWrapper(io.BytesIO(data), encoding="utf-8", errors="strict", newline="")
    return [row for row in csv.reader(text, strict=True)]


def xml_value(element):
    tag = element.tag
    if tag in SCALARS and len(element) != 0:
        fail("<%s> holds elements" % tag)
    text = element.text or ""
    if tag == "boolean":
        if text not in ("true", "false"):
            fail("bad boolean %r" % text)
        return text == "true"
    if tag == "integer":
        try:
            return int(text)
        except ValueError:
            fail("bad integer %r" % text)
    if tag == "string":
        return text
    if tag == "list":
        item_type = element.get("type")
        items = []
        for child in element:
            if child.tag != item_type:
                fail("<%s> in a list of %s" % (child.tag, item_type))
            items.append(xml_value(child))
        return items
    if tag == "structure":
        if element.get("typeName") is None:
            fail("structure without typeName")
        fields = {}
        for child in element:
            name = child.get("name")
            if child.tag != "field" or name is None or len(child) != 1:
                fail("bad field in structure %s" % element.get("typeName"))
            if name in fields:
                fail("field %r twice" % name)
            fields[name] = xml_value(child[0])
        return fields
    fail("unknown element <%s>" % tag)


def read_xml(data):
    root = ElementTree.fromstring(data)
    if root.tag != "output" or len(root) > 1:
        fail("the document is not <output> with at most one value")
    return xml_value(root[0]) if len(root) == 1 else None


def main():
    if len(sys.argv) != 2 or sys.argv[1] not in ("csv", "xml"):
        fail("usage: read_machine_format.py csv|xml < documents")
    read = read_csv if sys.argv[1] == "csv" else read_xml
    values = []
    for number, document in enumerate(json.load(sys.stdin)):
        try:
            values.append(read(document.encode("utf-8")))
        except (csv.Error, ElementTree.ParseError, UnicodeDecodeError) as error:
            fail("document %d: %s" % (number, error))
    json.dump(values, sys.stdout)


if __name__ == "__main__":
    main()
