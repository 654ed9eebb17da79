"""Writes the DXF fixtures of the drawing tests into a folder (argument 1).

Each version from R2000 to R2018 gets a drawing with blocks and attributes, several
extended-data applications (one twice on the same entity), nested dictionaries with
Xrecords, an extension dictionary, MTEXT with inline codes and non-ASCII text. After ezdxf
has written a file, an unknown entity, an unknown object and an unknown group code inside a
LINE are put into its text, as a foreign program would leave them.
"""
import sys
import os
import ezdxf

VERSIONS = ["R2000", "R2004", "R2007", "R2010", "R2013", "R2018"]
TEXT = "Ação ñ € Ω"  # the Greek letter lies outside code page 1252


def build(version):
    doc = ezdxf.new(version)
    for app in ("KVR_ZV", "KVR_ZV_WIRE", "ZV_OTHER"):
        doc.appids.new(app)
    doc.layers.new("PAGE$1", dxfattribs={"color": 3})
    frozen = doc.layers.new("PAGE$2$SELO")
    frozen.freeze()
    off = doc.layers.new("OFFLAYER")
    off.off()
    locked = doc.layers.new("LOCKED")
    locked.lock()
    doc.layers.get("PAGE$1").set_xdata("KVR_ZV", [(1000, "CAPA")])

    block = doc.blocks.new("BORNE_X", base_point=(1, 2))
    block.add_line((0, 0), (10, 0))
    block.add_circle((5, 5), 2.5)
    block.add_attdef("REGUA", (0, 5), dxfattribs={"height": 2.5, "prompt": "Strip"})
    block.add_attdef("NUMERO", (0, 8), dxfattribs={"height": 2.5, "prompt": "Number"})
    inner = doc.blocks.new("INNER")
    inner.add_arc((0, 0), 3, 0, 90)
    block.add_blockref("INNER", (20, 0))

    msp = doc.modelspace()
    for i in range(5):
        ref = msp.add_blockref("BORNE_X", (i * 30, 0), dxfattribs={"layer": "PAGE$1"})
        ref.add_attrib("REGUA", "X%d" % i, (i * 30, 5))
        ref.add_attrib("NUMERO", str(i + 1), (i * 30, 8))
        ref.set_xdata("KVR_ZV", [(1000, "item%d" % i), (1005, ref.dxf.handle), (1040, 2.5),
                                 (1070, 7), (1071, 123456), (1010, (1.0, 2.0, 3.0)),
                                 (1002, "{"), (1000, "inner"), (1002, "}")])
    wire = msp.add_lwpolyline([(0, 0), (10, 0), (10, 10)], dxfattribs={"layer": "PAGE$1"})
    wire.set_xdata("KVR_ZV_WIRE", [(1000, "W1")])
    wire.set_xdata("ZV_OTHER", [(1000, "first")])
    old = msp.add_polyline2d([(0, 0), (5, 5), (9, 1)])
    old.set_xdata("KVR_ZV_WIRE", [(1000, "W2")])
    msp.add_text(TEXT, dxfattribs={"height": 3, "layer": "PAGE$1"})
    msp.add_mtext("Line one\\PLine {\\fArial|b1;bold} two " + TEXT + " " + "x" * 300)
    msp.add_point((3, 4))
    msp.add_ellipse((0, 0), major_axis=(4, 0), ratio=0.5)
    msp.add_solid([(0, 0), (1, 0), (0, 1), (1, 1)])
    line = msp.add_line((0, 0), (1, 1), dxfattribs={"layer": "LOCKED", "color": 1})
    xdict = line.new_extension_dict()
    xrec = xdict.add_xrecord("ZV_NOTE")
    xrec.reset([(1, "note"), (40, 1.5)])

    root = doc.rootdict
    mgr = root.add_new_dict("ZV_DATA_MGR")
    cls = mgr.add_new_dict("CELayoutRotasFios")
    for key in ("41", "18467"):
        obj = cls.add_new_dict(key)
        for field, value in (("strKeyFio", "W" + key), ("strRotaData", "1A:X1-2B-P1-P2$3C-4D")):
            rec = obj.add_xrecord(field)
            rec.reset([(1000, value)])
    cables = root.add_new_dict("ZV_CABOS")
    rec = cables.add_xrecord("C1")
    rec.reset([(1, TEXT), (70, 3), (10, (1.0, 2.0, 0.0))])
    return doc


