"""Codepages as Python codecs: `open(..., encoding="ibm-930")`, `"...".encode("ibm-939", "strict")`.

A text is converted by the library as a whole; only where something cannot be converted it is looked at character by
character, and the error handler decides. Shift states are kept between the pieces of a text."""
from __future__ import annotations

import array
import codecs
import ctypes
import io
import re
import threading
import warnings
import weakref
from ctypes import c_int32, c_uint32
from typing import IO, Any, NamedTuple, Optional, Tuple, Union

from . import _native
from ._native import CHARACTERS, Error, library

_SINGLE = 0
_REPLACEMENT = "\ufffd"
_PIECE = 1 << 24  # characters that are encoded at once
_MOST = 0x7FFFFFF0  # bytes
_WINDOW = 64  # bytes that are decoded behind something malformed; twice as many where there was nothing
# Forms of UTF-8 that are no characters, and which the library reads: longer ones than need be, and surrogates.
_ILL_FORMED = re.compile(rb"\xe0[\x80-\x9f][\x80-\xbf]|\xed[\xa0-\xbf][\x80-\xbf]")
_PREFIX = "lexicor"
_locales = threading.local()


class _Handle:
    """A locale of a codepage, for one thread."""

    def __init__(self, codepage: str) -> None:
        code = c_int32()
        self.value: int = library().LXGetLocale(f"English.{codepage}".encode("ascii"), 0, ctypes.byref(code))
        if not self.value:
            raise Error(code.value, f"codepage {codepage}")

        weakref.finalize(self, library().LXReleaseLocale, self.value).atexit = False


def _plain(name: str) -> str:
    """A name as Python looks codecs up: other signs than letters and digits are alike."""
    return re.sub(r"[^0-9a-z]+", "_", name.lower())


def _simple(name: str) -> str:
    """A name by its letters and digits."""
    return re.sub(r"[^0-9a-z]", "", name.lower())


def _in_class(unit: int) -> str:
    """A character in a class of a regular expression, where some of ASCII have a meaning."""
    return f"\\x{unit:02x}" if unit < 0x80 else chr(unit)


def _codepages_by_name() -> dict[str, str]:
    """Codepages by their names and aliases, and by those without signs where that leaves them apart: CP949 and CP-949
    are not the same one."""
    pairs = [(alias, codepage) for codepage, alias in reversed(_native.aliases())]
    pairs += [(codepage, codepage) for codepage in _native.names(_native.CODEPAGE)]
    simple: dict[str, set[str]] = {}
    for name, codepage in pairs:
        simple.setdefault(_simple(name), set()).add(codepage)
    names = {name: next(iter(codepages)) for name, codepages in simple.items() if len(codepages) == 1}
    return {**names, **{_plain(name): codepage for name, codepage in pairs}}


class _Decoded(NamedTuple):
    text: str
    consumed: int
    state: int


