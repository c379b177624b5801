"""msvcrt's heap for the emulated process. Every block has a 16-byte header
whose first word is its size rounded up to 16. Blocks up to 4 KiB are taken
and given back by x86 code in the process (a free list per size and a bump
pointer), as they are many; larger ones, calloc and realloc are served by the
harness, which puts the small blocks it frees on the same free lists.
"""

import struct

from unicorn import UC_PROT_ALL

HEADER = 16
LARGEST_SMALL = 0x1000
SMALL_HEAP, SMALL_HEAP_SIZE = 0x40000000, 0x20000000
HEADS = SMALL_HEAP  # the first free block of each size / 16, 0 if none
NEXT, LIMIT = SMALL_HEAP + 0x410, SMALL_HEAP + 0x414  # the bump pointer and its end
SMALL_BLOCKS = SMALL_HEAP + 0x1000


def word(value):
    return struct.pack('<I', value)


def jump_to(target):
    return b'\xb8' + word(target) + b'\xff\xe0'  # mov eax, target; jmp eax


def malloc_code(fallback):
    """malloc(size); larger blocks and an exhausted heap go to `fallback`."""
    return b''.join([
        bytes.fromhex('8b 44 24 04 83 c0 0f 83 e0 f0'),  # eax = (size + 15) & ~15
        bytes.fromhex('75 05 b8 10 00 00 00'),           # 16 if that is 0
        bytes.fromhex('3d') + word(LARGEST_SMALL) + bytes.fromhex('77 3a'),  # ja large
        bytes.fromhex('89 c1 c1 e9 04'),                 # ecx = size class
        bytes.fromhex('8b 14 8d') + word(HEADS),         # edx = heads[ecx]
        bytes.fromhex('85 d2 74 0c'),                    # jz bump
        bytes.fromhex('8b 02 89 04 8d') + word(HEADS),   # heads[ecx] = [edx]
        bytes.fromhex('89 d0 c3'),                       # return edx
        bytes.fromhex('8b 15') + word(NEXT),             # bump: edx = next
        bytes.fromhex('8d 4c 02 10 3b 0d') + word(LIMIT) + bytes.fromhex('77 0c'),  # ja large
        bytes.fromhex('89 0d') + word(NEXT),             # next = edx + 16 + size
        bytes.fromhex('89 02 8d 42 10 c3'),              # header = size; return edx + 16
        jump_to(fallback),                               # large
    ])


def free_code(fallback):
    """free(block); blocks above 4 KiB go to `fallback`."""
    return b''.join([
        bytes.fromhex('8b 44 24 04 85 c0 74 1e'),        # return at once for null
        bytes.fromhex('8b 48 f0 81 f9') + word(LARGEST_SMALL) + bytes.fromhex('77 14'),
        bytes.fromhex('c1 e9 04 8b 14 8d') + word(HEADS),  # edx = heads[size class]
        bytes.fromhex('89 10 89 04 8d') + word(HEADS),   # [block] = edx; heads[..] = block
        bytes.fromhex('c3'),
        jump_to(fallback),
    ])


class Heap:
    def __init__(self, process):
        self.process = process
        self.free_blocks = {}  # rounded size above 4 KiB: addresses
        process.uc.mem_map(SMALL_HEAP, SMALL_HEAP_SIZE, UC_PROT_ALL)
        process.write(NEXT, word(SMALL_BLOCKS) + word(SMALL_HEAP + SMALL_HEAP_SIZE))

    def code(self, name, fallback):
        """x86 code of malloc or free, with the harness's `fallback` stub."""
        return {'malloc': malloc_code, 'free': free_code}[name](fallback)

    def size_of(self, block):
        return self.process.word(block - HEADER)

    def malloc(self, size):
        rounded = max(16, (size + 15) & ~15)
        reusable = self.free_blocks.get(rounded)
        block = reusable.pop() if reusable else self.process.reserve(rounded + HEADER) + HEADER
        self.process.write(block - HEADER, word(rounded))
        return block

    def free(self, block):
        if not block:
            return
        rounded = self.size_of(block)
        if rounded > LARGEST_SMALL:
            self.free_blocks.setdefault(rounded, []).append(block)
            return
        head = HEADS + 4 * (rounded >> 4)
        self.process.write(block, word(self.process.word(head)))
        self.process.write(head, word(block))

    def calloc(self, count, size):
        block = self.malloc(count * size)
        self.process.write(block, bytes(count * size))
        return block

    def realloc(self, block, size):
        if not block:
            return self.malloc(size)
        if size == 0:
            self.free(block)
            return 0
        if size <= self.size_of(block):
            return block
        moved = self.malloc(size)
        self.process.write(moved, self.process.read(block, self.size_of(block)))
        self.free(block)
        return moved