def build_r12():
    doc = ezdxf.new("R12")
    doc.appids.new("KVR_ZV")
    doc.layers.new("PAGE$1", dxfattribs={"color": 3})
    doc.layers.new("FROZEN").freeze()
    block = doc.blocks.new("BORNE_X", base_point=(1, 2))
    block.add_line((0, 0), (10, 0))
    block.add_attdef("REGUA", (0, 5), dxfattribs={"height": 2.5, "prompt": "Strip"})
    msp = doc.modelspace()
    line = msp.add_line((0, 0), (5, 5), dxfattribs={"layer": "PAGE$1"})
    ref = msp.add_blockref("BORNE_X", (30, 0), dxfattribs={"layer": "PAGE$1"})
    ref.add_attrib("REGUA", "X9", (30, 5))
    ref.set_xdata("KVR_ZV", [(1000, "item"), (1005, line.dxf.handle)])
    msp.add_polyline2d([(0, 0), (5, 5), (9, 1)], dxfattribs={"layer": "PAGE$1"})
    msp.add_text(TEXT, dxfattribs={"height": 3})
    msp.add_circle((1, 1), 2)
    msp.add_arc((1, 1), 2, 0, 90)
    return doc


def inject(path, version):
    """Puts an unknown entity, an unknown object and an unknown group code into the text."""
    encoding = "utf8" if version >= "R2007" else "cp1252"
    with open(path, encoding=encoding, errors="surrogateescape") as f:
        lines = f.read().split("\n")
    doc = ezdxf.readfile(path)
    msp_handle = doc.modelspace().block_record_handle
    root_handle = doc.rootdict.dxf.handle
    seed = int(doc.header["$HANDSEED"], 16)
    entity_handle, object_handle = "%X" % seed, "%X" % (seed + 1)
    pairs = [(lines[i], lines[i + 1]) for i in range(0, len(lines) - 1, 2)]
    out = []
    section = None
    replace_seed = False
    for i, (code, value) in enumerate(pairs):
        if replace_seed:
            out.append((code, "%X" % (seed + 2)))
            replace_seed = False
            continue
        if code.strip() == "2" and i > 0 and pairs[i - 1][1] == "SECTION":
            section = value
        if code.strip() == "0" and value == "ENDSEC" and section == "ENTITIES":
            out += [("  0", "ACME_WIDGET"), ("  5", entity_handle), ("330", msp_handle),
                    ("100", "AcDbEntity"), ("  8", "0"), ("100", "AcmeWidget"),
                    ("  1", "widget text"), (" 90", "42"), (" 10", "1.5"), (" 20", "2.5"),
                    (" 30", "0.0"), ("1001", "ZV_OTHER"), ("1000", "on widget")]
        if code.strip() == "0" and value == "ENDSEC" and section == "OBJECTS":
            out += [("  0", "ACME_DATA"), ("  5", object_handle), ("330", root_handle),
                    ("100", "AcmeData"), ("  1", "payload"), (" 70", "5"), ("  1", "again")]
        out.append((code, value))
        if value == "AcDbLine" and code.strip() == "100":
            out.append((" 47", "9.25"))  # not a code of LINE
        if code.strip() == "9" and value == "$HANDSEED":
            replace_seed = True
    text = "\n".join("%s\n%s" % p for p in out) + "\n"
    with open(path, "w", encoding=encoding, errors="surrogateescape") as f:
        f.write(text)
    return entity_handle, object_handle


def main():
    folder = sys.argv[1]
    os.makedirs(folder, exist_ok=True)
    for version in VERSIONS:
        doc = build(version)
        path = os.path.join(folder, "fixture_%s.dxf" % version)
        doc.saveas(path)
        inject(path, version)
    build_r12().saveas(os.path.join(folder, "fixture_R12.dxf"))
    # a binary DXF of the same drawing
    build("R2010").saveas(os.path.join(folder, "binary_R2010.dxf"), fmt="bin")


if __name__ == "__main__":
    main()
