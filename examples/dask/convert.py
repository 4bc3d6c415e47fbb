"""Converts a folder of files from one codepage to another, a file a task, and says what each of them loses.

    python3 convert.py --from ibm-930 --to utf-8 IN OUT [--scheduler tcp://HOST:8786]

Writes OUT/NAME for each IN/NAME, and a line of JSON for each to standard output. Exit code 1: something was lost.
"""
import argparse
import codecs
import json
import os
import pathlib
import sys
import uuid
from typing import Any, Dict, Optional, Tuple

import dask
from distributed import Client

PIECE_BYTES = 1 << 20


class Losses:
    """An error handler that counts, and goes on with a replacement."""

    def __init__(self) -> None:
        self.malformed = self.lacking = 0
        self.first: Optional[str] = None
        self.characters = 0  # that came before the piece at hand

    def __call__(self, error: UnicodeError) -> Tuple[Any, int]:
        if isinstance(error, UnicodeDecodeError):
            self.malformed += 1
            said = f"bytes {error.object[error.start:error.end].hex()}"
        else:
            self.lacking += error.end - error.start
            said = f"U+{ord(error.object[error.start]):04X} as character {self.characters + error.start}"
        self.first = self.first or said
        return codecs.replace_errors(error)


def convert_file(source: pathlib.Path, target: pathlib.Path, codepages: Tuple[str, str]) -> Dict[str, Any]:
    import lexicor  # noqa: F401  its codecs, in the worker

    losses = Losses()
    handler = f"count-{os.getpid()}-{id(losses)}"
    codecs.register_error(handler, losses)
    decoder = codecs.getincrementaldecoder(codepages[0])(handler)
    encoder = codecs.getincrementalencoder(codepages[1])(handler)
    unfinished = target.with_name(f".{uuid.uuid4().hex}")  # which is the name of no other file
    with source.open("rb") as read, unfinished.open("wb") as write:
        while True:
            piece = read.read(PIECE_BYTES)
            text = decoder.decode(piece, final=not piece)
            write.write(encoder.encode(text, final=not piece))
            losses.characters += len(text)
            if not piece:
                break
    unfinished.rename(target)
    return {"file": source.name, "characters": losses.characters, "malformed": losses.malformed,
            "lacking": losses.lacking, "first": losses.first}


def main() -> int:
    parser = argparse.ArgumentParser(description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument("--from", dest="source", required=True)
    parser.add_argument("--to", required=True)
    parser.add_argument("--scheduler", help="else a cluster of this machine's processors")
    parser.add_argument("inputs", type=pathlib.Path)
    parser.add_argument("outputs", type=pathlib.Path)
    given = parser.parse_args()
    given.outputs.mkdir(exist_ok=True)
    tasks = [dask.delayed(convert_file)(path, given.outputs / path.name, (given.source, given.to))
             for path in sorted(given.inputs.iterdir())]
    with Client(given.scheduler):
        reports = dask.compute(*tasks)
    for report in reports:
        print(json.dumps(report))
    return int(any(report["malformed"] or report["lacking"] for report in reports))


if __name__ == "__main__":
    sys.exit(main())
