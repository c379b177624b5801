#!/usr/bin/env python3
"""Messages made from the protocol description, each with the walk that the
decoder must make of it.

The generator walks the description the way the decoder walks it, but
writing: at each field read it chooses the bits that the read will find and
appends them, and it keeps the grammar variables as the walk keeps them
(module-wide, overwritten by every read), so that each condition, loop and
dispatch goes the way the decoder will go. Beside each message it writes the
walk: every field read with its id and bit range, the dispatch branches it
entered, and where the walk ends.

Usage:
  message_gen.py [--seed N] [--random N] --out FILE GRAMMAR_DIR

The corpus holds one message per dispatch branch that has a rule (IE,
extension and private body), each walking through its branch, and N random
messages of every size. Per message:
  # target ie 6 C_ID            or   # random 12
  message HEX
  reach TABLE ID                     one line per branch the walk entered
  field ID FIRST-LAST                one line per field read, 1-based bits
  end position=N bitsLeftOut=N flags=N passFlags=N
The flags are those of the Validation pass and of the other passes: 2 if an
optional member is absent, and in the Validation pass also if a loop ends
with its counter off the count (an inner container changed the count).
"""

import argparse
import os
import random
import sys

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))

from grammar_model import (GrammarError, FieldRead, Align, Call, If, When, Repeat,  # noqa: E402
                           Dispatch, Set, DISPATCH_TABLES)
from rnsap_gen import compile_grammar, SPARE_ID  # noqa: E402

# Limits that keep a message bounded; a walk that passes one is dropped.
MAX_MESSAGE_BITS = 8 * 16384
MAX_RULE_DEPTH = 200  # well below the depth at which the decoder stops
MAX_ATTEMPTS = 400
WIDE_FORM_SHARE = 0.15  # length determinants written in the 14-bit form at will
NEST_SHARE = 0.2  # dispatches that enter a choice already open, where one fits
ERR_CONDITION = 2


class GenerationError(Exception):
    """The walk cannot be written as chosen: the attempt is dropped."""


class NeedWideForm(Exception):
    """A 7-bit length determinant turned out too small for what it measures."""

    def __init__(self, occurrence):
        super().__init__(occurrence)
        self.occurrence = occurrence


def int32(v):
    v &= 0xffffffff
    return v - (1 << 32) if v & 0x80000000 else v


def divide(a, b):
    if b == 0:
        return 0
    q = abs(a) // abs(b)
    return q if (a < 0) == (b < 0) else -q


OPERATIONS = {
    '=': lambda v, a: int32(a),
    '+': lambda v, a: int32(v + a),
    '-': lambda v, a: int32(v - a),
    '*': lambda v, a: int32(v * a),
    '/': lambda v, a: int32(divide(v, a)),
}
COMPARISONS = {
    '==': lambda a, b: a == b, '!=': lambda a, b: a != b, '<': lambda a, b: a < b,
    '<=': lambda a, b: a <= b, '>': lambda a, b: a > b, '>=': lambda a, b: a >= b,
}


def variable_key(rule, name):
    """`$Name` is one variable for all rules; a bare name belongs to its rule."""
    return name if name.startswith('$') else f"{rule.name}::{name}"


def bitmap_key(rule):
    return f"{rule.name}::#bitmap"


# ------------------------------------------------------------------ read shapes

