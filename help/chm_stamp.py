#!/usr/bin/python3
"""Sets the two time stamps of a compiled help file, so that one set of sources gives one file.

Usage: chm_stamp.py FILE.chm EPOCH

chmcmd writes the time of day at which it ran into two places, both stored uncompressed: the
file header (milliseconds of the day, big-endian, at offset 0x10) and entry 10 of the internal
file #SYSTEM (the same number, little-endian). Both get the time of day of EPOCH (seconds since
1970, UTC), the project's SOURCE_DATE_EPOCH. Nothing else in chmcmd's output depends on when or
where it ran, as long as the project asks for no binary index (whose map chmcmd leaves partly
unwritten).
"""

import struct
import sys


class ChmError(Exception):
    pass


def encint(data, pos):
    """Reads one of the directory's variable-length numbers: 7 bits a byte, high bit set on
    every byte but the last."""
    value = 0
    while True:
        byte = data[pos]
        pos += 1
        value = (value << 7) | (byte & 0x7F)
        if not byte & 0x80:
            return value, pos


def directory(data):
    """Every entry of the file's directory: name -> (section, offset, length)."""
    if data[:4] != b'ITSF' or struct.unpack_from('<I', data, 4)[0] != 3:
        raise ChmError('not a version 3 compiled help file')
    dir_offset = struct.unpack_from('<Q', data, 0x48)[0]
    if data[dir_offset:dir_offset + 4] != b'ITSP':
        raise ChmError('no directory header')
    header_length, _, chunk_size = struct.unpack_from('<III', data, dir_offset + 8)
    chunk_count = struct.unpack_from('<I', data, dir_offset + 0x2C)[0]
    entries = {}
    for n in range(chunk_count):
        chunk = dir_offset + header_length + n * chunk_size
        if data[chunk:chunk + 4] != b'PMGL':
            continue  # an index chunk (PMGI) lists names that the listing chunks hold too
        free = struct.unpack_from('<I', data, chunk + 4)[0]
        pos, end = chunk + 0x14, chunk + chunk_size - free
        while pos < end:
            length, pos = encint(data, pos)
            name = data[pos:pos + length].decode('utf-8')
            pos += length
            section, pos = encint(data, pos)
            offset, pos = encint(data, pos)
            size, pos = encint(data, pos)
            entries[name] = (section, offset, size)
    return entries


def stamp(path, epoch):
    with open(path, 'rb') as f:
        data = bytearray(f.read())
    millis = (epoch % 86400) * 1000
    struct.pack_into('>I', data, 0x10, millis)
    section, offset, size = directory(data).get('/#SYSTEM', (None, 0, 0))
    if section != 0:
        raise ChmError('no uncompressed /#SYSTEM')
    content = struct.unpack_from('<Q', data, 0x58)[0]
    pos, end = content + offset + 4, content + offset + size  # after the format version
    while pos + 4 <= end:
        code, length = struct.unpack_from('<HH', data, pos)
        if code == 10 and length == 4:
            struct.pack_into('<I', data, pos + 4, millis)
        pos += 4 + length
    with open(path, 'wb') as f:
        f.write(data)


if __name__ == '__main__':
    if len(sys.argv) != 3:
        sys.exit(__doc__.strip().splitlines()[2])
    try:
        stamp(sys.argv[1], int(sys.argv[2]))
    except (ChmError, OSError, ValueError) as e:
        sys.exit('chm_stamp: %s' % e)
