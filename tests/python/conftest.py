"""What the package's tests share: the built rnsap-decode, the samples, and
the command line's JSON lines read back as one dict per message."""

import collections
import decimal
import json
import os
import subprocess
from pathlib import Path

import pytest

SAMPLES = Path(os.environ.get("RNSAP_SAMPLES", Path(__file__).parents[2] / "samples"))
CAPTURE = SAMPLES / "messages.pcap"
HEX_FILE = SAMPLES / "messages.hex"
PASSES = ("validate", "decode", "display", "keys")
PCAP_HEADER = 24


def run_decode(*arguments):
    return subprocess.run([os.environ["RNSAP_DECODE"], *map(str, arguments)],
                          capture_output=True, text=True, check=False)


def json_messages(*arguments):
    """The messages of `rnsap-decode --json ARGUMENTS`, in order, each a dict of
    its head, its header object and its lines by kind; and the capture's
    closing line."""
    run = run_decode("--json", *arguments)
    messages = collections.OrderedDict()
    closing = None
    for line in run.stdout.splitlines():
        item = json.loads(line, parse_float=decimal.Decimal)
        if item.pop("capture", False):
            closing = item
            continue
        head = {name: item.pop(name) for name in ("msg", "source", "frame", "time") if name in item}
        message = messages.setdefault(head["msg"], {"head": head, "fields": [], "lines": [],
                                                    "keys": [], "summary": None,
                                                    "header": None})
        kind = ("summary" if item.pop("summary", False) else "header" if item.pop("header", False)
                else "fields" if "fieldId" in item else "lines" if "displayId" in item else "keys")
        if kind in ("summary", "header"):
            message[kind] = item
        else:
            message[kind].append(item)
    return list(messages.values()), closing


def repeated_capture(path, times):
    """Writes at `path` the sample capture (classic pcap) with its frames `times` over."""
    octets = CAPTURE.read_bytes()
    path.write_bytes(octets[:PCAP_HEADER] + octets[PCAP_HEADER:] * times)
    return path


@pytest.fixture(scope="session")
def hex_messages():
    """The sample messages as text lines, in order."""
    lines = HEX_FILE.read_text().splitlines()
    return [line for line in lines if line.strip() and not line.lstrip().startswith("#")]
