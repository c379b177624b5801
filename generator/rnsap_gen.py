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
                           Repeat, Dispatch, Set, Shape, ValueList, Expr, DISPATCH_TABLES)
import tables  # noqa: E402
import emit  # noqa: E402

ENTRY_RULE = 'RNSAP_PDU'
SPARE_ID = 682
SPARE_LABEL = '  Spare'


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
        if self.format == '':
            return ''
        return self.format[:self.format.index('=') + 1]

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
        self.warnings = []
        self.fields = {SPARE_ID: spare_field()}
        self.dispatch = {t: {} for t in DISPATCH_TABLES}
        self.collect_dispatch()
        self.collect_fields()
        self.check_rules()

    # ------------------------------------------------------------ collection
    def error(self, where, msg):
        self.errors.append(f"{where}: {msg}")

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
                elif known.read.dictionary_signature() != read.dictionary_signature():
                    self.error(read.where, f"field {read.field_id} read differently at "
                                           f"{known.read.where}")

    def reads_of(self, stmts):
        for s in stmts:
            if isinstance(s, FieldRead):
                yield s
            for block in self.blocks_of(s):
                yield from self.reads_of(block)

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
            presence = [r.label for r in self.reads_of(rule.body) if r.presence]
            self.check_block(rule, rule.body, presence)

    def check_block(self, rule, stmts, presence):
        for s in stmts:
            if isinstance(s, Call) and s.rule not in self.g.rules:
                self.warnings.append(f"{s.where}: call of undefined rule {s.rule}")
            if isinstance(s, When) and s.label not in presence:
                self.error(s.where, f"no presence bit {s.label!r} in rule {rule.name}")
            for block in self.blocks_of(s):
                self.check_block(rule, block, presence)

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
        unreached = sorted(set(self.g.rules) - visited)
        if unreached:
            self.warnings.append(f"{len(unreached)} rules not reached from {ENTRY_RULE}: "
                                 + ' '.join(unreached))
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
        built = tables.build(c)
    except GrammarError as e:
        print(f"error: {e}", file=sys.stderr)
        return 1
    for w in c.warnings:
        print(f"warning: {w}", file=sys.stderr)
    for e in c.errors:
        print(f"error: {e}", file=sys.stderr)
    if c.errors:
        return 1
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
