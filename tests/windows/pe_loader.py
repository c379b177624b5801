"""A 32-bit Windows process of one thread in an emulated x86 (unicorn): DLLs
mapped from their PE files, relocated when they do not sit at their preferred
base, their imports bound, their TLS callbacks and entry points run with
DLL_PROCESS_ATTACH, their exports found by name and called cdecl.

Imports of the loaded DLLs bind to each other. KERNEL32.dll and msvcrt.dll
imports bind to stubs the process serves (windows_services.py); any other
import binds to a stub that stops the run naming it.
"""

import struct

import pefile
from unicorn import UC_ARCH_X86, UC_HOOK_CODE, UC_HOOK_INTR, UC_MODE_32, UC_PROT_ALL, Uc, UcError
from unicorn.x86_const import (UC_X86_REG_EAX, UC_X86_REG_EIP, UC_X86_REG_ESP, UC_X86_REG_DS,
                                UC_X86_REG_ES, UC_X86_REG_FS, UC_X86_REG_GDTR, UC_X86_REG_SS)

PAGE = 0x1000
DLL_PROCESS_ATTACH = 1

STUB_AREA, STUB_SIZE, STUB_AREA_SIZE = 0x00010000, 8, 0x00010000
STACK_TOP, STACK_SIZE = 0x00400000, 0x00200000
HEAP_START, HEAP_CHUNK = 0x01000000, 0x01000000
# The thread's TEB, which FS addresses, and the descriptor table giving FS its base.
TEB, GDT = 0x00008000, 0x00009000
TEB_SELF, TEB_STACK_BASE, TEB_STACK_LIMIT, TEB_TLS_SLOTS = 0x18, 0x04, 0x08, 0x2c
FS_SELECTOR = 1 << 3 | 3  # GDT entry 1, ring 3
FLAT_SELECTOR = 2 << 3  # GDT entry 2, ring 0
# The address each call from the harness returns to; the run stops there.
RETURN_TRAP = STUB_AREA
TRAP_INTERRUPT = 0x80


class ImportTrap(Exception):
    """A call of an import that no loaded DLL exports and the process does not serve."""


def page_up(value):
    return (value + PAGE - 1) & ~(PAGE - 1)


