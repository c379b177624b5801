#!/usr/bin/env python3
"""Build-time generator: protocol description -> rule tables and descriptor tables.

Usage:
  rnsap_gen.py --check GRAMMAR_DIR          check the description, print a summary
  rnsap_gen.py --dump GRAMMAR_DIR           print the field dictionary rows in order
  rnsap_gen.py --out DIR GRAMMAR_DIR        write the generated C++ sources into DIR
"""

import argparse
import os
import sys

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))

from grammar_model import (GrammarError, load_grammar, FieldRead, Align, Call, If, When,  # noqa
                           Repeat, Dispatch, Set, Shape, ValueList, Expr, DISPATCH_TABLES,
                           variable_key)
import tables  # noqa: E402
import emit  # noqa: E402

ENTRY_RULE = 'RNSAP_PDU'
SPARE_ID = 682
SPARE_LABEL = '  Spare'

# What the walk and the renderer hold, terminators included.
LABEL_BUFFER = 255
RULE_NAME_BUFFER = 71
NUMBER_BUFFER = 64        # a value name holding %u is formatted into it
LONGEST_NUMBER = 10       # digits of a 32-bit %u
MAX_RUN_BITS = 32
MAX_OFFSET = 0xffff       # ReadPlan.offset
MAX_GROUP_OFFSET = 0xff   # Group.from and Group.to
MAX_FIELD_BITS = 0xffff   # the dictionary's width code
MAX_KEY_RUN_BITS = 16     # a key of one value fills a fixed slot of one or two octets
NAME_FORMS = ('kNames', 'kNamesAndNumber')


class FieldDef:
    """One field of the dictionary: everything every read of its id shares."""

    def __init__(self, read, value_list):
        self.read = read
        self.id = read.field_id
        self.label = read.label
        self.shape = read.shape
        self.name = read.name if read.name is not None else read.label.lstrip(' ')
        self.altname = read.altname if read.altname is not None else self.name
        self.values = value_list
        self.display_values = None
        if read.show is not None:
            self.value_part = read.show
        elif value_list is not None:
            self.value_part = '%-S'
        elif read.minus:
            self.value_part = '%d'
        else:
            self.value_part = '%u'
        self.format = read.format if read.format is not None else read.label + '=' + self.value_part
        self.display_part = read.display if read.display is not None else self.format_value_part
        self.key = read.key
        # filled in by the row order
        self.row = None
        self.key_index = 0
        self.display_id = None
        self.key_row = -1

    @property
    def prefix(self):
        """The format in front of its value part, '=' included."""
        head, equals, _ = self.format.partition('=')
        return head + equals

    @property
    def format_value_part(self):
        return self.format[len(self.prefix):]


def spare_field():
    read = FieldRead(SPARE_ID, Shape('align'), SPARE_LABEL, '(Align)', show='%x')
    return FieldDef(read, None)


