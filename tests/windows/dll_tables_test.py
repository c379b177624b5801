"""What a 32-bit Windows host's loader sees of the built DLL, read from its PE
tables by objdump: an i386 DLL with the seven exports under their plain names,
importing the host calls from the host's two libraries and nothing else but
Windows system DLLs.

Usage: dll_tables_test.py OBJDUMP DLL
"""

import re
import subprocess
import sys
import unittest

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

EXPORT_NAME_TABLE = '[Ordinal/Name Pointer] Table'


def parse_imports(lines):
    """{lower-case DLL name: set of imported names} of the import tables."""
    imports, members = {}, None
    for line in lines:
        dll = re.match(r'\s*DLL Name: (\S+)', line)
        member = re.match(r'\t[0-9a-f]+\t\s*\d+\s+(\S+)', line)
        if dll:
            members = imports.setdefault(dll.group(1).lower(), set())
        elif member and members is not None:
            members.add(member.group(1))
        elif not line.strip():
            members = None
    return imports


def parse_exports(lines):
    """The names of the export name table."""
    start = lines.index(EXPORT_NAME_TABLE) + 1 if EXPORT_NAME_TABLE in lines else len(lines)
    names = []
    for line in lines[start:]:
        entry = re.match(r'\t\[\s*\d+\] (\S+)$', line)
        if not entry:
            break
        names.append(entry.group(1))
    return names


class DllTablesTest(unittest.TestCase):
    objdump = dll = None

    @classmethod
    def setUpClass(cls):
        cls.text = subprocess.run([cls.objdump, '-p', cls.dll], check=True, capture_output=True,
                                  text=True).stdout
        cls.lines = cls.text.splitlines()

    def test_is_an_i386_dll(self):
        self.assertRegex(self.text, r'file format pei-i386\n')
        self.assertRegex(self.text, r'\nCharacteristics 0x[0-9a-f]+\n(\t.*\n)*\tDLL\n')

    def test_is_a_release_build_without_debug_sections(self):
        headers = subprocess.run([self.objdump, '-h', self.dll], check=True, capture_output=True,
                                 text=True).stdout
        self.assertNotIn(' .debug_', headers)

    def test_exports_exactly_the_module_entry_points(self):
        exports = parse_exports(self.lines)
        self.assertEqual(len(exports), len(set(exports)))
        self.assertEqual(set(exports), MODULE_EXPORTS)
        self.assertRegex(self.text, r'\nName\s+[0-9a-f]+ vorel_rnsap_04B_DLL\.dll\n')

    def test_imports_host_calls_and_system_dlls_only(self):
        imports = parse_imports(self.lines)
        for dll, names in HOST_IMPORTS.items():
            self.assertEqual(imports.pop(dll, None), names, dll)
        self.assertIn('DisableThreadLibraryCalls', imports.get('kernel32.dll', ()))
        others = [dll for dll in imports if not SYSTEM_DLL.fullmatch(dll)]
        self.assertEqual(others, [], 'imports from DLLs that a host machine may lack')


if __name__ == '__main__':
    DllTablesTest.objdump, DllTablesTest.dll = sys.argv[1:3]
    unittest.main(argv=sys.argv[:1] + sys.argv[3:])
