"""Checks that a DXF file written by the host keeps the content of the file it was read from.

usage: content_dxf.py ORIGINAL WRITTEN

Both files are read group by group (ASCII or binary; comments skipped, nothing after 0/EOF),
and must name the same layers and blocks and hold, in each block and in model and paper
space, the same entities (counted by type; vertices, attributes and SEQENDs go with their
owner). Objects of the OBJECTS section that the original names by handle must still be there
with their type. ezdxf must load the written file, pass its audit, and see the same layers,
blocks and entities. Prints what differs; exit status 1 then.
"""
import collections
import struct
import sys
import ezdxf

SENTINEL = b"AutoCAD Binary DXF\r\n\x1a\x00"
SUBENTITIES = {"VERTEX", "ATTRIB", "SEQEND"}


def kind(code):
    if code < 0:
        return "i"
    if code <= 9 or 100 <= code < 110 or 300 <= code < 310 or 320 <= code < 370:
        return "s"
    if code < 60 or 110 <= code < 150 or 210 <= code < 240 or 460 <= code < 470:
        return "d"
    if code < 80 or 170 <= code < 180 or 270 <= code < 290 or 370 <= code < 390:
        return "h"
    if 400 <= code < 410 or 1060 <= code < 1071:
        return "h"
    if 90 <= code < 100 or 420 <= code < 430 or 440 <= code < 460 or code == 1071:
        return "i"
    if 160 <= code < 170:
        return "q"
    if 290 <= code < 300:
        return "b"
    if 310 <= code < 320 or code == 1004:
        return "x"
    if 1010 <= code < 1060:
        return "d"
    return "s"


def binary_tags(data):
    pos = len(SENTINEL)
    short = data[pos] == 0 and data[pos + 1] != 0
    tags = []
    while pos < len(data):
        if short:
            code = data[pos]
            pos += 1
            if code == 255:
                code = struct.unpack_from("<h", data, pos)[0]
                pos += 2
        else:
            code = struct.unpack_from("<h", data, pos)[0]
            pos += 2
        k = kind(code)
        if k == "s":
            end = data.index(b"\0", pos)
            value = data[pos:end].decode("cp1252", errors="replace")
            pos = end + 1
        elif k == "x":
            n = data[pos]
            value = data[pos + 1:pos + 1 + n].hex().upper()
            pos += 1 + n
        else:
            fmt = {"d": "<d", "h": "<h", "i": "<i", "q": "<q", "b": "<B"}[k]
            value = str(struct.unpack_from(fmt, data, pos)[0])
            pos += struct.calcsize(fmt)
        tags.append((code, value))
    return tags


def ascii_tags(data):
    lines = data.decode("utf8", errors="replace").split("\n")
    tags = []
    for i in range(0, len(lines) - 1, 2):
        tags.append((int(lines[i]), lines[i + 1].rstrip("\r")))
        if tags[-1] == (0, "EOF"):
            break
    return tags


def read(path):
    data = open(path, "rb").read()
    tags = binary_tags(data) if data.startswith(SENTINEL) else ascii_tags(data)
    result = []
    for code, value in tags:
        if code == 999:
            continue
        result.append((code, value))
        if (code, value) == (0, "EOF"):
            break
    return result


def space_name(name):
    upper = name.upper()
    if upper in ("*MODEL_SPACE", "$MODEL_SPACE"):
        return "*MODEL_SPACE"
    if upper.startswith("*PAPER_SPACE") or upper == "$PAPER_SPACE":
        return "*PAPER_SPACE"
    return name


def content(path):
    """Layers, blocks with their entity counts, and handled objects, from the raw groups."""
    tags = read(path)
    layers, blocks, objects = set(), {}, {}
    section, table, block = None, None, None
    entities = collections.defaultdict(collections.Counter)
    i = 0
    while i < len(tags):
        code, value = tags[i]
        j = i + 1
        while j < len(tags) and tags[j][0] != 0:
            j += 1
        body = tags[i + 1:j]
        first = dict(reversed(body))  # first value of each code
        if code == 0 and value in ("SECTION", "ENDSEC", "EOF"):
            section = first.get(2) if value == "SECTION" else None
        elif code == 0 and section == "TABLES":
            if value == "TABLE":
                table = first.get(2)
            elif value == "LAYER" and table == "LAYER":
                layers.add(first.get(2, ""))
        elif code == 0 and section == "BLOCKS":
            if value == "BLOCK":
                block = space_name(first.get(2, first.get(3, "")))
                blocks.setdefault(block, 0)
            elif value == "ENDBLK":
                block = None
            elif block is not None and value not in SUBENTITIES:
                entities[block][value] += 1
        elif code == 0 and section == "ENTITIES" and value not in SUBENTITIES:
            space = "*PAPER_SPACE" if first.get(67) == "1" else "*MODEL_SPACE"
            entities[space][value] += 1
        elif code == 0 and section == "OBJECTS" and 5 in first:
            objects[first[5].upper()] = value
        i = j
    for name in ("*MODEL_SPACE", "*PAPER_SPACE"):
        blocks.setdefault(name, 0)
    return {"layers": layers, "blocks": set(blocks),
            "entities": {b: dict(c) for b, c in entities.items() if c}, "objects": objects}


def ezdxf_view(path, problems):
    doc = ezdxf.readfile(path)
    for error in doc.audit().errors:
        problems.append("audit: %s" % error.message)
    entities = {}
    for b in doc.blocks:
        counts = collections.Counter(e.dxftype() for e in b)
        if counts:
            entities[space_name(b.name)] = dict(counts)
    return {"layers": {l.dxf.name for l in doc.layers}, "entities": entities,
            "blocks": {space_name(b.name) for b in doc.blocks}}


def main():
    original, written = sys.argv[1], sys.argv[2]
    problems = []
    a, b = content(original), content(written)
    if not a["layers"] <= b["layers"] or b["layers"] - a["layers"] - {"0"}:
        problems.append("layers differ: %s / %s" % (sorted(a["layers"]), sorted(b["layers"])))
    if a["blocks"] != b["blocks"]:
        problems.append("blocks differ: %s / %s" % (sorted(a["blocks"]), sorted(b["blocks"])))
    if a["entities"] != b["entities"]:
        problems.append("entities differ:\n  %s\n  %s" % (a["entities"], b["entities"]))
    for handle, kind_ in a["objects"].items():
        if b["objects"].get(handle) != kind_:
            problems.append("object %s (%s) is missing" % (handle, kind_))
    seen = ezdxf_view(written, problems)
    if not b["layers"] <= seen["layers"]:
        problems.append("ezdxf misses layers: %s" % sorted(b["layers"] - seen["layers"]))
    if not b["blocks"] <= seen["blocks"]:
        problems.append("ezdxf misses blocks: %s" % sorted(b["blocks"] - seen["blocks"]))
    for name, counts in b["entities"].items():
        if seen["entities"].get(name) != counts:
            problems.append("ezdxf sees in %s %s, the file holds %s"
                            % (name, seen["entities"].get(name), counts))
    for p in problems[:20]:
        print(p)
    print("OK" if not problems else "%d problems" % len(problems))
    return 1 if problems else 0


if __name__ == "__main__":
    sys.exit(main())