class Codepage:
    """A codepage of the locale directory, by object name or alias. `encode` and `decode` know every error handler."""

    _known: dict[str, "Codepage"] = {}
    _names: dict[str, str] = {}

    def __new__(cls, name: str) -> "Codepage":
        found = cls.find(name)
        if found is None:
            raise Error(30, name)
        return found

    @classmethod
    def find(cls, name: str) -> Optional["Codepage"]:
        if not cls._names:
            cls._names = _codepages_by_name()
        codepage = cls._names.get(_plain(name)) or cls._names.get(_simple(name))
        if codepage is None:
            return None
        if codepage not in cls._known:
            made = object.__new__(cls)
            made._set_up(codepage)
            cls._known[codepage] = made
        return cls._known[codepage]

    def _set_up(self, name: str) -> None:
        self.name = name
        self.codec_name = name.lower()
        lib, locale = library(), self._locale()
        self.shift = lib.LXGetLocaleNumInfo(locale, 87, 0) == 1
        self._width = lib.LXGetLocaleNumInfo(locale, 85, 0) + self.shift
        every = array.array("H", range(0x10000))
        codes, back = (c_uint32 * 0x10000)(), _native.unit_buffer(0x10000)
        lib.LXUnicodeToStringW(locale, codes, 0x10000, every.buffer_info()[0], 0x10000, 0)
        lib.LXStringToUnicodeW(back, 0x10000, locale, codes, 0x10000, 0)
        # What comes back as it was, is in the codepage. Surrogates come back from UTF-8, and are no characters.
        same = [unit for unit, other in enumerate(memoryview(back).cast("B").cast("H").tolist()) if unit == other]
        there = [unit for unit in same if not 0xD800 <= unit < 0xE000]
        if self._stands_in(codes, back):
            there.remove(0xFFFD)
        self._wide = frozenset(map(chr, (unit for unit in there if codes[unit] > 0xFF))) if self.shift else frozenset()
        # The bytes that lead to the states: none where no character needs one.
        wide = next(iter(self._wide), None)
        self._shifts: Tuple[bytes, ...] = () if wide is None else (self.close(1), self._convert(wide, _SINGLE)[0][:1])
        self._has_replacement = 0xFFFD in there
        self._ill_formed = _ILL_FORMED if name == "UTF-8" else None
        ranges: list[list[int]] = []
        for unit in there:
            if ranges and ranges[-1][1] == unit - 1:
                ranges[-1][1] = unit
            else:
                ranges.append([unit, unit])
        self._lacking = re.compile("[^" + "".join(f"{_in_class(a)}-{_in_class(b)}" for a, b in ranges) + "]+")
        self.characters = "".join(map(chr, there))

    @staticmethod
    def _stands_in(codes: Any, back: Any) -> bool:
        """Whether U+FFFD comes back only because the byte that stands for lost characters has that value."""
        return bool(back[0xFFFD] == 0xFFFD and codes[0xFFFD] == codes[0xFFFF])

    def _locale(self) -> int:
        handles: dict[str, _Handle] = _locales.__dict__
        if self.name not in handles:
            handles[self.name] = _Handle(self.name)
        return handles[self.name].value

    # Encoding.

    def encode(self, text: str, errors: str = "strict") -> bytes:
        """A whole text, which ends in the single-byte state."""
        data, state = self.encode_part(text, errors, _SINGLE)
        return data + self.close(state)

    def close(self, state: int) -> bytes:
        """The bytes that lead back to the single-byte state."""
        shift = ctypes.create_string_buffer(2)
        length = library().LXTerminateStringEx(self._locale(), shift, state, 0)
        return shift.raw[:length]

    def encode_part(self, text: str, errors: str, state: int) -> Tuple[bytes, int]:
        """A piece of a text, from a shift state on, and the state behind it."""
        parts: list[bytes] = []
        at, lacking = 0, self._lacking.search(text)
        while lacking:
            data, state = self._convert(text[at : lacking.start()], state)
            parts.append(data)
            error = UnicodeEncodeError(self.codec_name, text, lacking.start(), lacking.end(), f"not in {self.name}")
            instead, at = codecs.lookup_error(errors)(error)
            at = _checked(at, len(text))
            if isinstance(instead, bytes):
                parts.append(self.close(state) + instead)
                state = _SINGLE
            else:
                if self._lacking.search(instead):
                    raise error
                data, state = self._convert(instead, state)
                parts.append(data)
            lacking = self._lacking.search(text, at)
        data, state = self._convert(text[at:], state)
        return b"".join(parts) + data, state

    def _convert(self, text: str, state: int) -> Tuple[bytes, int]:
        parts: list[bytes] = []
        for at in range(0, len(text), _PIECE):
            piece = text[at : at + _PIECE]
            units, count = _native.units(piece)
            size = count * self._width
            output = ctypes.create_string_buffer(size)
            length = library().LXUnicodeToStringEx(self._locale(), output, state, size, units, count, 0)
            parts.append(ctypes.string_at(output, length))
            state = int(piece[-1] in self._wide)
        return b"".join(parts), state

    # Decoding.

    def decode(self, data: Union[bytes, bytearray, memoryview], errors: str = "strict") -> str:
        """A whole text. A character that its end cuts is an error."""
        return self.decode_part(_bytes_of(data), errors, _SINGLE, True).text

    def decode_part(self, data: bytes, errors: str, state: int, final: bool) -> _Decoded:
        """The whole characters of a piece of a text, from a shift state on; how many bytes they are, and the state
        behind them."""
        if len(data) > _MOST:
            raise OverflowError(f"{len(data)} bytes at once")
        parts: list[str] = []
        first_state, at, window = state, 0, len(data)
        while at < len(data):
            limit = min(at + window, len(data))
            ill = self._ill_formed.search(data, at, limit) if self._ill_formed else None
            limit = ill.start() if ill else limit
            text, end, state_there = self._characters(data, at, limit, state)
            lost = self._first_lost(data, at, state, text)
            if lost is None and end == at and ill:
                lost = 0, at, limit if at < limit else ill.end(), state
            if lost is None:
                parts.append(text)
                at, state, stop, reason = end, state_there, len(data), "cut by the end"
                window *= 2
                if limit < len(data):
                    continue
                if not final or at == len(data) or self._only_shift(data[at:]):
                    break
            else:
                index, at, stop, state = lost
                window = _WINDOW
                parts.append(text[:index])
                reason = f"no character of {self.name}"
            instead, behind = codecs.lookup_error(errors)(
                UnicodeDecodeError(self.codec_name, data, at, stop, reason))
            if not isinstance(instead, str):
                raise TypeError("the error handler must give a text to decode to")
            parts.append(instead)
            behind = _checked(behind, len(data))
            if behind < at:  # the state there is that of the way there
                at, state = 0, first_state
            state = self._moved(data, at, state, behind - at)[1]
            at = behind
        return _Decoded("".join(parts), at, state)

    def _moved(self, data: bytes, at: int, state: int, length: int, flags: int = 0) -> Tuple[int, int]:
        """Behind `length` bytes, or characters, from `at` on: the place and the state."""
        base = ctypes.cast(ctypes.c_char_p(data), ctypes.c_void_p).value or 0
        there = c_uint32(state)
        end = library().LXMoveStringPointerEx(self._locale(), base + at, state, length, ctypes.byref(there), flags)
        return min(end - base, len(data)), there.value

    def _characters(self, data: bytes, at: int, limit: int, state: int) -> Tuple[str, int, int]:
        """The text of the whole characters between two places, and the place and the state behind them."""
        end, state_there = self._moved(data, at, state, limit - at)
        buffer = _native.unit_buffer(end - at)
        base = ctypes.cast(ctypes.c_char_p(data), ctypes.c_void_p).value or 0
        count = library().LXStringToUnicodeEx(buffer, end - at, self._locale(), base + at, state, end - at, 0)
        return _native.text_of(buffer, count), end, state_there

    def _only_shift(self, data: bytes) -> bool:
        return data in self._shifts

    def _first_lost(self, data: bytes, at: int, state: int, text: str) -> Optional[Tuple[int, int, int, int]]:
        """Which character of a text has no Unicode value, where its bytes begin and end, and its state."""
        done, index = 0, text.find(_REPLACEMENT)
        while index >= 0:
            if index > done:
                at, state = self._moved(data, at, state, index - done, CHARACTERS)
            while data[at : at + 1] in self._shifts:
                state, at = self._shifts.index(data[at : at + 1]), at + 1
            end = self._end_of(data, at, state)
            if not (self._has_replacement and data[at:end] == self._convert(_REPLACEMENT, _SINGLE)[0]):
                return index, at, end, state
            done, index = index, text.find(_REPLACEMENT, index + 1)
        return None

    def _end_of(self, data: bytes, at: int, state: int) -> int:
        """The end of the character at `at`, without a shift byte behind it."""
        for length in range(1, 5):
            if self._moved(data[at : at + length], 0, state, length)[0] == length:
                return at + length
        return at + 1


