#!/usr/bin/python3
"""Writes the sources of the help file Help/Hivelet.chm and compiles them with chmcmd.

Usage: make_help.py --catalogue CATALOGUE.json --prose prose.ini --style style.css
                    --version VERSION --out DIR [--chmcmd PATH --epoch SECONDS --chm FILE]

CATALOGUE.json is what `hivelet-host catalogue` read from the built module: its identity
strings, every event with its menu path, display text and parameters, and the messages of its
own error codes. prose.ini holds what the module cannot say about itself: the overview, what
each event does, the error codes it can leave and an example. The pages take every menu text,
display text and parameter title from the catalogue, so the help says what the editor shows.

DIR receives the HTML pages, the style sheet, the contents (Hivelet.hhc), the index
(Hivelet.hhk) and the project (Hivelet.hhp). With --chmcmd, the project is compiled and the
result, with its time stamps set from --epoch, is written to --chm.
"""

import argparse
import configparser
import html
import json
import os
import re
import shutil
import subprocess
import sys

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))
import chm_stamp  # noqa: E402  (found through the path set just above)

KINDS = ('condition', 'action', 'expression')
KIND_PAGES = {'condition': 'conditions.html', 'action': 'actions.html',
              'expression': 'expressions.html'}
KIND_TITLES = {'condition': 'Conditions', 'action': 'Actions', 'expression': 'Expressions'}
EVENT_COUNTS = {'condition': 5, 'action': 13, 'expression': 8}

# Parameter types of the catalogue, as an author meets them in the editor.
PARAM_TYPES = {
    1000: 'root key, chosen from a list',
    45: 'text',
    22: 'integer',
    3: 'text expression',
}
ROOT_KEY, INTEGER = 1000, 22

# The overview's sections, in the contents tree under the overview page.
OVERVIEW_SECTIONS = 'overview sections'


class HelpError(Exception):
    """The catalogue and the prose do not fit together."""


def esc(text):
    return html.escape(text, quote=True)


def page_of(event):
    return event['routine'] + '.html'


def event_title(event, events):
    """The menu text, with the popup when another event of its kind has the same text."""
    same = [e for e in events if e['kind'] == event['kind'] and e['menu'][-1] == event['menu'][-1]]
    if len(same) > 1:
        return '%s (%s)' % (event['menu'][-1], ', '.join(event['menu'][:-1]))
    return event['menu'][-1]


def anchor(text):
    return re.sub(r'[^a-z0-9]+', '-', text.lower()).strip('-')