def layout(shape, p, n):
    """Segments (first bit, last bit, value shift, mirrored) of a read at bit
    p (0-based), in the order the value is built, and the bits it consumes."""
    k = shape.kind
    if k == 'run':
        return [(p, p + shape.width - 1, shape.width, False)], shape.width
    if k == 'peek':
        first = p + shape.offset
        return [(first, first + shape.width - 1, shape.width, False)], 0
    if k == 'groups':
        return ([(p + a, p + b, b - a + 1, False) for a, b in shape.groups],
                shape.groups[-1][1] + 1)
    if k in ('octets', 'octetsmirrored', 'octetsback'):
        octets = [(p + 8 * i, p + 8 * i + 7, 8, k == 'octetsmirrored') for i in range(n)]
        return (octets[::-1] if k == 'octetsback' else octets), 8 * n
    if k in ('bits', 'bitsback'):
        bits = [(p + i, p + i, 1, False) for i in range(n)]
        return (bits[::-1] if k == 'bitsback' else bits), n
    if k in ('nibbles', 'octetnibbles'):
        nibbles = n if k == 'nibbles' else 2 * n
        return [(p + 4 * i, p + 4 * i + 3, 4, False) for i in range(nibbles)], 4 * nibbles
    if k == 'digitpairs':
        digits = shape.digits or 2 * n
        segments = []
        for d in range(digits):
            first = p + 8 * (d // 2) + (4 if d % 2 == 0 else 0)
            segments.append((first, first + 3, 4, False))
        return segments, 8 * n
    raise GenerationError(f"unknown read shape {k}")


# ------------------------------------------------------------------ description analysis

class Description:
    """The compiled description and what the generator learns from it once."""

    def __init__(self, grammar_dir):
        self.c = compile_grammar(grammar_dir)
        if self.c.errors:
            raise GrammarError('; '.join(self.c.errors))
        self.rules = self.c.g.rules
        self.dispatch = self.c.dispatch
        self.presence = {}      # rule name -> presence labels in rule order
        self.sizes = set()      # variables that bound a loop or a read
        self.constants = {}     # variable -> constants it is compared with
        self.used = set()       # variables that anything reads
        self.determinants = set()  # ids of the form reads of length determinants
        self.lengths = set()       # ids of their 7-bit and 14-bit length reads
        for name in self.c.reached_rules:
            rule = self.rules[name]
            self.presence[name] = [r.label for r in self.c.reads_of(rule.body) if r.presence]
            self.scan(rule, rule.body)
        for name in self.c.reached_rules:
            self.find_determinants(self.rules[name], self.rules[name].body)
        # Rule -> the variables of its own that choose among its members.
        self.choices = {}
        for key, constants in self.constants.items():
            if '::' in key and len(constants) > 1:
                self.choices.setdefault(key.split('::')[0], set()).add(key)
        self.branch_of = {rule: (table, ident) for table, ident, rule in self.branches()}
        dispatched = self.dispatched_tables()
        self.nesting = [(table, ident, rule) for table, ident, rule in self.branches()
                        if rule in self.choices and table in dispatched[rule]]

    def dispatched_tables(self):
        """Rule -> the dispatch tables its walk can run, however deep."""
        direct = {name: ({s.table for s in self.c.statements(self.rules[name].body)
                          if isinstance(s, Dispatch)},
                         {s.rule for s in self.c.statements(self.rules[name].body)
                          if isinstance(s, Call) and s.rule in self.rules})
                  for name in self.c.reached_rules}
        tables = {name: set(own) for name, (own, _) in direct.items()}
        changed = True
        while changed:
            changed = False
            for name, (_, callees) in direct.items():
                reached = set().union(*(tables[c] for c in callees if c in tables))
                for table in set(tables[name]):
                    reached |= set().union(*(tables.get(r, set()) for r in self.dispatch[table].values() if r))
                if not reached <= tables[name]:
                    tables[name] |= reached
                    changed = True
        return tables

    def uses(self, rule, expr):
        for atom in expr.variables():
            self.used.add(variable_key(rule, atom))

    def scan(self, rule, stmts):
        for s in stmts:
            if isinstance(s, FieldRead) and s.shape.count is not None:
                self.uses(rule, s.shape.count)
                self.sizes.update(variable_key(rule, v) for v in s.shape.count.variables())
            elif isinstance(s, If):
                for lhs, _, rhs in s.cond.terms:
                    self.uses(rule, lhs)
                    self.uses(rule, rhs)
                    self.note_constant(rule, lhs, rhs)
                    self.note_constant(rule, rhs, lhs)
            elif isinstance(s, Repeat):
                self.used.add(variable_key(rule, s.var))
                self.sizes.add(variable_key(rule, s.var))
            elif isinstance(s, Dispatch):
                self.used.add(variable_key(rule, s.var))
            elif isinstance(s, Set):
                self.uses(rule, s.expr)
            for block in self.c.blocks_of(s):
                self.scan(rule, block)

    def note_constant(self, rule, var_side, constant_side):
        if (len(var_side.terms) == 1 and isinstance(var_side.terms[0][1], str)
                and constant_side.is_constant()):
            key = variable_key(rule, var_side.terms[0][1])
            self.constants.setdefault(key, set()).add(constant_side.constant())

    def find_determinants(self, rule, stmts):
        """The length determinant idiom: a 1-bit form read kept in V, then a
        7-bit length if V is 0, else a 1-bit read and a 14-bit length, both
        lengths read by nothing. What it measures is written afterwards."""
        for i, s in enumerate(stmts):
            for block in self.c.blocks_of(s):
                self.find_determinants(rule, block)
            if i + 2 >= len(stmts) or not self.is_run(s, 1) or s.keep is None:
                continue
            short, wide = stmts[i + 1], stmts[i + 2]
            if not (self.tests(short, s.keep, ('==', 0)) and len(short.then) == 1
                    and not short.otherwise and self.is_dead_run(rule, short.then[0], 7)):
                continue
            if not ((self.tests(wide, s.keep, ('!=', 0)) or self.tests(wide, s.keep, ('==', 1)))
                    and len(wide.then) == 2 and not wide.otherwise
                    and self.is_run(wide.then[0], 1) and self.is_dead_run(rule, wide.then[1], 14)):
                continue
            self.determinants.add(id(s))
            self.lengths.update((id(short.then[0]), id(wide.then[1])))

    @staticmethod
    def is_run(s, width):
        return (isinstance(s, FieldRead) and s.shape.kind == 'run' and s.shape.width == width
                and not s.presence and s.plus == 0 and s.minus == 0 and s.conversion == 'plain')

    def is_dead_run(self, rule, s, width):
        return self.is_run(s, width) and (s.keep is None
                                          or variable_key(rule, s.keep) not in self.used)

    @staticmethod
    def tests(s, var, comparison):
        if not isinstance(s, If) or len(s.cond.terms) != 1:
            return False
        lhs, cmp, rhs = s.cond.terms[0]
        return (lhs.terms == [('=', var)] and rhs.is_constant()
                and (cmp, rhs.constant()) == comparison)

    def branches(self):
        """Every dispatch branch that has a rule, as (table, id, rule)."""
        return [(t, i, r) for t in DISPATCH_TABLES for i, r in sorted(self.dispatch[t].items())
                if r is not None and r in self.rules]


# ------------------------------------------------------------------ the writing walk

class Profile:
    """How big a message may grow: beyond `size_bits` or `depth` rules deep
    the walk takes absent options, minimal counts and ids without a body."""

    def __init__(self, size_bits, depth, breadth):
        self.size_bits = size_bits
        self.depth = depth
        self.breadth = breadth  # mean of a count near the top of the message


class MessageWriter:
    """One walk of the description that writes the bits it reads."""

    def __init__(self, d, rng, profile, goal=None, wide_forms=frozenset()):
        self.d = d
        self.rng = rng
        self.profile = profile
        self.goal = goal              # (table, id) the walk should pass through, or
        #                               ('nest', table, id): enter that choice inside itself
        self.wide_forms = wide_forms  # determinant occurrences that take 14 bits
        self.bits = []
        self.ahead = {}               # bit -> value fixed by a look-ahead
        self.end_needed = 0           # bits the look-aheads need in the message
        self.vars = {}
        self.patchable = {}           # variable -> (bit, width, base) of its unused read
        self.fields = []              # (field id, first, last) 1-based, or None range
        self.reached = set()
        self.nested = set()           # (table, id) of choices walked inside themselves
        self.open = []                # names of the open rules, outermost first
        self.flags = 0                # ERR_CONDITION once an optional member is absent
        self.loop_flags = 0           # ERR_CONDITION of a loop ending off its count
        self.depth = 0
        self.determinants = 0
        self.frames = []              # per open rule: its length determinants to write

    # -- variables and conditions
    def get(self, key):
        self.patchable.pop(key, None)
        return self.vars.get(key, 0)

    def put(self, key, value):
        self.patchable.pop(key, None)
        self.vars[key] = int32(value)

    def evaluate(self, rule, expr):
        value = 0
        for op, atom in expr.terms:
            operand = self.get(variable_key(rule, atom)) if isinstance(atom, str) else atom
            value = OPERATIONS[op](value, operand)
        return value

    def holds(self, rule, cond):
        return all(COMPARISONS[cmp](self.evaluate(rule, lhs), self.evaluate(rule, rhs))
                   for lhs, cmp, rhs in cond.terms)

    def under_pressure(self):
        return self.depth >= self.profile.depth or len(self.bits) >= self.profile.size_bits

    # -- bits
    def bit_at(self, i):
        return self.bits[i] if i < len(self.bits) else self.ahead[i]

    def append(self, values):
        """Appends bits; a bit that a look-ahead fixed keeps its value."""
        for v in values:
            self.bits.append(self.ahead.get(len(self.bits), v))
        if len(self.bits) > MAX_MESSAGE_BITS:
            raise GenerationError("message too long")

    def random_bits(self, n):
        return [self.rng.getrandbits(1) for _ in range(n)]

    @staticmethod
    def to_bits(value, width):
        return [(value >> (width - 1 - i)) & 1 for i in range(width)]

    def overwrite(self, first, values):
        if any(first + i in self.ahead for i in range(len(values))):
            raise GenerationError("a look-ahead fixed bits that are written later")
        self.bits[first:first + len(values)] = values

    # -- the walk
    def call(self, name):
        rule = self.d.rules.get(name)
        if rule is None:
            return  # calls of undefined rules are left out of the program
        if self.depth >= MAX_RULE_DEPTH:
            raise GenerationError("rules nested too deep")
        self.depth += 1
        self.frames.append([])
        self.open.append(name)
        self.block(rule, rule.body)
        self.open.pop()
        for first, width, start, occurrence in self.frames.pop():
            self.write_length(first, width, start, occurrence)
        self.depth -= 1

    def block(self, rule, stmts):
        for s in stmts:
            if isinstance(s, FieldRead):
                self.read(rule, s)
            elif isinstance(s, Align):
                self.align()
            elif isinstance(s, Call):
                self.call(s.rule)
            elif isinstance(s, If):
                if self.holds(rule, s.cond):
                    self.rows(rule, s.then, lambda: self.holds(rule, s.cond))
                else:
                    self.block(rule, s.otherwise)
            elif isinstance(s, When):
                self.when(rule, s)
            elif isinstance(s, Repeat):
                self.repeat(rule, s)
            elif isinstance(s, Dispatch):
                self.dispatch(rule, s)
            elif isinstance(s, Set):
                self.put(variable_key(rule, s.var), self.evaluate(rule, s.expr))

    def rows(self, rule, stmts, test):
        """A block whose condition each statement tests anew where the walk
        reaches it: a nested rule that changes a variable of the condition
        takes effect on the statements after it."""
        for i, s in enumerate(stmts):
            if i and not test():
                return
            self.block(rule, [s])

    def when(self, rule, s):
        """The optional member whose presence bit the rule's bitmap holds."""
        if self.present(rule, s.label):
            self.rows(rule, s.body, lambda: self.present(rule, s.label))

    def present(self, rule, label):
        labels = self.d.presence[rule.name]
        if self.get(bitmap_key(rule)) & 1 << (len(labels) - 1 - labels.index(label)):
            return True
        self.flags |= ERR_CONDITION
        return False

    def repeat(self, rule, s):
        """A counted loop: the bound is read afresh at each test, so a count
        that the body overwrites takes effect at once."""
        key = variable_key(rule, s.var)
        counter = 0
        while counter < self.get(key):
            counter += 1
            self.block(rule, s.body)
        if counter != self.vars.get(key, 0):
            self.loop_flags |= ERR_CONDITION

    def align(self):
        """The padding to the next octet boundary: messages are whole octets,
        so counting from the message's end is counting from its start."""
        first = len(self.bits)
        self.append(self.random_bits(-first % 8))
        self.fields.append((SPARE_ID, first + 1, len(self.bits)))

    def dispatch(self, rule, s):
        key = variable_key(rule, s.var)
        table = self.d.dispatch[s.table]
        source = self.patchable.get(key)
        if source is not None:
            self.choose_id(key, s.table, table, source)
        ident = self.get(key)
        branch = table.get(ident)
        if branch is not None and branch in self.d.rules:
            self.reached.add((s.table, ident))
            self.call(branch)

    def choose_id(self, key, table_name, table, source):
        """Rewrites the read that set the dispatched variable, which nothing
        has used since, to the id this walk wants."""
        first, width, base = source
        fits = [i for i in sorted(table) if 0 <= i - base < 1 << width]
        reentered = [i for i in fits if table[i] in self.open and table[i] in self.d.choices]
        if self.goal and self.goal[0] == table_name and self.goal not in self.reached:
            wanted = [self.goal[1]] if self.goal[1] in fits else []
        elif self.goal and self.goal[:2] == ('nest', table_name) and self.goal[1:] not in self.nested:
            wanted = [self.goal[2]] if self.goal[2] in fits else []
        elif self.under_pressure():
            absent = next((i for i in range(base, base + (1 << width)) if i not in table), None)
            wanted = [i for i in fits if table[i] is None] + [absent] * (absent is not None)
        elif reentered and self.rng.random() < NEST_SHARE:
            wanted = reentered
        else:
            wanted = fits if self.rng.random() < 0.85 else []
        if wanted:
            ident = self.rng.choice(wanted)
            self.overwrite(first, self.to_bits(ident - base, width))
            self.vars[key] = ident

    def read(self, rule, r):
        n = 0
        if r.shape.count is not None:
            n = self.evaluate(rule, r.shape.count) & 0xffffffff
            if n > MAX_MESSAGE_BITS:
                raise GenerationError(f"read of {n} elements")
        p = len(self.bits)
        segments, consumed = layout(r.shape, p, n)
        if r.shape.kind == 'peek':
            self.look_ahead(rule, r, segments[0])
        else:
            if any(last >= p + consumed for _, last, _, _ in segments):
                raise GenerationError(f"field {r.field_id} has bits beyond what it consumes")
            self.append(self.choose_bits(rule, r, consumed))
        self.convert(rule, r, segments, p)
        if segments:
            self.fields.append((r.field_id, min(s[0] for s in segments) + 1,
                                max(s[1] for s in segments) + 1))
        else:
            self.fields.append((r.field_id, None, None))

    def look_ahead(self, rule, r, segment):
        first, last, width, _ = segment
        value = self.choose_value(rule, r, width) if r.keep else self.rng.getrandbits(width)
        for i, bit in enumerate(self.to_bits(value, width)):
            self.ahead.setdefault(first + i, bit)
        self.end_needed = max(self.end_needed, last + 1)

    def choose_bits(self, rule, r, consumed):
        if r.shape.kind != 'run':
            return self.random_bits(consumed)
        width = r.shape.width
        if id(r) in self.d.determinants:
            self.determinants += 1
            wide = self.rng.random() < WIDE_FORM_SHARE or self.determinants in self.wide_forms
            return [1 if wide else 0]
        if id(r) in self.d.lengths:
            # Written when the rule that reads the determinant ends.
            self.frames[-1].append((len(self.bits), width, len(self.bits) + width,
                                    self.determinants))
            return [0] * width
        if r.presence:
            return [0 if self.under_pressure() else self.rng.getrandbits(1)]
        if r.keep:
            return self.to_bits(self.choose_value(rule, r, width), width)
        return self.random_bits(width)

    def write_length(self, first, width, start, occurrence):
        """A length determinant counts the octets behind it up to the end of
        its rule."""
        octets = (len(self.bits) - start + 7) // 8
        if octets >= 1 << width:
            if width == 7:
                raise NeedWideForm(occurrence)
            raise GenerationError(f"{octets} octets do not fit a length determinant")
        self.overwrite(first, self.to_bits(octets, width))

    def base(self, r):
        """What the kept variable adds to the raw value of the read."""
        return r.plus - r.minus + (0 if r.conversion == 'plain' else 1)

    def choose_value(self, rule, r, width):
        """A raw value for a read whose variable steers the walk: often one
        that a condition compares with, small where it sizes a loop or read."""
        key = variable_key(rule, r.keep)
        base = self.base(r)
        constants = sorted(self.d.constants.get(key, ()))
        if key in self.d.choices.get(rule.name, ()) and self.open.count(rule.name) == 1 and (
                self.goal and self.goal[1:] == self.d.branch_of.get(rule.name)):
            wanted = constants[0]  # the choice to nest takes its first member
        elif key in self.d.choices.get(rule.name, ()) and self.open.count(rule.name) > 1:
            # A choice inside one of its own members takes another member,
            # a later one where there is one: the outer choice then reads that
            # member's row as well.
            current = self.vars.get(key, 0)
            wanted = self.rng.choice([c for c in constants if c > current]
                                     or [c for c in constants if c != current])
            self.nested.add(self.d.branch_of.get(rule.name))
        elif constants and self.rng.random() < 0.5:
            wanted = self.rng.choice(constants) + self.rng.choice((0, 0, 0, -1, 1))
        elif key in self.d.sizes:
            wanted = base + self.small_count()
        else:
            return self.rng.getrandbits(width)
        raw = (wanted - base) & 0xffffffff
        if raw < 1 << width:
            return raw
        return 0 if key in self.d.sizes else self.rng.getrandbits(width)

    def small_count(self):
        if self.under_pressure():
            return 0
        mean = max(0.7, self.profile.breadth / 4 ** max(0, self.depth - 1))
        return int(self.rng.expovariate(1 / mean))

    def convert(self, rule, r, segments, p):
        value = 0
        for first, last, shift, mirrored in segments:
            segment = 0
            order = range(last, first - 1, -1) if mirrored else range(first, last + 1)
            for i in order:
                segment = segment * 2 + self.bit_at(i)
            value = ((0 if shift >= 32 else value << shift) + segment) & 0xffffffff
        value = (value + r.plus - r.minus) & 0xffffffff
        if r.conversion == 'length':
            value += 1
        if r.keep:
            key = variable_key(rule, r.keep)
            self.put(key, value + 1 if r.conversion == 'count' else value)
            if r.shape.kind == 'run' and id(r) not in self.d.lengths:
                self.patchable[key] = (p, r.shape.width, self.base(r))
        if r.presence:
            key = bitmap_key(rule)
            if r.label == self.d.presence[rule.name][0]:
                self.vars[key] = 0
            self.put(key, value + 2 * (self.vars[key] & 0xffffffff))


# ------------------------------------------------------------------ messages

class Message:
    def __init__(self, title, octets, walk, position, bits_left_out):
        self.title = title
        self.octets = octets
        self.fields = walk.fields
        self.reached = walk.reached
        self.flags = walk.flags
        self.validation_flags = walk.flags | walk.loop_flags
        self.position = position
        self.bits_left_out = bits_left_out

    def text(self):
        lines = [f"# {self.title}", f"message {self.octets.hex()}"]
        lines += [f"reach {table} {ident}" for table, ident in sorted(self.reached)]
        for field_id, first, last in self.fields:
            lines.append(f"field {field_id} -" if first is None
                         else f"field {field_id} {first}-{last}")
        lines.append(f"end position={self.position} bitsLeftOut={self.bits_left_out} "
                     f"flags={self.validation_flags} passFlags={self.flags}")
        return '\n'.join(lines) + '\n'


def walk_message(d, rng_seed, profile, goal, trailing_octets):
    """Writes one message from the PDU frame on. A 7-bit length that turns out
    too small is written in the 14-bit form on a second walk that makes the
    same choices."""
    wide_forms = set()
    while True:
        w = MessageWriter(d, random.Random(rng_seed), profile, goal, frozenset(wide_forms))
        try:
            w.call('RNSAP_PDU')
            break
        except NeedWideForm as e:
            if e.occurrence in wide_forms:
                raise GenerationError("a length determinant does not settle") from e
            wide_forms.add(e.occurrence)
    walked = len(w.bits)
    w.append(w.random_bits(-walked % 8))  # the closing alignment
    position = len(w.bits) + 1
    w.append(w.random_bits(max(0, w.end_needed - len(w.bits))))
    w.append(w.random_bits(-len(w.bits) % 8 + 8 * trailing_octets))
    octets = bytes(int(''.join(map(str, w.bits[i:i + 8])), 2) for i in range(0, len(w.bits), 8))
    return w, octets, position


def make_message(d, title, seed_text, profile, goal=None, trailing_octets=0):
    """The first attempt that walks (and, with a goal, passes through it)."""
    last_error = "the goal was never reached"
    for attempt in range(MAX_ATTEMPTS):
        try:
            w, octets, position = walk_message(d, f"{seed_text}:{attempt}", profile, goal,
                                               trailing_octets)
        except GenerationError as e:
            last_error = str(e)
            continue
        if goal is None or goal in w.reached or goal[1:] in w.nested:
            return Message(title, octets, w, position, 8 * len(octets) - (position - 1))
    raise GenerationError(f"no message for {title} in {MAX_ATTEMPTS} attempts: {last_error}")


def random_profile(rng):
    kind = rng.random()
    if kind < 0.7:
        return Profile(8 * rng.randint(16, 300), rng.randint(4, 10), rng.uniform(1, 4))
    if kind < 0.93:
        return Profile(8 * rng.randint(300, 2000), rng.randint(6, 12), rng.uniform(8, 40))
    return Profile(8 * rng.randint(2000, 8000), rng.randint(6, 12), rng.uniform(150, 400))


def corpus(d, seed, random_count):
    for table, ident, rule in d.branches():
        yield make_message(d, f"target {table} {ident} {rule}", f"{seed}:{table}:{ident}",
                           Profile(8 * 400, 8, 1.5), goal=(table, ident))
    for table, ident, rule in d.nesting:
        yield make_message(d, f"nest {table} {ident} {rule}", f"{seed}:nest:{table}:{ident}",
                           Profile(8 * 800, 10, 1.5), goal=('nest', table, ident))
    rng = random.Random(f"{seed}:profiles")
    for n in range(random_count):
        trailing = rng.choice((0, 0, 0, 0, 1, 3))
        yield make_message(d, f"random {n}", f"{seed}:random:{n}", random_profile(rng),
                           trailing_octets=trailing)


def main():
    ap = argparse.ArgumentParser(description=__doc__.split('\n\n')[0])
    ap.add_argument('grammar')
    ap.add_argument('--seed', type=int, default=1)
    ap.add_argument('--random', type=int, default=300, help="random messages besides the targets")
    ap.add_argument('--out', required=True)
    args = ap.parse_args()
    try:
        d = Description(args.grammar)
        messages = list(corpus(d, args.seed, args.random))
    except (GrammarError, GenerationError) as e:
        print(f"error: {e}", file=sys.stderr)
        return 1
    with open(args.out, 'w', encoding='ascii') as out:
        out.write(f"# Messages generated from the protocol description, seed {args.seed}.\n")
        for m in messages:
            out.write(m.text())
    return 0


if __name__ == '__main__':
    sys.exit(main())
