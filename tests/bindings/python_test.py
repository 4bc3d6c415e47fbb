"""The Python module: that its codecs give what the library gives for every codepage, whole and in any pieces; that
they fit what Python does with codecs; that locales order, write and read as the library does."""
import codecs
import copy
import ctypes
import datetime
import doctest
import functools
import io
import os
import random
import subprocess
import sys
import threading
import tomllib

import pytest

import lexicor
from lexicor import _native

SOURCE = os.path.dirname(os.path.dirname(os.path.dirname(os.path.abspath(__file__))))
SAMPLES = os.path.join(SOURCE, "data/samples")
CODEPAGES = lexicor.names(lexicor.CODEPAGE)
HANDLERS = ["replace", "ignore", "backslashreplace", "xmlcharrefreplace", "namereplace", "surrogateescape"]


def locale_of(codepage):
    code = ctypes.c_int32()
    return _native.library().LXGetLocale(f"English.{codepage}".encode(), 0, ctypes.byref(code))


def converted(data, target, source):
    """By the library, from bytes to bytes."""
    convert = _native.library().LXConvertStringEx
    convert.argtypes = [ctypes.c_void_p, ctypes.c_void_p, ctypes.c_uint32, ctypes.c_int32, ctypes.c_void_p,
                        ctypes.c_char_p, ctypes.c_uint32, ctypes.c_int32, ctypes.c_int32]
    output = ctypes.create_string_buffer(6 * len(data) + 2)
    length = convert(locale_of(target), output, 0, len(output), locale_of(source), data, 0, len(data), 8)
    return output.raw[: length - 1]


def pieces(data, randomly):
    at = 0
    while at < len(data):
        length = randomly.choice([1, 1, 1, 2, 3, 5, 50])
        yield data[at : at + length], at + length >= len(data)
        at += length


@pytest.mark.parametrize("name", CODEPAGES)
def test_codec_is_the_library_in_any_pieces(name):
    randomly, page, codec = random.Random(name), lexicor.Codepage(name), f"lexicor-{name}"
    characters = list(page.characters)
    randomly.shuffle(characters)
    text = "".join(characters)
    data = converted(text.encode("utf-8"), name, "UTF-8")
    assert text.encode(codec) == data
    assert data.decode(codec) == text

    text = "".join(randomly.choices(characters, k=150)) + "".join(c for c in characters if c < "\x7f")
    encoder = codecs.getincrementalencoder(codec)()
    assert b"".join(encoder.encode(*piece) for piece in pieces(text, randomly)) == text.encode(codec)

    # Bytes of any kind, shift bytes among them. What ends inside a character is one more loss.
    data = text.encode(codec)[:80] + bytes(randomly.choices([14, 15, *range(256)], k=300))
    expected = converted(data, "UTF-8", name).decode("utf-8")
    whole = data.decode(codec, "replace")
    assert whole in (expected, expected + "\ufffd")
    for errors in "replace", "backslashreplace", "ignore":
        decoder = codecs.getincrementaldecoder(codec)(errors)
        assert "".join(decoder.decode(*piece) for piece in pieces(data, randomly)) == data.decode(codec, errors)


@pytest.mark.parametrize("codepage", ["IBM930", "MS932", "IBM273", "UTF-8"])
def test_error_handlers(codepage):
    codec = f"lexicor-{codepage}"
    text = "あ\U0001f600a\ud800".replace("あ", "ä" if codepage == "IBM273" else "あ")
    for errors in HANDLERS[:5]:
        instead = "".join(c if c in lexicor.Codepage(codepage).characters else
                          c.encode("ascii", errors).decode() for c in text)
        assert text.encode(codec, errors) == instead.encode(codec), errors
    with pytest.raises(UnicodeEncodeError) as raised:
        text.encode(codec)
    assert (raised.value.start, raised.value.end, raised.value.encoding) == (1, 2, codepage.lower())
    with pytest.raises(LookupError):
        text.encode(codec, "no such handler")


def test_handlers_of_the_caller():
    def back(error):  # goes back once, then on: in bytes behind the first one, where the next character begins
        seen.append(error)
        end = error.end if isinstance(error, UnicodeEncodeError) else error.start + 1
        return ("<", 0) if len(seen) == 1 else (">", end)

    codecs.register_error("back", back)
    seen = []
    assert b"\x0eEb\xfe\xfe\x0f\xc1".decode("ibm930", "back") == "日<日>>A"
    seen = []
    assert "日€本".encode("ibm930", "back").decode("ibm930") == "日<日>本"
    codecs.register_error("bytes", lambda error: (b"\x6f", error.end))
    assert "日€本".encode("ibm930", "bytes").decode("ibm930") == "日?本"
    codecs.register_error("outside", lambda error: ("", 99))
    with pytest.raises(IndexError):
        "€".encode("ibm930", "outside")
    with pytest.raises(UnicodeEncodeError):
        codecs.register_error("no help", lambda error: ("€", error.end))
        "€".encode("ibm930", "no help")