def _bytes_of(data: Any) -> bytes:
    """The bytes of what has some: not so many as a number says."""
    return bytes(memoryview(data))


def _checked(place: int, length: int) -> int:
    place = place + length if place < 0 else place
    if not 0 <= place <= length:
        raise IndexError(f"position {place} from error handler out of bounds")
    return place


# Codecs.


class _Encoder(codecs.IncrementalEncoder):
    page: Codepage

    def __init__(self, errors: str = "strict") -> None:
        super().__init__(errors)
        self.state = _SINGLE
        collector = getattr(_collecting, "encoders", None)
        if collector is not None:
            collector.append(self)

    def encode(self, input: str, final: bool = False) -> bytes:  # noqa: A002
        data, state = self.page.encode_part(input, self.errors, self.state)
        if final:
            data, state = data + self.page.close(state), _SINGLE
        self.state = state
        return data

    def reset(self) -> None:
        self.state = _SINGLE

    def getstate(self) -> int:
        return self.state

    def setstate(self, state: Union[int, str]) -> None:
        self.state = int(state)


class _Decoder(codecs.IncrementalDecoder):
    page: Codepage

    def __init__(self, errors: str = "strict") -> None:
        super().__init__(errors)
        self.pending, self.state = b"", _SINGLE

    def decode(self, input: Any, final: bool = False) -> str:  # noqa: A002
        data = self.pending + _bytes_of(input)
        done = self.page.decode_part(data, self.errors, self.state, final)
        self.pending, self.state = (b"", _SINGLE) if final else (data[done.consumed :], done.state)
        return done.text

    def reset(self) -> None:
        self.pending, self.state = b"", _SINGLE

    def getstate(self) -> Tuple[bytes, int]:
        return self.pending, self.state

    def setstate(self, state: Tuple[bytes, int]) -> None:
        self.pending, self.state = state


