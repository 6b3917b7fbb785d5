#!/usr/bin/env python3
"""Planted-fault check: see tools/plant-faults.sh and the head of tools/faults.list."""

import argparse
import json
import os
import re
import shutil
import subprocess
import sys
import time
from pathlib import Path

LINK_LINE = re.compile(r"Linking \S+ (?:executable|shared library|shared module|static library|module) (\S+)")
KEYS = ("id", "file", "find", "replace", "tests", "why")


def unescape(text):
    # \n and \t stand for a line break and a tab, \\ for one backslash; any other backslash stays as written.
    return re.sub(r"\\(.)", lambda m: {"n": "\n", "t": "\t", "\\": "\\"}.get(m.group(1), m.group(0)), text)


def parse_list(path):
    faults, block, errors = [], {}, []

    def finish(lineno):
        if not block:
            return
        missing = [k for k in ("id", "file", "find", "replace") if k not in block]
        if missing:
            errors.append(f"{path}:{lineno}: fault {block.get('id', '?')} lacks {', '.join(missing)}")
        else:
            faults.append(dict(block))
        block.clear()

    lines = Path(path).read_text(encoding="utf-8").splitlines()
    for lineno, line in enumerate(lines, 1):
        if line.startswith("#"):
            continue
        if not line.strip():
            finish(lineno)
            continue
        key, sep, value = line.partition(":")
        if not sep or key not in KEYS:
            errors.append(f"{path}:{lineno}: expected one of {', '.join(KEYS)} followed by ':'")
            continue
        if key in block:
            errors.append(f"{path}:{lineno}: {key} given twice in fault {block.get('id', '?')}")
        value = value[1:] if value.startswith(" ") else value
        block[key] = value if key in ("id", "file", "tests", "why") else unescape(value)
    finish(len(lines))
    ids = [f["id"] for f in faults]
    for dup in sorted({i for i in ids if ids.count(i) > 1}):
        errors.append(f"{path}: id {dup} used more than once")
    for f in faults:
        if f["find"] == f["replace"]:
            errors.append(f"{path}: fault {f['id']}: replace equals find")
    return faults, errors


def run(cmd, log=None, cwd=None, timeout=None, env=None):
    started = time.monotonic()
    proc = subprocess.run(cmd, cwd=cwd, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True,
                          errors="replace", timeout=timeout, env=env)
    if log:
        with open(log, "a", encoding="utf-8") as out:
            out.write(f"$ {' '.join(cmd)}\n{proc.stdout}\n[exit {proc.returncode}, "
                      f"{time.monotonic() - started:.1f} s]\n")
    return proc


