#!/usr/bin/python3
"""Checks the compiled help file as an author's help viewer reads it.

Usage: check_help.py Hivelet.chm CATALOGUE.json

Unpacks the file with extract_chmLib (Debian's libchm-bin) and checks it against the module's
catalogue, as the built hivelet-host read it from the module:
- one page per event, headed by the event's menu text under its menu path, with the event's
  exact display text and each parameter's title and type in order;
- the contents tree: the overview, the three kinds with every event once under its menu's
  popups, the error codes; every page of the file is in it;
- the index: every event's menu text and every expression's name lead to the event's page;
- every link of every page, contents entry and index entry resolves, anchors included;
- the #SYSTEM entries through which the viewer finds the contents, the index and the first page.
Prints one line per failed check and a closing count; exits 1 when a check failed.
"""

import html.parser
import json
import os
import struct
import subprocess
import sys
import tempfile

EVENT_COUNTS = {'condition': 5, 'action': 13, 'expression': 8}
KIND_TITLES = {'condition': 'Conditions', 'action': 'Actions', 'expression': 'Expressions'}
# What an author is told each parameter type is.
TYPE_WORDS = {1000: 'root key, chosen from a list', 45: 'text', 22: 'integer',
              3: 'text expression'}
VOID = {'meta', 'link', 'br', 'img', 'hr', 'param', 'input'}

failures = []


def check(condition, message):
    if not condition:
        failures.append(message)
    return condition


class Element:
    def __init__(self, tag, attrs, parent):
        self.tag, self.attrs, self.parent = tag, dict(attrs), parent
        self.children, self.parts = [], []

    @property
    def text(self):
        return ''.join(self.parts)

    def classes(self):
        return self.attrs.get('class', '').split()


class Page(html.parser.HTMLParser):
    """A page as a tree of elements, each with its whole text."""

    def __init__(self, text):
        super().__init__(convert_charrefs=True)
        self.root = Element('document', [], None)
        self.open = [self.root]
        self.elements = []
        self.feed(text)
        self.close()

    def handle_starttag(self, tag, attrs):
        element = Element(tag, attrs, self.open[-1])
        self.open[-1].children.append(element)
        self.elements.append(element)
        if tag not in VOID:
            self.open.append(element)

    def handle_endtag(self, tag):
        while len(self.open) > 1:
            if self.open.pop().tag == tag:
                break

    def handle_data(self, data):
        for element in self.open:
            element.parts.append(data)

    def find(self, tag, cls=None):
        return [e for e in self.elements
                if e.tag == tag and (cls is None or cls in e.classes())]

    def first_text(self, tag, cls=None):
        found = self.find(tag, cls)
        return found[0].text.strip() if found else None


class Sitemap(html.parser.HTMLParser):
    """A contents (.hhc) or index (.hhk) file: nodes of (names, locals, children)."""

    def __init__(self, text):
        super().__init__(convert_charrefs=True)
        self.top = []
        self.lists = []  # the lists open now; a nested list holds the last node's children
        self.current = None
        self.feed(text)
        self.close()

    def handle_starttag(self, tag, attrs):
        attrs = dict(attrs)
        if tag == 'ul':
            if not self.lists:
                self.lists.append(self.top)
            elif self.lists[-1]:
                self.lists.append(self.lists[-1][-1]['children'])
            else:
                self.lists.append(self.lists[-1])
        elif tag == 'object' and attrs.get('type') == 'text/sitemap':
            self.current = {'names': [], 'locals': [], 'children': []}
        elif tag == 'param' and self.current is not None:
            key = {'name': 'names', 'local': 'locals'}.get(attrs.get('name', '').lower())
            if key:
                self.current[key].append(attrs.get('value', ''))

    def handle_endtag(self, tag):
        if tag == 'ul' and self.lists:
            self.lists.pop()
        elif tag == 'object' and self.current is not None:
            (self.lists[-1] if self.lists else self.top).append(self.current)
            self.current = None


def walk(nodes, path=()):
    for node in nodes:
        yield path + (node['names'][0],), node
        yield from walk(node['children'], path + (node['names'][0],))


def unpack(chm, out):
    result = subprocess.run(['extract_chmLib', chm, out], stdout=subprocess.PIPE,
                            stderr=subprocess.STDOUT, text=True)
    if result.returncode != 0:
        sys.exit('check_help: extract_chmLib failed:\n' + result.stdout)
    files = {}
    for folder, _, names in os.walk(out):
        for name in names:
            path = os.path.join(folder, name)
            files[os.path.relpath(path, out).replace(os.sep, '/')] = path
    return files


def read(path):
    with open(path, 'rb') as f:
        return f.read()


def system_entries(data):
    """#SYSTEM: a format version, then (code, length, data) records."""
    entries, pos = {}, 4
    while pos + 4 <= len(data):
        code, length = struct.unpack_from('<HH', data, pos)
        entries[code] = data[pos + 4:pos + 4 + length]
        pos += 4 + length
    return entries


