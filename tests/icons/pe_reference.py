#!/usr/bin/env python3
"""Independent reading of a PE file with pefile, for comparison in the tests: the resource directory in stored
order. Prints JSON."""
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


def main(path):
    try:
        pe = pefile.PE(path)
    except pefile.PEFormatError as error:
        print(json.dumps({"error": str(error)}))
        return
    print(json.dumps({"resources": resources(pe)}))


if __name__ == "__main__":
    main(sys.argv[1])
