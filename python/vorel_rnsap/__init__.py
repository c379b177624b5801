"""The Vorel RNSAP decoder module for Python.

decode() runs one pass over one message; read_capture() decodes the RNSAP
messages of a pcap or pcapng file one by one; write_json_lines() writes a
capture's decode as `rnsap-decode --json -r` does. The decoder module is
loaded once per process, from the package unless load_module() named another
file first; passes from several threads run one at a time.
"""

import os

from . import _native

from ._native import (
    CaptureCounts,
    CaptureError,
    CaptureNote,
    CaptureReader,
    DisplayLine,
    Field,
    JsonLinesOutcome,
    Key,
    Message,
    Segment,
    Summary,
    decode,
    load_module,
    loaded_module,
    write_json_lines,
)

PASSES = ("validate", "decode", "display", "keys")
# What the reading of a capture counts, in the order of the closing line.
COUNT_NAMES = ("frames", "rnsap", "skipped", "malformed", "duplicates", "evicted", "incomplete",
               "unattributed")

_native.set_default_module(os.path.join(os.path.dirname(__file__), "vorel_rnsap_04B_DLL.so"))


def read_capture(path, pass_="keys"):
    """The messages of the capture at `path`, each with `pass_` run over it.

    The reader's `counts` and `notes` are complete once the
    iteration has ended; a file that cannot be read to its end raises
    CaptureError there.
    """
    return CaptureReader(os.fspath(path), pass_)


__all__ = [
    "COUNT_NAMES",
    "PASSES",
    "CaptureCounts",
    "CaptureError",
    "CaptureNote",
    "CaptureReader",
    "DisplayLine",
    "Endpoint",
    "Field",
    "JsonLinesOutcome",
    "Key",
    "Message",
    "Origin",
    "Segment",
    "Summary",
    "decode",
    "load_module",
    "loaded_module",
    "read_capture",
    "write_json_lines",
]
