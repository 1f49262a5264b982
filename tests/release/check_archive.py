#!/usr/bin/python3
"""Checks the release archive and that the version is the same everywhere an author sees it.

Usage: check_archive.py ARCHIVE.zip VERSION EPOCH Hivelet.hzx Hivelet.chm README.md

- The archive is named Hivelet-VERSION.zip and holds exactly Hivelet.hzx, Help/Hivelet.chm and
  INSTALL.txt, in that order, with the bytes of the built module and help file; every entry is
  dated EPOCH (the zip format's earliest date when EPOCH is older) and carries only the
  MS-DOS attribute "archive".
- The module's version block: the fixed file and product versions are VERSION, and the
  ProductVersion and SpecialBuild texts are VERSION's numbers in the host's forms.
- INSTALL.txt names VERSION and has Windows line ends; every Hivelet-*.zip that README.md
  names is Hivelet-VERSION.zip, and it names one.
Prints one line per failed check and a closing count; exits 1 when a check failed.
"""

import os
import re
import sys
import time
import zipfile

import pefile

ENTRIES = ['Hivelet.hzx', 'Help/Hivelet.chm', 'INSTALL.txt']
failures = []


def check(condition, message):
    if not condition:
        failures.append(message)
    return condition


def read(path):
    with open(path, 'rb') as f:
        return f.read()


def version_block(path):
    """The fixed versions (four numbers each) and the version strings of the module."""
    pe = pefile.PE(path)
    fixed = pe.VS_FIXEDFILEINFO[0]

    def numbers(high, low):
        return [high >> 16, high & 0xFFFF, low >> 16, low & 0xFFFF]

    strings = {}
    for info in pe.FileInfo[0]:
        for table in getattr(info, 'StringTable', []):
            strings.update({k.decode(): v.decode() for k, v in table.entries.items()})
    return (numbers(fixed.FileVersionMS, fixed.FileVersionLS),
            numbers(fixed.ProductVersionMS, fixed.ProductVersionLS), strings)


def check_archive(archive, version, epoch, dll, chm):
    check(os.path.basename(archive) == 'Hivelet-%s.zip' % version,
          'the archive is %s, not Hivelet-%s.zip' % (os.path.basename(archive), version))
    with zipfile.ZipFile(archive) as z:
        infos = z.infolist()
        check([i.filename for i in infos] == ENTRIES,
              'entries %r, expected %r' % ([i.filename for i in infos], ENTRIES))
        check(z.testzip() is None, 'an entry is damaged')
        stamp = time.gmtime(max(epoch, 315532800))
        date = stamp[:5] + (stamp.tm_sec // 2 * 2,)  # the zip format counts seconds in twos
        for info in infos:
            check(info.date_time == date, '%s is dated %r, not %r' % (info.filename,
                                                                    info.date_time, date))
            check(info.create_system == 0 and info.external_attr == 0x20 and info.extra == b'',
                  '%s carries attributes other than "archive", or extra fields' % info.filename)
        contents = {i.filename: z.read(i) for i in infos}
    check(contents.get('Hivelet.hzx') == read(dll), 'Hivelet.hzx is not the built module')
    check(contents.get('Help/Hivelet.chm') == read(chm), 'Help/Hivelet.chm is not the built help')
    return contents.get('INSTALL.txt', b'').decode('ascii', 'replace')


def check_versions(version, dll, install, readme):
    numbers = [int(n) for n in version.split('.')]
    check(len(numbers) == 4, 'version %s has not four numbers' % version)
    file_version, product_version, strings = version_block(dll)
    check(file_version == numbers, 'the module\'s file version is %r' % file_version)
    check(product_version == numbers, 'the module\'s product version is %r' % product_version)
    text = ', '.join(str(n) for n in numbers)
    check(strings.get('ProductVersion') == text,
          'ProductVersion is %r, not %r' % (strings.get('ProductVersion'), text))
    check(strings.get('SpecialBuild') == '%08d' % numbers[3],
          'SpecialBuild is %r' % strings.get('SpecialBuild'))
    check(install.startswith('Hivelet %s\r\n' % version), 'INSTALL.txt does not begin with the version')
    check('\n' not in install.replace('\r\n', ''), 'INSTALL.txt has lines without CR LF')
    named = re.findall(r'Hivelet-([0-9][0-9.]*[0-9])\.zip', readme)
    check(named, 'README.md names no Hivelet-<version>.zip')
    for other in named:
        check(other == version, 'README.md names Hivelet-%s.zip, not %s' % (other, version))


def main(argv):
    if len(argv) != 6:
        sys.exit(__doc__.strip().splitlines()[2])
    archive, version, epoch, dll, chm, readme = argv
    install = check_archive(archive, version, int(epoch), dll, chm)
    check_versions(version, dll, install, read(readme).decode('utf-8'))
    for message in failures:
        print('FAILED: ' + message)
    print('%s: %d failed checks' % (os.path.basename(archive), len(failures)))
    return 1 if failures else 0


if __name__ == '__main__':
    sys.exit(main(sys.argv[1:]))
