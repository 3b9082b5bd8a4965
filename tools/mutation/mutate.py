#!/usr/bin/env python3
"""Mutation check: plants each fault of mutants.txt in turn into a scratch copy of the
repository, rebuilds, runs the release suite and reports whether the suite noticed.

    tools/mutation/run.sh [options] [ID ...]

Every mutant replaces one exact snippet that must occur exactly once in its file. A mutant
whose snippet is missing or ambiguous is "stale", one that does not compile "invalid"; both
are reported and left out of the score. The working tree is never touched: tracked files
(as they stand in the working tree, or in a given revision) are copied to the scratch folder,
built there once with ccache, and each mutated file is restored after its run.
"""

import argparse
import io
import os
import re
import shutil
import subprocess
import sys
import tarfile
import tempfile
import time
from dataclasses import dataclass
from pathlib import Path

HERE = Path(__file__).resolve().parent
REPO = HERE.parent.parent


@dataclass
class Mutant:
    id: str
    file: str
    effect: str
    original: str
    replacement: str


def parse_mutants(path):
    """## ID path, then "# what a user hears, sees or loses", then "- " original lines and
    "+ " replacement lines (several of each make a multi-line snippet)."""
    mutants, current = [], None
    for number, line in enumerate(path.read_text().splitlines(), 1):
        if line.startswith("## "):
            parts = line[3:].split()
            if len(parts) != 2:
                sys.exit(f"{path}:{number}: expected '## ID file'")
            current = Mutant(parts[0], parts[1], "", None, None)
            mutants.append(current)
        elif current is None or not line.strip():
            continue
        elif line.startswith("# "):
            current.effect = (current.effect + " " + line[2:]).strip()
        elif line[:2] in ("- ", "+ ") or line in ("-", "+"):
            attribute = "original" if line[0] == "-" else "replacement"
            text = line[2:]
            previous = getattr(current, attribute)
            setattr(current, attribute, text if previous is None else previous + "\n" + text)
        else:
            sys.exit(f"{path}:{number}: unexpected line")
    for m in mutants:
        if m.original is None or m.replacement is None or not m.effect:
            sys.exit(f"{path}: mutant {m.id} needs an effect line, '- ' and '+ ' lines")
    ids = [m.id for m in mutants]
    if len(ids) != len(set(ids)):
        sys.exit(f"{path}: duplicate mutant ids")
    return mutants


def run(command, cwd, log=None, env=None, timeout=None):
    with open(log, "w") if log else open(os.devnull, "w") as out:
        return subprocess.run(command, cwd=cwd, stdout=out, stderr=subprocess.STDOUT,
                              env=env, timeout=timeout).returncode


def tracked_tree(revision):
    """A temporary folder holding the tracked files of the working tree or of a revision."""
    staging = Path(tempfile.mkdtemp(prefix="veltrane-mutation-staging-"))
    if revision:
        archive = subprocess.run(["git", "archive", revision], cwd=REPO, check=True,
                                 stdout=subprocess.PIPE).stdout
        with tarfile.open(fileobj=io.BytesIO(archive)) as tar:
            tar.extractall(staging)
    else:
        names = subprocess.run(["git", "ls-files", "-z"], cwd=REPO, check=True,
                               stdout=subprocess.PIPE).stdout.decode().split("\0")
        for name in filter(None, names):
            source = REPO / name
            if source.is_file():
                (staging / name).parent.mkdir(parents=True, exist_ok=True)
                shutil.copy2(source, staging / name)
    return staging


def sync(staging, source):
    """Makes source (but its build/ folder) equal to staging, rewriting only files that
    differ so that an incremental build redoes no more than it must."""
    wanted = {p.relative_to(staging) for p in staging.rglob("*") if p.is_file()}
    for path in list(source.rglob("*")):
        relative = path.relative_to(source)
        if relative.parts[0] == "build" or not path.is_file():
            continue
        if relative not in wanted:
            path.unlink()
    for relative in wanted:
        new, old = staging / relative, source / relative
        if not old.exists() or old.read_bytes() != new.read_bytes():
            old.parent.mkdir(parents=True, exist_ok=True)
            shutil.copy2(new, old)


def build_targets(build):
    """The test executables (and through their dependencies the plug-in formats) and the
    tools the tests run; not the stand-alone application or the benchmarks."""
    listing = subprocess.run(["cmake", "--build", build, "--target", "help"],
                             stdout=subprocess.PIPE, text=True).stdout
    names = re.findall(r"^\.\.\. (\S+)", listing, re.M)
    targets = [n for n in names if re.fullmatch(r"veltrane_\w+_tests", n)
               and n != "veltrane_sanitized_tests"]
    targets += [n for n in ("veltrane-render", "veltrane-editor-shot") if n in names]
    return targets or ["all"]


