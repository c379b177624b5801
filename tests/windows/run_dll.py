"""Runs the 32-bit Windows DLL of the module in an emulated x86 and prints the
digest lines of a message file, which `pass_digest MESSAGE_FILE` prints
natively: the host stand-ins' DLLs, the module's DLL (away from its preferred
base, so that every relocation is applied) and the digest driver are loaded
and the driver's digest_messages is called over the file's text.

Usage: run_dll.py WIN32_BUILD_DIR MESSAGE_FILE
"""

import os
import sys

from pe_loader import Process
from windows_services import WindowsServices

MODULE_DLL = 'vorel_rnsap_04B_DLL.dll'
# In dependency order, each loaded before the DLLs that import it.
DLL_PATHS = ('hostrt/pu_ParserUtilities.dll', 'hostrt/kf_OptSupport.dll', MODULE_DLL,
             'tests/windows/rnsap_digest_driver.dll')
# Where the module is placed instead of its preferred base.
MODULE_BASE = 0x10000000


class WindowsRun:
    """The four DLLs loaded into one emulated process."""

    def __init__(self, build_dir):
        self.process = Process()
        self.services = WindowsServices(self.process)
        self.dlls = {}
        for path in DLL_PATHS:
            base = MODULE_BASE if path == MODULE_DLL else None
            dll = self.process.load(os.path.join(build_dir, path), self.services.serve, base)
            self.dlls[os.path.basename(path)] = dll
        self.module = self.dlls[MODULE_DLL]

    def call(self, dll_name, export, *arguments):
        return self.process.call(self.dlls[dll_name].exports[export], *arguments)

    def digest(self, message_text, write_line):
        """Calls write_line with each digest line; returns the driver's status."""
        text = self.process.reserve(len(message_text))
        self.process.write(text, message_text)
        sink = self.process.stub(lambda process, at: write_line(
            process.c_string(process.word(at)).decode('latin-1')))
        return self.call('rnsap_digest_driver.dll', 'digest_messages', text, len(message_text),
                         sink)


def main():
    if len(sys.argv) != 3:
        sys.exit('usage: run_dll.py WIN32_BUILD_DIR MESSAGE_FILE')
    with open(sys.argv[2], 'rb') as messages:
        text = messages.read()
    status = WindowsRun(sys.argv[1]).digest(text, print)
    if status != 0:
        sys.exit(f'no messages digested from {sys.argv[2]}')


if __name__ == '__main__':
    main()
