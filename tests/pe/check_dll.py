#!/usr/bin/python3
"""Static checks of the shipped 32-bit module's bytes.

Usage: /usr/bin/python3 tests/pe/check_dll.py PATH/Hivelet.hzx

Checks the PE headers, the export directory against the fixed name/ordinal table and against
module/resources/Hivelet.def, the imported libraries, and the exact content of every resource.
The expected texts below are a second copy kept apart from Hivelet.rc on purpose: the checks
must compare the compiled file with something that the resource script did not produce.
Prints one line per check and a closing "N passed, M failed"; exits 1 when any check failed.
"""

import hashlib
import os
import struct
import sys

import pefile

HERE = os.path.dirname(os.path.abspath(__file__))
ROOT = os.path.normpath(os.path.join(HERE, '..', '..'))
DEF_PATH = os.path.join(ROOT, 'module', 'resources', 'Hivelet.def')

MODULE_NAME = 'Hivelet.hzx'
LANG_EN_US = 1033

# Every name the host may look up, with its fixed ordinal.
EXPORT_ORDINALS = {
    'GetInfos': 2, 'LoadObject': 6, 'UnloadObject': 7, 'PutObject': 8, 'RemoveObject': 9,
    'CreateObject': 14, 'GetHelpFileName': 16, 'GetObjectRect': 19, 'IsTransparent': 21,
    'PrepareToWriteObject': 22, 'UpdateFileNames': 23, 'Initialize': 25, 'Free': 26,
    'UsesFile': 30, 'CreateFromFile': 31, 'DuplicateObject': 32, 'GetObjInfos': 36,
    'GetTextCaps': 37, 'GetTextAlignment': 38, 'SetTextAlignment': 39, 'GetTextFont': 40,
    'SetTextFont': 41, 'GetTextClr': 42, 'SetTextClr': 43, 'GetDependencies': 44,
    'GetFilters': 45, 'CreateRunObject': 50, 'DestroyRunObject': 51, 'HandleRunObject': 52,
    'DisplayRunObject': 53, 'PauseRunObject': 57, 'ContinueRunObject': 58,
    'GetRunObjectInfos': 59, 'GetConditionMenu': 60, 'GetActionMenu': 61,
    'GetExpressionMenu': 62, 'GetConditionCodeFromMenu': 63, 'GetActionCodeFromMenu': 64,
    'GetExpressionCodeFromMenu': 65, 'GetConditionString': 66, 'GetActionString': 67,
    'GetExpressionString': 68, 'InitParameter': 69, 'EditParameter': 70,
    'GetParameterString': 71, 'GetConditionTitle': 72, 'GetActionTitle': 73,
    'GetExpressionTitle': 74, 'GetConditionInfos': 75, 'GetActionInfos': 76,
    'GetExpressionInfos': 77, 'UpdateEditStructure': 78, 'GetRunObjectDataSize': 80,
    'StartApp': 85, 'EndApp': 86, 'StartFrame': 87, 'EndFrame': 88, 'GetExpressionParam': 89,
    'GetProperties': 100, 'ReleaseProperties': 101, 'GetPropValue': 102, 'SetPropValue': 103,
    'IsPropEnabled': 104, 'GetPropCheck': 105, 'SetPropCheck': 106, 'GetPropCreateParam': 107,
    'ReleasePropCreateParam': 108, 'EditProp': 109, 'GetDebugTree': 110, 'GetDebugItem': 111,
    'EditDebugItem': 112, 'SaveRunObject': 113, 'LoadRunObject': 114,
}
assert len(EXPORT_ORDINALS) == 73

SYSTEM_DLLS = {'kernel32.dll', 'user32.dll', 'advapi32.dll', 'msvcrt.dll'}

