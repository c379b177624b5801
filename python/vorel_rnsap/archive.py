"""Decodes an archive of captures on a Dask cluster, one task per capture file.

    python3 -m vorel_rnsap.archive --out DIR [--scheduler ADDRESS] INPUT...

An INPUT is a capture file, a directory (every .pcap, .pcapng and .cap
under it) or a glob. Each capture's decode goes to a file of JSON lines
under DIR, as `rnsap-decode --json -r` writes it. Without --scheduler a
local cluster of --workers processes runs the tasks, one thread each, since
a process runs one pass at a time; with it, the workers of that scheduler
run them and must see the inputs and DIR under the same paths.
"""

import argparse
import glob
import os
import sys
import time
from pathlib import Path

CAPTURE_SUFFIXES = (".pcap", ".pcapng", ".cap")


def find_captures(inputs):
    """(capture, name of its output) for every capture the inputs name: a file
    by its own name, a file found under a directory by its path there."""
    found = []
    for given in inputs:
        path = Path(given)
        if path.is_dir():
            found += [(file, file.relative_to(path)) for file in sorted(path.rglob("*"))
                      if file.is_file() and file.suffix in CAPTURE_SUFFIXES]
        elif path.exists():
            found.append((path, Path(path.name)))
        else:
            matches = sorted(glob.glob(given, recursive=True))
            if not matches:
                raise SystemExit(f"archive: {given}: no such file, directory or match")
            found += [(Path(match), Path(Path(match).name)) for match in matches]
    names = [name for _, name in found]
    doubles = sorted({str(name) for name in names if names.count(name) > 1})
    if doubles:
        raise SystemExit(f"archive: two captures would write the same output: {', '.join(doubles)}")
    return found


def decode_capture(capture, output, pass_):
    """The task: one capture's JSON lines, with what it counted and noted."""
    import vorel_rnsap

    os.makedirs(os.path.dirname(output), exist_ok=True)
    outcome = vorel_rnsap.write_json_lines(capture, output, pass_)
    return {"capture": capture, "read": outcome.read, "errors": outcome.errors,
            **{name: getattr(outcome.counts, name) for name in vorel_rnsap.COUNT_NAMES}}


class Progress:
    """One line on a terminal that counts the captures done, redrawn as they end."""

    def __init__(self, total, stream):
        self.total, self.done, self.messages = total, 0, 0
        self.stream = stream if stream.isatty() else None
        self.started = time.monotonic()

    def advance(self, result):
        self.done += 1
        self.messages += result["rnsap"]
        if self.stream:
            width = 30
            filled = width * self.done // self.total
            seconds = time.monotonic() - self.started
            self.stream.write(f"\r[{'#' * filled}{'.' * (width - filled)}] {self.done}/{self.total}"
                              f" captures, {self.messages} messages, {seconds:.1f} s")
            self.stream.flush()

    def close(self):
        if self.stream:
            self.stream.write("\n")


def run(client, captures, out, pass_):
    """Decodes every capture on the client's cluster; returns the task results
    in the order of the captures."""
    from distributed import as_completed

    futures = [client.submit(decode_capture, str(capture.resolve()),
                             str((out / name).resolve()) + ".jsonl", pass_, pure=False)
               for capture, name in captures]
    progress = Progress(len(futures), sys.stderr)
    for future in as_completed(futures):
        progress.advance(future.result())
    progress.close()
    return [future.result() for future in futures]


def report(results):
    """The notes and errors of every capture on standard error, the totals as
    one JSON line on standard output; whether every capture was read."""
    for result in results:
        sys.stderr.write(result["errors"])
    from vorel_rnsap import COUNT_NAMES

    totals = {name: sum(result[name] for result in results) for name in COUNT_NAMES}
    unread = sum(not result["read"] for result in results)
    print(f'{{"archive":true,"captures":{len(results)},"unread":{unread},'
          + ",".join(f'"{name}":{count}' for name, count in totals.items()) + "}")
    return unread == 0


def parse_arguments(arguments):
    parser = argparse.ArgumentParser(prog="python3 -m vorel_rnsap.archive",
                                     description=__doc__.split("\n\n")[0])
    parser.add_argument("inputs", nargs="+", metavar="INPUT",
                        help="a capture, a directory of captures, or a glob")
    parser.add_argument("--out", required=True, type=Path, help="where the JSON lines go")
    parser.add_argument("--pass", dest="pass_", default="decode",
                        choices=("validate", "decode", "display", "keys"),
                        help="the pass to run (default decode)")
    parser.add_argument("--scheduler", metavar="ADDRESS",
                        help="the scheduler of a running cluster, instead of a local one")
    parser.add_argument("--workers", type=int, default=2,
                        help="worker processes of the local cluster (default 2)")
    options = parser.parse_args(arguments)
    if options.workers < 1:
        parser.error("--workers takes a number from 1 on")
    return options


def main(arguments=None):
    options = parse_arguments(arguments)
    captures = find_captures(options.inputs)
    from distributed import Client, LocalCluster

    if options.scheduler:
        with Client(options.scheduler) as client:
            results = run(client, captures, options.out, options.pass_)
    else:
        with LocalCluster(n_workers=options.workers, threads_per_worker=1, processes=True,
                          dashboard_address=None) as cluster, Client(cluster) as client:
            results = run(client, captures, options.out, options.pass_)
    return 0 if report(results) else 1


if __name__ == "__main__":
    sys.exit(main())
