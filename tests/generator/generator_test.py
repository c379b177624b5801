"""The generator refuses a faulty description with file:line and the fault, and
turns a good one into the expected tables."""

import os
import subprocess
import sys
import tempfile
import unittest

GENERATOR = os.path.join(os.path.dirname(__file__), '..', '..', 'generator')
sys.path.insert(0, GENERATOR)

import rnsap_gen  # noqa: E402
import tables  # noqa: E402
from grammar_model import GrammarError  # noqa: E402


def pdu(body, after=''):
    """A description whose entry rule holds `body` from line 2 of t.rg on."""
    return f"rule RNSAP_PDU {{\n{body}\n}}\n{after}"


# (description, expected message fragment)
REFUSALS = [
    # variables read but never written
    (pdu('field 1 8 "  Length" keep Length\nfield 2 octets(Lenght) "  Data"'),
     't.rg:3: variable Lenght is read but never written (rule RNSAP_PDU)'),
    (pdu('call A\nrepeat N { field 2 1 "  x" }', 'rule A { field 1 8 "  n" keep N }'),
     't.rg:3: variable N is read'),
    (pdu('dispatch Id ie'), 'variable Id is read'),
    (pdu('field 1 1 "  b" if Flag == 1'), 'variable Flag is read'),
    (pdu('set A = $B + 1'), 'variable $B is read'),
    # calls
    (pdu('call Missing'), 't.rg:2: call of undefined rule Missing'),
    # runs, look-aheads, groups, loops, digit pairs
    (pdu('field 1 0 "  x"'), 't.rg:2: a run of 0 bits'),
    (pdu('field 1 33 "  x"'), 'a run of 33 bits'),
    (pdu('field 1 peek(0, 33) "  x"'), 'a run of 33 bits'),
    (pdu('field 1 peek(65536, 1) "  x"'), 'look-ahead offset 65536'),
    (pdu('field 1 groups(8-15, 1-7) "  x"'), 'group 1-7 is not a run behind'),
    (pdu('field 1 groups(1-8, 8-15) "  x"'), 'group 8-15 is not a run behind'),
    (pdu('field 1 groups(7-1) "  x"'), 'group 7-1 is not a run behind'),
    (pdu('field 1 groups(0-15, 17-33) "  x"'), 'groups of 33 bits'),
    (pdu('field 1 groups(250-260) "  x"'), 'group offset 260 is beyond 255'),
    (pdu('field 1 octets(0) "  x"'), 'a loop of 0 elements'),
    (pdu('field 1 octets(8192) "  x"'), 'a loop of 65536 bits'),
    (pdu('field 1 digitpairs(2, 5) "  x"'), '5 digits in 2 octets: at most 4'),
    (pdu('field 1 digitpairs(2, 0) "  x"'), 't.rg:2: digitpairs cut to 0 digits'),
    (pdu('field 1 8 "  n" keep N\nfield 2 digitpairs(N, 3) "  x"'),
     't.rg:3: digitpairs cut to a number of digits needs a constant octet count'),
    # presence bits
    (pdu('field 1 1 "  a OPTIONAL" presence\nfield 1 1 "  a OPTIONAL" presence'),
     "t.rg:3: presence bit '  a OPTIONAL' twice in rule RNSAP_PDU"),
    (pdu('\n'.join(f'field {i} 1 "  m{i} OPTIONAL" presence' for i in range(33))),
     't.rg:1: rule RNSAP_PDU has 33 presence bits, more than the 32'),
    # texts against their buffers
    (pdu(f'field 1 1 "{"L" * 255}"'), 'label of 255 characters, more than the 254'),
    (pdu('', f'rule Long "{"R" * 71}" {{ align }}'), 't.rg:4: literal of rule Long has 71'),
    # value names and formats against the renderer
    (pdu('field 1 1 "  x" values { 0 "%u%u" }'), "value name '%u%u'"),
    (pdu('field 1 1 "  x" values V', 'values V { other "%d" }'),
     "t.rg:4: value name '%d': a name holds no directive but one %u"),
    (pdu(f'field 1 1 "  x" values {{ 0 "{"n" * 54}%u" }}'), 'a name with %u holds at most 55'),
    (pdu("field 1 1 \"  x\" format 'x%u'"), "format 'x%u' has no '='"),
    (pdu("field 1 1 \"  x\" format '%u=%u'"), 'holds a directive in front of its value part'),
    (pdu("field 1 1 \"  x\" show '%q'"), "unknown value part '%q'"),
    (pdu("field 1 1 \"  x\" display '%-[\"%o\"]'"), 'unknown value part'),
    (pdu("field 1 1 \"  x\" show '%-S'"), "value part '%-S' without a value list"),
    # select parameters and values
    (pdu('select $S (values) { else: V } { field 1 1 "  x" }'),
     "t.rg:2: select parameter 'values' is a reserved word"),
    (pdu('select $S (a a) { else: 1 2 } { field 1 1 "  x" }'), "parameter 'a' is named twice"),
    (pdu('select $S (a) { else: field } { field a 1 "  x" }'),
     "select value 'field' is not a field id, label, number or name"),
    (pdu('select $S (a) { else: ~ } { field a 1 "  x" }'), "select value '~'"),
    # expressions
    (pdu('set A = 2 + 3 * 4'), "t.rg:2: '+' and '*' in one expression"),
    (pdu('set A = 8 / 2 - 1'), "'/' and '-' in one expression"),
]