STRINGS = {
    1: 'HZ2',
    2: 'Hivelet',
    128: 'Hivelet',
    129: 'The Hivelet developers',
    130: 'Copyright (C) 2026 The Hivelet developers',
    131: 'The Hivelet object allows you to retrieve or write values from or to the registry.',
    132: 'https://hivelet.invalid/',
    1000: 'Root key',
    1001: 'Key name',
    1002: 'Value name',
    1003: 'Current Root Key = %s',
    1004: 'Current Key = %s',
    1005: 'Invalid parameters.',
    1006: 'The value you try to read from is not a DWORD value.',
    1007: 'The value you try to read from is not a string value.',
    1008: '0=32-bit, 1=64-bit',
    5000: 'Set root key to %0',
    5001: 'Set current key to %0',
    5002: 'Set value %0 of current key to %1',
    5003: 'Set value %0 of current key to %1',
    5004: 'Set value %2 of key %0\\%1 to %3',
    5005: 'Set value %2 of key %0\\%1 to %3',
    5006: 'Delete current key',
    5007: 'Delete value %0 of current key',
    5008: 'Delete key %0\\%1',
    5009: 'Delete value %2 of key %0\\%1',
    5010: 'Create current key',
    5011: 'Create key %0\\%1',
    5012: 'Set 64-bit mode to %0',
    6000: '%o: key %0\\%1 exists',
    6001: '%o: value %2 of key %0\\%1 exists',
    6002: '%o: current key exists',
    6003: '%o: value %0 of current key exists',
    6004: '%o: last action successful',
    7000: 'RegCurRootKey$(',
    7001: 'RegCurKey$(',
    7002: 'RegCurKeyDW(',
    7003: 'RegCurKeySZ$(',
    7004: 'RegKeyDW(',
    7005: 'RegKeySZ$(',
    7006: 'RegErrCode(',
    7007: 'RegErrText$(',
}

SEPARATOR = ('separator',)


# A plain enabled menu item.
def item(text, command):
    return ('item', text, command, 0)


# A plain popup item and the items it opens.
def popup(text, children):
    return ('popup', text, 0, children)


# Each menu: one nameless popup around the items the editor is shown.
MENUS = {
    20000: [popup('', [
        popup('Current Key', [
            item('Set Current Root Key', 25000), item('Set Current Key', 25001), SEPARATOR,
            item('Create Current Key', 25010), SEPARATOR,
            item('Set DWORD Value', 25002), item('Set String Value', 25003), SEPARATOR,
            item('Delete Current Key', 25006), item('Delete Value', 25007)]),
        popup('Any Key', [
            item('Create Key', 25011), SEPARATOR,
            item('Set DWORD Value', 25004), item('Set String Value', 25005), SEPARATOR,
            item('Delete Key', 25008), item('Delete Value', 25009)]),
        item('Set 64-bit mode', 25012)])],
    20001: [popup('', [
        item('Current key exists', 26002), item('Value exists in current key', 26003),
        SEPARATOR, item('Key exists', 26000), item('Value exists', 26001), SEPARATOR,
        item('Last action successful', 26004)])],
    20002: [popup('', [
        popup('Current Key', [
            item('Get Current Root Key', 27000), item('Get Current Key', 27001), SEPARATOR,
            item('Get DWORD Value', 27002), item('Get String Value', 27003)]),
        popup('Any Key', [item('Get DWORD Value', 27004), item('Get String Value', 27005)]),
        SEPARATOR,
        item('Last error code', 27006), item('Last error message', 27007)])],
}

BUTTON_CLASS, LISTBOX_CLASS = ('ordinal', 0x0080), ('ordinal', 0x0083)
DIALOG_ID = 101
DIALOG = {
    'style': 0x80C800C0, 'exstyle': 0, 'x': 0, 'y': 0, 'cx': 186, 'cy': 90,
    'menu': '', 'class': '', 'caption': 'Select a root key',  # one zero word: none, default
    'font': (8, 'Tahoma'),
}
DIALOG_CONTROLS = [
    {'style': 0x50010001, 'exstyle': 0, 'x': 129, 'y': 7, 'cx': 50, 'cy': 14, 'id': 1,
     'class': BUTTON_CLASS, 'text': 'OK', 'extra': b''},
    {'style': 0x50010000, 'exstyle': 0, 'x': 129, 'y': 24, 'cx': 50, 'cy': 14, 'id': 2,
     'class': BUTTON_CLASS, 'text': 'Cancel', 'extra': b''},
    {'style': 0x50A10101, 'exstyle': 0, 'x': 7, 'y': 7, 'cx': 109, 'cy': 76, 'id': 1001,
     'class': LISTBOX_CLASS, 'text': '', 'extra': b''},
]