@pytest.mark.parametrize("cut", [b"\x0e\x45", b"\x0eEb\x45"])
def test_what_the_end_cuts(cut):
    with pytest.raises(UnicodeDecodeError, match="cut by the end"):
        cut.decode("ibm930")
    assert cut.decode("ibm930", "replace").endswith("\ufffd")
    assert b"\xc1\x0e".decode("ibm930") == "A"


def test_malformed_text_is_decoded_in_parts_and_utf8_has_one_form():
    assert (b"\xff" * 20_000 + b"a" * 2_000_000).decode("lexicor-utf-8", "ignore") == "a" * 2_000_000
    for ill in b"\xe0\x80\x80", b"\xed\xa0\x80", b"\xed\xa0\xbd\xed\xb8\x80":
        assert (b"a\xe3" + ill + b"b").decode("lexicor-utf-8", "replace") == "a" + "\ufffd" * (1 + len(ill) // 3) + "b"
        with pytest.raises(UnicodeDecodeError):
            ill.decode("lexicor-utf-8")


def test_files(tmp_path):
    path, text = tmp_path / "host", "日本a\n語\r\n" * 3000 + "end語"
    with lexicor.open(path, "w", encoding="ibm-930", newline="") as file:
        for at in range(0, len(text), 7):
            file.write(text[at : at + 7])
    assert path.read_bytes() == text.encode("ibm-930")
    with open(path, encoding="ibm-930", newline="") as file:
        assert file.read() == text
    with open(path, encoding="ibm-930") as file:
        assert list(file) == text.replace("\r", "").splitlines(keepends=True)
    with open(path, encoding="ibm-930", newline="") as file:  # places within runs of double-byte characters
        for count in 1, 2, 5, 4096, 8191:
            file.read(count)
            place, rest = file.tell(), file.read()
            assert text.endswith(rest)
            file.seek(place)
            assert file.read() == rest
            file.seek(0)
    with lexicor.open(path, "a", encoding="ibm-930") as file:
        file.write("本")
    assert path.read_bytes() == text.encode("ibm-930") + "本".encode("ibm-930")
    with lexicor.open(path, "w", encoding="ibm-930") as file:
        file.write("日本"), file.seek(0), file.write("本")
    assert path.read_bytes() == "本".encode("ibm-930") + "日本".encode("ibm-930")[4:]
    with pytest.raises(ValueError, match="shift states"):
        lexicor.open(path, "r+", encoding="ibm-930")
    with codecs.open(path, "w", encoding="ibm-939") as file:
        file.write("日"), file.write("本\n語"), file.reset()
    assert path.read_bytes() == "日本\n語".encode("ibm-939")
    with codecs.open(path, encoding="ibm-939") as file:
        assert [file.readline(), file.read()] == ["日本\n", "語"]
    wrapper = io.TextIOWrapper(io.BytesIO(b"\xc1\xff"), encoding="ibm-930", errors="strict")
    assert wrapper.read() == "A\x9f"


def test_names():
    for name in "IBM-930", "ibm930", "cp930", "lexicor_ibm-930", "Lexicor IBM930":
        assert codecs.lookup(name).name == "ibm930"
    for codepage, alias in _native.aliases():
        assert lexicor.Codepage(alias).name == codepage
    assert codecs.lookup("IBM-932").name == "ibm942" and codecs.lookup("IBM932").name == "ms932"
    assert codecs.lookup("utf-8").name == "utf-8"
    assert {lexicor.Locale.native(f"de_DE.{codeset}").name for codeset in ("UTF-8", "utf8")} == {"German_Germany.UTF-8@Default"}
    assert codecs.lookup("lexicor-utf-8").decode(b"\xf0\x9f\x98\x80", "ignore")[0] == ""
    with pytest.raises(LookupError):
        "".encode("ibm-no-such")
    with pytest.raises(lexicor.Error, match="codepage not found") as raised:
        lexicor.Codepage("no-such")
    assert raised.value.code == 30
    assert lexicor.convert("日本".encode("cp932"), "MS932", "ibm-930") == "日本".encode("ibm-930")


@pytest.mark.parametrize("name", ["German", "Swedish", "Japanese", "English@Binary", "French@FrenchCanadian"])
def test_order(name):
    locale, words = lexicor.Locale(name), []
    for sample in "german", "japanese", "english", "russian":
        words += open(f"{SAMPLES}/{sample}.txt", encoding="utf-8").read().split()[:150]
    words += ["", "ｱ", "ア", "\uff21", "Ā", "ÿ", "A\0b", "x" * 500]
    for ignore in 0, lexicor.Option.CASE, lexicor.Option.WIDTH:
        if ignore == lexicor.Option.WIDTH and name.endswith("Binary"):
            continue  # there only the order of keys knows width
        compared = sorted(words, key=functools.cmp_to_key(lambda a, b: locale.compare(a, b, ignore)))
        keyed = sorted(words, key=lambda word: locale.key(word, ignore))
        assert [locale.key(word, ignore) for word in compared] == [locale.key(word, ignore) for word in keyed]


def test_what_is_refused():
    locale = lexicor.Locale("German.IBM930")
    with pytest.raises(TypeError, match="neither copied"):
        copy.copy(locale)
    for name in "German\0Klingon", "\0":
        with pytest.raises(ValueError, match="null"):
            lexicor.Locale(name)
    for item, value in ((1 << 32) + 1, None), (lexicor.Item.CURRENCY_DIGITS, 1 << 32):
        with pytest.raises(OverflowError):
            locale.item(item) if value is None else locale.set(item, value)
    with pytest.raises(OverflowError):
        locale.key("a", 1 << 32)
    for wrong in (lambda: locale.compare("a", "b", "c"), lambda: locale.format_number("5"), lambda: locale.item(1.5)):
        with pytest.raises(TypeError):
            wrong()
    for text, base in ("2147483648", 10), ("-80000001", 16):
        with pytest.raises(OverflowError):
            locale.parse_integer(text, base)
    assert locale.parse_integer("-80000000", 16) == -1 << 31
    with pytest.raises(ValueError, match="ends before"):
        locale.parse_time("3. Oktober", "%d. %B %Y")
    with pytest.raises(TypeError):
        lexicor.Codepage("UTF-8").decode(5)
    assert locale.compare("a ", "a", lexicor.Option.BLANKS) == 0


def test_numbers_and_times():
    for name in lexicor.names(lexicor.TERRITORY)[::9]:
        locale = lexicor.Locale(f"English_{name}.UTF-8")
        for value in 0, -1, 7, 2147483647, -2147483648:
            assert locale.parse_integer(locale.format_integer(value)) == value
        moment = datetime.datetime(2026, 11, 21, 14, 5, 9)
        text = locale.format_time(moment, "%d.%m.%Y %H:%M:%S")
        assert locale.parse_time(text, "%d.%m.%Y %H:%M:%S") == moment
    german = lexicor.Locale("German_Germany.IBM273")
    assert german.format_currency(-99.9) == "-99,90 €"
    assert german.format_time(datetime.time(14, 5)) == "14:05:00"
    assert german.format_time(moment, "x" * 300) == "x" * 300
    for text in "", "12x", "1,5,5", "%d":
        with pytest.raises(ValueError):
            german.parse_number(text)
    with pytest.raises(ValueError):
        german.parse_time("1.2.", "%d.")
    with pytest.raises(lexicor.Error, match="time format"):
        german.format_time(moment, "%Q")
    with pytest.raises(OverflowError):
        german.format_integer(1 << 31)
    german.set(lexicor.Item.CURRENCY, "DM")
    german.set(lexicor.Item.CURRENCY_DIGITS, 0)
    assert german.format_currency(5).endswith("DM") and german.item(lexicor.Item.CURRENCY_DIGITS) == 0
    with pytest.raises(lexicor.Error):
        german.set(lexicor.Item.MONTH, "x")
    assert german.map("ｱ１", lexicor.Map.FULL_WIDTH) == "ア１" and german.map("٣", lexicor.Map.DIGITS) == "3"
    assert german.upper("ß" * 1000) == "SS" * 1000


def test_catalog(tmp_path):
    path, long = str(tmp_path / "x.cat"), "ä" * 3000
    subprocess.run(["lexicor-gencat", path], input=f"1 kurz\n2 {long}\n".encode(), check=True)
    catalog = lexicor.Catalog(lexicor.Locale("German.UTF-8"), path)
    assert [catalog.message(1, 1), catalog.message(1, 2), catalog.message(2, 1, "x")] == ["kurz", long, "x"]
    with pytest.raises(KeyError):
        catalog.message(9, 9)
    with pytest.raises(lexicor.Error, match="catalog"):
        lexicor.Catalog(lexicor.Locale("German"), path + "x")


def test_threads_share_a_locale_and_codecs():
    locale, wrong = lexicor.Locale("German_Germany"), []

    def work(number):
        for i in range(200):
            if i % 3 == number % 3:
                with pytest.raises(lexicor.Error):
                    locale.item(99)
            if locale.key("Äpfel") != key or "日本".encode("ibm-930").decode("ibm-930") != "日本":
                wrong.append(number)

    key = locale.key("Äpfel")
    threads = [threading.Thread(target=work, args=(number,)) for number in range(6)]
    for thread in threads:
        thread.start()
    for thread in threads:
        thread.join()
    assert not wrong


def test_the_page():
    failed, tried = doctest.testfile(f"{SOURCE}/docs/python.md", module_relative=False,
                                     optionflags=doctest.IGNORE_EXCEPTION_DETAIL)
    assert failed == 0 and tried > 20


def test_the_version_is_the_library_s():
    with open(f"{SOURCE}/bindings/python/pyproject.toml", "rb") as file:
        assert tomllib.load(file)["project"]["version"] == lexicor.version()


def test_without_data_codecs_say_why():
    environment = {**os.environ, "LX_LOCALEDIR": "/nowhere"}
    for name in "ibm930", "lexicor-ibm930":
        said = subprocess.run([sys.executable, "-c", "import sys, lexicor; ''.encode(sys.argv[1])", name], env=environment,
                              capture_output=True, text=True).stderr
        assert "no codepages: /nowhere" in said
        assert f"LookupError: unknown encoding: {name}" in said.replace("_", "-")
