"""The generator refuses a faulty description with file:line and the fault, and
builds a good one silently. The tables it builds from the protocol description
are the descriptor tables test's."""

import os
import subprocess
import sys
import tempfile
import unittest

HERE = os.path.dirname(__file__)
GENERATOR = os.path.join(HERE, '..', '..', 'generator')
sys.path.insert(0, GENERATOR)

import rnsap_gen  # noqa: E402
from grammar_model import GrammarError  # noqa: E402


def refusals():
    """(description, expected message fragment) of each case of refusals.txt."""
    with open(os.path.join(HERE, 'refusals.txt'), encoding='utf-8') as fh:
        blocks = fh.read().split('\n== ')[1:]
    return [(text + '\n', expected) for expected, _, text in (b.partition('\n') for b in blocks)]


with open(os.path.join(HERE, 'good_description.rg'), encoding='utf-8') as fh:
    GOOD = fh.read()


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
        for text, expected in refusals():
            with self.subTest(expected=expected):
                try:
                    errors = self.compile(text).errors
                except GrammarError as e:
                    errors = [str(e)]
                self.assertTrue(any(expected in e for e in errors), errors)

    def test_text_that_is_not_utf8_is_refused_at_its_line(self):
        with open(os.path.join(self.grammar, 't.rg'), 'wb') as fh:
            fh.write(b'rule RNSAP_PDU {\n  field 1 1 "  \xe9"\n}\n')
        with self.assertRaisesRegex(GrammarError, r't\.rg:2: not UTF-8'):
            rnsap_gen.compile_grammar(self.grammar)

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
