"""Derivation of everything the module carries from the compiled description:
the descriptor tables the host reads and the program the passes walk."""

import re
from dataclasses import dataclass, field as dc_field

from grammar_model import (FieldRead, Align, Call, If, When, Repeat, Dispatch, Set, Expr,
                           DISPATCH_TABLES, variable_key)

CATCH_ALL_POOL_PAIR = (50, 0)
FINAL_STRING = '$$_FINAL_STRING_$$'
VARIABLE_WIDTH = 0xffffffff


# ------------------------------------------------------------------ widths and layouts

def value_bits(fd):
    """Number of value bits of a field, or None when only the message tells."""
    s = fd.shape
    if s.kind == 'align':
        return None
    if s.kind in ('run', 'peek'):
        return s.width
    if s.kind == 'groups':
        return sum(b - a + 1 for a, b in s.groups)
    if not s.count.is_constant():
        return None
    n = s.count.constant()
    if s.kind == 'digitpairs' and s.digits:
        return 4 * s.digits
    per_element = {'octets': 8, 'octetsback': 8, 'octetsmirrored': 8, 'bits': 1,
                   'bitsback': 1, 'nibbles': 4, 'octetnibbles': 8, 'digitpairs': 8}
    return per_element[s.kind] * n


def size_class(bits):
    if bits is None or bits > 24:
        return 4
    return (bits + 7) // 8


def number_token(n):
    return bytes([0x10]) + n.to_bytes(4, 'big')


def param_token(i):
    return bytes([0x08, i, 0x00])


def bit_item(high, low):
    """Bits from `high` down to `low`, the first listed least significant."""
    if high == low:
        return number_token(high)
    return bytes([0x05]) + number_token(high) + number_token(low)


def layout_items(fd):
    """(items, element count or None for a run-time count, element size)."""
    s = fd.shape
    if s.kind == 'run':
        return [bit_item(s.width, 1)], 1, s.width
    if s.kind == 'peek':
        return [bit_item(s.offset + s.width, s.offset + 1)], 1, 0
    if s.kind == 'groups':
        items = [bit_item(b + 1, a + 1) for a, b in reversed(s.groups)]
        return items, 1, s.groups[-1][1] + 1
    count = s.count.constant() if s.count.is_constant() else None
    if s.kind == 'digitpairs' and s.digits:
        items = []
        for octet in range(count):
            items += [bit_item(8 * octet + 8, 8 * octet + 5), bit_item(8 * octet + 4, 8 * octet + 1)]
        return items[:s.digits], 1, 8 * count
    element = {
        'octets': ([bit_item(8, 1)], 8), 'octetsback': ([bit_item(8, 1)], 8),
        'octetsmirrored': ([bytes([0x05]) + number_token(1) + number_token(8)], 8),
        'bits': ([bit_item(1, 1)], 1), 'bitsback': ([bit_item(1, 1)], 1),
        'nibbles': ([bit_item(4, 1)], 4),
        'octetnibbles': ([bit_item(4, 1), bit_item(8, 5)], 8),
        'digitpairs': ([bit_item(8, 5), bit_item(4, 1)], 8),
    }
    items, size = element[s.kind]
    return items, count, size


def layout_record(fd):
    if fd.shape.kind == 'align':
        body = bytes([0xFF, 0x00, 0x00])
    else:
        items, count, size = layout_items(fd)
        body = bytes([0xFF, 0x02, 0x55, 0x01, 0x04, len(items)]) + b''.join(items)
        if count is None:
            body += param_token(0) + number_token(size) + param_token(1)
        else:
            body += number_token(count) + number_token(size) + param_token(0)
    return len(body).to_bytes(2, 'little') + body


# ------------------------------------------------------------------ descriptor tables

@dataclass
class DescriptorTables:
    dictionary: list = dc_field(default_factory=list)
    value_rows: list = dc_field(default_factory=list)  # (kind, pool index, string index)
    pool: list = dc_field(default_factory=list)
    strings: list = dc_field(default_factory=list)
    layout: bytearray = dc_field(default_factory=bytearray)
    layout_records: int = 0


