#!/usr/bin/env python3
"""Compiles every source of the program, the service and the components for Windows, for syntax and types
only, with Debian's MinGW-w64 compiler against Qt's own headers.

The list of sources and each one's include folders and definitions come from the build's
compile_commands.json: CMake knows them, so there is no second list to keep. No Qt build for Windows exists
on these machines, so nothing is linked or run.
Usage: windows-check.py [BUILD_DIR [SOURCE_DIR [PART_OF_PATH ...]]]: the last arguments limit the check
to the sources whose path contains one of them."""
import concurrent.futures
import json
import os
import shlex
import shutil
import subprocess
import sys

COMPILER = "x86_64-w64-mingw32-g++"
CHECKED_FOLDERS = ("src", "components", "service")
# Options that name outputs, dependency files or the host's code model; the rest (definitions, include
# folders, warnings, language level) is kept as the build uses it.
DROPPED_WITH_VALUE = {"-o", "-MF", "-MT", "-MQ"}
DROPPED = {"-c", "-MD", "-MMD", "-fPIC", "-g"}
# Headers of libraries the build finds in the host's /usr/include, which cannot be put on the cross
# compiler's path as a whole (the C library's headers there are not Windows'). They are platform-neutral.
HOST_LIBRARY_HEADERS = ("archive.h", "archive_entry.h")


def host_library_headers(folder):
    os.makedirs(folder, exist_ok=True)
    for name in HOST_LIBRARY_HEADERS:
        link = os.path.join(folder, name)
        if os.path.exists("/usr/include/" + name) and not os.path.lexists(link):
            os.symlink("/usr/include/" + name, link)
    return folder


def windows_arguments(command, source_dir):
    words = shlex.split(command)[1:]
    kept = []
    skip_next = False
    for word in words:
        if skip_next:
            skip_next = False
            continue
        if word in DROPPED_WITH_VALUE:
            skip_next = True
            continue
        if word in DROPPED or word.startswith("-O") or word.startswith("-fsanitize") or word.endswith(".cpp"):
            continue
        # Qt's platform definitions for the target, not for the host.
        kept.append(word.replace("/mkspecs/linux-g++", "/mkspecs/win32-g++"))
    return kept + ["-fsyntax-only", "-DUNICODE", "-D_UNICODE", "-std=c++20"]


def main():
    build_dir = os.path.abspath(sys.argv[1] if len(sys.argv) > 1 else "build")
    source_dir = os.path.abspath(sys.argv[2] if len(sys.argv) > 2 else ".")
    only = sys.argv[3:]
    if shutil.which(COMPILER) is None:
        print(f"{COMPILER} is missing: install the Debian package mingw-w64", file=sys.stderr)
        return 2
    database = os.path.join(build_dir, "compile_commands.json")
    if not os.path.exists(database):
        print(f"{database} is missing: configure the build first (make configure)", file=sys.stderr)
        return 2

    prefixes = tuple(os.path.join(source_dir, folder) + os.sep for folder in CHECKED_FOLDERS)
    entries = {}
    for entry in json.load(open(database)):
        path = os.path.abspath(os.path.join(entry["directory"], entry["file"]))
        if path.startswith(prefixes) and path.endswith(".cpp") and (not only or any(o in path for o in only)):
            entries.setdefault(path, entry)  # a source built into two targets is checked once
    if not entries:
        print("no sources found in " + database, file=sys.stderr)
        return 2

    shim = host_library_headers(os.path.join(build_dir, "windows-check-include"))

    def check(path):
        entry = entries[path]
        arguments = [COMPILER] + windows_arguments(entry["command"], source_dir) + ["-isystem", shim, path]
        result = subprocess.run(arguments, cwd=entry["directory"], capture_output=True, text=True)
        return path, result.returncode, result.stderr

    failed = []
    warned = 0
    with concurrent.futures.ThreadPoolExecutor(max_workers=os.cpu_count() or 2) as pool:
        for path, code, errors in pool.map(check, sorted(entries)):
            relative = os.path.relpath(path, source_dir)
            if code != 0:
                failed.append(relative)
                print(f"FAILED {relative}\n{errors}", flush=True)
            elif errors.strip():
                warned += 1
                print(f"warnings in {relative}\n{errors}", flush=True)
    print(f"windows-check: {len(entries) - len(failed)} of {len(entries)} sources compile for Windows"
          + (f", {warned} with warnings" if warned else ""))
    if failed:
        print("failed: " + " ".join(failed))
    return 1 if failed or warned else 0


if __name__ == "__main__":
    sys.exit(main())
