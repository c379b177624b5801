"""The Windows DLL as the emulated run loads it: an i386 release DLL with the
seven exports under their plain names, importing the host calls from the
host's two libraries and nothing but Windows system DLLs besides; attached
once, relocated, its queries pointing into its own image, date_conv leaving times before 1970
alone, and a call of an import the harness does not serve stopping the run
with its name. The digest lines themselves are compared with the native
build's by scripts/test.sh.

Usage: dll_run_test.py WIN32_BUILD_DIR
"""

import re
import struct
import sys
import unittest

import pefile

from pe_loader import DLL_PROCESS_ATTACH, ImportTrap
from run_dll import WindowsRun

MODULE_EXPORTS = {'vex_DLLGetPtr', 'vex_DLLGetTable', 'vex_PreDecodeMV', 'vex_PreDecodeMD',
                  'vex_PreDecodeTO', 'KFE_vorel_rnsap_04b', 'date_conv'}
# The host calls the module makes. pu_Malloc, the fifth call of
# pu_ParserUtilities, belongs to the host's set-up of the field record: the
# module itself never calls it.
HOST_IMPORTS = {
    'pu_parserutilities.dll': {'pu_Realloc', 'pu_CreateNewLayerInfo', 'pu_AddDecodedFieldsData',
                               'pu_AddFieldsToDisplayData'},
    'kf_optsupport.dll': {'kf_InitialiseOptKFE'},
}
# Present on every Windows machine; the C and C++ runtimes are linked in.
SYSTEM_DLL = re.compile(r'(kernel32|msvcrt|ucrtbase|api-ms-win-crt-[a-z0-9-]+)\.dll')

NO_ENTRY = 0xd0410001
LISTED = {'vex_DLLGetPtr': (1, 2, 4, 5), 'vex_DLLGetTable': (1, 2, 4, 5, 6, 7, 8, 9)}
IDENTITY_WORDS, HEADER_WORDS, LOWEST_TEXT_ADDRESS = 25, 4, 0x10000


class DllRunTest(unittest.TestCase):
    build_dir = None

    @classmethod
    def setUpClass(cls):
        cls.windows = WindowsRun(cls.build_dir)
        cls.process, cls.module = cls.windows.process, cls.windows.module
        cls.scratch = cls.process.reserve(256)

    def query(self, export, index):
        self.process.write(self.scratch, struct.pack('<I', 0xa5a5a5a5))
        status = self.windows.call(self.module.name, export, index & 0xffffffff, self.scratch)
        return status, self.process.word(self.scratch)

    def test_is_an_i386_release_dll_with_the_module_exports_and_host_imports(self):
        pe = self.module.pe
        self.assertEqual(pe.FILE_HEADER.Machine, pefile.MACHINE_TYPE['IMAGE_FILE_MACHINE_I386'])
        self.assertTrue(pe.is_dll())
        self.assertFalse([s.Name for s in pe.sections if s.Name.startswith(b'.debug_')])
        self.assertEqual(self.module.name, 'vorel_rnsap_04B_DLL.dll')
        exports = [symbol.name.decode() for symbol in pe.DIRECTORY_ENTRY_EXPORT.symbols]
        self.assertCountEqual(exports, MODULE_EXPORTS)
        imports = {entry.dll.decode().lower(): {symbol.name.decode() for symbol in entry.imports}
                   for entry in pe.DIRECTORY_ENTRY_IMPORT}
        for dll, names in HOST_IMPORTS.items():
            self.assertEqual(imports.pop(dll, None), names, dll)
        self.assertIn('DisableThreadLibraryCalls', imports.get('kernel32.dll', ()))
        others = [dll for dll in imports if not SYSTEM_DLL.fullmatch(dll)]
        self.assertEqual(others, [], 'imports from DLLs that a host machine may lack')

    def test_attached_once_turning_off_thread_calls_with_its_own_handle(self):
        self.assertEqual(self.module.entry_calls, [(self.module.base, DLL_PROCESS_ATTACH)])
        self.assertEqual(self.windows.services.disable_thread_library_calls, [self.module.base])

    def test_queries_point_into_the_relocated_image(self):
        self.assertNotEqual(self.module.base, self.module.preferred_base)
        for export, listed in LISTED.items():
            for index in range(-1, 12):
                status, entry = self.query(export, index)
                if index in listed:
                    self.assertEqual(status, 0, f'{export}({index})')
                    self.assertTrue(self.module.contains(entry), f'{export}({index}): {entry:#x}')
                else:
                    self.assertEqual((status, entry), (NO_ENTRY, 0), f'{export}({index})')

    def test_identity_texts_and_dictionary_names_lie_in_the_image(self):
        _, header = self.query('vex_DLLGetPtr', 2)
        words = struct.unpack(f'<{HEADER_WORDS + IDENTITY_WORDS}I',
                              self.process.read(header, 4 * (HEADER_WORDS + IDENTITY_WORDS)))
        texts = [word for word in words if word >= LOWEST_TEXT_ADDRESS]
        self.assertGreater(len(texts), 15)
        for text in texts:
            self.assertTrue(self.module.contains(text), f'{text:#x}')
        self.assertEqual(self.process.c_string(words[HEADER_WORDS + 2]),
                         b'Vorel RNSAP 04B V3.0.0(IP)')
        _, dictionary = self.query('vex_DLLGetTable', 4)
        name = self.process.word(dictionary + 12)
        self.assertEqual(self.process.c_string(name), b'PDU EXTENSION')

    def date_text(self, seconds):
        self.windows.call('rnsap_digest_driver.dll', 'date_text', seconds & 0xffffffff, self.scratch,
                      64)
        return self.process.c_string(self.scratch).decode()

    def test_date_conv_appends_nothing_before_1970(self):
        self.assertEqual(self.date_text(86399), 'T=1970-01-01 23:59:59')
        for seconds in (-1, -86400, -2**31):
            self.assertEqual(self.date_text(seconds), 'T=', seconds)

    def test_an_unserved_import_stops_the_run_naming_itself(self):
        slots = {symbol.name: self.module.mapped(symbol.address)
                 for entry in self.module.pe.DIRECTORY_ENTRY_IMPORT
                 if entry.dll.lower() == b'msvcrt.dll' for symbol in entry.imports}
        with self.assertRaisesRegex(ImportTrap, r'msvcrt\.dll!fwrite'):
            self.process.call(self.process.word(slots[b'fwrite']))


if __name__ == '__main__':
    DllRunTest.build_dir = sys.argv.pop(1)
    unittest.main()
