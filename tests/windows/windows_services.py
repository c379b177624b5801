"""The KERNEL32.dll and msvcrt.dll calls that the DLLs of the run make, served
with their documented Windows behaviour for a process of one thread: the heap
functions over a heap of the harness, the memory and string functions,
gmtime (null before 1970, as msvcrt's 32-bit gmtime), _initterm,
DisableThreadLibraryCalls, thread-local storage and critical sections.
"""

import struct
import time

# _initterm(begin, end): calls each non-null function pointer in [begin, end).
INITTERM_CODE = bytes.fromhex(
    '56 57 8b 74 24 0c 8b 7c 24 10'  # push esi; push edi; esi = begin; edi = end
    '39 fe 73 0d'                      # next: cmp esi, edi; jae done
    '8b 06 85 c0 74 02 ff d0'          # eax = [esi]; call eax if not null
    '83 c6 04 eb ef'                   # esi += 4; jmp next
    '5f 5e c3')                        # done: pop edi; pop esi; ret


THREAD_ID = 1


class Heap:
    """malloc and its kin: blocks from the process's heap area, freed ones
    reused by their rounded size."""

    def __init__(self, process):
        self.process = process
        self.sizes = {}  # address of each live block: its rounded size
        self.free_blocks = {}  # rounded size: addresses

    def malloc(self, size):
        rounded = max(16, (size + 15) & ~15)
        reusable = self.free_blocks.get(rounded)
        address = reusable.pop() if reusable else self.process.reserve(rounded)
        self.sizes[address] = rounded
        return address

    def free(self, address):
        if address:
            self.free_blocks.setdefault(self.sizes.pop(address), []).append(address)

    def calloc(self, count, size):
        address = self.malloc(count * size)
        self.process.write(address, bytes(count * size))
        return address

    def realloc(self, address, size):
        if not address:
            return self.malloc(size)
        if size == 0:
            self.free(address)
            return 0
        if size <= self.sizes[address]:
            return address
        moved = self.malloc(size)
        self.process.write(moved, self.process.read(address, self.sizes[address]))
        self.free(address)
        return moved


class WindowsServices:
    """serve(dll, name): the address of a served call, or None."""

    def __init__(self, process):
        self.process = process
        self.heap = Heap(process)
        self.disable_thread_library_calls = []  # the module handle of each call
        self.tls_slots = []
        self.handles = 0x100  # the last handle given out
        self.errno_word = process.reserve(4)
        self.gmtime_result = process.reserve(36)
        self.initterm = process.code_stub(INITTERM_CODE)
        self.c_locale_name = process.code_stub(b'C\0')
        self.served = {}

    def serve(self, dll, name):
        dll = dll.lower()
        if dll == 'msvcrt.dll' and name == '_initterm':
            return self.initterm
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

    def copy(self, destination, source, size):
        self.process.write(destination, self.process.read(source, size))
        return destination

    def append(self, destination, source):
        end = destination + len(self.process.c_string(destination))
        self.process.write(end, self.process.c_string(source) + b'\0')
        return destination

    def find_char(self, text, char):
        at = (self.process.c_string(text) + b'\0').find(bytes([char & 0xff]))
        return text + at if at >= 0 else 0

    def find_byte(self, data, byte, size):
        at = self.process.read(data, size).find(bytes([byte & 0xff]))
        return data + at if at >= 0 else 0


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
    'memcpy': (3, WindowsServices.copy),
    'memmove': (3, WindowsServices.copy),
    'memset': (3, lambda s, at, byte, size: s.process.write(at, bytes([byte & 0xff]) * size) or at),
    'memcmp': (3, WindowsServices.memory_compare),
    'strlen': (1, lambda s, text: len(s.process.c_string(text))),
    'strcmp': (2, WindowsServices.string_compare),
    'strncmp': (3, WindowsServices.string_compare),
    'strcat': (2, WindowsServices.append),
    'strchr': (2, WindowsServices.find_char),
    'memchr': (3, WindowsServices.find_byte),
    'getenv': (1, lambda s, name: 0),
    'setlocale': (2, lambda s, category, locale: s.c_locale_name),
    'gmtime': (1, WindowsServices.gmtime),
    '_errno': (0, lambda s: s.errno_word),
    '_lock': (1, lambda s, lock: 0),
    '_unlock': (1, lambda s, lock: 0),
    'abort': (0, abort),
}