class Compiler:
    def __init__(self, grammar):
        self.g = grammar
        self.errors = []
        self.spare = spare_field()  # the padding each 'align' reads
        self.fields = {SPARE_ID: self.spare}
        self.dispatch = {t: {} for t in DISPATCH_TABLES}
        self.collect_dispatch()
        self.collect_fields()
        self.check_rules()

    # ------------------------------------------------------------ collection
    def error(self, where, msg):
        """Records an error once: the members of a family share their lines."""
        text = f"{where}: {msg}"
        if text not in self.errors:
            self.errors.append(text)

    def collect_dispatch(self):
        for rule in self.g.rules.values():
            for table, ident in rule.tags:
                self.add_branch(table, ident, rule.name, rule.where)
        for table, ident in self.g.empty_branches:
            self.add_branch(table, ident, None, f"branch {table} {ident}")

    def add_branch(self, table, ident, rule, where):
        if ident in self.dispatch[table]:
            self.error(where, f"{table} id {ident} has two branches")
        self.dispatch[table][ident] = rule

    def resolve_values(self, values, where):
        if values is None or isinstance(values, ValueList):
            return values
        vl = self.g.value_lists.get(values)
        if vl is None:
            self.error(where, f"unknown value list {values}")
        return vl

    def collect_fields(self):
        for rule in self.g.rules.values():
            for read in self.reads_of(rule.body):
                if read.field_id == SPARE_ID:
                    self.error(read.where, "field 682 is read by 'align' only")
                    continue
                known = self.fields.get(read.field_id)
                if known is None:
                    fd = FieldDef(read, self.resolve_values(read.values, read.where))
                    if read.displayvalues:
                        fd.display_values = self.resolve_values(read.displayvalues, read.where)
                    self.fields[read.field_id] = fd
                    self.check_field(fd)
                elif known.read.dictionary_signature() != read.dictionary_signature():
                    self.error(read.where, f"field {read.field_id} read differently at "
                                           f"{known.read.where}")

    def reads_of(self, stmts):
        return (s for s in self.statements(stmts) if isinstance(s, FieldRead))

    def statements(self, stmts):
        """Every statement of a block, nested ones included, in order."""
        for s in stmts:
            yield s
            for block in self.blocks_of(s):
                yield from self.statements(block)

    @staticmethod
    def blocks_of(s):
        if isinstance(s, If):
            return [s.then, s.otherwise]
        if isinstance(s, (When, Repeat)):
            return [s.body]
        return []

    def check_rules(self):
        if ENTRY_RULE not in self.g.rules:
            self.error('grammar', f"no rule {ENTRY_RULE}")
        for rule in self.g.rules.values():
            if text_size(rule.literal) > RULE_NAME_BUFFER - 1:
                self.error(rule.where, f"literal of rule {rule.name} has "
                                       f"{text_size(rule.literal)} characters, more than the "
                                       f"{RULE_NAME_BUFFER - 1} the rule name buffer holds")
            if outside_latin1(rule.literal):
                self.error(rule.where, f"literal of rule {rule.name} {LATIN1_FAULT}")
            for s in self.statements(rule.body):
                if isinstance(s, Call) and s.rule not in self.g.rules:
                    self.error(s.where, f"call of undefined rule {s.rule}")
            self.check_presence(rule)
        self.check_variables()

    def check_presence(self, rule):
        """Presence bits stand in the rule's own block, each read before its test."""
        presence = self.presence_labels(rule)
        read = []
        for s in self.statements(rule.body):
            if isinstance(s, FieldRead) and s.presence:
                read.append(s.label)
                if not any(s is top for top in rule.body):
                    self.error(s.where, f"presence bit {s.label!r} inside a block")
            if isinstance(s, When) and s.label not in read:
                self.error(s.where, f"presence bit {s.label!r} tested before it is read"
                           if s.label in presence
                           else f"no presence bit {s.label!r} in rule {rule.name}")

    def presence_labels(self, rule):
        """The labels of the rule's presence bits, each naming one bit of its bitmap."""
        labels = []
        for r in self.reads_of(rule.body):
            if r.presence and r.label in labels:
                self.error(r.where, f"presence bit {r.label!r} twice in rule {rule.name}")
            labels += [r.label] if r.presence else []
        if len(labels) > MAX_RUN_BITS:
            self.error(rule.where, f"rule {rule.name} has {len(labels)} presence bits, more "
                                   f"than the {MAX_RUN_BITS} its bitmap holds")
        return labels

    def check_variables(self):
        """Every variable read is written somewhere: a misspelt name is not a new 0."""
        written, read = set(), []
        for rule in self.g.rules.values():
            for s in self.statements(rule.body):
                written.update(variable_key(rule.name, v) for v in variables_written(s))
                read += [(rule, v, s.where) for v in variables_read(s)]
        for rule, var, where in read:
            if variable_key(rule.name, var) not in written:
                self.error(where, f"variable {var} is read but never written (rule {rule.name})")

    # ------------------------------------------------------------ field checks
    def check_field(self, fd):
        where = fd.read.where
        texts = (fd.label, fd.name, fd.altname, fd.format, fd.display_part)
        foreign = next((text for text in texts if outside_latin1(text)), None)
        if foreign is not None:
            self.error(where, f"text {foreign!r} {LATIN1_FAULT}")
        if text_size(fd.label) > LABEL_BUFFER - 1:
            self.error(where, f"label of {text_size(fd.label)} characters, more than the "
                              f"{LABEL_BUFFER - 1} the label buffer holds")
        for problem in shape_problems(fd):
            self.error(where, problem)
        for problem in display_problems(fd):
            self.error(where, problem)
        for vl in (fd.values, fd.display_values):
            for problem in value_name_problems(vl):
                self.error(vl.where, problem)

    # ------------------------------------------------------------ row order
    def order_rows(self):
        """Each field takes its row at its first read in a depth-first walk from
        the PDU frame, each dispatch in ascending id."""
        rows, visited = [], set()

        def add(fid):
            fd = self.fields[fid]
            if fd.row is None:
                fd.row = len(rows)
                rows.append(fd)

        def visit_rule(name):
            if name in visited or name not in self.g.rules:
                return
            visited.add(name)
            visit(self.g.rules[name].body)

        def visit(stmts):
            for s in stmts:
                if isinstance(s, FieldRead):
                    add(s.field_id)
                elif isinstance(s, Align):
                    add(SPARE_ID)
                elif isinstance(s, Call):
                    visit_rule(s.rule)
                elif isinstance(s, Dispatch):
                    for ident in sorted(self.dispatch[s.table]):
                        if self.dispatch[s.table][ident]:
                            visit_rule(self.dispatch[s.table][ident])
                for block in self.blocks_of(s):
                    visit(block)

        visit_rule(ENTRY_RULE)
        if self.spare.row is None:
            self.error('grammar', f"no 'align' is reached from {ENTRY_RULE}: the walk needs "
                                  "the Spare field")
        self.unreached_rules = sorted(set(self.g.rules) - visited)
        self.reached_rules = [n for n in self.g.rules if n in visited]
        self.rows = rows
        self.derive_row_columns()

    def derive_row_columns(self):
        first_of_name = {}
        key_index = 0
        for fd in self.rows:
            first_of_name.setdefault(fd.name, fd.id)
            fd.display_id = first_of_name[fd.name]
            if fd.key:
                key_index += 1
                fd.key_index = key_index
                rows = [i for i, n in enumerate(self.g.key_table) if n == fd.name]
                if not rows:
                    self.error(fd.read.where, f"key field {fd.id} {fd.name!r} has no row in "
                                              "the key-field table")
                else:
                    fd.key_row = rows[-1]


