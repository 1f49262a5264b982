#!/usr/bin/python3
"""Tests of the help generator's refusals and of what it makes of texts it did not write.

Usage: make_help_test.py CATALOGUE.json

The catalogue is the one the built module gave; each test changes a copy of it, or of the
prose, in one way. A help file that has drifted from the module must stop the build, never
ship: an event without prose, an example that does not fit the event's parameters, a link
that leads nowhere. Texts from the module reach the pages escaped.
"""

import copy
import json
import os
import sys
import tempfile
import unittest

ROOT = os.path.normpath(os.path.join(os.path.dirname(os.path.abspath(__file__)), '..', '..'))
sys.path.insert(0, os.path.join(ROOT, 'help'))
import make_help  # noqa: E402  (found through the path set just above)

CATALOGUE = None


def prose():
    return make_help.read_prose(os.path.join(ROOT, 'help', 'prose.ini'))


def event(catalogue, routine):
    return next(e for e in catalogue['events'] if e['routine'] == routine)


class Refusals(unittest.TestCase):
    def assertRefused(self, catalogue, text):
        with self.assertRaises(make_help.HelpError) as caught:
            make_help.Help(catalogue, prose(), '1.0.0.2')
        self.assertIn(text, str(caught.exception))

    def test_an_event_the_prose_does_not_describe(self):
        catalogue = copy.deepcopy(CATALOGUE)
        event(catalogue, 'ActDeleteKey')['routine'] = 'ActDeleteKeyTree'
        self.assertRefused(catalogue, 'prose has no [ActDeleteKeyTree]')

    def test_an_example_that_does_not_fit_the_parameters(self):
        catalogue = copy.deepcopy(CATALOGUE)
        event(catalogue, 'ActSetString')['params'].pop()
        self.assertRefused(catalogue, '[ActSetString] example gives 4 values for 3 parameters')

    def test_a_link_to_nowhere(self):
        notes = prose()
        notes['ActCreateKey']['does'] += ' See [[ActCreateKeys]].'
        with self.assertRaisesRegex(make_help.HelpError, 'link to "ActCreateKeys"'):
            with tempfile.TemporaryDirectory() as out:
                make_help.Help(CATALOGUE, notes, '1.0.0.2').write(out, STYLE)


class Rendering(unittest.TestCase):
    def pages(self, catalogue):
        with tempfile.TemporaryDirectory() as out:
            make_help.Help(catalogue, prose(), '1.0.0.2').write(out, STYLE)
            pages = {}
            for name in os.listdir(out):
                with open(os.path.join(out, name), encoding='utf-8') as f:
                    pages[name] = f.read()
            return pages

    def test_module_texts_are_escaped(self):
        catalogue = copy.deepcopy(CATALOGUE)
        odd = event(catalogue, 'CndValueExists')
        odd['menu'][-1] = 'Value <exists> & "set"'
        odd['text'] = '%o: <b>%2</b> & %0\\%1'
        odd['params'][2]['title'] = 'Name & <type>'
        page = self.pages(catalogue)['CndValueExists.html']
        self.assertIn('<h1>Value &lt;exists&gt; &amp; &quot;set&quot;</h1>', page)
        self.assertIn('<code>%o: &lt;b&gt;%2&lt;/b&gt; &amp; %0\\%1</code>', page)
        self.assertIn('<td class="title">Name &amp; &lt;type&gt;</td>', page)
        self.assertNotIn('<b>', page)

    def test_examples_read_as_the_event_sheet_and_the_expression_editor_show_them(self):
        pages = self.pages(CATALOGUE)
        self.assertIn('<code>Hivelet: value &quot;Player&quot; of key HKEY_CURRENT_USER\\'
                      '&quot;Software\\Hivelet Demo&quot; exists</code>',
                      pages['CndValueExists.html'])
        self.assertIn('<code>Set 64-bit mode to 1</code>', pages['ActSet64BitMode.html'])
        self.assertIn('<code>RegKeyDW(&quot;HKEY_CURRENT_USER&quot;, '
                      '&quot;Software\\Hivelet Demo&quot;, &quot;Volume&quot;)</code>',
                      pages['ExpGetDword.html'])

    def test_the_module_messages_and_version_reach_the_pages(self):
        catalogue = copy.deepcopy(CATALOGUE)
        catalogue['messages'][1]['text'] = 'Not a number.'
        pages = self.pages(catalogue)
        self.assertIn('<td class="message">Not a number.</td>', pages['errors.html'])
        self.assertIn('Hivelet-1.0.0.2.zip', pages['index.html'])


STYLE = os.path.join(ROOT, 'help', 'style.css')

if __name__ == '__main__':
    if len(sys.argv) < 2:
        sys.exit(__doc__.strip().splitlines()[2])
    with open(sys.argv.pop(1), encoding='utf-8') as f:
        CATALOGUE = json.load(f)
    unittest.main()
