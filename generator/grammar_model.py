"""Parser and model of the protocol description (*.rg files).

The description is read into rules of statements; families are expanded into
one rule per member and numbered selections into condition chains, so that
everything downstream sees plain rules.
"""

import os
import re
from dataclasses import dataclass, field as dc_field
from typing import List, Optional


class GrammarError(Exception):
    pass


# ---------------------------------------------------------------- lexing

TOKEN_RE = re.compile(r"""
    (?P<ws>[ \t\r]+)
  | (?P<comment>\#[^\n]*)
  | (?P<nl>\n)
  | (?P<dstr>"[^"\n]*")
  | (?P<sstr>'[^'\n]*')
  | (?P<word>(?:[A-Za-z_]|\{M\})(?:[A-Za-z0-9_]|\{M\})*)
  | (?P<op>==|!=|<=|>=|&&|[{}();:,<>=*/+\-~])
  | (?P<var>\$[A-Za-z_][A-Za-z0-9_]*)
  | (?P<num>[0-9]+)
""", re.VERBOSE)


@dataclass
class Token:
    kind: str  # 'str', 'op', 'var', 'word', 'num', 'nl'
    text: str
    where: str

    @property
    def value(self):
        return self.text


def tokenize(text, filename):
    tokens = []
    pos, line = 0, 1
    while pos < len(text):
        m = TOKEN_RE.match(text, pos)
        if not m:
            raise GrammarError(f"{filename}:{line}: unexpected character {text[pos]!r}")
        kind = m.lastgroup
        s = m.group()
        where = f"{filename}:{line}"
        if kind == 'nl':
            tokens.append(Token('nl', s, where))
            line += 1
        elif kind in ('dstr', 'sstr'):
            tokens.append(Token('str', s[1:-1], where))
        elif kind not in ('ws', 'comment'):
            tokens.append(Token(kind, s, where))
        pos = m.end()
    tokens.append(Token('nl', '\n', f"{filename}:{line}"))
    return tokens


# ---------------------------------------------------------------- model

@dataclass
class Expr:
    """atom (op atom)*: atoms are ints or variable names, evaluated left to right."""
    terms: list  # [(op, atom)], first op '='

    def is_constant(self):
        return all(isinstance(a, int) for _, a in self.terms)

    def constant(self):
        v = 0
        for op, a in self.terms:
            v = apply_op(v, op, a)
        return v

    def variables(self):
        return [a for _, a in self.terms if isinstance(a, str)]


def apply_op(v, op, a):
    if op == '=':
        return a
    if op == '+':
        return v + a
    if op == '-':
        return v - a
    if op == '*':
        return v * a
    if op == '/':
        return int(v / a)
    raise GrammarError(f"bad operator {op}")


@dataclass
class Shape:
    kind: str  # run, octets, octetsback, octetsmirrored, bits, bitsback,
    #            nibbles, octetnibbles, digitpairs, groups, peek
    count: Optional[Expr] = None  # elements (octets, bits, nibbles, digit octets)
    width: int = 0                # run width, peek run length
    digits: int = 0               # digitpairs cut to this many digits (0: all)
    groups: list = dc_field(default_factory=list)  # [(from, to)] offsets
    offset: int = 0               # peek offset

    def signature(self):
        return (self.kind, repr(self.count), self.width, self.digits, tuple(self.groups),
                self.offset)


@dataclass
class FieldRead:
    field_id: int
    shape: Shape
    label: str
    where: str
    values: Optional[object] = None      # list name (str) or inline list
    show: Optional[str] = None
    format: Optional[str] = None
    name: Optional[str] = None
    altname: Optional[str] = None
    display: Optional[str] = None
    displayvalues: Optional[str] = None
    key: bool = False
    keep: Optional[str] = None
    conversion: str = 'plain'  # plain, count, length
    plus: int = 0
    minus: int = 0
    presence: bool = False

    def dictionary_signature(self):
        values = self.values
        if isinstance(values, ValueList):
            values = (tuple(values.entries), values.catch_all)
        return (self.shape.signature(), self.label, values, self.show, self.format,
                self.name, self.altname, self.display, self.displayvalues, self.key,
                self.conversion, self.plus, self.minus, self.presence)


@dataclass
class Align:
    where: str


@dataclass
class Call:
    rule: str
    where: str