LATIN1_FAULT = "holds a character outside Latin-1, the module's character set"


def outside_latin1(text):
    return any(ord(ch) > 0xff for ch in text)


def text_size(text):
    return len(text.encode('latin-1', errors='replace'))


def variables_read(s):
    """Variables a statement reads: conditions, loop bounds, selectors, counts."""
    if isinstance(s, FieldRead):
        return s.shape.count.variables() if s.shape.count else []
    if isinstance(s, Set):
        return s.expr.variables()
    if isinstance(s, If):
        return [v for lhs, _, rhs in s.cond.terms for v in lhs.variables() + rhs.variables()]
    if isinstance(s, (Repeat, Dispatch)):
        return [s.var]
    return []


def variables_written(s):
    if isinstance(s, FieldRead) and s.keep:
        return [s.keep]
    if isinstance(s, Set):
        return [s.var]
    return []


def shape_problems(fd):
    s = fd.shape
    if fd.key and s.kind in ('run', 'peek', 'groups') and tables.value_bits(fd) > MAX_KEY_RUN_BITS:
        yield (f"a key of {tables.value_bits(fd)} bits in one value: a key holds at most "
               f"{MAX_KEY_RUN_BITS}, or comes in octets, half-octets or bits")
    if s.kind in ('run', 'peek') and not 1 <= s.width <= MAX_RUN_BITS:
        yield f"a run of {s.width} bits: a run holds 1 to {MAX_RUN_BITS}"
    if s.kind == 'peek' and s.offset > MAX_OFFSET:
        yield f"look-ahead offset {s.offset} is beyond {MAX_OFFSET}"
    if s.kind == 'groups':
        yield from group_problems(s.groups)
    if s.count is not None:
        yield from loop_problems(fd)


