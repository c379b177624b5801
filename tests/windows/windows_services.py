"""The KERNEL32.dll and msvcrt.dll calls that the DLLs of the run make, served
with their documented Windows behaviour for a process of one thread: the heap
functions (emulated_heap.py), the memory and string functions, gmtime (null
and errno EINVAL before 1970, as msvcrt's 32-bit gmtime), _initterm,
DisableThreadLibraryCalls, thread-local storage, critical sections,
semaphores and module handles. serve() gives None for any other call.
"""

import struct
import time

from emulated_heap import Heap

# Calls served by x86 code of the harness: the ones made per field read,
# which would cost a trip out of the emulator each, and _initterm, which calls
# back into the DLL. Copies and fills go by words: each store is costly in the
# emulator.
X86_CODE = {
    # _initterm(begin, end): calls each non-null function pointer in [begin, end).
    '_initterm': bytes.fromhex(
        '56 57 8b 74 24 0c 8b 7c 24 10'  # push esi; push edi; esi = begin; edi = end
        '39 fe 73 0d'                      # next: cmp esi, edi; jae done
        '8b 06 85 c0 74 02 ff d0'          # eax = [esi]; call eax if not null
        '83 c6 04 eb ef'                   # esi += 4; jmp next
        '5f 5e c3'),                       # done: pop edi; pop esi; ret
    # memmove(destination, source, size), backwards when the destination
    # overlaps the source's end; memcpy the same.
    'memmove': bytes.fromhex(
        '57 56 8b 7c 24 0c 8b 74 24 10 8b 4c 24 14 89 f8'  # edi, esi, ecx; eax = edi
        '39 f7 76 15 8d 14 0e 39 d7 73 0e'  # forward if edi <= esi or edi >= esi + ecx
        '8d 74 0e ff 8d 7c 0f ff fd f3 a4 fc eb 0f'  # from the last byte down
        'fc 89 ca c1 e9 02 f3 a5'                     # forward: words (rep movsd),
        '89 d1 83 e1 03 f3 a4'                        # then the last bytes
        '5e 5f c3'),
    # memset(destination, byte, size)
    'memset': bytes.fromhex(
        '57 8b 7c 24 08 0f b6 44 24 0c 69 c0 01 01 01 01'  # eax = the byte in each octet
        '8b 4c 24 10 89 ca c1 e9 02 fc f3 ab'              # words (rep stosd),
        '89 d1 83 e1 03 f3 aa'                             # then the last bytes
        '8b 44 24 08 5f c3'),                              # eax = destination
    # strlen(text)
    'strlen': bytes.fromhex(
        '57 8b 7c 24 08 31 c0 b9 ff ff ff ff fc f2 ae'  # repne scasb from ecx = -1
        'f7 d1 49 89 c8 5f c3'),                         # eax = ~ecx - 1
    # memchr(data, byte, size)
    'memchr': bytes.fromhex(
        '57 8b 7c 24 08 8b 44 24 0c 8b 4c 24 10'  # edi = data, al = byte, ecx = size
        '85 c9 74 0a fc f2 ae 75 05'              # repne scasb unless size is 0
        '8d 47 ff 5f c3'                          # found: eax = edi - 1
        '31 c0 5f c3'),                           # not found: eax = 0
}
X86_CODE['memcpy'] = X86_CODE['memmove']


THREAD_ID = 1
EINVAL = 22


