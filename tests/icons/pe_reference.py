#!/usr/bin/env python3
"""Independent reading of a PE file with pefile, for comparison in the tests: the resource directory in stored
order and the version strings under the first translation. Prints JSON."""
import json
import sys

import pefile


def key(entry):
    if entry.name is not None:
        return str(entry.name)
    return entry.id


def resources(pe):
    out = []
    root = getattr(pe, "DIRECTORY_ENTRY_RESOURCE", None)
    if root is None:
        return None
    for rtype in root.entries:
        if not hasattr(rtype, "directory"):
            continue
        for name in rtype.directory.entries:
            if not hasattr(name, "directory"):
                continue
            for lang in name.directory.entries:
                data = lang.data.struct
                try:
                    offset = pe.get_offset_from_rva(data.OffsetToData)
                except pefile.PEFormatError:
                    offset = -1
                out.append([key(rtype), key(name), lang.id, data.Size, offset])
    return out


def version(pe):
    translation = None
    tables = {}
    for group in getattr(pe, "FileInfo", None) or []:
        for info in group:
            if info.Key == b"VarFileInfo":
                for var in info.Var:
                    value = var.entry.get(b"Translation")
                    if value and translation is None:
                        lang, codepage = (int(v, 16) for v in value.split()[:2])
                        translation = "%04X%04X" % (lang, codepage)
            elif info.Key == b"StringFileInfo":
                for table in info.StringTable:
                    tables.setdefault(table.LangID.decode().upper(),
                                      {k.decode(): v.decode("utf-8", "replace") for k, v in table.entries.items()})
    if translation is None:
        return None
    return {"translation": translation, "fields": tables.get(translation, {})}


def main(path):
    try:
        pe = pefile.PE(path)
    except pefile.PEFormatError as error:
        print(json.dumps({"error": str(error)}))
        return
    print(json.dumps({"resources": resources(pe), "version": version(pe)}))


if __name__ == "__main__":
    main(sys.argv[1])