class Help:
    def __init__(self, catalogue, prose, version):
        self.catalogue = catalogue
        self.prose = prose
        self.version = version
        self.events = catalogue['events']
        self.by_routine = {e['routine']: e for e in self.events}
        self.object_name = catalogue['object']['name']
        self.messages = {m['code']: m['text'] for m in catalogue['messages']}
        self.errors = self._read_errors()
        self.pages = {}  # file name -> HTML
        self._check()

    # ----- reading and checking the two sources

    def _read_errors(self):
        errors = {}
        for section in self.prose.sections():
            match = re.fullmatch(r'error (\d+)', section)
            if match:
                code = int(match.group(1))
                errors[code] = dict(self.prose[section])
        for code in self.messages:
            if code not in errors:
                raise HelpError('prose has no [error %d] for the module\'s own code' % code)
        return dict(sorted(errors.items()))

    def _check(self):
        for kind in KINDS:
            count = sum(1 for e in self.events if e['kind'] == kind)
            if count != EVENT_COUNTS[kind]:
                raise HelpError('the catalogue has %d %ss, not %d'
                                % (count, kind, EVENT_COUNTS[kind]))
        for event in self.events:
            routine = event['routine']
            if not self.prose.has_section(routine):
                raise HelpError('prose has no [%s]' % routine)
            section = self.prose[routine]
            for key in ('summary', 'does', 'example'):
                if key not in section:
                    raise HelpError('[%s] lacks %s' % (routine, key))
            for param in event['params']:
                if param['type'] not in PARAM_TYPES:
                    raise HelpError('%s: unknown parameter type %d' % (routine, param['type']))
            values = self.example_values(event)
            if len(values) != len(event['params']):
                raise HelpError('[%s] example gives %d values for %d parameters'
                                % (routine, len(values), len(event['params'])))
            for param, value in zip(event['params'], values):
                if param['type'] == INTEGER and not re.fullmatch(r'-?[0-9]+', value):
                    raise HelpError('[%s] example gives "%s" for an integer' % (routine, value))
            for code, _ in self.event_errors(event):
                if code not in self.errors:
                    raise HelpError('[%s] names error %d, which has no [error %d]'
                                    % (routine, code, code))
        known = set(self.by_routine) | {'overview', OVERVIEW_SECTIONS, 'errors', 'index'}
        known |= {'error %d' % code for code in self.errors}
        for section in self.prose.sections():
            if section not in known:
                raise HelpError('prose has [%s], which is no event of the module' % section)

    def example_values(self, event):
        text = self.prose[event['routine']]['example'].strip()
        return [v.strip() for v in text.split('|')] if text else []

    def event_errors(self, event):
        """(code, meaning) pairs of the event's errors entry, in the order written."""
        text = self.prose[event['routine']].get('errors', '').strip()
        pairs = []
        for line in text.splitlines():
            code, sep, meaning = line.partition(':')
            if not sep or not code.strip().isdigit():
                raise HelpError('[%s] errors: "%s" is not "code: meaning"'
                                % (event['routine'], line))
            pairs.append((int(code), meaning.strip()))
        return pairs

    # ----- text

    def inline(self, text):
        """Escapes a line of prose and turns `code` and [[target|text]] into HTML."""
        out = []
        for part in re.split(r'(`[^`]*`|\[\[[^\]]*\]\])', text):
            if part.startswith('`') and part.endswith('`') and len(part) > 1:
                out.append('<code>%s</code>' % esc(part[1:-1]))
            elif part.startswith('[[') and part.endswith(']]'):
                target, _, label = part[2:-2].partition('|')
                href, default = self.link(target)
                out.append('<a href="%s">%s</a>' % (esc(href), esc(label or default)))
            else:
                out.append(esc(part))
        return ''.join(out)

    def link(self, target):
        """The address and default text of a link: a routine name, an error code (error 2),
        a page name, or a section of the overview (index#views)."""
        if target in self.by_routine:
            event = self.by_routine[target]
            return page_of(event), event['menu'][-1]
        match = re.fullmatch(r'error (\d+)', target)
        if match and int(match.group(1)) in self.errors:
            return 'errors.html#error-%s' % match.group(1), 'error %s' % match.group(1)
        page, _, fragment = target.partition('#')
        sections = self.prose[OVERVIEW_SECTIONS]
        titles = {'index': self.object_name, 'errors': 'error codes'}
        titles.update({k + 's': KIND_TITLES[k].lower() for k in KINDS})
        if page in titles and not fragment:
            return page + '.html', titles[page]
        if page == 'index' and fragment in sections:
            return 'index.html#' + fragment, sections[fragment]
        raise HelpError('link to "%s", which is no page, event or error code' % target)

    def blocks(self, text):
        """Prose to HTML: paragraphs, "- " lists and "## Heading {#id}" headings, separated by
        blank lines."""
        out = []
        for block in re.split(r'\n\s*\n', text.strip()):
            lines = [line.strip() for line in block.strip().splitlines()]
            if not lines or not lines[0]:
                continue
            heading = re.fullmatch(r'(#{2,3}) (.*?)(?: \{#([a-z0-9-]+)\})?', lines[0])
            if heading and len(lines) == 1:
                level = len(heading.group(1))
                ident = heading.group(3) or anchor(heading.group(2))
                out.append('<h%d id="%s">%s</h%d>'
                           % (level, ident, self.inline(heading.group(2)), level))
            elif all(line.startswith('- ') for line in lines):
                items = ''.join('<li>%s</li>' % self.inline(line[2:]) for line in lines)
                out.append('<ul>%s</ul>' % items)
            else:
                out.append('<p>%s</p>' % self.inline(' '.join(lines)))
        return '\n'.join(out)

    # ----- what the editor shows

    def sheet_value(self, param, value):
        """A parameter value as the event sheet or an expression shows it."""
        if param['type'] in (ROOT_KEY, INTEGER):
            return value
        return '"%s"' % value

    def sentence(self, event, values):
        """The event with its parameters filled in, as the event sheet or the expression
        editor shows it."""
        shown = [self.sheet_value(p, v) for p, v in zip(event['params'], values)]
        if event['kind'] == 'expression':
            return event['text'] + ', '.join(shown) + ')'
        return re.sub(r'%([0-3o])',
                      lambda m: self.object_name if m.group(1) == 'o' else shown[int(m.group(1))],
                      event['text'])

    # ----- pages

    def page(self, name, title, body, crumbs=()):
        trail = ''
        if crumbs:
            trail = '<p class="path">%s</p>\n' % ' &gt; '.join(crumbs)
        self.pages[name] = (
            '<!DOCTYPE HTML PUBLIC "-//W3C//DTD HTML 4.01//EN" '
            '"http://www.w3.org/TR/html4/strict.dtd">\n'
            '<html>\n<head>\n'
            '<meta http-equiv="Content-Type" content="text/html; charset=utf-8">\n'
            '<title>%s</title>\n<link rel="stylesheet" type="text/css" href="style.css">\n'
            '</head>\n<body>\n%s%s\n<p class="footer">%s %s &middot; %s</p>\n</body>\n</html>\n'
            % (esc(title), trail, body, esc(self.object_name), esc(self.version),
               esc(self.catalogue['object']['copyright'])))

    def kind_link(self, kind):
        return '<a href="%s">%s</a>' % (KIND_PAGES[kind], KIND_TITLES[kind])

    def event_page(self, event):
        section = self.prose[event['routine']]
        kind = event['kind']
        crumbs = [self.kind_link(kind)] + [esc(p) for p in event['menu'][:-1]]
        body = ['<h1>%s</h1>' % esc(event['menu'][-1]),
                '<p class="summary">%s</p>' % self.inline(section['summary'])]
        if kind == 'expression':
            body.append('<h2>In an expression</h2>')
        else:
            body.append('<h2>In the event sheet</h2>')
        body.append('<p class="display"><code>%s</code></p>' % esc(event['text']))
        body.append('<p class="note">%s</p>' % self.display_note(event))
        body.append(self.params_table(event))
        body.append('<h2>What it does</h2>\n' + self.blocks(section['does']))
        body.append(self.errors_table(event))
        values = self.example_values(event)
        body.append('<h2>Example</h2>\n<p class="example"><code>%s</code></p>'
                    % esc(self.sentence(event, values)))
        if section.get('example_note', '').strip():
            body.append(self.blocks(section['example_note']))
        self.page(page_of(event), event_title(event, self.events), '\n'.join(body), crumbs)

    def display_note(self, event):
        """How the display text is read: its placeholders, or how an expression is written."""
        if event['kind'] == 'expression':
            if event['params']:
                return ('Write the name, then the arguments in the order below, separated by '
                        'commas, then a closing parenthesis.')
            return 'Write the name, then a closing parenthesis.'
        marks = []
        if event['params']:
            last = len(event['params']) - 1
            marks.append('%%0 stands for the parameter below' if last == 0 else
                         '%%0 to %%%d stand for the parameters below' % last)
        if '%o' in event['text']:
            marks.append('%o for the object\'s name')
        if not marks:
            return 'The event sheet shows this text as it is.'
        return ', '.join(marks) + '.'

    def params_table(self, event):
        if not event['params']:
            return '<p>It takes no %s.</p>' % (
                'arguments' if event['kind'] == 'expression' else 'parameters')
        rows = []
        for index, param in enumerate(event['params']):
            place = '%%%d' % index if event['kind'] != 'expression' else str(index + 1)
            rows.append('<tr class="param"><td>%s</td><td class="title">%s</td>'
                        '<td class="type">%s</td></tr>'
                        % (place, esc(param['title']), PARAM_TYPES[param['type']]))
        heading = 'Arguments' if event['kind'] == 'expression' else 'Parameters'
        first = 'Argument' if event['kind'] == 'expression' else 'In the text'
        return ('<h2>%s</h2>\n<table class="params">\n'
                '<tr><th>%s</th><th>Title</th><th>Type</th></tr>\n%s\n</table>'
                % (heading, first, '\n'.join(rows)))

    def errors_table(self, event):
        pairs = self.event_errors(event)
        out = ['<h2>Error codes</h2>']
        if not pairs:
            if event['kind'] == 'condition':
                out.append('<p>A condition never changes the <a href="index.html#error-state">'
                           'error state</a>: the last error code stays what the last action or '
                           'value reader left.</p>')
            else:
                out.append('<p>It leaves the <a href="index.html#error-state">error state</a> '
                           'as it was.</p>')
            return '\n'.join(out)
        out.append('<p>It replaces the <a href="index.html#error-state">error state</a> with '
                   'its own outcome:</p>\n<table class="errors">\n'
                   '<tr><th>Code</th><th>When</th></tr>')
        for code, meaning in pairs:
            out.append('<tr><td><a href="errors.html#error-%d">%d</a></td><td>%s</td></tr>'
                       % (code, code, self.inline(meaning)))
        out.append('</table>')
        return '\n'.join(out)

    def kind_page(self, kind):
        events = [e for e in self.events if e['kind'] == kind]
        body = ['<h1>%s</h1>' % KIND_TITLES[kind],
                self.blocks(self.prose['overview'][kind + 's'])]
        group = None
        rows = []
        for event in events:
            popup = ' > '.join(event['menu'][:-1])
            if popup != group:
                if rows:
                    rows.append('</table>')
                group = popup
                if popup:
                    rows.append('<h2 id="%s">%s</h2>' % (anchor(popup), esc(popup)))
                rows.append('<table class="events">')
            rows.append('<tr><td class="name"><a href="%s">%s</a></td><td>%s</td></tr>'
                        % (page_of(event), esc(event['menu'][-1]),
                           self.inline(self.prose[event['routine']]['summary'])))
        rows.append('</table>')
        body.extend(rows)
        self.page(KIND_PAGES[kind], KIND_TITLES[kind], '\n'.join(body))

    def overview_page(self):
        section = self.prose['overview']
        obj = self.catalogue['object']
        body = ['<h1>%s</h1>' % esc(obj['name']),
                '<p class="summary">%s</p>' % esc(obj['description']),
                '<p>Version %s, by %s.</p>' % (esc(self.version), esc(obj['maker']))]
        text = section['body'].replace('@VERSION@', self.version)
        body.append(self.blocks(text.replace('@HELP_FILE@', self.catalogue['helpFile'])))
        self.page('index.html', obj['name'], '\n'.join(body))

    def errors_page(self):
        body = ['<h1>Error codes</h1>', self.blocks(self.prose['errors']['intro']),
                '<h2 id="own">The module\'s own codes</h2>',
                '<table class="errors">',
                '<tr><th>Code</th><th>Message</th><th>Meaning</th></tr>']
        for code, entry in self.errors.items():
            if code in self.messages:
                body.append('<tr id="error-%d"><td>%d</td><td class="message">%s</td><td>%s</td>'
                            '</tr>' % (code, code, esc(self.messages[code]),
                                       self.inline(entry['meaning'])))
        body += ['</table>', '<h2 id="system">Codes from Windows</h2>',
                 self.blocks(self.prose['errors']['system']),
                 '<table class="errors">',
                 '<tr><th>Code</th><th>Name in Windows</th><th>Meaning here</th></tr>']
        for code, entry in self.errors.items():
            if code not in self.messages:
                body.append('<tr id="error-%d"><td>%d</td><td><code>%s</code></td><td>%s</td>'
                            '</tr>' % (code, code, esc(entry.get('name', '')),
                                       self.inline(entry['meaning'])))
        body.append('</table>')
        self.page('errors.html', 'Error codes', '\n'.join(body))

    # ----- contents and index

    def contents(self):
        """The contents tree: overview with its sections, each kind with its popups and
        events in menu order, the error codes."""
        def item(name, local, children=None):
            return (name, local, children or [])

        overview = [item(title, 'index.html#' + ident)
                    for ident, title in self.prose[OVERVIEW_SECTIONS].items()]
        tree = [item(self.object_name, 'index.html', overview)]
        for kind in KINDS:
            children = []
            groups = {}
            for event in (e for e in self.events if e['kind'] == kind):
                leaf = item(event['menu'][-1], page_of(event))
                siblings = children
                for depth in range(len(event['menu']) - 1):
                    popup = tuple(event['menu'][:depth + 1])
                    if popup not in groups:
                        groups[popup] = item(popup[-1], '%s#%s' % (KIND_PAGES[kind],
                                                                   anchor(' > '.join(popup))))
                        siblings.append(groups[popup])
                    siblings = groups[popup][2]
                siblings.append(leaf)
            tree.append(item(KIND_TITLES[kind], KIND_PAGES[kind], children))
        tree.append(item('Error codes', 'errors.html'))
        return sitemap(tree)

    def index(self):
        """The index: every event's menu text, every expression's name, the error codes and
        the keywords of the prose's [index], sorted without regard to case."""
        entries = {}

        def add(keyword, title, local):
            entries.setdefault(keyword, [])
            if (title, local) not in entries[keyword]:
                entries[keyword].append((title, local))

        for event in self.events:
            title = event_title(event, self.events)
            add(event['menu'][-1], title, page_of(event))
            if event['kind'] == 'expression':
                add(event['text'].rstrip('('), title, page_of(event))
        for code, entry in self.errors.items():
            add('error %d' % code, 'Error %d' % code, 'errors.html#error-%d' % code)
        for keyword, target in self.prose['index'].items():
            add(keyword, keyword, self.link(target)[0])
        ordered = sorted(entries.items(), key=lambda kv: (kv[0].lower(), kv[0]))
        lines = []
        for keyword, topics in ordered:
            # One topic: the keyword and its page. Several: each with the title that the
            # viewer's list of topics shows.
            params = '<param name="Name" value="%s">' % esc(keyword)
            for title, local in topics:
                if len(topics) > 1:
                    params += '<param name="Name" value="%s">' % esc(title)
                params += '<param name="Local" value="%s">' % esc(local)
            lines.append('<LI><OBJECT type="text/sitemap">%s</OBJECT>' % params)
        return SITEMAP_HEAD + '<UL>\n%s\n</UL>\n</BODY></HTML>\n' % '\n'.join(lines)

    def project(self, files):
        return ('[OPTIONS]\r\nCompatibility=1.1 or later\r\nCompiled file=Hivelet.chm\r\n'
                'Contents file=Hivelet.hhc\r\nIndex file=Hivelet.hhk\r\n'
                'Default topic=index.html\r\nDisplay compile progress=No\r\n'
                'Full-text search=Yes\r\nBinary Index=No\r\nBinary TOC=No\r\n'
                'Language=0x409 English (United States)\r\nTitle=%s Help\r\n\r\n'
                '[FILES]\r\n%s\r\n' % (self.object_name, '\r\n'.join(files)))

    def write(self, out, style):
        self.overview_page()
        for kind in KINDS:
            self.kind_page(kind)
        for event in self.events:
            self.event_page(event)
        self.errors_page()
        if os.path.exists(os.path.join(out, 'Hivelet.hhp')):
            shutil.rmtree(out)  # the pages of an earlier run, which may have other names
        os.makedirs(out, exist_ok=True)
        for name, text in self.pages.items():
            write_text(os.path.join(out, name), text)
        shutil.copyfile(style, os.path.join(out, 'style.css'))
        write_text(os.path.join(out, 'Hivelet.hhc'), self.contents())
        write_text(os.path.join(out, 'Hivelet.hhk'), self.index())
        files = sorted(self.pages) + ['style.css']
        write_text(os.path.join(out, 'Hivelet.hhp'), self.project(files))


