"""The package against the command line: the same messages give the same
fields, lines, keys and summaries as `rnsap-decode --json`, in every pass."""

import decimal
import threading

import pytest
import vorel_rnsap

from conftest import CAPTURE, HEX_FILE, PASSES, json_messages, run_decode


def as_json(message):
    """A message in the command line's JSON names, without its head."""
    summary = message.summary
    json_summary = {"result": summary.result if summary.pass_ == "keys" else bool(summary.result),
                    "bitsLeftOut": summary.bits_left_out, "position": summary.position,
                    "flags": summary.flags}
    if summary.verdict is not None:
        json_summary["verdict"] = summary.verdict
    keys = [{"row": key.row, "name": key.name, "value": key.value} for key in message.keys]
    for json_key, key in zip(keys, message.keys):
        if key.bits is not None:
            json_key["bits"] = key.bits
    return {
        "fields": [{"fieldId": field.field_id, "label": field.label, "depth": field.depth,
                    "text": field.text, "value": field.value,
                    "segments": [[s.first_bit, s.last_bit, s.value] for s in field.segments],
                    "firstSegment": field.first_segment, "bitOrderGroup": field.bit_order_group}
                   for field in message.fields],
        "lines": [{"displayId": line.display_id, "text": line.text} for line in message.lines],
        "keys": keys,
        "summary": json_summary,
    }


def without_head(expected):
    return {kind: lines for kind, lines in expected.items() if kind not in ("head", "header")}


@pytest.mark.parametrize("pass_", PASSES)
def test_hex_messages_decode_as_the_command_line_decodes_them(pass_, hex_messages):
    expected, _ = json_messages("--pass", pass_, "-f", HEX_FILE)
    assert len(expected) == len(hex_messages)
    for text, cli_message in zip(hex_messages, expected):
        message = vorel_rnsap.decode(text, pass_)
        assert message.pass_ == pass_ and message.frame is None
        assert as_json(message) == without_head(cli_message)


@pytest.mark.parametrize("pass_", PASSES)
def test_a_capture_reads_as_the_command_line_reads_it(pass_):
    expected, closing = json_messages("--pass", pass_, "-r", CAPTURE)
    reader = vorel_rnsap.read_capture(CAPTURE, pass_)
    messages = list(reader)
    assert [as_json(message) for message in messages] == [without_head(m) for m in expected]
    assert [(m.frame, decimal.Decimal(m.time_ns) / 10**9) for m in messages] == [
        (m["head"]["frame"], m["head"]["time"]) for m in expected]
    assert {name: getattr(reader.counts, name) for name in vorel_rnsap.COUNT_NAMES} == {
        name: count for name, count in closing.items() if name != "source"}
    assert reader.notes == []
    first = messages[0].origin
    assert (first.source.address, first.destination.port, first.association, first.opc, first.dpc,
            first.sccp, first.connection) == ("10.0.0.1", 2905, 1, 1001, 1002, "UDT", 0)


@pytest.mark.parametrize("pass_", PASSES)
def test_json_lines_are_the_command_lines(pass_, tmp_path):
    output = tmp_path / "out.jsonl"
    outcome = vorel_rnsap.write_json_lines(str(CAPTURE), str(output), pass_)
    assert outcome.read and outcome.errors == "" and outcome.counts.rnsap == 51
    assert output.read_text() == run_decode("--json", "--pass", pass_, "-r", CAPTURE).stdout


def test_every_form_of_a_message_decodes_alike(hex_messages):
    octets = bytes.fromhex(hex_messages[3].replace(" ", "").replace(":", ""))
    decoded = [as_json(vorel_rnsap.decode(form, "decode"))
               for form in (hex_messages[3], octets, bytearray(octets), memoryview(octets))]
    assert decoded[1:] == decoded[:1] * 3 and decoded[0]["fields"]


def test_threads_decode_as_one_thread_does(hex_messages):
    expected = [as_json(vorel_rnsap.decode(text, "display")) for text in hex_messages]
    results = {}

    def decode_all(number):
        results[number] = [as_json(vorel_rnsap.decode(text, "display")) for text in hex_messages]
        results[number, "capture"] = len(list(vorel_rnsap.read_capture(CAPTURE, "decode")))

    threads = [threading.Thread(target=decode_all, args=(number,)) for number in range(4)]
    for thread in threads:
        thread.start()
    for thread in threads:
        thread.join()
    assert all(results[number] == expected for number in range(4))
    assert {results[number, "capture"] for number in range(4)} == {len(hex_messages)}