BITMAP_IDS = (400, 401)
RAW_DATA = {200: bytes((0x16, 0x25, 0x08, 0x59))}

VERSION_FIXED = {
    'Signature': 0xFEEF04BD, 'StrucVersion': 0x00010000,
    'FileVersionMS': 0x00010000, 'FileVersionLS': 0x00000002,
    'ProductVersionMS': 0x00010000, 'ProductVersionLS': 0x00000002,
    'FileFlagsMask': 0, 'FileFlags': 0x20, 'FileOS': 0x00010001, 'FileType': 1,
    'FileSubtype': 0, 'FileDateMS': 0, 'FileDateLS': 0,
}
VERSION_STRING_TABLE = '040904E4'
VERSION_STRINGS = [
    ('Comments', ''),
    ('CompanyName', 'The Hivelet developers'),
    ('FileDescription', 'Hivelet Object'),
    ('FileVersion', '2.02'),
    ('InternalName', 'Hivelet'),
    ('LegalCopyright', 'Copyright (C) 2026 The Hivelet developers'),
    ('LegalTrademarks', ''),
    ('OriginalFilename', 'Hivelet.hzx'),
    ('PrivateBuild', ''),
    ('ProductName', ''),
    ('ProductVersion', '1, 0, 0, 2'),
    ('SpecialBuild', '00000002'),
]
VERSION_TRANSLATION = struct.pack('<HH', 0x0409, 1252)

RT_BITMAP, RT_MENU, RT_DIALOG, RT_STRING, RT_RCDATA, RT_VERSION = 2, 4, 5, 6, 10, 16
MF_POPUP, MF_END = 0x0010, 0x0080
DS_SETFONT = 0x40


class BadResource(Exception):
    pass


# Style words and other flag sets read best in hex.
def shown(value):
    return '0x%X' % value if isinstance(value, int) and value > 0xFFFF else repr(value)


# Collects the outcome of each check and prints it as one line.
class Report:
    def __init__(self):
        self.passed = 0
        self.failed = 0

    def check(self, name, ok, detail=''):
        if ok:
            self.passed += 1
            print('PASS ' + name)
        else:
            self.failed += 1
            print('FAIL ' + name + (': ' + detail if detail else ''))
        return ok

    def equal(self, name, got, want):
        if isinstance(got, dict) and isinstance(want, dict):
            keys = sorted(set(got) | set(want))
            detail = ', '.join('%s got %s want %s' % (k, shown(got.get(k)), shown(want.get(k)))
                               for k in keys if got.get(k) != want.get(k))
        else:
            detail = 'got %r, want %r' % (got, want)
        return self.check(name, got == want, detail)


# A zero-terminated UTF-16 string at pos; returns it and the position after the terminator.
def read_sz(data, pos):
    end = pos
    while True:
        if end + 2 > len(data):
            raise BadResource('unterminated string at %d' % pos)
        if data[end:end + 2] == b'\0\0':
            return data[pos:end].decode('utf-16-le'), end + 2
        end += 2


# A template field that is either 0xFFFF and an ordinal, or a zero-terminated string.
def read_sz_or_ordinal(data, pos):
    if struct.unpack_from('<H', data, pos)[0] == 0xFFFF:
        return ('ordinal', struct.unpack_from('<H', data, pos + 2)[0]), pos + 4
    return read_sz(data, pos)


# Template parts start on 32-bit boundaries.
def align4(pos):
    return (pos + 3) & ~3


# Texts of one string block: 16 entries, each a WORD length and that many UTF-16 units.
def parse_string_block(block_id, data):
    texts, pos = {}, 0
    for index in range(16):
        if pos + 2 > len(data):
            raise BadResource('block %d ends inside entry %d' % (block_id, index))
        length = struct.unpack_from('<H', data, pos)[0]
        text = data[pos + 2:pos + 2 + 2 * length]
        if len(text) != 2 * length:
            raise BadResource('block %d: entry %d runs past the block' % (block_id, index))
        if length:
            texts[(block_id - 1) * 16 + index] = text.decode('utf-16-le')
        pos += 2 + 2 * length
    if any(data[pos:]):
        raise BadResource('block %d: data after its 16 entries' % block_id)
    return texts