class Process:
    """The emulated CPU and memory of a process with one thread, the stubs of
    served calls, and memory handed out fresh by reserve()."""

    def __init__(self):
        self.uc = Uc(UC_ARCH_X86, UC_MODE_32)
        self.uc.mem_map(STUB_AREA, STUB_AREA_SIZE, UC_PROT_ALL)
        self.uc.mem_map(STACK_TOP - STACK_SIZE, STACK_SIZE, UC_PROT_ALL)
        self._map_thread_block()
        self.uc.mem_write(RETURN_TRAP, b'\xf4')  # hlt, never reached: the run ends before it
        self.stubs = []  # the harness function of each stub, in address order
        self.next_stub = STUB_AREA + STUB_SIZE
        self.code_end = STUB_AREA + STUB_AREA_SIZE
        self.uc.hook_add(UC_HOOK_INTR, self._on_interrupt)
        self.heap_end = self.heap_mapped = HEAP_START
        self.modules = {}  # lower-case DLL name: LoadedDll
        self.tls_indices = 0  # the DLLs given a block of thread-local data

    def _map_thread_block(self):
        """The TEB of the one thread: its own address, its stack and its TLS slots."""
        self.uc.mem_map(TEB, 2 * PAGE, UC_PROT_ALL)
        self.tls_slots = TEB + PAGE // 2
        for offset, value in ((TEB_SELF, TEB), (TEB_STACK_BASE, STACK_TOP),
                              (TEB_STACK_LIMIT, STACK_TOP - STACK_SIZE),
                              (TEB_TLS_SLOTS, self.tls_slots)):
            self.write(TEB + offset, struct.pack('<I', value))
        # Present, writable 32-bit data segments: ring 3 over the TEB's page for
        # FS, ring 0 over all 4 GiB for the stack and data (the emulator's CPU
        # runs in ring 0).
        teb_segment = (PAGE - 1) | TEB << 16 | 0xf2 << 40 | 0x4 << 52
        flat_segment = 0xffff | 0x92 << 40 | 0xf << 48 | 0xc << 52
        self.write(GDT + 8, struct.pack('<QQ', teb_segment, flat_segment))
        self.uc.reg_write(UC_X86_REG_GDTR, (0, GDT, 3 * 8 - 1, 0))
        self.uc.reg_write(UC_X86_REG_FS, FS_SELECTOR)
        for register in (UC_X86_REG_SS, UC_X86_REG_DS, UC_X86_REG_ES):
            self.uc.reg_write(register, FLAT_SELECTOR)

    # ---- memory ------------------------------------------------------------

    def read(self, address, size):
        return bytes(self.uc.mem_read(address, size))

    def write(self, address, data):
        self.uc.mem_write(address, bytes(data))

    def word(self, address):
        return struct.unpack('<I', self.read(address, 4))[0]

    def c_string(self, address, limit=1 << 20):
        data = bytearray()
        while len(data) < limit:
            chunk = self.read(address + len(data), 64)
            end = chunk.find(b'\0')
            if end >= 0:
                return bytes(data + chunk[:end])
            data += chunk
        raise ValueError(f'no NUL within {limit} bytes at {address:#x}')

    def reserve(self, size):
        """Fresh zeroed memory from the top of the heap area, 16-byte aligned."""
        address = self.heap_end
        self.heap_end += (size + 15) & ~15
        if self.heap_end > self.heap_mapped:
            grow = page_up(self.heap_end - self.heap_mapped) + HEAP_CHUNK
            self.uc.mem_map(self.heap_mapped, grow, UC_PROT_ALL)
            self.heap_mapped += grow
        return address

    # ---- stubs -------------------------------------------------------------

    def stub(self, function, popped_bytes=0):
        """An address whose call runs `function(process, arguments address)`; its
        result goes to EAX. stdcall stubs pop `popped_bytes` of arguments."""
        address = self.next_stub
        self.next_stub += STUB_SIZE
        if self.next_stub > self.code_end:
            raise MemoryError('stub area full')
        ret = b'\xc3' if popped_bytes == 0 else b'\xc2' + struct.pack('<H', popped_bytes)
        self.write(address, bytes([0xcd, TRAP_INTERRUPT]) + ret)
        self.stubs.append(function)
        return address

    def code_stub(self, code):
        """An address holding x86 code of the harness's own, from the top of the
        stub area: code kept apart from data that is written, so that the
        emulator never has to translate it again."""
        self.code_end -= (len(code) + 15) & ~15
        if self.code_end < self.next_stub:
            raise MemoryError('stub area full')
        self.write(self.code_end, code)
        return self.code_end

    def _on_interrupt(self, uc, number, _):
        eip = uc.reg_read(UC_X86_REG_EIP)
        index = (eip - 2 - STUB_AREA) // STUB_SIZE - 1
        if number != TRAP_INTERRUPT or not 0 <= index < len(self.stubs):
            raise RuntimeError(f'interrupt {number:#x} at {eip:#x}')
        result = self.stubs[index](self, uc.reg_read(UC_X86_REG_ESP) + 4)
        uc.reg_write(UC_X86_REG_EAX, (result or 0) & 0xffffffff)

    # ---- calls -------------------------------------------------------------

    def call(self, address, *arguments):
        """Calls the code at `address` with 32-bit arguments; returns EAX."""
        esp = STACK_TOP - 0x100 - 4 * len(arguments)
        self.write(esp, struct.pack(f'<I{len(arguments)}I', RETURN_TRAP, *arguments))
        self.uc.reg_write(UC_X86_REG_ESP, esp)
        try:
            self.uc.emu_start(address, RETURN_TRAP)
        except UcError as error:
            raise RuntimeError(f'{error} at {self.where(self.uc.reg_read(UC_X86_REG_EIP))}') from None
        return self.uc.reg_read(UC_X86_REG_EAX)

    def where(self, address):
        """`address` as DLL+offset, or in hex."""
        for dll in self.modules.values():
            if dll.contains(address):
                return f'{dll.name}+{address - dll.base:#x}'
        return f'{address:#x}'

    # ---- DLLs --------------------------------------------------------------

    def load(self, path, serve_import, base=None):
        """Maps the DLL at `path` at `base` (its preferred base if None), binds its
        imports to loaded DLLs or to `serve_import(dll, name)`, and runs its TLS
        callbacks and entry point with DLL_PROCESS_ATTACH."""
        dll = LoadedDll(self, path, base)
        dll.bind_imports(lambda dll_name, name: self._resolve(dll_name, name, serve_import))
        self.modules[dll.name.lower()] = dll
        dll.attach()
        return dll

    def _resolve(self, dll_name, name, serve_import):
        loaded = self.modules.get(dll_name.lower())
        if loaded is not None and name in loaded.exports:
            return loaded.exports[name]
        served = serve_import(dll_name, name)
        return served if served is not None else self.stub(trap(f'{dll_name}!{name}'))


