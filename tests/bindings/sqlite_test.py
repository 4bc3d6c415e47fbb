"""The extension of SQLite, loaded by the real program and by Python's module: that a table and its index are in the
order of the command line, that a changed order is noticed, that connections of several threads are apart."""
import os
import random
import sqlite3
import subprocess
import threading

import pytest

EXTENSION = os.environ["LEXICOR_EXTENSION"]
NAMES = 200_000


def connect(path=":memory:"):
    connection = sqlite3.connect(path)
    connection.enable_load_extension(True)
    connection.load_extension(EXTENSION)
    return connection


def value(connection, expression, *arguments):
    return connection.execute(f"SELECT {expression}", arguments).fetchone()[0]


@pytest.fixture(scope="module")
def names():
    """Names, some twice, with letters that a German order has places for."""
    randomly = random.Random(1)
    starts, ends = "Mül Mul Muell Öz Oz Ång Zw É Ge ge GE Stra Straß".split(), "ler er berg-Süd mann ße sse Ü u a".split()
    return [f"{randomly.choice(starts)}{randomly.choice(ends)}{randomly.choice(ends)} {randomly.randrange(300)}"
            for _ in range(NAMES)]


def test_an_indexed_table_is_in_the_order_of_the_command_line(names, tmp_path):
    text, database = tmp_path / "names", str(tmp_path / "names.db")
    text.write_text("\n".join(names) + "\n", encoding="utf-8")
    expected = subprocess.run(["lexicor", "sort", "--locale", "German_Germany.UTF-8", str(text)], check=True,
                              capture_output=True).stdout
    script = f"""
.load {EXTENSION}
.output /dev/null
SELECT lexicor_collation('german', 'German_Germany');
.output
CREATE TABLE person(name TEXT COLLATE german);
.mode tabs
.import {text} person
CREATE INDEX by_name ON person(name);
SELECT name FROM person ORDER BY name;
.output {tmp_path}/said
PRAGMA integrity_check;
EXPLAIN QUERY PLAN SELECT name FROM person ORDER BY name;
EXPLAIN QUERY PLAN SELECT * FROM person WHERE name BETWEEN 'Öz' AND 'Str';
SELECT count(*) FROM person WHERE name BETWEEN 'Ö' AND 'Str';
SELECT count(*) FROM person WHERE lexicor_key(name, 'German') BETWEEN lexicor_key('Ö', 'German') AND
  lexicor_key('Str', 'German');
"""
    ran = subprocess.run(["sqlite3", "-bail", database], input=script.encode(), capture_output=True)
    assert ran.stderr == b"" and ran.stdout == expected
    said = (tmp_path / "said").read_text().splitlines()
    assert said[0] == "ok" and "by_name" in said[2] and "by_name (name>? AND name<?)" in said[4]
    assert said[-1] == said[-2] and int(said[-1]) > NAMES // 20


def test_a_database_of_other_orders(tmp_path):
    words = ["Äpfel", "Zaun", "apfel", "Ölung", "zebra", "Apfel", "\U0001f601", "\U0001f600", "", "a\0b", "ａ"]
    for encoding in "UTF-8", "UTF-16":
        database = connect()
        database.execute(f"PRAGMA encoding = '{encoding}'")
        database.execute("CREATE TABLE word(w)")
        database.executemany("INSERT INTO word VALUES(?)", [(word,) for word in words])
        for locale in "German", "Swedish.Latin1", "English@Binary":
            name = "c" + locale[0]
            for _ in range(2):  # a second time is none
                assert value(database, "lexicor_collation(?, ?)", name, locale).startswith(locale[:7])
            by_order = [row[0] for row in database.execute("SELECT w FROM word ORDER BY w COLLATE " + name)]
            by_key = [row[0] for row in database.execute("SELECT w FROM word ORDER BY lexicor_key(w, ?), w", (locale,))]
            assert by_order == by_key
    value(database, "lexicor_collation('c', 'German', 'case')")
    assert value(database, "'APFEL' = 'apfel' COLLATE c") == 1
    assert value(database, "'\U0001f600' < '\U0001f601' COLLATE c") == 1
    for locale in "German", "English@Binary":
        for _ in range(2):
            value(database, f"lexicor_collation('{random.choice('wW')}{locale[0]}', ?, 'width')", locale)
        order = [row[0] for row in database.execute(f"SELECT w FROM word ORDER BY w COLLATE w{locale[0]}")]
        keys = [value(database, "lexicor_key(?, ?, 'width')", word, locale) for word in order]
        assert keys == sorted(keys) and value(database, f"'ab' = 'abc' COLLATE w{locale[0]}") == 0