def value_list_rows(vl):
    """A list's rows in table order: the catch-all first."""
    rows = [(None, vl.catch_all)] if vl.catch_all is not None else []
    return rows + list(vl.entries)


def build_descriptors(c):
    t = DescriptorTables()
    string_index, pool_index, layout_offset = {}, {}, {}

    def intern_string(s):
        if s not in string_index:
            string_index[s] = len(t.strings)
            t.strings.append(s)
        return string_index[s]

    def intern_pool(v):
        if v is None:
            if 'catch-all' not in pool_index:
                pool_index['catch-all'] = len(t.pool)
                for number in CATCH_ALL_POOL_PAIR:
                    pool_index.setdefault(number, len(t.pool))
                    t.pool.append(number)
            return pool_index['catch-all']
        if v not in pool_index:
            pool_index[v] = len(t.pool)
            t.pool.append(v)
        return pool_index[v]

    def intern_layout(fd):
        rec = bytes(layout_record(fd))
        if rec not in layout_offset:
            layout_offset[rec] = len(t.layout)
            t.layout += rec
            t.layout_records += 1
        return layout_offset[rec]

    for fd in c.rows:
        bits = value_bits(fd)
        row = {
            'flags': 0x05000000 | (0x10000 if fd.key else 0) | size_class(bits),
            'fieldId': fd.id, 'keyIndex': fd.key_index, 'name': fd.name,
            'altName': fd.altname, 'valueCount': 0, 'firstValue': 0xffffffff,
            'widthCode': VARIABLE_WIDTH if bits is None else 0xffff0000 + bits,
            'formatIndex': intern_string(fd.format), 'layoutOffset': intern_layout(fd),
        }
        if fd.values is not None:
            rows = value_list_rows(fd.values)
            row['valueCount'] = len(rows)
            row['firstValue'] = len(t.value_rows)
            for value, text in rows:
                kind = 0x00010000 if value is None else 1
                t.value_rows.append((kind, intern_pool(value), intern_string(text)))
        t.dictionary.append(row)
    t.pool.append(0)
    t.strings.append(FINAL_STRING)
    t.layout += bytes(4)  # the empty record that ends the table, and two zero bytes
    return t


# ------------------------------------------------------------------ the program

VALUE_FORMS = {
    '%u': 'kUnsigned', '%d': 'kSigned', '%x': 'kHex', '%b': 'kBinary', '%s': 'kText',
    '%-S': 'kNames', '%-S (%u)': 'kNamesAndNumber', '%u octets': 'kUnsignedOctets',
    '': 'kEmpty',
}
ELEMENT_LIST = re.compile(r'^%-\["(%[Xxu])"(?::"([^"]*)")?\]$')
ELEMENT_FORMS = {'%X': 'kElementsUpperHex', '%x': 'kElementsLowerHex', '%u': 'kElementsDecimal'}


def value_form(part):
    """(form, separator) of a value part of the display language."""
    if part in VALUE_FORMS:
        return VALUE_FORMS[part], ''
    m = ELEMENT_LIST.match(part)
    if not m:
        raise ValueError(f"unknown value part {part!r}")
    return ELEMENT_FORMS[m.group(1)], m.group(2) or ''


RUNTIME_SHAPES = {
    'run': 'kRun', 'octets': 'kOctets', 'octetsback': 'kOctetsBack',
    'octetsmirrored': 'kOctetsMirrored', 'bits': 'kBits', 'bitsback': 'kBitsBack',
    'nibbles': 'kNibbles', 'octetnibbles': 'kNibbles', 'digitpairs': 'kDigitPairs',
    'groups': 'kGroups', 'peek': 'kPeek',
}
FIRST_SEGMENT = {'octetsback': 'kLast', 'bitsback': 'kLast', 'digitpairs': 'kSecond'}
COMPARES = {'==': 'kEq', '!=': 'kNe', '<': 'kLt', '<=': 'kLe', '>': 'kGt', '>=': 'kGe'}