@dataclass
class Cond:
    terms: list  # [(Expr, cmp, Expr)] joined by &&


@dataclass
class If:
    cond: Cond
    then: list
    otherwise: list
    where: str


@dataclass
class When:
    label: str
    body: list
    where: str


@dataclass
class Repeat:
    var: str
    body: list
    where: str


@dataclass
class Dispatch:
    var: str
    table: str
    where: str


@dataclass
class Set:
    var: str
    expr: Expr
    where: str


@dataclass
class Rule:
    name: str
    literal: str
    body: list
    where: str
    tags: list = dc_field(default_factory=list)  # [(table, id)]


@dataclass
class ValueList:
    name: str
    entries: list  # [(value, text)]
    catch_all: Optional[str]
    where: str


@dataclass
class Grammar:
    rules: dict
    value_lists: dict
    empty_branches: list  # [(table, id)]
    key_table: list


DISPATCH_TABLES = ('ie', 'extension', 'private')
MAX_EXPRESSION_NUMBER = 0x7fffffff
LOOP_SHAPES = ('octets', 'octetsback', 'octetsmirrored', 'bits', 'bitsback', 'nibbles',
               'octetnibbles', 'digitpairs')
FIELD_ATTRIBUTES = ('values', 'show', 'format', 'name', 'altname', 'display', 'displayvalues',
                    'key', 'keep', 'count', 'length', 'plus', 'minus', 'presence')
# Words with a meaning of their own: no select parameter may take one as its name.
RESERVED_WORDS = frozenset(
    ('rule', 'family', 'member', 'only', 'branch', 'empty', 'keytable', 'other', 'align',
     'field', 'call', 'if', 'else', 'when', 'repeat', 'dispatch', 'set', 'select', 'groups',
     'peek') + DISPATCH_TABLES + LOOP_SHAPES + FIELD_ATTRIBUTES)


def variable_key(rule_name, var):
    """A `$Name` is shared by all rules; a bare name belongs to its rule."""
    return var if var.startswith('$') else (rule_name, var)


# ---------------------------------------------------------------- parsing