# One level of a MENU template up to the item flagged MF_END; returns the nodes and position.
def parse_menu_items(data, pos):
    nodes = []
    while True:
        if pos + 2 > len(data):
            raise BadResource('menu level has no item flagged as the last one')
        flags = struct.unpack_from('<H', data, pos)[0]
        pos += 2
        if flags & MF_POPUP:
            text, pos = read_sz(data, pos)
            children, pos = parse_menu_items(data, pos)
            nodes.append(('popup', text, flags & ~(MF_POPUP | MF_END), children))
        else:
            command = struct.unpack_from('<H', data, pos)[0]
            text, pos = read_sz(data, pos + 2)
            other = flags & ~MF_END
            if other == 0 and command == 0 and text == '':
                nodes.append(SEPARATOR)
            else:
                nodes.append(('item', text, command, other))
        if flags & MF_END:
            return nodes, pos


# The tree of a classic MENU template (header: version 0, header size 0).
def parse_menu(data):
    version, header_size = struct.unpack_from('<HH', data, 0)
    if (version, header_size) != (0, 0):
        raise BadResource('not a classic menu template (%d, %d)' % (version, header_size))
    nodes, pos = parse_menu_items(data, 4)
    if any(data[pos:]):
        raise BadResource('data after the last top-level item')
    return nodes


# Header fields and controls of a classic DIALOG template.
def parse_dialog(data):
    if data[:4] == b'\x01\x00\xff\xff':
        raise BadResource('an extended (DIALOGEX) template')
    style, exstyle, count, x, y, cx, cy = struct.unpack_from('<IIHhhhh', data, 0)
    header = {'style': style, 'exstyle': exstyle, 'x': x, 'y': y, 'cx': cx, 'cy': cy}
    header['menu'], pos = read_sz_or_ordinal(data, 18)
    header['class'], pos = read_sz_or_ordinal(data, pos)
    header['caption'], pos = read_sz(data, pos)
    header['font'] = None
    if style & DS_SETFONT:
        points = struct.unpack_from('<H', data, pos)[0]
        face, pos = read_sz(data, pos + 2)
        header['font'] = (points, face)
    controls = []
    for _ in range(count):
        pos = align4(pos)
        c_style, c_exstyle, c_x, c_y, c_cx, c_cy, c_id = struct.unpack_from('<IIhhhhH', data, pos)
        control = {'style': c_style, 'exstyle': c_exstyle, 'x': c_x, 'y': c_y, 'cx': c_cx,
                   'cy': c_cy, 'id': c_id}
        control['class'], pos = read_sz_or_ordinal(data, pos + 18)
        control['text'], pos = read_sz_or_ordinal(data, pos)
        extra_size = struct.unpack_from('<H', data, pos)[0]
        control['extra'] = data[pos + 2:pos + 2 + extra_size]
        pos += 2 + extra_size
        controls.append(control)
    if any(data[pos:]):
        raise BadResource('data after the last control')
    return header, controls


# One node of a version block: (key, type, value bytes, children); text values keep their NUL.
def parse_version_node(data, pos):
    length, value_length, value_type = struct.unpack_from('<HHH', data, pos)
    end = pos + length
    if length < 6 or end > len(data):
        raise BadResource('version node at %d has a bad length %d' % (pos, length))
    key, p = read_sz(data, pos + 6)
    p = align4(p)
    value_size = value_length * 2 if value_type == 1 else value_length
    value = data[p:p + value_size]
    p = align4(p + value_size)
    children = []
    while p < end:
        child, p = parse_version_node(data, p)
        children.append(child)
        p = align4(p)
    return (key, value_type, value, children), end


# Every resource of the file as {(type, name): {language: bytes}}.
def collect_resources(pe):
    found = {}
    if not hasattr(pe, 'DIRECTORY_ENTRY_RESOURCE'):
        return found
    for type_entry in pe.DIRECTORY_ENTRY_RESOURCE.entries:
        rtype = type_entry.id if type_entry.name is None else str(type_entry.name)
        for name_entry in type_entry.directory.entries:
            name = name_entry.id if name_entry.name is None else str(name_entry.name)
            languages = found.setdefault((rtype, name), {})
            for lang_entry in name_entry.directory.entries:
                entry = lang_entry.data.struct
                languages[lang_entry.id] = pe.get_data(entry.OffsetToData, entry.Size)
    return found