class Checker:
    def __init__(self, args):
        self.args = args
        self.source = Path(args.source).resolve()
        root = Path(args.scratch_root) if args.scratch_root else self.source.parent
        self.scratch = root / f"plant-scratch-{args.name or self.source.name}"
        self.tree = self.scratch / "tree"
        # The build lies inside the tree, as in a checkout, so that the shared compiler cache (paths taken
        # relative to the build folder) hits for objects built elsewhere from the same sources.
        self.build = self.tree / "build"
        self.logs = self.scratch / "logs"
        self.times_file = self.scratch / "test-times.json"
        self.planted_file = self.scratch / "planted.json"
        # Niceness is set to the wanted level, not added to that of a caller already running under nice.
        raise_by = args.nice - os.nice(0)
        self.nice = ["nice", "-n", str(raise_by)] if raise_by > 0 else []
        self.env = dict(os.environ, QT_QPA_PLATFORM="offscreen")
        if shutil.which("ccache"):
            self.env.setdefault("CMAKE_CXX_COMPILER_LAUNCHER", "ccache")
        self.times = json.loads(self.times_file.read_text()) if self.times_file.exists() else {}

    def say(self, text):
        print(text, flush=True)

    # --- the scratch copy -------------------------------------------------------------------------
    def source_files(self):
        if (self.source / ".git").exists():
            out = subprocess.run(["git", "-C", str(self.source), "ls-files", "-co", "--exclude-standard", "-z"],
                                 check=True, stdout=subprocess.PIPE).stdout.decode()
            names = [n for n in out.split("\0") if n]
        else:
            names = []
            for root, dirs, files in os.walk(self.source):
                dirs[:] = [d for d in dirs if d not in (".git", "node_modules") and not d.startswith("build")]
                names += [os.path.relpath(os.path.join(root, f), self.source) for f in files]
        return sorted(n for n in names if (self.source / n).is_file() or (self.source / n).is_symlink())

    def undo_interrupted_plant(self):
        if self.planted_file.exists():
            planted = json.loads(self.planted_file.read_text())
            target = self.tree / planted["file"]
            if target.exists():
                target.write_text(planted["original"], encoding="utf-8")
                self.say(f"put back {planted['file']} left faulty by an interrupted run")
            self.planted_file.unlink()

    def refresh_tree(self):
        self.tree.mkdir(parents=True, exist_ok=True)
        self.logs.mkdir(parents=True, exist_ok=True)
        self.undo_interrupted_plant()
        names = self.source_files()
        # Only files whose bytes differ are written, with a fresh time stamp, so ninja rebuilds just those.
        changed = 0
        for name in names:
            src, dst = self.source / name, self.tree / name
            if src.is_symlink():
                target = os.readlink(src)
                if not dst.is_symlink() or os.readlink(dst) != target:
                    dst.parent.mkdir(parents=True, exist_ok=True)
                    if dst.exists() or dst.is_symlink():
                        dst.unlink()
                    os.symlink(target, dst)
                    changed += 1
                continue
            data = src.read_bytes()
            if dst.is_symlink() or not dst.is_file() or dst.read_bytes() != data:
                dst.parent.mkdir(parents=True, exist_ok=True)
                if dst.is_symlink():
                    dst.unlink()
                dst.write_bytes(data)
                changed += 1
            shutil.copymode(src, dst)
        wanted = set(names)
        for root, dirs, files in os.walk(self.tree):
            dirs[:] = [d for d in dirs if d != "node_modules" and not (root == str(self.tree) and d == "build")]
            for f in files:
                rel = os.path.relpath(os.path.join(root, f), self.tree)
                if rel not in wanted:
                    os.unlink(os.path.join(root, f))
        self.say(f"scratch tree {self.tree}: {len(names)} files, {changed} refreshed")
        if not (self.tree / "node_modules").exists() and (self.tree / "package.json").exists():
            if (self.source / "node_modules").is_dir():
                shutil.copytree(self.source / "node_modules", self.tree / "node_modules", symlinks=True)
            elif (self.tree / "tools/install-ruffle.sh").exists():
                subprocess.run([str(self.tree / "tools/install-ruffle.sh")], check=True)

    def configure_and_build(self):
        if not (self.build / "build.ninja").exists():
            self.say("configuring the scratch build")
            proc = run(self.nice + ["cmake", "-S", str(self.tree), "-B", str(self.build), "-G", "Ninja",
                                    "-DBRIMVAULT_BUILD_BENCH=OFF", "-DBRIMVAULT_BUILD_FUZZ=OFF"],
                       log=self.logs / "configure.log", env=self.env)
            if proc.returncode:
                sys.exit(f"configure failed, see {self.logs / 'configure.log'}")
        self.say("building the scratch tree as it is")
        started = time.monotonic()
        proc = self.ninja(self.logs / "build.log")
        if proc.returncode:
            sys.exit(f"the unchanged tree does not build, see {self.logs / 'build.log'}")
        self.say(f"built in {time.monotonic() - started:.0f} s")

    def ninja(self, log, targets=None):
        return run(self.nice + ["ninja", "-C", str(self.build), f"-j{self.args.jobs}"] + (targets or []),
                   log=log, env=self.env)

    def objects_of(self, path):
        proc = run(["ninja", "-C", str(self.build), "-t", "query", str(path)], env=self.env)
        if proc.returncode:
            return []
        outputs = proc.stdout.split("outputs:", 1)
        return [o for o in outputs[1].split() if o.endswith(".o")] if len(outputs) == 2 else []

    def reached_by_file(self, path, regex):
        names = [n for n, t in self.tests.items() if path in t["inputs"]]
        if regex:
            names += [n for n in self.tests_matching(regex) if n not in names]
        return sorted(names, key=lambda n: (self.estimate(n), n))

    # --- which tests a fault reaches ---------------------------------------------------------------
    def load_tests(self):
        out = run(["ctest", "--test-dir", str(self.build), "--show-only=json-v1"], env=self.env)
        if out.returncode:
            sys.exit("ctest cannot list the tests:\n" + out.stdout)
        self.tests = {}
        for test in json.loads(out.stdout[out.stdout.index("{"):]).get("tests", []):
            command = test.get("command") or []
            exe = None
            if command:
                path = Path(command[0])
                if path.is_absolute() and self.build in path.parents:
                    exe = str(path.relative_to(self.build))
            inputs = set()
            if exe:
                proc = run(["ninja", "-C", str(self.build), "-t", "inputs", exe], env=self.env)
                inputs = set(proc.stdout.split()) if proc.returncode == 0 else set()
            timeout = next((p["value"] for p in test.get("properties", []) if p.get("name") == "TIMEOUT"), 0)
            self.tests[test["name"]] = {"exe": exe, "inputs": inputs, "timeout": float(timeout or 0)}
        self.say(f"{len(self.tests)} tests in the scratch build")
        # What tests start or load as processes and libraries: every linked target that is not a test.
        out = run(["ninja", "-C", str(self.build), "-t", "targets", "all"], env=self.env).stdout
        test_exes = {t["exe"] for t in self.tests.values()}
        self.runtime_targets = sorted(
            target for target, _, rule in (line.partition(": ") for line in out.splitlines())
            if re.match(r"CXX_(EXECUTABLE|MODULE_LIBRARY|SHARED_LIBRARY)_LINKER", rule) and target not in test_exes)

    def tests_matching(self, regex):
        out = run(["ctest", "--test-dir", str(self.build), "--show-only=json-v1", "-R", regex], env=self.env)
        if out.returncode or "{" not in out.stdout:
            return []
        return [t["name"] for t in json.loads(out.stdout[out.stdout.index("{"):]).get("tests", [])]

    def reached_tests(self, relinked, regex):
        # A test is reached when its own executable was relinked, or anything it links or needs built
        # before it runs (the program, the service, components, helper executables) was.
        names = [n for n, t in self.tests.items()
                 if t["exe"] and (t["exe"] in relinked or t["inputs"] & relinked)]
        if regex:
            names += [n for n in self.tests_matching(regex) if n not in names]
        return sorted(names, key=lambda n: (self.estimate(n), n))

    def estimate(self, name):
        # Until a test has passed once, a tenth of its time-out stands in for its run time.
        if name in self.times:
            return self.times[name]
        timeout = self.tests.get(name, {}).get("timeout") or self.args.timeout
        return timeout / 10

    def run_test(self, name, log):
        started = time.monotonic()
        proc = run(self.nice + ["ctest", "--test-dir", str(self.build), "-R", f"^{re.escape(name)}$",
                                "--output-on-failure", "--timeout", str(self.args.timeout)], log=log, env=self.env)
        took = time.monotonic() - started
        ran = re.search(r"tests passed, (\d+) tests failed out of (\d+)", proc.stdout)
        if not ran or ran.group(2) == "0":
            return None, took
        passed = proc.returncode == 0 and ran.group(1) == "0"
        if passed:
            self.times[name] = round(took, 1)
        return passed, took

    # --- one fault ---------------------------------------------------------------------------------
    def plant(self, fault):
        fid, path = fault["id"], self.tree / fault["file"]
        log = self.logs / f"{fid}.log"
        log.write_text("")
        started = time.monotonic()
        if not path.is_file():
            return {"id": fid, "status": "NOT-APPLIED", "detail": f"{fault['file']} does not exist"}
        original = path.read_text(encoding="utf-8")
        count = original.count(fault["find"])
        if count != 1:
            return {"id": fid, "status": "NOT-APPLIED",
                    "detail": f"find text occurs {count} times in {fault['file']}, not once"}
        self.planted_file.write_text(json.dumps({"file": fault["file"], "original": original}))
        path.write_text(original.replace(fault["find"], fault["replace"]), encoding="utf-8")
        result = {"id": fid}
        try:
            objects = self.objects_of(path)
            if objects:
                # Built lazily: the changed objects, the program, service and components, then each reached
                # test just before it runs, so that a caught fault costs one or two links, not all of them.
                proc = self.ninja(log, objects + self.runtime_targets)
                if proc.returncode:
                    result.update(status="BUILD-FAILED", detail=f"see {log}")
                    return result
                names = self.reached_by_file(str(path), fault.get("tests"))
            else:
                # A header: build everything and take the tests whose executables or dependencies relinked.
                proc = self.ninja(log)
                if proc.returncode:
                    result.update(status="BUILD-FAILED", detail=f"see {log}")
                    return result
                names = self.reached_tests(set(LINK_LINE.findall(proc.stdout)), fault.get("tests"))
            result["tests"] = names
            if not names:
                result.update(status="MISSED", detail="no test reaches this code")
                return result
            caught, ran = [], 0
            for name in names:
                exe = self.tests.get(name, {}).get("exe")
                proc = self.ninja(log, [exe] if exe else None)
                if proc.returncode:
                    result.update(status="BUILD-FAILED", detail=f"{exe or 'the tree'} does not link, see {log}")
                    return result
                passed, took = self.run_test(name, log)
                ran += 1
                if passed is None:
                    result.update(status="ERROR", detail=f"ctest did not run {name}, see {log}")
                    return result
                if not passed:
                    caught.append(name)
                    if not self.args.all_tests:
                        break
            result["ran"] = ran
            if caught:
                result.update(status="CAUGHT", caught=caught)
            else:
                result.update(status="MISSED", detail=f"{ran} tests passed")
            return result
        finally:
            # The unchanged file is rebuilt together with the next fault: consecutive faults mostly lie in
            # one library, so one link serves both (the tests it reaches are run for the next fault too).
            path.write_text(original, encoding="utf-8")
            self.planted_file.unlink()
            result["seconds"] = round(time.monotonic() - started, 1)
            self.times_file.write_text(json.dumps(self.times, indent=1, sort_keys=True))

    def verify_catchers(self, results):
        """A test that fails on the unchanged tree proves nothing about a fault."""
        proc = self.ninja(self.logs / "final-build.log")
        if proc.returncode:
            sys.exit(f"the unchanged tree no longer builds, see {self.logs / 'final-build.log'}")
        catchers = sorted({name for r in results if r["status"] == "CAUGHT" for name in r["caught"]})
        if not catchers or not self.args.verify:
            return
        self.say(f"running the {len(catchers)} catching tests on the unchanged tree")
        broken = []
        for name in catchers:
            passed, _ = self.run_test(name, self.logs / "verify.log")
            if not passed:
                broken.append(name)
                self.say(f"  {name} fails on the unchanged tree too")
        for r in results:
            if r["status"] == "CAUGHT" and all(name in broken for name in r["caught"]):
                r.update(status="UNSURE", detail=f"{', '.join(r['caught'])} fails on the unchanged tree too")

    def check_only(self, faults):
        bad = 0
        for fault in faults:
            path = self.source / fault["file"]
            count = path.read_text(encoding="utf-8").count(fault["find"]) if path.is_file() else -1
            if count != 1:
                bad += 1
                where = "missing file" if count < 0 else f"find text occurs {count} times"
                self.say(f"not applied  {fault['id']:<16} {fault['file']}: {where}")
        self.say(f"{len(faults) - bad} of {len(faults)} faults apply to {self.source}")
        return 1 if bad else 0