def trap(full_name):
    def unserved(_process, _arguments):
        raise ImportTrap(f'call of {full_name}, an import the harness does not serve')
    return unserved


class LoadedDll:
    """One DLL mapped into the process."""

    def __init__(self, process, path, base):
        self.process = process
        self.pe = pefile.PE(path, fast_load=True)
        self.pe.parse_data_directories()
        header = self.pe.OPTIONAL_HEADER
        self.preferred_base = header.ImageBase
        self.base = self.preferred_base if base is None else base
        self.size = page_up(header.SizeOfImage)
        self.name = self.pe.DIRECTORY_ENTRY_EXPORT.name.decode() if hasattr(
            self.pe, 'DIRECTORY_ENTRY_EXPORT') else path.rsplit('/', 1)[-1]
        process.uc.mem_map(self.base, self.size, UC_PROT_ALL)
        process.write(self.base, self.pe.get_memory_mapped_image()[:self.size])
        self._relocate()
        self.exports = self._exports()
        self.entry_calls = []  # (module handle, reason) each time the entry point ran
        entry = self.base + header.AddressOfEntryPoint
        process.uc.hook_add(UC_HOOK_CODE, self._on_entry, begin=entry, end=entry)

    def _on_entry(self, uc, _address, _size, _data):
        esp = uc.reg_read(UC_X86_REG_ESP)
        self.entry_calls.append((self.process.word(esp + 4), self.process.word(esp + 8)))

    def mapped(self, address):
        """A virtual address of the PE file as it lies in this mapping."""
        return address - self.preferred_base + self.base

    def _relocate(self):
        delta = (self.base - self.preferred_base) & 0xffffffff
        if delta == 0:
            return
        for block in getattr(self.pe, 'DIRECTORY_ENTRY_BASERELOC', []):
            for entry in block.entries:
                if entry.type == pefile.RELOCATION_TYPE['IMAGE_REL_BASED_HIGHLOW']:
                    at = self.base + entry.rva
                    value = (self.process.word(at) + delta) & 0xffffffff
                    self.process.write(at, struct.pack('<I', value))
                elif entry.type != pefile.RELOCATION_TYPE['IMAGE_REL_BASED_ABSOLUTE']:
                    raise ValueError(f'{self.name}: relocation type {entry.type}')

    def _exports(self):
        if not hasattr(self.pe, 'DIRECTORY_ENTRY_EXPORT'):
            return {}
        return {symbol.name.decode(): self.base + symbol.address
                for symbol in self.pe.DIRECTORY_ENTRY_EXPORT.symbols if symbol.name}

    def bind_imports(self, resolve):
        for entry in getattr(self.pe, 'DIRECTORY_ENTRY_IMPORT', []):
            dll_name = entry.dll.decode()
            for symbol in entry.imports:
                name = symbol.name.decode() if symbol.name else f'#{symbol.ordinal}'
                slot = self.mapped(symbol.address)
                self.process.write(slot, struct.pack('<I', resolve(dll_name, name)))

    def attach(self):
        tls = getattr(self.pe, 'DIRECTORY_ENTRY_TLS', None)
        if tls is not None:
            self._give_thread_data(tls.struct)
            self._run_tls_callbacks(tls.struct)
        entry = self.pe.OPTIONAL_HEADER.AddressOfEntryPoint
        if entry and not self.process.call(self.base + entry, self.base, DLL_PROCESS_ATTACH, 0):
            raise RuntimeError(f'{self.name}: DllMain refused DLL_PROCESS_ATTACH')

    def _give_thread_data(self, tls):
        """The thread's copy of the DLL's thread-local data, under the next TLS index."""
        index = self.process.tls_indices
        self.process.tls_indices += 1
        start, end = self.mapped(tls.StartAddressOfRawData), self.mapped(tls.EndAddressOfRawData)
        block = self.process.reserve(end - start + tls.SizeOfZeroFill)
        self.process.write(block, self.process.read(start, end - start))
        self.process.write(self.process.tls_slots + 4 * index, struct.pack('<I', block))
        self.process.write(self.mapped(tls.AddressOfIndex), struct.pack('<I', index))

    def _run_tls_callbacks(self, tls):
        at = self.mapped(tls.AddressOfCallBacks) if tls.AddressOfCallBacks else 0
        while at and (callback := self.process.word(at)) != 0:
            self.process.call(callback, self.base, DLL_PROCESS_ATTACH, 0)
            at += 4

    def contains(self, address):
        return self.base <= address < self.base + self.size
