"""Loads a DXF file written by the host with ezdxf, audits it and prints what ezdxf sees as
JSON: version, layers with their states and extended data, model-space entities with
attributes and extended data, blocks, and the dictionary tree. Exit status 1 when the file
does not load or the audit finds errors (they are printed instead).
"""
import json
import sys
import ezdxf


def xdata(entity):
    if not entity.xdata:
        return {}
    return {app: [[c, list(v) if isinstance(v, tuple) else v] for c, v in tags]
            for app, tags in entity.xdata.data.items()}


def tree(dictionary, depth=0):
    result = {}
    for name, obj in dictionary.items():
        if obj.dxftype() == "DICTIONARY" and depth < 8:
            result[name] = tree(obj, depth + 1)
        elif obj.dxftype() == "XRECORD":
            result[name] = [[c, list(v) if isinstance(v, tuple) else v] for c, v in obj.tags]
        else:
            result[name] = obj.dxftype()
    return result


def entity_info(e):
    info = {"type": e.dxftype(), "handle": e.dxf.handle, "owner": e.dxf.owner,
            "layer": e.dxf.get("layer") if e.dxf.is_supported("layer") else None,
            "xdata": xdata(e)}
    if e.dxftype() == "INSERT":
        info["name"] = e.dxf.name
        info["attribs"] = [[a.dxf.tag, a.dxf.text, a.dxf.owner] for a in e.attribs]
        info["seqend"] = bool(e.attribs) and e.seqend is not None
    if e.dxftype() in ("LWPOLYLINE",):
        info["points"] = [list(p[:2]) for p in e.get_points()]
    if e.dxftype() == "POLYLINE":
        info["points"] = [list(v.dxf.location)[:2] for v in e.vertices]
    if e.dxftype() == "MTEXT":
        info["text"] = e.text
    if e.dxftype() == "TEXT":
        info["text"] = e.dxf.text
    if e.has_extension_dict:
        info["xdict"] = tree(e.get_extension_dict().dictionary)
    return info


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
    result = {
        "version": doc.dxfversion,
        "layers": {l.dxf.name: {"frozen": l.is_frozen(), "off": l.is_off(),
                                "locked": l.is_locked(), "xdata": xdata(l)} for l in doc.layers},
        "appids": sorted(a.dxf.name.upper() for a in doc.appids),
        "modelspace": [entity_info(e) for e in doc.modelspace()],
        "blocks": {b.name: [entity_info(e) for e in b] for b in doc.blocks
                   if not b.name.startswith("*")},
        "dictionaries": tree(doc.rootdict),
        "clayer": doc.header.get("$CLAYER"),
    }
    print(json.dumps(result))
    return 0


if __name__ == "__main__":
    sys.exit(main())
