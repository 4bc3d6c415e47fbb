"""Orders the lines of a folder of UTF-8 files by a locale: the parts in OUT, one behind the other, are in order.

    python3 order.py --locale Swedish IN OUT [--scheduler tcp://HOST:8786]

Each file gets keys and is sorted where it lies; a sample of all keys says where the parts begin; each part is then merged
of one piece from every file. Only bytes are compared. Lines that are equal to the locale stay in the order of the files.
"""
import argparse
import bisect
import heapq
import operator
import pathlib
import sys
from typing import List, Tuple

import dask
import lexicor
from distributed import Client

Row = Tuple[bytes, str]
SAMPLES = 100  # of each file
KEY = operator.itemgetter(0)


def keyed(path: pathlib.Path, locale: str) -> List[Row]:
    key = lexicor.Locale(locale).key
    with path.open(encoding="utf-8", newline="\n") as lines:
        return sorted(((key(line), line) for line in (line.rstrip("\n") for line in lines)), key=KEY)


def sample(rows: List[Row]) -> List[bytes]:
    return [key for key, _ in rows[::max(1, len(rows) // SAMPLES)]]


def cut(rows: List[Row], bounds: List[bytes]) -> List[List[Row]]:
    keys = [key for key, _ in rows]
    places = [0, *(bisect.bisect_left(keys, bound) for bound in bounds), len(rows)]
    return [rows[begin:end] for begin, end in zip(places, places[1:])]


def write_part(path: pathlib.Path, pieces: List[List[Row]]) -> int:
    with path.open("w", encoding="utf-8", newline="\n") as part:
        part.writelines(f"{line}\n" for _, line in heapq.merge(*pieces, key=KEY))
    return sum(map(len, pieces))


def main() -> int:
    parser = argparse.ArgumentParser(description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument("--locale", required=True)
    parser.add_argument("--parts", type=int, default=8)
    parser.add_argument("--scheduler", help="else a cluster of this machine's processors")
    parser.add_argument("inputs", type=pathlib.Path)
    parser.add_argument("outputs", type=pathlib.Path)
    given = parser.parse_args()
    given.outputs.mkdir(exist_ok=True)
    for old in given.outputs.glob("part-*"):  # of an order with more parts
        old.unlink()
    with Client(given.scheduler):
        files = dask.persist(*(dask.delayed(keyed)(path, given.locale) for path in sorted(given.inputs.iterdir())))
        keys = sorted(key for some in dask.compute(*map(dask.delayed(sample), files)) for key in some)
        bounds = [keys[len(keys) * part // given.parts] for part in range(1, given.parts)] if keys else []
        pieces = [dask.delayed(cut, nout=len(bounds) + 1)(rows, bounds) for rows in files]
        parts = [dask.delayed(write_part)(given.outputs / f"part-{part:05}", [piece[part] for piece in pieces])
                 for part in range(len(bounds) + 1)]
        counts = dask.compute(*parts)
    print(f"{sum(counts)} lines in {len(counts)} parts")
    return 0


if __name__ == "__main__":
    sys.exit(main())