# Exported names with their ordinals as the .def file declares them.
def read_def_exports(path):
    exports, in_exports = {}, False
    with open(path, encoding='utf-8') as source:
        for line in source:
            words = line.split(';', 1)[0].split()
            if not words:
                continue
            if words[0].upper() == 'EXPORTS':
                in_exports = True
            elif words[0].upper() in ('LIBRARY', 'NAME', 'DESCRIPTION', 'VERSION',
                                      'HEAPSIZE', 'STACKSIZE', 'SECTIONS'):
                in_exports = False
            elif in_exports:
                # "Name=InternalName @n": the export is the name before the '='.
                ordinal = next((int(w[1:]) for w in words[1:] if w.startswith('@')), None)
                exports[words[0].split('=', 1)[0]] = ordinal
    return exports


# A 32-bit x86 DLL.
def check_headers(report, pe):
    report.equal('PE32 optional header (not PE32+)', hex(pe.OPTIONAL_HEADER.Magic), '0x10b')
    report.equal('machine i386', hex(pe.FILE_HEADER.Machine), '0x14c')
    report.check('file is a DLL', pe.FILE_HEADER.Characteristics & 0x2000 != 0,
                 'IMAGE_FILE_DLL not set')


# Export directory name, names and ordinals, against the table and Hivelet.def.
def check_exports(report, pe):
    directory = getattr(pe, 'DIRECTORY_ENTRY_EXPORT', None)
    if not report.check('export directory present', directory is not None):
        return
    name = pe.get_string_at_rva(directory.struct.Name)
    report.equal('export directory name', name.decode('ascii', 'replace'), MODULE_NAME)
    exported = {}
    problems = []
    for symbol in directory.symbols:
        if symbol.name is None:
            problems.append('ordinal %d has no name' % symbol.ordinal)
            continue
        symbol_name = symbol.name.decode('ascii', 'replace')
        if symbol.forwarder:
            problems.append('%s is forwarded' % symbol_name)
        if symbol_name in exported:
            problems.append('%s exported twice' % symbol_name)
        exported[symbol_name] = symbol.ordinal
        want = EXPORT_ORDINALS.get(symbol_name)
        if want is None:
            problems.append('%s is not a host entry point' % symbol_name)
        elif symbol.ordinal != want:
            problems.append('%s at ordinal %d, want %d' % (symbol_name, symbol.ordinal, want))
    report.check('every export is a host entry point at its fixed ordinal', not problems,
                 '; '.join(problems))
    declared = read_def_exports(DEF_PATH)
    wrong = {n: o for n, o in declared.items() if EXPORT_ORDINALS.get(n) != o}
    report.check('Hivelet.def declares each name at its fixed ordinal', not wrong,
                 ', '.join('%s @%s' % item for item in sorted(wrong.items())))
    missing = sorted(set(declared) - set(exported))
    extra = sorted(set(exported) - set(declared))
    report.check('exported names equal the names in Hivelet.def (%d)' % len(declared),
                 not missing and not extra, 'missing %s, not declared %s' % (missing, extra))
    absent = sorted(set(EXPORT_ORDINALS) - set(exported))
    report.check('every entry point the host looks up is exported', not absent,
                 'missing %s' % ', '.join(absent))


# Static linking must leave nothing but system libraries to load.
def check_imports(report, pe):
    libraries = [entry.dll.decode('ascii', 'replace')
                 for attribute in ('DIRECTORY_ENTRY_IMPORT', 'DIRECTORY_ENTRY_DELAY_IMPORT')
                 for entry in getattr(pe, attribute, [])]
    foreign = [name for name in libraries if name.lower() not in SYSTEM_DLLS
               and not name.lower().startswith('api-ms-win-crt-')]
    report.check('imports only system libraries (%s)' % ', '.join(libraries), not foreign,
                 'also imports %s' % ', '.join(foreign))
    # The root-key dialog in 32 bits: its user-data slot through the LONG forms.
    user32 = {symbol.name.decode('ascii', 'replace')
              for entry in getattr(pe, 'DIRECTORY_ENTRY_IMPORT', [])
              if entry.dll.decode('ascii', 'replace').lower() == 'user32.dll'
              for symbol in entry.imports if symbol.name}
    wanted = {'SetWindowLongW', 'GetWindowLongW', 'DialogBoxParamW', 'EndDialog', 'LoadMenuW',
              'wsprintfW'}
    report.check('user32 imports include %s' % ', '.join(sorted(wanted)), wanted <= user32,
                 'missing %s' % ', '.join(sorted(wanted - user32)))


