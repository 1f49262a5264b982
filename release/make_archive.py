#!/usr/bin/python3
"""Packs the release archive, the same bytes for the same files.

Usage: make_archive.py --epoch SECONDS ARCHIVE.zip NAME=PATH...

Each NAME=PATH puts the file PATH into the archive as NAME (with "/" between folders), in the
order given. Every entry gets the date and time of SECONDS (the project's SOURCE_DATE_EPOCH,
UTC; the zip format holds nothing before 1980), the plain MS-DOS attribute of a file (archive)
and no extra fields, and is compressed with zlib's deflate, so the archive depends only on the
files' bytes.
"""

import argparse
import os
import sys
import time
import zipfile

ZIP_EPOCH = 315532800  # 1980-01-01 00:00:00 UTC, the earliest time a zip entry holds
# The attribute Windows gives every file it writes; zipfile would store Unix permissions for 0.
FILE_ATTRIBUTE_ARCHIVE = 0x20


def entry(name, epoch):
    stamp = time.gmtime(max(epoch, ZIP_EPOCH))[:6]
    info = zipfile.ZipInfo(name, date_time=stamp)
    info.create_system = 0   # MS-DOS attributes, as a Windows user's tools expect
    info.external_attr = FILE_ATTRIBUTE_ARCHIVE
    info.compress_type = zipfile.ZIP_DEFLATED
    return info


def pack(archive, files, epoch):
    temporary = archive + '.part'
    with zipfile.ZipFile(temporary, 'w') as z:
        for name, path in files:
            with open(path, 'rb') as f:
                z.writestr(entry(name, epoch), f.read(), compresslevel=9)
    os.replace(temporary, archive)


def main(argv):
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument('--epoch', type=int, required=True)
    parser.add_argument('archive')
    parser.add_argument('files', nargs='+', metavar='NAME=PATH')
    args = parser.parse_args(argv)
    files = []
    for item in args.files:
        name, sep, path = item.partition('=')
        if not sep or not name or name.startswith('/') or '\\' in name:
            parser.error('%s is not NAME=PATH with a relative NAME' % item)
        files.append((name, path))
    try:
        pack(args.archive, files, args.epoch)
    except OSError as e:
        print('make_archive: %s' % e, file=sys.stderr)
        return 1
    return 0


if __name__ == '__main__':
    sys.exit(main(sys.argv[1:]))
