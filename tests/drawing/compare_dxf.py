"""Compares a DXF file written by the host with the file it was read from.

usage: compare_dxf.py ORIGINAL WRITTEN

The written file must hold every object of the original with the same tags (only the table
record counts and $HANDSEED may differ, and new APPID records may be added), must load in
ezdxf and pass its audit without errors, and ezdxf must see the same layers, blocks,
extended data and dictionary trees in both. Prints what differs; exit status 1 then.
"""
import re
import sys
import ezdxf

ESCAPE = re.compile(r"\\U\+([0-9A-Fa-f]{4})")


def raw_tags(path):
    data = open(path, "rb").read()
    text = data.decode("utf8", errors="replace")
    version = re.search(r"\$ACADVER\r?\n\s*1\r?\n(AC\d+)", text).group(1)
    if version < "AC1021":
        text = data.decode("cp1252", errors="replace")
        text = ESCAPE.sub(lambda m: chr(int(m.group(1), 16)), text)
    lines = text.split("\n")
    return [(int(lines[i]), lines[i + 1].rstrip("\r")) for i in range(0, len(lines) - 1, 2)]


def objects(tags):
    """Objects by handle, and header variables by name."""
    result, header = {}, {}
    current, var = None, None
    section = None
    for i, (code, value) in enumerate(tags):
        if code == 2 and i and tags[i - 1] == (0, "SECTION"):
            section = value
        if section == "HEADER":
            if code == 9:
                var = value
                header[var] = []
            elif var:
                header[var].append((code, value))
            continue
        if code == 0:
            current = [(code, value)]
            if value not in ("SECTION", "ENDSEC", "ENDTAB", "EOF"):
                handle_code = 105 if value == "DIMSTYLE" else 5
                j = i + 1
                handle = None
                while j < len(tags) and tags[j][0] != 0:
                    if tags[j][0] == handle_code:
                        handle = tags[j][1]
                        break
                    j += 1
                if handle:
                    result[handle.upper()] = current
            continue
        if current is not None:
            current.append((code, value))
    return result, header


def tags_equal(a, b):
    if a == b:
        return True
    if len(a) != len(b):
        return False
    for (ca, va), (cb, vb) in zip(a, b):
        if ca != cb:
            return False
        if va != vb:
            try:
                if abs(float(va) - float(vb)) > 1e-9 * max(1.0, abs(float(va))):
                    return False
            except ValueError:
                return False
    return True


def compare_raw(original, written, problems):
    a, ha = objects(raw_tags(original))
    b, hb = objects(raw_tags(written))
    for handle, tags in a.items():
        if handle not in b:
            problems.append("object %s (%s) is missing" % (handle, tags[0][1]))
            continue
        mine = b[handle]
        if tags[0][1] == "TABLE":
            tags = [t for t in tags if t[0] != 70]
            mine = [t for t in mine if t[0] != 70]
        if not tags_equal(tags, mine):
            problems.append("object %s (%s) differs:\n  %s\n  %s" % (handle, tags[0][1], tags[:40], mine[:40]))
    for handle, tags in b.items():
        if handle not in a and tags[0][1] != "APPID":
            problems.append("object %s (%s) was added" % (handle, tags[0][1]))
    for name, values in ha.items():
        if name == "$HANDSEED":
            if int(hb[name][0][1], 16) < int(values[0][1], 16):
                problems.append("$HANDSEED went down")
            continue
        if name not in hb or not tags_equal(values, hb[name]):
            problems.append("header %s differs: %s / %s" % (name, values, hb.get(name)))


def xdata_of(entity):
    if not entity.xdata:
        return {}
    return {app: [tuple(t) for t in tags] for app, tags in entity.xdata.data.items()}


def dictionary_tree(doc, dictionary, depth=0):
    tree = {}
    for name, obj in dictionary.items():
        if isinstance(obj, str):
            tree[name] = obj
        elif obj.dxftype() == "DICTIONARY" and depth < 8:
            tree[name] = dictionary_tree(doc, obj, depth + 1)
        elif obj.dxftype() == "XRECORD":
            tree[name] = [tuple(t) for t in obj.tags]
        else:
            tree[name] = obj.dxftype()
    return tree


def summary(path):
    doc = ezdxf.readfile(path)
    layers = {l.dxf.name: (l.is_frozen(), l.is_off(), l.is_locked(), l.dxf.color, xdata_of(l))
              for l in doc.layers}
    blocks = {}
    for block in doc.blocks:
        blocks[block.name] = [(e.dxftype(), e.dxf.handle, e.dxf.owner, (e.dxf.get("layer") if e.dxf.is_supported("layer") else None), xdata_of(e))
                              for e in block]
    attribs = {}
    for ref in doc.modelspace().query("INSERT"):
        attribs[ref.dxf.handle] = [(a.dxf.tag, a.dxf.text, a.dxf.owner) for a in ref.attribs]
    return {"layers": layers, "blocks": blocks, "attribs": attribs,
            "dictionaries": dictionary_tree(doc, doc.rootdict)}


def same_text(text):
    return re.sub(r"\\\\U\+([0-9A-Fa-f]{4})", lambda m: chr(int(m.group(1), 16)), text)


def main():
    original, written = sys.argv[1], sys.argv[2]
    problems = []
    if not open(original, "rb").read(18).startswith(b"AutoCAD Binary DXF"):
        compare_raw(original, written, problems)
    doc = ezdxf.readfile(written)
    auditor = doc.audit()
    for error in auditor.errors:
        problems.append("audit: %s" % (error.message,))
    a, b = summary(original), summary(written)
    for key in a:
        # \U+XXXX escapes compare as the characters they stand for
        if same_text(str(a[key])) != same_text(str(b[key])):
            problems.append("ezdxf sees different %s:\n  %s\n  %s" % (key, a[key], b[key]))
    for p in problems[:20]:
        print(p)
    print("OK" if not problems else "%d problems" % len(problems))
    return 1 if problems else 0


if __name__ == "__main__":
    sys.exit(main())