# No resource missing, none extra, all U.S. English.
def check_resource_set(report, resources):
    expected = {(RT_STRING, key // 16 + 1) for key in STRINGS}
    expected |= {(RT_MENU, key) for key in MENUS}
    expected |= {(RT_DIALOG, DIALOG_ID), (RT_VERSION, 1)}
    expected |= {(RT_BITMAP, key) for key in BITMAP_IDS}
    expected |= {(RT_RCDATA, key) for key in RAW_DATA}
    report.check('resource set is exactly the expected one', set(resources) == expected,
                 'missing %s, unexpected %s' % (sorted(expected - set(resources), key=str),
                                                sorted(set(resources) - expected, key=str)))
    wrong = ['%s/%s: %s' % (rtype, name, sorted(langs))
             for (rtype, name), langs in sorted(resources.items(), key=str)
             if sorted(langs) != [LANG_EN_US]]
    report.check('every resource is in language 1033 only', not wrong, '; '.join(wrong))


# The content of one resource in language 1033, or None after a failed check.
def resource_data(report, resources, rtype, name, label):
    data = resources.get((rtype, name), {}).get(LANG_EN_US)
    if data is None:
        report.check(label, False, 'resource missing')
    return data


# Every string id with its exact text, and no other id.
def check_strings(report, resources):
    texts = {}
    for rtype, block in sorted(key for key in resources if key[0] == RT_STRING):
        data = resources[(rtype, block)].get(LANG_EN_US)
        if data is None:
            continue
        try:
            texts.update(parse_string_block(block, data))
        except BadResource as error:
            report.check('string block %d' % block, False, str(error))
    for key, want in sorted(STRINGS.items()):
        report.equal('string %d' % key, texts.get(key), want)
    extra = sorted(set(texts) - set(STRINGS))
    report.check('no other strings', not extra, 'unexpected ids %s' % extra)


# The three menus as exact trees of items, flags, ids and texts.
def check_menus(report, resources):
    for key, want in sorted(MENUS.items()):
        label = 'menu %d' % key
        data = resource_data(report, resources, RT_MENU, key, label)
        if data is None:
            continue
        try:
            report.equal(label, parse_menu(data), want)
        except (BadResource, struct.error) as error:
            report.check(label, False, str(error))


# The root-key dialog template, header and each control.
def check_dialog(report, resources):
    data = resource_data(report, resources, RT_DIALOG, DIALOG_ID, 'dialog %d' % DIALOG_ID)
    if data is None:
        return
    try:
        header, controls = parse_dialog(data)
    except (BadResource, struct.error) as error:
        report.check('dialog %d' % DIALOG_ID, False, str(error))
        return
    report.equal('dialog %d header' % DIALOG_ID, header, DIALOG)
    report.equal('dialog %d control count' % DIALOG_ID, len(controls), len(DIALOG_CONTROLS))
    for index, (got, want) in enumerate(zip(controls, DIALOG_CONTROLS), 1):
        report.equal('dialog %d control %d (id %d)' % (DIALOG_ID, index, want['id']), got, want)


# The SHA-256 of each picture's bytes as drawn and shipped; a new drawing changes them here.
BITMAP_SHA256 = {
    400: '1ac12d11eaa2fb44f1766604fc4770c829d66e986f0eeb94c1d98a64c14fed26',
    401: 'bb5da16cf1105995c353f8a0c1f0f1ec4cebb34eea2807445ba7ac770afe042f',
}


# Both pictures: size, header and the exact bytes shipped.
def check_bitmaps(report, resources):
    pixels_of = {}
    for key in BITMAP_IDS:
        data = resource_data(report, resources, RT_BITMAP, key, 'bitmap %d' % key)
        if data is None:
            continue
        report.equal('bitmap %d size' % key, len(data), 2088)
        fields = struct.unpack_from('<IiiHHIIiiII', data.ljust(40, b'\0'), 0)
        report.equal('bitmap %d header (size, 32x32 bottom-up, 1 plane, 8 bpp, BI_RGB, '
                     '1024 image bytes, 256 colours)' % key,
                     (fields[0], fields[1], fields[2], fields[3], fields[4], fields[5],
                      fields[6], fields[9]), (40, 32, 32, 1, 8, 0, 1024, 256))
        report.equal('bitmap %d SHA-256' % key, hashlib.sha256(data).hexdigest(),
                     BITMAP_SHA256[key])
        pixels_of[key] = data[-1024:]
        report.check('bitmap %d is a picture, not a flat fill' % key,
                     len(set(pixels_of[key])) >= 4,
                     'only %d colours used' % len(set(pixels_of[key])))
    if len(pixels_of) == 2:
        report.check('bitmaps 400 and 401 differ', pixels_of[400] != pixels_of[401])


# The host's four bytes of raw data.
def check_raw_data(report, resources):
    for key, want in sorted(RAW_DATA.items()):
        label = 'raw data %d' % key
        data = resource_data(report, resources, RT_RCDATA, key, label)
        if data is not None:
            report.equal(label, data.hex(' '), want.hex(' '))


# The value of a text node of the version block, or None when it is not a terminated text.
def version_text(node):
    key, value_type, value, children = node
    if value_type != 1 or children:
        return None
    text = value.decode('utf-16-le', 'replace')
    if text == '':
        return ''
    return text[:-1] if text.endswith('\0') and '\0' not in text[:-1] else None


# Fixed fields, the one string table in order, and the translation.
def check_version(report, resources):
    data = resource_data(report, resources, RT_VERSION, 1, 'version block')
    if data is None:
        return
    try:
        (key, _, fixed, blocks), _ = parse_version_node(data, 0)
    except (BadResource, struct.error) as error:
        report.check('version block', False, str(error))
        return
    report.equal('version block key', key, 'VS_VERSION_INFO')
    names = list(VERSION_FIXED)
    got = dict(zip(names, struct.unpack('<13I', fixed))) if len(fixed) == 52 else len(fixed)
    report.equal('version fixed fields', got, VERSION_FIXED)
    by_key = {}
    for block in blocks:
        by_key.setdefault(block[0], []).append(block)
    report.equal('version blocks', sorted(by_key), ['StringFileInfo', 'VarFileInfo'])
    tables = [t for b in by_key.get('StringFileInfo', []) for t in b[3]]
    report.equal('one string table', [t[0] for t in tables], [VERSION_STRING_TABLE])
    if tables:
        strings = [(node[0], version_text(node)) for node in tables[0][3]]
        report.equal('version strings, in order', strings, VERSION_STRINGS)
    variables = [(v[0], v[2]) for b in by_key.get('VarFileInfo', []) for v in b[3]]
    report.equal('version translation 0x0409/1252', variables,
                 [('Translation', VERSION_TRANSLATION)])


# Runs every check on the file named on the command line.
def main(argv):
    if len(argv) != 2:
        sys.stderr.write('usage: check_dll.py PATH/Hivelet.hzx\n')
        return 2
    report = Report()
    try:
        pe = pefile.PE(argv[1])
    except (OSError, pefile.PEFormatError) as error:
        report.check('file is a PE image', False, str(error))
        pe = None
    if pe is not None:
        check_headers(report, pe)
        check_exports(report, pe)
        check_imports(report, pe)
        resources = collect_resources(pe)
        check_resource_set(report, resources)
        check_strings(report, resources)
        check_menus(report, resources)
        check_dialog(report, resources)
        check_bitmaps(report, resources)
        check_raw_data(report, resources)
        check_version(report, resources)
    print('%d passed, %d failed' % (report.passed, report.failed))
    return 1 if report.failed else 0


if __name__ == '__main__':
    sys.exit(main(sys.argv))
