#!/usr/bin/env python3
"""Faults of sources: faults.py FILE... Each file is a sound source; its name tells of what. Below a line stand bad ones
that take its place, and what `lexicor-data check` says of the source then:

  #! TEXT       a line in place of the one above; several, or none at all
  #= C: TEXT    how the message begins: the column in the line replaced, and what is wrong. The place may be
                +N:C for N lines below, or begin with the word file. "accepted": nothing is wrong
  #. C: TEXT    the same of a source that ends there, without a line end
  ## TEXT       a comment on what follows

Says what is not said, and of which source.
"""
import os
import re
import subprocess
import sys
import tempfile

# Where a kind of source stands, and the list of objects that leads to it.
PLACES = {'control': ('control.txt', ''), 'alias': ('alias.txt', 'codepage 1 US-ASCII'),
          'language': ('languages/T.toml', 'codepage 1 US-ASCII\nlanguage 1 T\nterritory 1 UnitedStates'),
          'territory': ('territories/T.toml', 'territory 1 T'), 'sort': ('sorts/T.txt', 'sort 1 T'),
          'ucm': ('codepages/Test.ucm', 'codepage 1 Test')}


def parse(path):
    """The lines of the sound source, and its faults: the line replaced, by which, whether it ends there, what is said."""
    sound, faults, instead = [], [], []
    for line in open(path, encoding='utf-8', newline='\n').read().split('\n')[:-1]:
        mark, rest = line[:2], line[3:]
        if mark == '#!':
            instead.append(rest)
        elif mark in ('#=', '#.'):
            faults.append((len(sound), instead, mark == '#.', rest))
            instead = []
        elif mark != '##':
            assert not instead, f'{path}: nothing is said of the lines before {line}'
            sound.append(line)
    assert faults and not instead, f'{path}: nothing is said of the last lines'
    return sound, faults


def said_of(kind, text):
    """What check says first of a source."""
    name, listed = PLACES[kind]
    with tempfile.TemporaryDirectory() as directory:
        for file, content in (('control.txt', listed), ('alias.txt', ''), (name, text)):
            os.makedirs(os.path.dirname(f'{directory}/{file}'), exist_ok=True)
            open(f'{directory}/{file}', 'w', encoding='utf-8', newline='').write(content)
        ran = subprocess.run(['lexicor-data', 'check', directory], stderr=subprocess.PIPE, encoding='utf-8')
        begin = f'{directory}/{name}:'
        return next((line[len(begin):] for line in ran.stderr.splitlines() if line.startswith(begin)), 'accepted')


failed = False
for path in sys.argv[1:]:
    kind = next(kind for kind in PLACES if kind in os.path.basename(path))
    sound, faults = parse(path)
    for line, instead, ends, said in [(0, [], False, 'accepted')] + faults:
        lines = sound[:max(line - 1, 0)] + instead + ([] if ends else sound[line:])
        text = '\n'.join(lines) + ('' if ends else '\n')
        below, place = re.fullmatch(r'(?:\+(\d+):)?(.*)', said, re.DOTALL).groups()
        expected = said[5:] if said.startswith('file:') else said if said == 'accepted' else f'{line + int(below or 0)}:{place}'
        came = said_of(kind, text)
        if not came.startswith(expected):
            print(f'{path}:{line}: not "{expected}" but "{came}" of\n{text}')
            failed = True
sys.exit(failed)