@dataclass
class Program:
    steps: list = dc_field(default_factory=list)
    reads: list = dc_field(default_factory=list)
    groups: list = dc_field(default_factory=list)
    expr_terms: list = dc_field(default_factory=list)
    exprs: list = dc_field(default_factory=list)
    cond_terms: list = dc_field(default_factory=list)
    conds: list = dc_field(default_factory=list)
    rules: list = dc_field(default_factory=list)
    fields: list = dc_field(default_factory=list)
    value_names: list = dc_field(default_factory=list)
    value_lists: list = dc_field(default_factory=list)
    dispatch: dict = dc_field(default_factory=dict)
    variables: dict = dc_field(default_factory=dict)
    entry_rule: int = 0


class ProgramBuilder:
    def __init__(self, c):
        self.c = c
        self.p = Program()
        self.rule_index = {name: i for i, name in enumerate(c.reached_rules)}
        self.list_index = {}

    def slot(self, rule, var):
        return self.p.variables.setdefault(variable_key(rule.name, var), len(self.p.variables))

    def expr(self, rule, e):
        first = len(self.p.expr_terms)
        for op, atom in e.terms:
            if isinstance(atom, int):
                self.p.expr_terms.append((op, False, atom))
            else:
                self.p.expr_terms.append((op, True, self.slot(rule, atom)))
        self.p.exprs.append((first, len(e.terms)))
        return len(self.p.exprs) - 1

    def cond(self, rule, cond):
        first = len(self.p.cond_terms)
        for lhs, cmp, rhs in cond.terms:
            self.p.cond_terms.append((self.expr(rule, lhs), COMPARES[cmp], self.expr(rule, rhs)))
        self.p.conds.append((first, len(cond.terms)))
        return len(self.p.conds) - 1

    def names(self, vl):
        if vl is None:
            return None
        key = id(vl)
        if key not in self.list_index:
            first = len(self.p.value_names)
            self.p.value_names += [(v, t) for v, t in vl.entries]
            self.list_index[key] = len(self.p.value_lists)
            self.p.value_lists.append((first, len(vl.entries), vl.catch_all))
        return self.list_index[key]

    def build(self):
        for fd in self.c.rows:
            form, separator = value_form(fd.format_value_part)
            display_form, _ = value_form(fd.display_part)
            self.p.fields.append({
                'fieldId': fd.id, 'displayId': fd.display_id, 'prefix': fd.prefix,
                'form': form, 'displayForm': display_form, 'separator': separator,
                'names': self.names(fd.values),
                'displayNames': self.names(fd.display_values or fd.values),
                'firstSegment': FIRST_SEGMENT.get(fd.shape.kind, 'kFirst'),
                'keyRow': fd.key_row,
                'keySize': size_class(value_bits(fd)) if fd.key else 0,
            })
        for name in self.c.reached_rules:
            rule = self.c.g.rules[name]
            first = len(self.p.steps)
            presence = [r.label for r in self.c.reads_of(rule.body) if r.presence]
            self.p.steps += self.block(rule, rule.body, presence)
            self.p.rules.append((rule.literal, first, len(self.p.steps) - first))
        for table in DISPATCH_TABLES:
            branches = self.c.dispatch[table]
            size = max(branches) + 1 if branches else 0
            row = ['kNoBranch'] * size
            for ident, rule in branches.items():
                if rule is None:
                    row[ident] = 'kEmptyBranch'
                elif rule in self.rule_index:
                    row[ident] = self.rule_index[rule]
            self.p.dispatch[table] = row
        self.p.entry_rule = self.rule_index['RNSAP_PDU']
        return self.p

    def block(self, rule, stmts, presence):
        out = []
        for s in stmts:
            if isinstance(s, FieldRead):
                if s.presence and s.label == presence[0]:
                    out.append(('kSet', self.slot(rule, '#bitmap'),
                                self.expr(rule, Expr([('=', 0)])), 0, 0))
                out.append(('kRead', 0, self.read(rule, s), 0, 0))
            elif isinstance(s, Align):
                out.append(('kAlign', 0, 0, 0, 0))
            elif isinstance(s, Call):
                out.append(('kCall', 0, self.rule_index[s.rule], 0, 0))
            elif isinstance(s, If):
                cond = self.cond(rule, s.cond)
                then = self.retested(rule, s.then, presence, lambda n: ('kIf', 0, cond, n, 0))
                otherwise = self.block(rule, s.otherwise, presence)
                out.append(('kIf', 0, cond, len(then), len(otherwise)))
                out += then + otherwise
            elif isinstance(s, When):
                slot = self.slot(rule, '#bitmap')
                mask = 1 << (len(presence) - 1 - presence.index(s.label))
                body = self.retested(rule, s.body, presence, lambda n: ('kWhen', slot, mask, n, 0))
                out.append(('kWhen', slot, mask, len(body), 0))
                out += body
            elif isinstance(s, Repeat):
                body = self.block(rule, s.body, presence)
                out.append(('kRepeat', self.slot(rule, s.var), 0, len(body), 0))
                out += body
            elif isinstance(s, Dispatch):
                table = {'ie': 'kDispatchIe', 'extension': 'kDispatchExtension',
                         'private': 'kDispatchPrivate'}[s.table]
                out.append(('kDispatch', self.slot(rule, s.var), table, 0, 0))
            elif isinstance(s, Set):
                out.append(('kSet', self.slot(rule, s.var), self.expr(rule, s.expr), 0, 0))
        return out

    def retested(self, rule, stmts, presence, guard):
        """The steps of a block whose condition each statement tests anew
        where the walk reaches it, as each row of a rule table tests its own:
        a nested rule that changes a variable of the condition takes effect
        on the statements after it. `guard(n)` is the test step in front of
        the n steps of the statements that follow the first."""
        if not stmts:
            return []
        rest = self.retested(rule, stmts[1:], presence, guard)
        return self.block(rule, stmts[:1], presence) + ([guard(len(rest))] + rest if rest else [])

    def read(self, rule, r):
        fd = self.c.fields[r.field_id]
        shape = r.shape
        count_expr = 'kNoExpr'
        if shape.count is not None:
            count = shape.count
            if shape.kind == 'octetnibbles':
                count = Expr(count.terms + [('*', 2)])
            count_expr = self.expr(rule, count)
        width, offset, group_count = shape.width, shape.offset, 0
        if shape.kind == 'digitpairs':
            width = shape.digits
        if shape.kind == 'groups':
            offset = len(self.p.groups)
            group_count = len(shape.groups)
            self.p.groups += shape.groups
            width = shape.groups[-1][1] + 1
        self.p.reads.append({
            'field': fd.row, 'shape': RUNTIME_SHAPES[shape.kind],
            'conversion': {'plain': 'kPlain', 'count': 'kCount',
                           'length': 'kLength'}[r.conversion],
            'keepSlot': self.slot(rule, r.keep) if r.keep else 'kNoSlot',
            'bitmapSlot': self.slot(rule, '#bitmap') if r.presence else 'kNoSlot',
            'countExpr': count_expr, 'width': width, 'offset': offset,
            'groupCount': group_count, 'adjust': r.plus - r.minus, 'label': r.label,
        })
        return len(self.p.reads) - 1


@dataclass
class Built:
    descriptors: DescriptorTables
    program: Program


def build(c):
    return Built(build_descriptors(c), ProgramBuilder(c).build())


def summary(c, built):
    d = built.descriptors
    branches = {t: sum(1 for v in c.dispatch[t].values()) for t in DISPATCH_TABLES}
    return '\n'.join([
        f"rules: {len(c.g.rules)} defined, {len(c.reached_rules)} reached, "
        f"{len(c.unreached_rules)} not reached",
        f"dictionary rows: {len(d.dictionary)} ({sum(1 for r in d.dictionary if r['keyIndex'])} key)",
        f"distinct names: {len(set(r['name'] for r in d.dictionary))}",
        f"value rows: {len(d.value_rows)}, pool: {len(d.pool)}, strings: {len(d.strings)}",
        f"layout records: {d.layout_records}, layout bytes: {len(d.layout)}",
        f"dispatch branches: " + ', '.join(f"{t} {n}" for t, n in branches.items()),
        f"field reads: {len(built.program.reads)}, steps: {len(built.program.steps)}, "
        f"variables: {len(built.program.variables)}",
    ] + ([f"not reached: {' '.join(c.unreached_rules)}"] if c.unreached_rules else []))
