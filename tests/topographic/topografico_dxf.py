"""Reads a drawing with ezdxf, audits it and prints one JSON object: the layers, and per
block reference of model space its handle, block, layer, insertion point, attributes and the
strings of its representation data (KVR_ZV_REPRESENTACAO, and KVR_ZV_REPRESENTACAO_ACE for an
accessory's block); and by handle the representation chains (KVR_ZV_REPRESENTACAO_ESQ, and
KVR_ZV_REPRESENTACAO_ACE_ESQ for accessories) of every object that has one, Xrecords included. Exit status 1 when the file does not load or the audit
finds errors (they are printed instead).
"""
import json
import sys
import ezdxf


def strings(entity, application):
    if not entity.has_xdata(application):
        return []
    return [v for c, v in entity.get_xdata(application) if c == 1000]


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
        inserts.append({"handle": e.dxf.handle, "name": e.dxf.name, "layer": e.dxf.layer,
                        "x": e.dxf.insert.x, "y": e.dxf.insert.y,
                        "attribs": {a.dxf.tag: a.dxf.text for a in e.attribs},
                        "rep": strings(e, "KVR_ZV_REPRESENTACAO"),
                        "ace": strings(e, "KVR_ZV_REPRESENTACAO_ACE")})
    esq, ace_esq = {}, {}
    for e in doc.entitydb.values():
        if e.is_alive and e.has_xdata("KVR_ZV_REPRESENTACAO_ESQ"):
            esq[e.dxf.handle] = strings(e, "KVR_ZV_REPRESENTACAO_ESQ")
        if e.is_alive and e.has_xdata("KVR_ZV_REPRESENTACAO_ACE_ESQ"):
            ace_esq[e.dxf.handle] = strings(e, "KVR_ZV_REPRESENTACAO_ACE_ESQ")
    print(json.dumps({"layers": [l.dxf.name for l in doc.layers], "inserts": inserts,
                      "esq": esq, "ace_esq": ace_esq}))
    return 0


if __name__ == "__main__":
    sys.exit(main())
