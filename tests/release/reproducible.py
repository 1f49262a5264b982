#!/usr/bin/python3
"""Builds the release twice more, from two copies of the sources in two other folders, and
checks that the module, the help file and the archive come out byte for byte the same in all
three builds.

Usage: reproducible.py --source DIR --tree DIR --work DIR --epoch SECONDS --wine-prefix DIR
                       --version VERSION

--source is the source tree, --tree its release build (configured with the release preset),
--work a folder for the two copies (emptied first, removed when all is the same). The copies
are built with the release preset's settings and the same SOURCE_DATE_EPOCH, at paths of
different lengths, so that a time stamp or a path in an output shows as a difference.
"""

import argparse
import os
import shutil
import subprocess
import sys
import time


def source_files(source):
    """The files of the source tree as git sees them (tracked, or new and not ignored), or every
    file outside build/ and .git/ when the tree is not a git checkout."""
    try:
        out = subprocess.run(['git', '-C', source, 'ls-files', '-z', '--cached', '--others',
                              '--exclude-standard'], check=True, stdout=subprocess.PIPE,
                             stderr=subprocess.DEVNULL).stdout
        names = [n for n in out.decode().split('\0') if n]
    except (OSError, subprocess.CalledProcessError):
        names = []
        for folder, dirs, files in os.walk(source):
            dirs[:] = [d for d in dirs if folder != source or d not in ('build', '.git')]
            names += [os.path.relpath(os.path.join(folder, f), source) for f in files]
    return sorted(n for n in names if os.path.isfile(os.path.join(source, n)))


def copy_sources(source, destination):
    for name in source_files(source):
        target = os.path.join(destination, name)
        os.makedirs(os.path.dirname(target), exist_ok=True)
        shutil.copy2(os.path.join(source, name), target)


def build(source, binary, epoch, wine_prefix):
    env = dict(os.environ, SOURCE_DATE_EPOCH=str(epoch))
    env.pop('CMAKE_BUILD_PARALLEL_LEVEL', None)
    for command in (['cmake', '--preset', 'release', '-B', binary,
                     '-DHV_WINE_PREFIX=' + wine_prefix],
                    ['cmake', '--build', binary, '-j', '2']):
        result = subprocess.run(command, cwd=source, env=env, stdout=subprocess.PIPE,
                                stderr=subprocess.STDOUT, text=True)
        if result.returncode != 0:
            sys.exit('reproducible: %s failed:\n%s' % (' '.join(command), result.stdout[-4000:]))


def artefacts(binary, version):
    return {'bin/Hivelet.hzx': os.path.join(binary, 'bin', 'Hivelet.hzx'),
            'bin/Help/Hivelet.chm': os.path.join(binary, 'bin', 'Help', 'Hivelet.chm'),
            'Hivelet-%s.zip' % version: os.path.join(binary, 'Hivelet-%s.zip' % version)}


def first_difference(a, b):
    for i, (x, y) in enumerate(zip(a, b)):
        if x != y:
            return i
    return min(len(a), len(b))


def main(argv):
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    for option in ('--source', '--tree', '--work', '--wine-prefix', '--version'):
        parser.add_argument(option, required=True)
    parser.add_argument('--epoch', type=int, required=True)
    args = parser.parse_args(argv)
    for name in ('source', 'tree', 'work', 'wine_prefix'):
        setattr(args, name, os.path.abspath(getattr(args, name)))

    shutil.rmtree(args.work, ignore_errors=True)
    trees = {'the release tree': args.tree}
    for name, folder in (('copy A', 'a'), ('copy B', 'b-in-a-folder-with-a-longer-name')):
        source = os.path.join(args.work, folder, 'hivelet')
        copy_sources(args.source, source)
        start = time.time()
        build(source, os.path.join(args.work, folder, 'out', 'release'), args.epoch,
              args.wine_prefix)
        print('%s: built in %s in %.0f s' % (name, folder, time.time() - start))
        trees[name] = os.path.join(args.work, folder, 'out', 'release')

    different = 0
    for label, path in artefacts(args.tree, args.version).items():
        with open(path, 'rb') as f:
            expected = f.read()
        same = 0
        for name, tree in trees.items():
            with open(artefacts(tree, args.version)[label], 'rb') as f:
                actual = f.read()
            if actual == expected:
                same += 1
                continue
            different += 1
            print('DIFFERENT: %s of %s (%d bytes) and of the release tree (%d bytes), first at '
                  'byte %d' % (label, name, len(actual), len(expected),
                               first_difference(actual, expected)))
        print('%s: %d bytes, the same in %d of %d builds' % (label, len(expected), same,
                                                              len(trees)))
    if different:
        print('the copies stay in %s' % args.work)
        return 1
    shutil.rmtree(args.work)
    return 0


if __name__ == '__main__':
    sys.exit(main(sys.argv[1:]))
