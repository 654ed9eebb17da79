"""Reads a strip drawing with ezdxf, audits it and prints one JSON object: the page layers
and, per block reference of model space, its block, layer, insertion point, attributes and
the strings of its KVR_ZV_REPRESENTACAO data. Exit status 1 when the file does not load or
the audit finds errors (they are printed instead).
"""
import json
import sys
import ezdxf


def main():
    try:
        doc = ezdxf.readfile(sys.argv[1])
    except Exception as error:  # any failure to load is the answer
        print("load failed: %s" % error)
        return 1
    auditor = doc.audit()
    if auditor.errors:
        for error in auditor.errors:
            print("audit error: %s" % error.message)
        return 1
    inserts = []
    for e in doc.modelspace().query("INSERT"):
        rep = []
        if e.has_xdata("KVR_ZV_REPRESENTACAO"):
            rep = [v for c, v in e.get_xdata("KVR_ZV_REPRESENTACAO") if c == 1000]
        inserts.append({"name": e.dxf.name, "layer": e.dxf.layer,
                        "x": round(e.dxf.insert.x, 4), "y": round(e.dxf.insert.y, 4),
                        "attribs": {a.dxf.tag: a.dxf.text for a in e.attribs}, "rep": rep})
    print(json.dumps({"layers": [l.dxf.name for l in doc.layers], "inserts": inserts}))
    return 0


if __name__ == "__main__":
    sys.exit(main())