def check_event_pages(events, pages):
    """Each event has exactly one page; returns the page file of each routine."""
    event_pages = {name: p for name, p in pages.items() if p.find('p', 'display')}
    check(len(event_pages) == sum(EVENT_COUNTS.values()),
          '%d pages describe an event, not %d' % (len(event_pages), sum(EVENT_COUNTS.values())))
    found = {}
    for event in events:
        where = '%s %s (%s)' % (event['kind'], event['code'], event['routine'])
        crumbs = [KIND_TITLES[event['kind']]] + event['menu'][:-1]
        matches = [name for name, p in event_pages.items()
                   if p.first_text('h1') == event['menu'][-1]
                   and p.first_text('p', 'path') == ' > '.join(crumbs)
                   and p.first_text('p', 'display') == event['text']]
        if not check(len(matches) == 1, '%s: %d pages with its menu path and display text %r'
                     % (where, len(matches), event['text'])):
            continue
        page = event_pages[matches[0]]
        found[event['routine']] = matches[0]
        rows = [[c.text.strip() for c in row.children if c.tag == 'td']
                for row in page.find('tr', 'param')]
        place = (lambda i: str(i + 1)) if event['kind'] == 'expression' else (lambda i: '%%%d' % i)
        expected = [[place(i), p['title'], TYPE_WORDS.get(p['type'], '?')]
                    for i, p in enumerate(event['params'])]
        check(rows == expected, '%s: parameters %r, expected %r' % (where, rows, expected))
        check(page.first_text('title'), '%s: the page has no title' % where)
    return found


def check_contents(catalogue, contents, found, html_files):
    tree = Sitemap(contents).top
    names = [node['names'][0] for node in tree]
    expected = [catalogue['object']['name'], 'Conditions', 'Actions', 'Expressions',
                'Error codes']
    check(names == expected, 'contents: top level %r, expected %r' % (names, expected))
    entries = list(walk(tree))
    for event in catalogue['events']:
        page = found.get(event['routine'])
        path = (KIND_TITLES[event['kind']],) + tuple(event['menu'])
        at = [node['locals'] for p, node in entries if p == path]
        check(at == [[page]], 'contents: %s is %r, expected once, at %s' % (
            ' > '.join(path), at, page))
    listed = {local.split('#')[0] for _, node in entries for local in node['locals']}
    for name in html_files:
        check(name in listed, 'contents: page %s is not in the tree' % name)
    return [local for _, node in entries for local in node['locals']]


def check_index(catalogue, index, found):
    entries = Sitemap(index).top
    keywords = {}
    for node in entries:
        keywords.setdefault(node['names'][0], []).extend(node['locals'])
    order = [node['names'][0].lower() for node in entries]
    check(order == sorted(order), 'index: keywords are not in alphabetical order')
    for event in catalogue['events']:
        page = found.get(event['routine'])
        words = [event['menu'][-1]]
        if event['kind'] == 'expression':
            words.append(event['text'].rstrip('('))
        for word in words:
            check(page in keywords.get(word, []), 'index: "%s" does not lead to %s' % (word, page))
    return [local for node in entries for local in node['locals']]


def check_links(pages, files, extra):
    ids = {name: {e.attrs['id'] for e in p.elements if 'id' in e.attrs}
           for name, p in pages.items()}

    def resolves(source, target):
        if ':' in target.split('#')[0]:
            return check(False, '%s: link to %s outside the help file' % (source, target))
        name, _, fragment = target.partition('#')
        name = name or source
        if not check(name in files, '%s: link to missing %s' % (source, target)):
            return
        if fragment:
            check(fragment in ids.get(name, set()),
                  '%s: link to %s, which has no #%s' % (source, target, fragment))

    for name, page in pages.items():
        for element in page.elements:
            if element.tag in ('a', 'link') and 'href' in element.attrs:
                resolves(name, element.attrs['href'])
    for source, target in extra:
        resolves(source, target)


def main(argv):
    if len(argv) != 2:
        sys.exit(__doc__.strip().splitlines()[2])
    chm, catalogue_path = argv
    with open(catalogue_path, encoding='utf-8') as f:
        catalogue = json.load(f)
    for kind, count in EVENT_COUNTS.items():
        check(sum(1 for e in catalogue['events'] if e['kind'] == kind) == count,
              'the catalogue does not have %d %ss' % (count, kind))
    with tempfile.TemporaryDirectory() as out:
        files = unpack(chm, out)
        html_files = sorted(n for n in files if n.endswith('.html'))
        pages = {n: Page(read(files[n]).decode('utf-8')) for n in html_files}
        found = check_event_pages(catalogue['events'], pages)

        system = system_entries(read(files['#SYSTEM']))
        wanted = {0: b'Hivelet.hhc\0', 1: b'Hivelet.hhk\0', 2: b'index.html\0'}
        for code, value in wanted.items():
            check(system.get(code) == value,
                  '#SYSTEM entry %d is %r, not %r' % (code, system.get(code), value))
        check(system.get(3, b'').startswith(catalogue['object']['name'].encode()),
              '#SYSTEM: the window title does not name the object')

        contents = check_contents(catalogue, read(files['Hivelet.hhc']).decode('utf-8'), found,
                                  html_files)
        index = check_index(catalogue, read(files['Hivelet.hhk']).decode('utf-8'), found)
        check_links(pages, set(files), [('Hivelet.hhc', t) for t in contents]
                    + [('Hivelet.hhk', t) for t in index])
    for message in failures:
        print('FAILED: ' + message)
    print('%d pages, %d events: %d failed checks' % (len(pages), len(found), len(failures)))
    return 1 if failures else 0


if __name__ == '__main__':
    sys.exit(main(sys.argv[1:]))