class WindowsServices:
    """serve(dll, name): the address of a served call, or None; records the
    calls of DisableThreadLibraryCalls."""

    def __init__(self, process):
        self.process = process
        self.heap = Heap(process)
        self.disable_thread_library_calls = []  # the module handle of each call
        self.tls_slots = []
        self.handles = 0x100  # the last handle given out
        self.errno_word = process.reserve(4)
        self.gmtime_result = process.reserve(36)
        self.c_locale_name = process.reserve(2)
        process.write(self.c_locale_name, b'C\0')
        self.served = {}
        self.code = {}  # name: address of its x86 code

    def serve(self, dll, name):
        dll = dll.lower()
        code = self.x86_code_of(name) if dll == 'msvcrt.dll' else None
        if code is None:
            return self.harness_stub(dll, name)
        if name not in self.code:
            self.code[name] = self.process.code_stub(code)
        return self.code[name]

    def x86_code_of(self, name):
        if name == '_errno':
            return b'\xb8' + struct.pack('<I', self.errno_word) + b'\xc3'  # mov eax, errno; ret
        if name in ('malloc', 'free'):
            return self.heap.code(name, self.harness_stub('msvcrt.dll', name))
        return X86_CODE.get(name)

    def harness_stub(self, dll, name):
        table = KERNEL32 if dll == 'kernel32.dll' else MSVCRT if dll == 'msvcrt.dll' else {}
        if name not in table:
            return None
        if (dll, name) not in self.served:
            argument_count, function = table[name]
            stdcall_bytes = 4 * argument_count if dll == 'kernel32.dll' else 0
            self.served[dll, name] = self.process.stub(
                lambda process, at: function(self, *arguments(process, at, argument_count)),
                stdcall_bytes)
        return self.served[dll, name]

    # ---- calls with more to them than a line ------------------------------

    def gmtime(self, time_pointer):
        seconds = struct.unpack('<i', self.process.read(time_pointer, 4))[0]
        if seconds < 0:
            self.process.write(self.errno_word, struct.pack('<i', EINVAL))
            return 0
        utc = time.gmtime(seconds)
        fields = (utc.tm_sec, utc.tm_min, utc.tm_hour, utc.tm_mday, utc.tm_mon - 1,
                  utc.tm_year - 1900, (utc.tm_wday + 1) % 7, utc.tm_yday - 1, 0)
        self.process.write(self.gmtime_result, struct.pack('<9i', *fields))
        return self.gmtime_result

    def new_handle(self):
        self.handles += 1
        return self.handles

    def tls_alloc(self):
        self.tls_slots.append(0)
        return len(self.tls_slots) - 1

    def tls_set(self, index, value):
        self.tls_slots[index] = value
        return 1

    def get_module_handle(self, name_pointer, wide):
        if not name_pointer:
            return 0
        raw = self.process.read(name_pointer, 256)
        name = (raw.decode('utf-16-le') if wide else raw.decode('latin-1')).split('\0')[0]
        loaded = self.process.modules.get(name.lower())
        return loaded.base if loaded else 0

    def memory_compare(self, first, second, size):
        a, b = self.process.read(first, size), self.process.read(second, size)
        return (a > b) - (a < b)

    def string_compare(self, first, second, limit=None):
        a, b = self.process.c_string(first), self.process.c_string(second)
        if limit is not None:
            a, b = a[:limit], b[:limit]
        return (a > b) - (a < b)

    def append(self, destination, source):
        end = destination + len(self.process.c_string(destination))
        self.process.write(end, self.process.c_string(source) + b'\0')
        return destination

    def find_char(self, text, char):
        at = (self.process.c_string(text) + b'\0').find(bytes([char & 0xff]))
        return text + at if at >= 0 else 0


def arguments(process, at, count):
    return struct.unpack(f'<{count}I', process.read(at, 4 * count)) if count else ()


def abort(_services):
    raise RuntimeError('abort() called')


# name: (argument count, function(services, *arguments)). KERNEL32 calls are
# stdcall: their stubs pop the arguments.
KERNEL32 = {
    'DisableThreadLibraryCalls':
        (1, lambda s, module: s.disable_thread_library_calls.append(module) or 1),
    'InitializeCriticalSection': (1, lambda s, section: 0),
    'EnterCriticalSection': (1, lambda s, section: 0),
    'LeaveCriticalSection': (1, lambda s, section: 0),
    'DeleteCriticalSection': (1, lambda s, section: 0),
    'TlsAlloc': (0, WindowsServices.tls_alloc),
    'TlsGetValue': (1, lambda s, index: s.tls_slots[index]),
    'TlsSetValue': (2, WindowsServices.tls_set),
    'GetLastError': (0, lambda s: 0),
    'GetCurrentThreadId': (0, lambda s: THREAD_ID),
    'CreateSemaphoreW': (4, lambda s, attributes, initial, maximum, name: s.new_handle()),
    'ReleaseSemaphore': (3, lambda s, handle, count, previous: 1),
    'WaitForSingleObject': (2, lambda s, handle, milliseconds: 0),
    'CloseHandle': (1, lambda s, handle: 1),
    'GetModuleHandleA': (1, lambda s, name: s.get_module_handle(name, False)),
    'GetModuleHandleW': (1, lambda s, name: s.get_module_handle(name, True)),
    'GetProcAddress': (2, lambda s, module, name: 0),
}

MSVCRT = {
    'malloc': (1, lambda s, size: s.heap.malloc(size)),
    'calloc': (2, lambda s, count, size: s.heap.calloc(count, size)),
    'realloc': (2, lambda s, block, size: s.heap.realloc(block, size)),
    'free': (1, lambda s, block: s.heap.free(block)),
    'memcmp': (3, WindowsServices.memory_compare),
    'strcmp': (2, WindowsServices.string_compare),
    'strncmp': (3, WindowsServices.string_compare),
    'strcat': (2, WindowsServices.append),
    'strchr': (2, WindowsServices.find_char),
    'getenv': (1, lambda s, name: 0),
    'setlocale': (2, lambda s, category, locale: s.c_locale_name),
    'gmtime': (1, WindowsServices.gmtime),
    '_lock': (1, lambda s, lock: 0),
    '_unlock': (1, lambda s, lock: 0),
    'abort': (0, abort),
}