def test_values_and_errors():
    database = connect()
    assert value(database, "lexicor_upper(?, 'German')", "ß" * 1000 + "\U0001f600ä") == "SS" * 1000 + "\U0001f600Ä"
    assert value(database, "lexicor_format(-1234567, 'French')") == "-1 234 567"
    assert value(database, "lexicor_format(2147483648, 'German')") == "2.147.483.648,00"
    assert value(database, "lexicor_format('2026-11-21T14:05', 'German', '%H:%M')") == "14:05"
    assert value(database, "lexicor_convert(?, 'MS932', 'UTF-8')", "日本".encode("cp932")) == "日本"
    assert value(database, "lexicor_convert(x'C10E', 'IBM930', 'UTF-8', 'strict')") == "A"
    assert value(database, "lexicor_key('a', NULL)") is None
    assert value(database, "lexicor_key('', 'English@Binary')") == b""
    assert value(database, "lexicor_key(NULL, 'German') IS NULL AND lexicor_digest(NULL) IS NULL") == 1
    assert len(value(database, "lexicor_digest('German')")) == 128
    assert value(database, "lexicor_digest('German') = lexicor_digest('German_Austria.IBM273')") == 1
    assert value(database, "lexicor_digest('German') = lexicor_digest('Swedish@Swedish')") == 0
    for expression, words in [
            ("lexicor_upper('x', 'German@None')", "German@None: sort not found"),
            ("lexicor_collation('x', 'German', 'size')", "ignore 'case' or 'width', not 'size'"),
            ("lexicor_key('x', 1)", "a locale must be a text"),
            ("lexicor_convert('x', 'UTF-8', 'no')", "no: codepage not found"),
            ("lexicor_convert(x'FF', 'UTF-8', 'Latin1', 'strict')", "not all of it is text in UTF-8"),
            ("lexicor_convert(x'41E3', 'UTF-8', 'Latin1', 'strict')", "not all of it is text in UTF-8"),
            ("lexicor_convert(x'EDA080', 'UTF-8', 'UTF-8', 'strict')", "not all of it is text in UTF-8"),
            ("lexicor_convert(x'C10E45', 'IBM930', 'UTF-8', 'strict')", "not all of it is text in IBM930"),
            ("lexicor_format('soon', 'German')", "'soon' is no date"),
            ("lexicor_format('2026-02-29', 'German')", "'2026-02-29' is no date"),
            ("lexicor_format('2026-02-01 10:00 Uhr', 'German')", "is no date"),
            ("lexicor_format(9007199254740993, 'German')", "9007199254740993 is beyond 2.53"),
            ("lexicor_format('2026-11-21', 'German', '%Q')", "the time format is not valid"),
            ("lexicor_format(1, 'German', 'long')", "not 'long'")]:
        with pytest.raises(sqlite3.OperationalError, match=words.replace("(", ".")):
            value(database, expression)
    value(database, "lexicor_collation('x', 'German')")
    with pytest.raises(sqlite3.OperationalError, match="unable to delete/modify collation sequence"):
        value(database, "lexicor_collation('x', 'Swedish')")


def test_threads_have_connections_of_their_own(names):
    orders, failed = [], []

    def work(locale):
        try:
            for _ in range(3):
                database = connect()
                value(database, "lexicor_collation('own', ?)", locale)
                database.execute("CREATE TABLE t(name TEXT COLLATE own)")
                database.executemany("INSERT INTO t VALUES(?)", [(name,) for name in names[:2000]])
                orders.append((locale, tuple(row[0] for row in database.execute("SELECT name FROM t ORDER BY name"))))
                database.close()
        except Exception as error:
            failed.append(error)

    threads = [threading.Thread(target=work, args=(locale,)) for locale in ("German", "Swedish@Swedish") * 3]
    for thread in threads:
        thread.start()
    for thread in threads:
        thread.join()
    assert not failed and len(orders) == 18 and len(set(orders)) == 2


def test_without_data_loading_says_why():
    ran = subprocess.run(["sqlite3", ":memory:", f".load {EXTENSION}"], env={**os.environ, "LX_LOCALEDIR": "/nowhere"},
                         capture_output=True, text=True)
    assert "lexicor: no locale directory; LX_LOCALEDIR can name one" in ran.stderr