SITEMAP_HEAD = ('<!DOCTYPE HTML PUBLIC "-//IETF//DTD HTML//EN">\n<HTML>\n<HEAD>\n'
                '<meta name="GENERATOR" content="Hivelet help generator">\n</HEAD>\n<BODY>\n')
# The contents tree with lines and buttons, as the viewer draws a book tree.
TREE_STYLE = ('<OBJECT type="text/site properties"><param name="Window Styles" '
              'value="0x800025"></OBJECT>\n')


def sitemap(tree):
    def items(nodes, depth):
        pad = '  ' * depth
        out = [pad + '<UL>']
        for name, local, children in nodes:
            out.append('%s<LI><OBJECT type="text/sitemap"><param name="Name" value="%s">'
                       '<param name="Local" value="%s"></OBJECT>' % (pad, esc(name), esc(local)))
            if children:
                out.extend(items(children, depth + 1))
        out.append(pad + '</UL>')
        return out
    return SITEMAP_HEAD + TREE_STYLE + '\n'.join(items(tree, 0)) + '\n</BODY></HTML>\n'


def write_text(path, text):
    with open(path, 'w', encoding='utf-8', newline='\n') as f:
        f.write(text)


def read_prose(path):
    prose = configparser.ConfigParser(interpolation=None, delimiters=('=',),
                                      comment_prefixes=(';',), empty_lines_in_values=True)
    prose.optionxform = str  # keys keep their case: they are routine names and anchors
    with open(path, encoding='utf-8') as f:
        prose.read_file(f)
    return prose