def describe(result):
    status, fid = result["status"], result["id"]
    secs = f"{result['seconds']:.0f} s" if "seconds" in result else ""
    if status == "CAUGHT":
        return f"CAUGHT        {fid:<16} by {', '.join(result['caught'])} ({result['ran']} run, {secs})"
    if status == "NOT-APPLIED":
        return f"not applied   {fid:<16} {result['detail']}"
    return f"{status:<13} {fid:<16} {result.get('detail', '')} ({secs})"


def main():
    parser = argparse.ArgumentParser(prog="plant-faults.sh", description=(
        "Plants each fault of the list alone in a scratch copy of the source tree "
        "(<scratch-root>/plant-scratch-<name>, reused between runs), rebuilds it with ninja, runs the tests "
        "built from the changed file, directly or through the program, service and components they start "
        "(cheapest first, stopping at the first failure) and reports CAUGHT, MISSED or BUILD-FAILED for each."))
    parser.add_argument("--tool-dir", help=argparse.SUPPRESS, default=str(Path(__file__).resolve().parent))
    parser.add_argument("--source", help="source tree to copy (default: the repository holding this tool)")
    parser.add_argument("--list", help="fault list (default: faults.list beside this tool)")
    parser.add_argument("--only", help="comma-separated fault ids to plant")
    parser.add_argument("--report", help="also write the report to this file")
    parser.add_argument("--name", help="scratch folder name suffix (default: the source folder's name)")
    parser.add_argument("--scratch-root", help="where scratch folders go (default: beside the source tree)")
    parser.add_argument("--jobs", type=int, default=2, help="ninja jobs (default 2)")
    parser.add_argument("--nice", type=int, default=10, help="niceness of builds and tests (default 10, 0: none)")
    parser.add_argument("--timeout", type=int, default=300,
                        help="ctest time-out for tests that set none themselves (default 300 s)")
    parser.add_argument("--all-tests", action="store_true",
                        help="run every reached test instead of stopping at the first that fails")
    parser.add_argument("--no-verify", dest="verify", action="store_false",
                        help="do not rerun a catching test on the unchanged tree")
    parser.add_argument("--check", action="store_true",
                        help="only check that every fault's find text occurs once in the source tree")
    args = parser.parse_args()
    tool_dir = Path(args.tool_dir)
    args.source = args.source or str(tool_dir.parent)
    args.list = args.list or str(tool_dir / "faults.list")
    if not Path(args.source).is_dir():
        sys.exit(f"no such source tree: {args.source}")

    faults, errors = parse_list(args.list)
    if errors:
        sys.exit("\n".join(errors))
    if args.only:
        wanted = [i.strip() for i in args.only.split(",") if i.strip()]
        unknown = [i for i in wanted if i not in {f["id"] for f in faults}]
        if unknown:
            sys.exit(f"unknown fault ids: {', '.join(unknown)}")
        faults = [f for f in faults if f["id"] in wanted]

    checker = Checker(args)
    if args.check:
        sys.exit(checker.check_only(faults))

    started = time.monotonic()
    checker.refresh_tree()
    checker.configure_and_build()
    checker.load_tests()
    results = []
    (checker.scratch / "progress.txt").write_text("")
    for n, fault in enumerate(faults, 1):
        checker.say(f"[{n}/{len(faults)}] {fault['id']}: {fault.get('why', '')}")
        result = checker.plant(fault)
        results.append(result)
        checker.say(describe(result))
        with open(checker.scratch / "progress.txt", "a", encoding="utf-8") as progress:
            progress.write(describe(result) + "\n")
    checker.verify_catchers(results)
    lines = [describe(r) for r in results]

    total = time.monotonic() - started
    counts = {}
    for r in results:
        counts[r["status"]] = counts.get(r["status"], 0) + 1
    planted = [r for r in results if "seconds" in r]
    summary = [f"source {checker.source}, list {args.list}",
               f"{len(results)} faults: " + ", ".join(f"{v} {k.lower()}" for k, v in sorted(counts.items())),
               f"total {total / 60:.1f} min, {sum(r['seconds'] for r in planted) / max(len(planted), 1):.0f} s "
               f"per planted fault"]
    report = "\n".join(lines + [""] + summary) + "\n"
    checker.say("\n" + "\n".join(summary))
    if args.report:
        Path(args.report).write_text(report)
    (checker.scratch / "report.txt").write_text(report)
    sys.exit(0 if all(r["status"] in ("CAUGHT", "MISSED") for r in results) else 1)


if __name__ == "__main__":
    main()