class Parser:
    def __init__(self, tokens):
        self.toks = tokens
        self.i = 0

    # -- token helpers
    def peek(self, skip_nl=True):
        j = self.i
        while skip_nl and self.toks[j].kind == 'nl':
            j += 1
        return self.toks[j]

    def next(self, skip_nl=True):
        while skip_nl and self.toks[self.i].kind == 'nl':
            self.i += 1
        t = self.toks[self.i]
        self.i += 1
        return t

    def at_end(self):
        return all(t.kind == 'nl' for t in self.toks[self.i:])

    def expect(self, text, skip_nl=True):
        t = self.next(skip_nl)
        if t.text != text or t.kind == 'str':
            raise GrammarError(f"{t.where}: expected {text!r}, found {t.text!r}")
        return t

    def expect_kind(self, kind, what, skip_nl=True):
        t = self.next(skip_nl)
        if t.kind != kind:
            raise GrammarError(f"{t.where}: expected {what}, found {t.text!r}")
        return t

    def accept(self, text, skip_nl=False):
        t = self.peek(skip_nl)
        if t.text == text and t.kind != 'str':
            self.next(skip_nl)
            return True
        return False

    def number(self):
        t = self.next(False)
        if t.kind != 'num':
            raise GrammarError(f"{t.where}: expected a number, found {t.text!r}")
        return int(t.text)

    def signed_number(self):
        neg = self.accept('-')
        n = self.number()
        return -n if neg else n

    def at_statement_end(self):
        t = self.peek(False)
        return t.kind == 'nl' or t.text in (';', '}')

    # -- top level
    def parse_file(self, grammar, filename):
        while not self.at_end():
            t = self.next()
            if t.text == ';':
                continue
            if t.text == 'values':
                vl = self.value_list_body(self.expect_kind('word', 'a list name').text, t.where)
                if vl.name in grammar.value_lists:
                    raise GrammarError(f"{t.where}: value list {vl.name} defined twice")
                grammar.value_lists[vl.name] = vl
            elif t.text == 'rule':
                self.add_rule(grammar, self.rule(t))
            elif t.text == 'family':
                for r in self.family(t):
                    self.add_rule(grammar, r)
            elif t.text == 'branch':
                table = self.next(False).text
                if table not in DISPATCH_TABLES:
                    raise GrammarError(f"{t.where}: unknown dispatch {table}")
                ident = self.number()
                self.expect('empty', False)
                grammar.empty_branches.append((table, ident))
            elif t.text == 'keytable':
                if grammar.key_table:
                    raise GrammarError(f"{t.where}: a second key-field table")
                self.expect('{')
                while not self.accept('}', True):
                    grammar.key_table.append(self.expect_kind('str', 'a key name').text)
            else:
                raise GrammarError(f"{t.where}: unexpected {t.text!r}")

    @staticmethod
    def add_rule(grammar, rule):
        if rule.name in grammar.rules:
            raise GrammarError(f"{rule.where}: rule {rule.name} already defined at "
                               f"{grammar.rules[rule.name].where}")
        grammar.rules[rule.name] = rule

    def value_list_body(self, name, where):
        self.expect('{')
        entries, catch_all = [], None
        while not self.accept('}', True):
            t = self.next()
            if t.text == 'other':
                catch_all = self.expect_kind('str', 'a text', False).text
            elif t.kind == 'num':
                if any(value == int(t.text) for value, _ in entries):
                    raise GrammarError(f"{t.where}: value {t.text} named twice in a value list")
                entries.append((int(t.text), self.expect_kind('str', 'a text', False).text))
            else:
                raise GrammarError(f"{t.where}: bad value list entry {t.text!r}")
        return ValueList(name, entries, catch_all, where)

    def tags(self):
        tags = []
        while self.peek(False).text in DISPATCH_TABLES:
            table = self.next(False).text
            tags.append((table, self.number()))
        return tags

    def rule(self, start):
        name = self.expect_kind('word', 'a rule name', False).text
        literal = name
        if self.peek(False).kind == 'str':
            literal = self.next(False).text
        tags = self.tags()
        body = self.block()
        return Rule(name, literal, body, start.where, tags)

    def family(self, start):
        name = self.expect_kind('word', 'a family name', False).text
        literal = name
        if self.peek(False).kind == 'str':
            literal = self.next(False).text
        self.expect('{')
        members = []
        while not self.accept('}', True):
            self.expect('member')
            suffix = self.next(False).text
            first = self.number()
            members.append((suffix, first, self.tags()))
        body_start = self.i
        self.skip_block()
        body_end = self.i
        if not members:
            raise GrammarError(f"{start.where}: family {name} has no member")
        base = members[0][1]
        rules = []
        for suffix, first, tags in members:
            toks = [self.member_token(t, suffix) for t in self.toks[body_start:body_end]]
            sub = Parser(toks + [Token('nl', '\n', start.where)])
            sub.family_member = (suffix, first - base)
            sub.family_suffixes = [m[0] for m in members]
            rules.append(Rule(name.replace('{M}', suffix), literal.replace('{M}', suffix),
                              sub.block(), start.where, tags))
        return rules

    @staticmethod
    def member_token(tok, suffix):
        if tok.kind in ('str', 'word'):
            return Token(tok.kind, tok.text.replace('{M}', suffix), tok.where)
        return tok

    def skip_block(self):
        """Moves past a block without reading it: its text is read per instance."""
        self.expect('{')
        depth = 1
        while depth:
            t = self.next()
            if t.kind == 'op' and t.text in '{}':
                depth += 1 if t.text == '{' else -1

    # -- statements
    def block(self):
        self.expect('{')
        stmts = []
        while not self.accept('}', True):
            if self.accept(';', True):
                continue
            stmts.extend(self.statement())
        return stmts

    def statement(self):
        t = self.next()
        w = t.where
        if t.text == 'align':
            stmt = Align(w)
        elif t.text == 'field':
            stmt = self.field_read(w)
        elif t.text == 'call':
            stmt = Call(self.expect_kind('word', 'a rule name', False).text, w)
        elif t.text == 'if':
            return [self.if_chain(w)]
        elif t.text == 'when':
            label = self.expect_kind('str', 'a presence label', False).text
            return [When(label, self.block_or_statement(), w)]
        elif t.text == 'repeat':
            var = self.variable()
            return [Repeat(var, self.block(), w)]
        elif t.text == 'dispatch':
            var = self.variable()
            table = self.next(False).text
            if table not in DISPATCH_TABLES:
                raise GrammarError(f"{w}: unknown dispatch {table}")
            stmt = Dispatch(var, table, w)
        elif t.text == 'set':
            var = self.variable()
            self.expect('=', False)
            stmt = Set(var, self.expr(), w)
        elif t.text == 'select':
            return [self.select(w)]
        elif t.text == 'only':
            return self.only(w)
        else:
            raise GrammarError(f"{w}: unknown statement {t.text!r}")
        if self.accept('if'):
            return [If(self.cond(), [stmt], [], w)]
        if not self.at_statement_end():
            raise GrammarError(f"{w}: unexpected {self.peek(False).text!r} after statement")
        return [stmt]

    def block_or_statement(self):
        if self.peek().text == '{':
            return self.block()
        return self.statement()

    def if_chain(self, where):
        cond = self.cond()
        then = self.block()
        otherwise = []
        if self.peek().text == 'else':
            self.next()
            if self.accept('if'):
                otherwise = [self.if_chain(where)]
            else:
                otherwise = self.block()
        return If(cond, then, otherwise, where)

    def only(self, where):
        suffixes = []
        while self.peek().text != '{':
            suffixes.append(self.next(False).text)
        body = self.block()
        member = getattr(self, 'family_member', None)
        if member is None:
            raise GrammarError(f"{where}: 'only' outside a family")
        for suffix in suffixes:
            if suffix not in self.family_suffixes:
                raise GrammarError(f"{where}: 'only' names {suffix}, no member of the family")
        return body if member[0] in suffixes else []

    def select(self, where):
        var = self.variable()
        self.expect('(', False)
        params = []
        while not self.accept(')'):
            t = self.expect_kind('word', 'a parameter name', False)
            if t.text in RESERVED_WORDS or t.text in params:
                raise GrammarError(f"{t.where}: select parameter {t.text!r} is "
                                   + ("named twice" if t.text in params else "a reserved word"))
            params.append(t.text)
        self.expect('{')
        rows = []  # (number or None, [tokens])
        while not self.accept('}', True):
            t = self.next()
            if t.text == 'else':
                key = None
            elif t.kind == 'num':
                key = int(t.text)
                if any(row_key == key for row_key, _ in rows):
                    raise GrammarError(f"{t.where}: select row {key} twice")
            else:
                raise GrammarError(f"{t.where}: bad select row {t.text!r}")
            self.expect(':', False)
            vals = []
            while not self.at_statement_end():
                v = self.next(False)
                if v.kind == 'op' or (v.kind == 'word' and v.text in RESERVED_WORDS):
                    raise GrammarError(f"{v.where}: select value {v.text!r} is not a field id, "
                                       "label, number or name")
                vals.append(v)
            if len(vals) != len(params):
                raise GrammarError(f"{t.where}: select row needs {len(params)} values")
            rows.append((key, vals))
        body_start = self.i
        self.skip_block()
        body_end = self.i
        if not rows or rows[-1][0] is not None:
            raise GrammarError(f"{where}: select needs a last 'else' row")

        def instance(vals):
            subst = dict(zip(params, vals))
            toks = [subst.get(tk.text, tk) if tk.kind == 'word' else tk
                    for tk in self.toks[body_start:body_end]]
            sub = Parser(toks + [Token('nl', '\n', where)])
            sub.family_member = getattr(self, 'family_member', None)
            sub.family_suffixes = getattr(self, 'family_suffixes', [])
            return sub.block()

        chain = instance(rows[-1][1])
        for key, vals in reversed(rows[:-1]):
            cond = Cond([(Expr([('=', var)]), '==', Expr([('=', key)]))])
            chain = [If(cond, instance(vals), chain, where)]
        return chain[0]

    def variable(self):
        t = self.next(False)
        if t.kind not in ('var', 'word'):
            raise GrammarError(f"{t.where}: expected a variable, found {t.text!r}")
        return t.text

    def atom(self):
        t = self.next(False)
        if t.kind == 'num':
            if int(t.text) > MAX_EXPRESSION_NUMBER:
                raise GrammarError(f"{t.where}: number {t.text} is beyond the walk's signed "
                                   "32-bit arithmetic")
            return int(t.text)
        if t.kind in ('var', 'word'):
            return t.text
        raise GrammarError(f"{t.where}: expected a number or variable, found {t.text!r}")

    def expr(self):
        """A left-to-right chain of one kind of operator: '*' '/' or '+' '-'."""
        terms = [('=', self.atom())]
        while self.peek(False).text in ('*', '/', '+', '-'):
            t = self.next(False)
            if len(terms) > 1 and (t.text in '*/') != (terms[1][0] in '*/'):
                raise GrammarError(f"{t.where}: '{terms[1][0]}' and '{t.text}' in one expression: "
                                   "'*' '/' and '+' '-' do not mix")
            terms.append((t.text, self.atom()))
            if terms[-1] == ('/', 0):
                raise GrammarError(f"{t.where}: a division by 0")
        return Expr(terms)

    def cond(self):
        terms = []
        while True:
            lhs = self.expr()
            cmp = self.next(False).text
            if cmp not in ('==', '!=', '<', '<=', '>', '>='):
                raise GrammarError(f"{self.toks[self.i - 1].where}: bad comparison {cmp!r}")
            terms.append((lhs, cmp, self.expr()))
            if not self.accept('&&'):
                return Cond(terms)

    # -- field reads
    def field_id(self):
        shifted = self.accept('~')
        n = self.number()
        if shifted:
            member = getattr(self, 'family_member', None)
            if member is None:
                raise GrammarError(f"{self.toks[self.i - 1].where}: '~' id outside a family")
            n += member[1]
        return n

    def shape(self):
        t = self.next(False)
        if t.kind == 'num':
            return Shape('run', width=int(t.text))
        kind = t.text
        self.expect('(', False)
        if kind in LOOP_SHAPES:
            shape = Shape(kind, count=self.expr())
            if kind == 'digitpairs' and self.accept(','):
                shape.digits = self.number()
                if shape.digits == 0:
                    raise GrammarError(f"{t.where}: digitpairs cut to 0 digits")
        elif kind == 'groups':
            shape = Shape(kind)
            while True:
                a = self.number()
                self.expect('-', False)
                shape.groups.append((a, self.number()))
                if not self.accept(','):
                    break
        elif kind == 'peek':
            shape = Shape(kind)
            shape.offset = self.number()
            self.expect(',', False)
            shape.width = self.number()
        else:
            raise GrammarError(f"{t.where}: unknown read shape {kind!r}")
        self.expect(')', False)
        return shape

    def field_read(self, where):
        fid = self.field_id()
        shape = self.shape()
        label = self.expect_kind('str', 'a label', False).text
        f = FieldRead(fid, shape, label, where)
        while not self.at_statement_end() and self.peek(False).text != 'if':
            t = self.next(False)
            a = t.text
            if a == 'values':
                if self.peek(False).text == '{':
                    f.values = self.value_list_body(None, t.where)
                else:
                    f.values = self.expect_kind('word', 'a list name', False).text
            elif a in ('show', 'format', 'name', 'altname', 'display'):
                setattr(f, a, self.expect_kind('str', 'a text', False).text)
            elif a == 'displayvalues':
                f.displayvalues = self.expect_kind('word', 'a list name', False).text
            elif a in ('key', 'presence'):
                setattr(f, a, True)
            elif a in ('keep', 'count', 'length'):
                if f.keep is not None:
                    raise GrammarError(f"{t.where}: a read keeps one variable, {f.keep} already")
                f.keep = self.variable()
                f.conversion = 'plain' if a == 'keep' else a
            elif a == 'plus':
                f.plus = self.number()
            elif a == 'minus':
                f.minus = self.number()
            else:
                raise GrammarError(f"{t.where}: unknown field attribute {a!r}")
        return f


def decoded(octets, filename):
    try:
        return octets.decode('utf-8')
    except UnicodeDecodeError as e:
        line = octets.count(b'\n', 0, e.start) + 1
        raise GrammarError(f"{filename}:{line}: not UTF-8 text") from None


def load_grammar(root):
    grammar = Grammar({}, {}, [], [])
    files = []
    for dirpath, _, names in os.walk(root):
        files += [os.path.join(dirpath, n) for n in names if n.endswith('.rg')]
    for path in sorted(files):
        filename = os.path.relpath(path, os.path.dirname(root) or '.')
        with open(path, 'rb') as fh:
            text = decoded(fh.read(), filename)
        Parser(tokenize(text, filename)).parse_file(grammar, path)
    return grammar
