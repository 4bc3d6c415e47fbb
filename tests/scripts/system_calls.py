#!/usr/bin/env python3
"""Programs whose calls of the operating system fail: system_calls.py SOURCE_DIR BUILD_DIR

Runs each program with each of its calls on files failing in turn, with tests/platform/failing_calls.c in front of it:
it ends with 0 and the output of a sound run, or with 1 or 2, a message, and the output file as it was. Reads and writes that
are short, and reads and writes that are interrupted, change nothing. Prints what is otherwise.
"""
import errno
import os
import re
import shutil
import subprocess
import sys
import tempfile

source, build = map(os.path.abspath, sys.argv[1:3])
SHIM = build + '/lib/failing_calls.so'
OLD = b'what was there before\n'

# What is done in a directory of files, and the file that it writes; data/ is a small source, and dir what it becomes.
COMMANDS = [
    (['lexicor', '--locale-dir', 'dir', 'convert', '--from', 'US-ASCII', '--to', 'IBM037', '-o', 'out', 'in'], 'out'),
    (['lexicor', '--locale-dir', 'dir', 'convert', '--from', 'US-ASCII', '--to', 'IBM037', 'in'], None),
    (['lexicor', '--locale-dir', 'dir', 'sort', '--locale', 'English.US-ASCII', '-o', 'out', 'in'], 'out'),
    (['lexicor', '--locale-dir', 'dir', 'format', 'money', '1234.5', '--locale', 'Swedish'], None),
    (['lexicor', '--locale-dir', 'dir', 'format', 'time', '2026-11-21T14:05:09', '--locale', 'Swedish'], None),
    (['lexicor', '--locale-dir', 'dir', 'message', 'in.cat', '1', '2', '--locale', 'English'], None),
    (['lexicor-gencat', '--new', 'out', 'in.msg', '--locale', 'English', '--locale-dir', 'dir'], 'out'),
    (['lexicor-data', 'compile', 'data', 'made'], 'made/te_00752.nls'),
    (['lexicor-data', 'check', 'dir'], None),
    (['lexicor-data', 'dump', 'dir/te_00752.nls'], None),
]
WAYS = [(errno.EIO, False), (errno.ENOSPC, False), (errno.EIO, True), (errno.EINTR, False), (0, False)]


def run(command, root, at=0, error=0, on=False):
    report = root + '.report'
    environment = {**os.environ, 'LC_ALL': 'C', 'LD_PRELOAD': SHIM, 'FAULT_ROOT': root, 'FAULT_AT': str(at),
                   'FAULT_ERRNO': str(error), 'FAULT_REPORT': report, 'PATH': build + '/bin'}
    if on:
        environment['FAULT_ON'] = '1'
    with open(root + '/stdout', 'wb') as out:
        ran = subprocess.run(command, cwd=root, env=environment, stdin=subprocess.DEVNULL, stdout=out,
                             stderr=subprocess.PIPE, timeout=60)
    calls, left_open = map(int, open(report).read().split())
    return ran.returncode, open(root + '/stdout', 'rb').read(), ran.stderr, calls, left_open


def make(root):
    """The files that the commands work on."""
    def do(*command):
        subprocess.run(command, cwd=root, check=True, stdout=subprocess.DEVNULL,
                       env={**os.environ, 'PATH': build + '/bin'})

    def write(name, text):
        os.makedirs(os.path.dirname(f'{root}/{name}'), exist_ok=True)
        open(f'{root}/{name}', 'w').write(text)

    write('in', 'b line\na line\n' * 3000)  # more than a buffer holds
    write('in.msg', '$set 1\n1 one\n2 two\n')
    do('lexicor-data', 'subset', build + '/locale', 'dir', '--locale', 'Swedish', '--locale', 'English', '--codepage', 'IBM037')
    do('lexicor-gencat', 'in.cat', 'in.msg', '--locale', 'English', '--locale-dir', 'dir')
    write('data/control.txt', 'language 1 English\nterritory 840 UnitedStates\nterritory 752 Sweden\ncodepage 367 US-ASCII\n')
    write('data/alias.txt', 'US-ASCII ascii\n')
    for name in ('territories/UnitedStates.toml', 'territories/Sweden.toml', 'codepages/US-ASCII.ucm'):
        write('data/' + name, open(f'{source}/data/{name}').read())
    write('data/languages/English.toml', re.sub('(?m)^default = .*', 'default = { territory = "UnitedStates", codepage = '
          '"US-ASCII", sort = "Binary" }', open(f'{source}/data/languages/English.toml').read()))


def content(path):
    return open(path, 'rb').read() if os.path.exists(path) else None


def names(root):
    return sorted(os.path.relpath(os.path.join(d, f), root) for d, _, files in os.walk(root) for f in files)


failed = tried = 0
with tempfile.TemporaryDirectory() as work:
    sound = work + '/sound'
    os.mkdir(sound)
    make(sound)
    for command, written in COMMANDS:
        def fresh():
            shutil.rmtree(work + '/root', ignore_errors=True)
            shutil.copytree(sound, work + '/root')
            if written:
                os.makedirs(os.path.dirname(work + '/root/' + written), exist_ok=True)
                open(work + '/root/' + written, 'wb').write(OLD)
            return os.path.realpath(work + '/root')
        root = fresh()
        code, output, said, calls, left_open = run(command, root)
        result, files = content(f'{root}/{written}'), names(root)
        assert code == 0 and calls > 0, (command, code, said)
        for error, on in WAYS:
            for at in range(1, calls + 1):
                root = fresh()
                tried += 1
                got, out, err, _, left = run(command, root, at, error, on)
                now = content(f'{root}/{written}')
                faults = []
                if got not in (0, 1, 2):
                    faults.append(f'exit {got}')
                if got == 0 and (out != output or now != result) and not err:
                    faults.append('another result, and nothing is said')
                if got != 0 and not err and not on:
                    faults.append('nothing is said')
                if written and now not in (OLD, result):
                    faults.append('a part of the output' if now is not None else 'the old output is gone')
                if left > left_open:
                    faults.append(f'{left} descriptors are open at the end')
                if error == 0 and got != 0:
                    faults.append('a short read or write is a failure')
                spare = [n for n in names(root) if n not in files]
                if spare and not on and 'unlink' not in str(err):
                    faults.append(f'left over: {spare}')
                for fault in faults:
                    print(f'{" ".join(command)}: call {at} of {calls}, {errno.errorcode.get(error, "short")}'
                          f'{" from then on" if on else ""}: {fault}; {err.decode()[:200]!r}')
                    failed += 1
print(f'{tried} runs of {len(COMMANDS)} commands, {failed} faults')
sys.exit(failed != 0)