GOOD = '''values Flag { 0 "off" 1 "on" }
rule RNSAP_PDU "PDU" {
  field 10 1 "Kind" values Flag keep $Kind
  field 11 4 "  Count" count N
  repeat N { call Item }
  set Bits = N * 8 / 2
  if Bits > 4 && $Kind == 1 { field 12 8 "  Extra" minus 5 }
  select $Kind (id label) {
    1: 13 "  One"
    else: 14 "  Other"
  } {
    field id 2 label
  }
  align
}
rule Item { field 20 3 "  Count" values { other "v%u" 7 "seven" } if $Kind == 1 }
rule Unused { field 30 1 "  Unused" }
'''


class GeneratorTest(unittest.TestCase):
    def setUp(self):
        self.tmp = tempfile.TemporaryDirectory()
        self.grammar = os.path.join(self.tmp.name, 'grammar')
        os.mkdir(self.grammar)

    def tearDown(self):
        self.tmp.cleanup()

    def write(self, text):
        with open(os.path.join(self.grammar, 't.rg'), 'w', encoding='utf-8') as fh:
            fh.write(text)

    def compile(self, text):
        self.write(text)
        return rnsap_gen.compile_grammar(self.grammar)

    def test_refusals(self):
        for text, expected in REFUSALS:
            with self.subTest(expected=expected):
                try:
                    errors = self.compile(text).errors
                except GrammarError as e:
                    errors = [str(e)]
                self.assertTrue(any(expected in e for e in errors), errors)

    def test_good_description(self):
        c = self.compile(GOOD)
        self.assertEqual(c.errors, [])
        d = tables.build(c).descriptors
        rows = [(r['fieldId'], c.fields[r['fieldId']].display_id, d.strings[r['formatIndex']])
                for r in d.dictionary]
        self.assertEqual(rows, [
            (10, 10, 'Kind=%-S'), (11, 11, '  Count=%u'), (20, 11, '  Count=%-S'),
            (12, 12, '  Extra=%d'), (13, 13, '  One=%u'), (14, 14, '  Other=%u'),
            (682, 682, '  Spare=%x')])
        values = [(kind, d.pool[pool], d.strings[text]) for kind, pool, text in d.value_rows]
        self.assertEqual(values, [(1, 0, 'off'), (1, 1, 'on'), (0x10000, 50, 'v%u'),
                                  (1, 7, 'seven')])

    def test_build_is_silent_and_check_summarises(self):
        self.write(GOOD)

        def run(*args):
            return subprocess.run([sys.executable, os.path.join(GENERATOR, 'rnsap_gen.py'),
                                   *args, self.grammar], capture_output=True, text=True)
        built = run('--out', os.path.join(self.tmp.name, 'out'))
        self.assertEqual((built.returncode, built.stdout, built.stderr), (0, '', ''))
        checked = run('--check')
        self.assertIn('rules: 3 defined, 2 reached, 1 not reached', checked.stdout)
        self.assertIn('not reached: Unused', checked.stdout)


if __name__ == '__main__':
    unittest.main()
