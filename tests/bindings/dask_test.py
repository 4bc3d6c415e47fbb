"""The examples of many machines on a cluster of two workers, beside one process; and the shell's way of docs/many-machines.md."""
import json
import os
import pathlib
import random
import re
import subprocess
import sys

import lexicor
import pytest
from distributed import LocalCluster

ROOT = pathlib.Path(__file__).parents[2]
SAMPLES = sorted((ROOT / "data/samples").glob("*.txt"))


@pytest.fixture(scope="module")
def cluster():
    with LocalCluster(n_workers=2, threads_per_worker=1, dashboard_address=None) as workers:
        yield workers.scheduler_address


def run(script, *arguments):
    return subprocess.run([sys.executable, ROOT / "examples/dask" / script, *arguments], stdout=subprocess.PIPE, text=True)


def test_convert(tmp_path, cluster):
    (tmp_path / "in").mkdir()
    text = "請求書 ｶﾞｽ ABC\n" * 200_000  # in several pieces, cut anywhere
    texts = {"long": text, "empty": "", "lossy": "10 € für Größe\n"}
    for name, content in texts.items():
        (tmp_path / "in" / name).write_bytes(content.encode())
    (tmp_path / "in/broken").write_bytes(b"a\xff\xe3\x81b")
    done = run("convert.py", "--from", "utf-8", "--to", "ibm-930", "--scheduler", cluster, tmp_path / "in", tmp_path / "out")
    assert done.returncode == 1
    reports = {report.pop("file"): report for report in map(json.loads, done.stdout.splitlines())}
    for name, content in texts.items():
        assert (tmp_path / "out" / name).read_bytes() == content.encode("ibm-930", "replace")
        assert reports[name]["characters"] == len(content)
    assert {name: (report["malformed"], report["lacking"]) for name, report in reports.items()} == {
        "long": (0, 0), "empty": (0, 0), "lossy": (0, 4), "broken": (2, 2)}
    assert reports["lossy"]["first"] == "U+20AC as character 3"

    (tmp_path / "in/broken").unlink(), (tmp_path / "in/lossy").unlink()
    back = run("convert.py", "--from", "ibm-930", "--to", "utf-8", tmp_path / "out", tmp_path / "back")
    assert (tmp_path / "back/long").read_text() == text


def lines_of_samples():
    words = sorted({word for path in SAMPLES for word in re.findall(r"\w+", path.read_text(encoding="utf-8"))})
    draw = random.Random(5)
    return [" ".join(draw.choices(words, k=2)) for _ in range(20_000)]


@pytest.mark.parametrize("locale", ["Swedish@Swedish", "French@FrenchCanadian"])
def test_order(tmp_path, cluster, locale):
    lines = lines_of_samples() + ["", "Ångström", "ångström", "angstrom"]
    (tmp_path / "in").mkdir()
    for part in range(7):
        (tmp_path / f"in/{part}").write_text("".join(f"{line}\n" for line in lines[part * 3000:(part + 1) * 3000]))
    done = run("order.py", "--locale", locale, "--parts", "5", "--scheduler", cluster, tmp_path / "in", tmp_path / "out")
    assert done.stdout == f"{len(lines)} lines in 5 parts\n"
    parts = [path.read_text() for path in sorted((tmp_path / "out").iterdir())]
    assert all(parts)
    assert "".join(parts).splitlines() == sorted(lines, key=lexicor.Locale(locale).key)


def test_shell(tmp_path):
    page = (ROOT / "docs/many-machines.md").read_text(encoding="utf-8")
    script = re.search(r"```sh\n(.*?)```", page, re.S)[1]
    lines = lines_of_samples()
    (tmp_path / "names.txt").write_text("".join(f"{line}\n" for line in lines))
    subprocess.run(["bash", "-euc", script], cwd=tmp_path, check=True, env={**os.environ, "LC_ALL": "C.UTF-8"})
    key = lexicor.Locale("Swedish@Swedish").key
    ordered = (tmp_path / "ordered.txt").read_text().splitlines()
    assert sorted(ordered) == sorted(lines)
    assert [key(line) for line in ordered] == sorted(map(key, lines))