def group_problems(groups):
    end = -1
    for a, b in groups:
        if a > b or a <= end:
            yield f"group {a}-{b} is not a run behind the one before it"
        end = b
    if end > MAX_GROUP_OFFSET:
        yield f"group offset {end} is beyond {MAX_GROUP_OFFSET}"
    bits = sum(b - a + 1 for a, b in groups)
    if bits > MAX_RUN_BITS:
        yield f"groups of {bits} bits: a value holds at most {MAX_RUN_BITS}"


def loop_problems(fd):
    s = fd.shape
    if not s.count.is_constant():
        if s.digits:
            yield "digitpairs cut to a number of digits needs a constant octet count"
        return
    n = s.count.constant()
    if n < 1:
        yield f"a loop of {n} elements"
    elif s.digits > 2 * n:
        yield f"{s.digits} digits in {n} octets: at most {2 * n}"
    elif tables.value_bits(fd) > MAX_FIELD_BITS:
        yield f"a loop of {tables.value_bits(fd)} bits: a field holds at most {MAX_FIELD_BITS}"


def display_problems(fd):
    """The format and the Display pass's value part in the forms the renderer has."""
    if fd.format and '=' not in fd.format:
        yield f"format {fd.format!r} has no '=' in front of its value part"
        return
    if '%' in fd.prefix:
        yield f"format {fd.format!r} holds a directive in front of its value part"
    for part, names in ((fd.format_value_part, fd.values),
                        (fd.display_part, fd.display_values or fd.values)):
        try:
            form, _ = tables.value_form(part)
        except ValueError as e:
            yield str(e)
            continue
        if form in NAME_FORMS and names is None:
            yield f"value part {part!r} without a value list"


def value_name_problems(vl):
    """A value name is printed as it stands, or with its one %u filled in."""
    if vl is None:
        return
    longest = NUMBER_BUFFER - 1 - LONGEST_NUMBER + len('%u')
    for _, text in tables.value_list_rows(vl):
        if outside_latin1(text):
            yield f"value name {text!r} {LATIN1_FAULT}"
        elif '%' in text.replace('%u', '', 1):
            yield f"value name {text!r}: a name holds no directive but one %u"
        elif '%u' in text and text_size(text) > longest:
            yield f"value name {text!r}: a name with %u holds at most {longest} characters"


def compile_grammar(grammar_dir):
    c = Compiler(load_grammar(grammar_dir))
    c.order_rows()
    return c


def main():
    ap = argparse.ArgumentParser()
    ap.add_argument('grammar')
    ap.add_argument('--check', action='store_true')
    ap.add_argument('--dump', action='store_true')
    ap.add_argument('--out')
    args = ap.parse_args()
    try:
        c = compile_grammar(args.grammar)
    except GrammarError as e:
        print(f"error: {e}", file=sys.stderr)
        return 1
    for e in c.errors:
        print(f"error: {e}", file=sys.stderr)
    if c.errors:
        return 1
    built = tables.build(c)
    if args.dump:
        for fd in c.rows:
            print(f"{fd.row:5} {fd.id:5} key={fd.key_index:<3} disp={fd.display_id:<5} "
                  f"{fd.format!r} values={len(fd.values.entries) if fd.values else 0}")
    if args.check or args.dump:
        print(tables.summary(c, built))
    if args.out:
        emit.write_all(c, built, args.out)
    return 0


if __name__ == '__main__':
    sys.exit(main())
