#!/usr/bin/env python3
"""Runs a transcript of a shell and compares what it writes: transcript.py SOURCE_DIR BUILD_DIR FILE [--update]

A transcript is text with indented commands. "  $ " begins one and "  > " continues it. Below stands what it writes to
standard output and standard error, then "[N]" if it exits with N. A line that ends in " (re)" is a regular expression;
one that ends in " (no-eol)" has no line end. Bytes that are no text are written as \\xHH. --update writes what came.
"""
import difflib
import os
import re
import subprocess
import sys
import tempfile

source_dir, build_dir, path = map(os.path.abspath, sys.argv[1:4])
MARK = b'\x1f\x1f'

# What stands in the file: lines of text, and commands with what is expected of them.
lines, commands = open(path, encoding='utf-8').read().splitlines(), {}
for number, line in enumerate(lines):
    if line.startswith('  $ '):
        last = number
        commands[number] = [line[4:], []]
    elif line.startswith('  >'):
        commands[last][0] += '\n' + line[4:]
    elif line.startswith('  '):
        commands[last][1].append(line[2:])

environment = {name: value for name, value in os.environ.items() if not name.startswith(('LX_', 'LC_', 'LANG'))}
environment.update(LC_ALL='C', SOURCE=source_dir, SAMPLES=source_dir + '/data/samples', LOCALE=build_dir + '/locale',
                   PATH=build_dir + '/bin:' + os.environ['PATH'])
script = 'exec 2>&1\nset -o pipefail\n' + ''.join(f"{command}\nprintf '\\n\\037\\037%d\\n' $?\n" for command, _ in commands.values())
with tempfile.TemporaryDirectory() as directory:
    written = subprocess.run(['bash', '-c', script], cwd=directory, env=environment, stdin=subprocess.DEVNULL,
                             stdout=subprocess.PIPE).stdout
outputs = written.split(b'\n' + MARK)


def shown(output):
    text = output.decode('utf-8', 'backslashreplace')
    return ''.join(c if c.isprintable() or c == '\n' else f'\\x{ord(c):02x}' if c < '\x80' else f'\\u{ord(c):04x}' for c in text)


def matches(line, expected):
    return line == expected or expected.endswith(' (re)') and re.fullmatch(expected[:-5], line) is not None


actual, status = [line for line in lines], 0
for index, (number, (command, expected)) in reversed(list(enumerate(commands.items()))):
    output = outputs[index] if index == 0 else outputs[index].partition(b'\n')[2]
    code = outputs[index + 1].partition(b'\n')[0].decode() if index + 1 < len(outputs) else 'the shell ended'
    came = shown(output)
    came = came.splitlines() if came.endswith('\n') or came == '' else (came + ' (no-eol)').splitlines()
    came += [f'[{code}]'] if code != '0' else []
    came = [expected[i] if i < len(expected) and matches(line, expected[i]) else line for i, line in enumerate(came)]
    begin = number + 1 + command.count('\n')
    actual[begin:begin + len(expected)] = ['  ' + line for line in came]
if '--update' in sys.argv:
    open(path, 'w', encoding='utf-8').write('\n'.join(actual) + '\n')
difference = list(difflib.unified_diff(lines, actual, path, 'came', lineterm=''))
if difference:
    print('\n'.join(difference))
sys.exit(bool(difference) or len(commands) == 0)