def main():
    parser = argparse.ArgumentParser(description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument("ids", nargs="*", help="run only these mutants")
    parser.add_argument("--mutants", default=str(HERE / "mutants.txt"))
    parser.add_argument("--scratch", default=f"/tmp/veltrane-mutation-{os.getuid()}")
    parser.add_argument("--keep", action="store_true", help="keep the scratch build for the next run")
    parser.add_argument("--revision", help="test this revision's tracked files instead of the working tree")
    parser.add_argument("--timeout", type=int, default=300, help="seconds per test before it counts as hung")
    parser.add_argument("--jobs", type=int, default=2)
    parser.add_argument("--all-tests", action="store_true", help="run the whole suite even after a failure")
    parser.add_argument("--exclude", help="leave out the tests matching this regular expression (ctest -E)")
    parser.add_argument("--list", action="store_true", help="list the mutants and stop")
    parser.add_argument("--check", action="store_true", help="check that every snippet applies to the working tree and stop")
    args = parser.parse_args()

    mutants = parse_mutants(Path(args.mutants))
    if args.ids:
        unknown = set(args.ids) - {m.id for m in mutants}
        if unknown:
            sys.exit("unknown mutant ids: " + " ".join(sorted(unknown)))
        mutants = [m for m in mutants if m.id in args.ids]
    if args.list or args.check:
        stale = 0
        for m in mutants:
            path = REPO / m.file
            count = path.read_text().count(m.original) if path.exists() else 0
            stale += count != 1
            status = "" if count == 1 else f"  STALE: snippet found {count} times"
            if args.list or count != 1:
                print(f"{m.id:5} {m.file:42} {m.effect}{status}")
        print(f"{len(mutants)} mutants, {stale} stale")
        return 1 if stale else 0

    scratch = Path(args.scratch)
    source, build = scratch / "src", scratch / "src" / "build"
    source.mkdir(parents=True, exist_ok=True)
    staging = tracked_tree(args.revision)
    try:
        sync(staging, source)
    finally:
        shutil.rmtree(staging, ignore_errors=True)

    # The same layout as tools/build.sh (build/ inside the tree, paths relative to it for
    # ccache), so the scratch build shares the worktrees' cache.
    env = dict(os.environ, CCACHE_BASEDIR=str(source), LANG="C.UTF-8")
    logs = scratch / "logs"
    logs.mkdir(exist_ok=True)
    jobs = str(args.jobs)
    ctest = ["ctest", "-j", jobs, "--timeout", str(args.timeout), "--output-on-failure"]
    if not args.all_tests:
        ctest.append("--stop-on-failure")
    if args.exclude:
        ctest += ["-E", args.exclude]

    print(f"scratch copy in {source}; configuring and building once", flush=True)
    if run(["cmake", "-S", ".", "-B", "build", "-DCMAKE_BUILD_TYPE=Release",
            "-DVELTRANE_BUILD_BENCHMARKS=OFF"], source, logs / "configure.log", env) != 0:
        sys.exit(f"configure failed: {logs / 'configure.log'}")
    targets = build_targets(str(build))
    build_command = ["cmake", "--build", "build", "-j", jobs, "--target", *targets]
    if run(build_command, source, logs / "build.log", env) != 0:
        sys.exit(f"the unmutated tree does not build: {logs / 'build.log'}")
    started = time.time()
    if run(ctest, build, logs / "baseline.log", env) != 0:
        sys.exit(f"the unmutated suite fails: {logs / 'baseline.log'}")
    print(f"unmutated suite passes ({time.time() - started:.0f} s)", flush=True)

    results = []
    for m in mutants:
        path = source / m.file
        text = path.read_text() if path.exists() else ""
        count = text.count(m.original)
        started = time.time()
        detail = ""
        if count != 1:
            outcome, detail = "stale", f"snippet found {count} times"
        else:
            path.write_text(text.replace(m.original, m.replacement))
            try:
                log = logs / f"{m.id}.log"
                if run(build_command, source, logs / f"{m.id}.build.log", env) != 0:
                    outcome, detail = "invalid", f"does not compile, see {logs / (m.id + '.build.log')}"
                else:
                    try:
                        code = run(ctest, build, log, env, timeout=args.timeout * 20)
                    except subprocess.TimeoutExpired:
                        code = -1
                    report = log.read_text(errors="replace")
                    failed = re.findall(r"^\s+\d+ - (\S+) \((\w+)", report, re.M)
                    if code == 0:
                        outcome = "survived"
                    elif code == -1 or any(kind == "Timeout" for _, kind in failed):
                        outcome, detail = "killed", "by timeout"
                    else:
                        outcome = "killed"
                        detail = "by " + ", ".join(name for name, _ in failed[:3]) if failed else "by the suite"
            finally:
                path.write_text(text)
        results.append((m, outcome))
        print(f"{m.id:5} {outcome:8} {time.time() - started:5.0f} s  {m.file}: {m.effect}"
              + (f"  [{detail}]" if detail else ""), flush=True)

    killed = sum(1 for _, o in results if o == "killed")
    scored = sum(1 for _, o in results if o in ("killed", "survived"))
    for label in ("survived", "stale", "invalid"):
        names = [m.id for m, o in results if o == label]
        if names:
            print(f"{label}: {' '.join(names)}")
    percent = 100.0 * killed / scored if scored else 0.0
    print(f"mutation score: {killed}/{scored} killed ({percent:.1f} %)")

    if not args.keep:
        shutil.rmtree(scratch, ignore_errors=True)
    return 0 if all(o in ("killed", "survived") for _, o in results) else 1


if __name__ == "__main__":
    sys.exit(main())