def compile_chm(chmcmd, out, epoch, chm):
    built = os.path.join(out, 'Hivelet.chm')
    if os.path.exists(built):
        os.remove(built)
    result = subprocess.run([chmcmd, '--no-html-scan', 'Hivelet.hhp'], cwd=out,
                            stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True)
    if result.returncode != 0 or not os.path.exists(built):
        raise HelpError('chmcmd failed:\n' + result.stdout)
    chm_stamp.stamp(built, epoch)
    os.makedirs(os.path.dirname(os.path.abspath(chm)), exist_ok=True)
    shutil.copyfile(built, chm)


def main(argv):
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument('--catalogue', required=True)
    parser.add_argument('--prose', required=True)
    parser.add_argument('--style', required=True)
    parser.add_argument('--version', required=True)
    parser.add_argument('--out', required=True)
    parser.add_argument('--chmcmd')
    parser.add_argument('--epoch', type=int, default=0)
    parser.add_argument('--chm')
    args = parser.parse_args(argv)
    try:
        with open(args.catalogue, encoding='utf-8') as f:
            catalogue = json.load(f)
        Help(catalogue, read_prose(args.prose), args.version).write(args.out, args.style)
        if args.chmcmd:
            compile_chm(args.chmcmd, args.out, args.epoch, args.chm)
    except (HelpError, OSError, ValueError, KeyError, configparser.Error) as e:
        print('make_help: %s' % e, file=sys.stderr)
        return 1
    return 0


if __name__ == '__main__':
    sys.exit(main(sys.argv[1:]))
