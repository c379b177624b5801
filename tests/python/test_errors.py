"""Faults the package turns into exceptions, with the command line's texts."""

import subprocess
import sys

import pytest
import vorel_rnsap

from conftest import CAPTURE, repeated_capture, run_decode


@pytest.mark.parametrize("text", ["zz", "0a b", "", "0a0"])
def test_bad_hex_is_refused_as_the_command_line_refuses_it(text):
    with pytest.raises(ValueError) as refusal:
        vorel_rnsap.decode(text)
    assert run_decode(text).stderr == f"argument 1: error: {refusal.value}\n"


@pytest.mark.parametrize("call, error", [
    (lambda: vorel_rnsap.decode("00", "walk"), ValueError),
    (lambda: vorel_rnsap.read_capture(CAPTURE, "walk"), ValueError),
    (lambda: vorel_rnsap.decode(12), TypeError),
    (lambda: vorel_rnsap.decode(memoryview(b"\0\0\0\0").cast("I")), TypeError),
    (lambda: vorel_rnsap.load_module(str(CAPTURE)), RuntimeError),
])
def test_misuse_raises(call, error):
    with pytest.raises(error):
        call()


def test_a_cut_capture_reads_up_to_its_cut_and_raises_there(tmp_path):
    cut = tmp_path / "cut.pcap"
    octets = CAPTURE.read_bytes()
    cut.write_bytes(octets[:len(octets) - 30])
    cli = run_decode("-V", "--json", "-r", cut)
    reader = vorel_rnsap.read_capture(cut, "keys")
    read = []
    with pytest.raises(vorel_rnsap.CaptureError) as failure:
        read.extend(reader)
    assert cli.returncode == 1 and cli.stderr == f"{failure.value}\n"
    assert len(read) == reader.counts.rnsap == cli.stdout.count('"summary":true')

    output = tmp_path / "cut.jsonl"
    outcome = vorel_rnsap.write_json_lines(str(cut), str(output), "decode")
    assert not outcome.read and outcome.errors == cli.stderr
    assert output.read_text() == cli.stdout


def test_a_missing_capture_raises_the_command_lines_error(tmp_path):
    missing = tmp_path / "missing.pcap"
    with pytest.raises(vorel_rnsap.CaptureError) as failure:
        next(vorel_rnsap.read_capture(missing))
    assert run_decode("-r", missing).stderr == f"{failure.value}\n"
    with pytest.raises(RuntimeError, match="cannot write"):
        vorel_rnsap.write_json_lines(str(CAPTURE), str(missing / "out.jsonl"))


def test_a_reader_left_early_stops(tmp_path):
    large = repeated_capture(tmp_path / "large.pcap", 100)
    for _ in range(20):
        reader = vorel_rnsap.read_capture(large, "decode")
        assert next(reader).frame == 1
        del reader


def test_a_module_that_cannot_load_is_refused_with_the_command_lines_text(tmp_path):
    missing = tmp_path / "missing.so"
    script = f"import vorel_rnsap; vorel_rnsap.load_module({str(missing)!r})"
    python = subprocess.run([sys.executable, "-c", script], capture_output=True, text=True)
    error = run_decode("--module", missing, "00").stderr.removeprefix("rnsap-decode: ")
    assert python.returncode == 1 and python.stderr.endswith(f"RuntimeError: {error}")
