"""The archive command on a local Dask cluster of two worker processes: each
capture's JSON lines are the command line's, and the totals add up."""

import json
import os
import subprocess
import sys

import pytest
from distributed import LocalCluster
from vorel_rnsap import COUNT_NAMES, archive

from conftest import CAPTURE, repeated_capture, run_decode


@pytest.fixture
def captures(tmp_path):
    """A directory of captures: the sample, the sample three times over in a
    folder, and one cut short; with what rnsap-decode makes of each."""
    folder = tmp_path / "captures"
    (folder / "day").mkdir(parents=True)
    (folder / "sample.pcap").write_bytes(CAPTURE.read_bytes())
    repeated_capture(folder / "day" / "thrice.pcap", 3)
    (folder / "cut.pcapng").write_bytes(CAPTURE.read_bytes()[:-30])
    (folder / "notes.txt").write_text("not a capture")
    expected = {name: run_decode("-V", "--json", "-r", (folder / name).resolve())
                for name in ("sample.pcap", "day/thrice.pcap", "cut.pcapng")}
    return folder, expected


def check_outputs(out, expected):
    for name, cli in expected.items():
        assert (out / f"{name}.jsonl").read_text() == cli.stdout
    assert sorted(str(path.relative_to(out)) for path in out.rglob("*.jsonl")) == sorted(
        f"{name}.jsonl" for name in expected)


def closing_totals(expected):
    totals = dict.fromkeys(COUNT_NAMES, 0)
    for cli in expected.values():
        closing = json.loads(cli.stdout.splitlines()[-1])
        for name in totals:
            totals[name] += closing[name]
    return totals


def test_the_archive_command_decodes_a_directory_on_a_local_cluster(captures, tmp_path):
    folder, expected = captures
    out = tmp_path / "out"
    run = subprocess.run([sys.executable, "-m", "vorel_rnsap.archive", "--out", out, folder],
                         capture_output=True, text=True, env=os.environ)
    check_outputs(out, expected)
    assert run.returncode == 1 and run.stderr == "".join(
        expected[name].stderr for name in sorted(expected))
    assert json.loads(run.stdout) == {"archive": True, "captures": 3, "unread": 1,
                                      **closing_totals(expected)}


def test_the_archive_command_runs_on_a_scheduler_given(captures, tmp_path, capsys):
    folder, expected = captures
    del expected["cut.pcapng"]
    out = tmp_path / "out"
    with LocalCluster(n_workers=2, threads_per_worker=1, dashboard_address=None) as cluster:
        status = archive.main(["--scheduler", cluster.scheduler_address, "--out", str(out),
                               str(folder / "sample.pcap"), str(folder / "d*" / "*.pcap")])
    check_outputs(out, {"sample.pcap": expected["sample.pcap"],
                        "thrice.pcap": expected["day/thrice.pcap"]})
    assert status == 0 and json.loads(capsys.readouterr().out)["rnsap"] == closing_totals(
        expected)["rnsap"]


@pytest.mark.parametrize("inputs, refusal", [
    (["{folder}/nothing*"], "no such file, directory or match"),
    (["{folder}/sample.pcap", "{folder}/sample.pcap"], "would write the same output: sample.pcap"),
])
def test_the_archive_command_refuses_inputs_before_it_starts(captures, inputs, refusal):
    folder, _ = captures
    with pytest.raises(SystemExit, match=refusal):
        archive.main(["--out", "unused"] + [given.format(folder=folder) for given in inputs])