class _Writer(codecs.StreamWriter):
    page: Codepage
    _state = _SINGLE

    def encode(self, input: str, errors: str = "strict") -> Tuple[bytes, int]:  # noqa: A002
        data, self._state = self.page.encode_part(input, errors, self._state)
        return data, len(input)

    def reset(self) -> None:
        """Ends the text in the single-byte state."""
        self.stream.write(self.page.close(self._state))
        self._state = _SINGLE


class _Reader(codecs.StreamReader):
    page: Codepage
    _state = _SINGLE

    def decode(self, input: bytes, errors: str = "strict") -> Tuple[str, int]:  # noqa: A002
        done = self.page.decode_part(_bytes_of(input), errors, self._state, False)
        self._state = done.state
        return done.text, done.consumed

    def reset(self) -> None:
        super().reset()
        self._state = _SINGLE


_collecting = threading.local()


def _codec_info(page: Codepage, name: str) -> codecs.CodecInfo:
    def encode(text: str, errors: str = "strict") -> Tuple[bytes, int]:
        return page.encode(text, errors), len(text)

    def decode(data: Any, errors: str = "strict") -> Tuple[str, int]:
        return page.decode(data, errors), len(data)

    own = {"page": page}
    make: Any = codecs.CodecInfo
    info: codecs.CodecInfo = make(
        encode, decode, name=name,
        incrementalencoder=type("IncrementalEncoder", (_Encoder,), own),
        incrementaldecoder=type("IncrementalDecoder", (_Decoder,), own),
        streamwriter=type("StreamWriter", (_Writer,), own), streamreader=type("StreamReader", (_Reader,), own))
    return info


def _search(name: str) -> Optional[codecs.CodecInfo]:
    """Names of codepages that Python has no codec for; with "lexicor-" before it, of every one. Without codepages
    names of others are left to the searches behind this one."""
    try:
        page = Codepage.find(re.sub(f"^{_PREFIX}[-_]", "", name))
    except Error as error:
        if name.startswith(_PREFIX):
            raise LookupError(f"unknown encoding: {name} (no codepages: {error})") from None
        warnings.warn(f"no codepages: {error}", RuntimeWarning, stacklevel=2)
        return None
    return None if page is None else _codec_info(page, page.codec_name)


codecs.register(_search)


class _File(io.TextIOWrapper):
    """A text file that ends in the single-byte state, which io.TextIOWrapper does not see to."""

    def __init__(self, *arguments: Any, **options: Any) -> None:
        _collecting.encoders = []
        try:
            super().__init__(*arguments, **options)
            self._encoders: list[_Encoder] = _collecting.encoders
        finally:
            _collecting.encoders = None

    def _end(self) -> None:
        """Ends what was written in the single-byte state."""
        if not self.closed and getattr(self, "_encoders", None):
            self.flush()
            self.buffer.write(b"".join(encoder.encode("", True) for encoder in self._encoders))

    def seek(self, cookie: int, whence: int = 0) -> int:
        self._end()
        return super().seek(cookie, whence)

    def close(self) -> None:
        try:
            self._end()
        finally:  # the file is closed whatever happens, and an error on the way is reported
            super().close()


def open_text(file: Any, mode: str = "r", encoding: str = "utf-8", errors: Optional[str] = None,
              newline: Optional[str] = None) -> IO[str]:
    """As the built-in open() for text. What is written ends in the single-byte state of a shift-sensitive codepage,
    also without a line end, and before seek(): the built-in open() leaves files in the state of the last write().
    Text with shift states is not updated in place ("+"), and appended text has states of its own."""
    if "b" in mode:
        raise ValueError("binary mode has no encoding")
    page = getattr(codecs.lookup(encoding).incrementalencoder, "page", None)
    if "+" in mode and page is not None and page.shift:
        raise ValueError(f"text in {page.name} has shift states, and cannot be updated in place")
    binary = io.open(file, mode.replace("t", "") + "b")
    try:
        return _File(binary, encoding=encoding, errors=errors, newline=newline)
    except BaseException:
        binary.close()
        raise


def convert(data: bytes, source: str, target: str, errors: str = "strict") -> bytes:
    """Bytes from one codepage to another. `errors` handles what is malformed, and what the target lacks."""
    return Codepage(target).encode(Codepage(source).decode(data, errors), errors)
