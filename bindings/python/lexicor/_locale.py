"""Locales: order, numbers, money, times, case, items; and message catalogs.

Texts are str, which the library takes as 16-bit Unicode: the codepage of a locale matters to its name and to what is
written for others, not to what is done here. A locale may be used by several threads; they take turns."""
from __future__ import annotations

import ctypes
import datetime
import enum
import re
import threading
import weakref
from ctypes import c_int32, c_void_p
from typing import Any, Callable, Optional, Tuple, Union, overload

from . import _native
from ._native import E_MESSAGE, E_SIZE, OK, Error, library
from ._codepage import Codepage


class Item(enum.IntEnum):
    """What a locale can be asked for. Of a range the first one: `Item.DAY + 1` is Monday."""

    LANGUAGE_ID, LANGUAGE, LANGUAGE_ABBREVIATION, LANGUAGE_NAME = 1, 2, 3, 4
    TERRITORY_ID, TERRITORY, TERRITORY_ABBREVIATION, TERRITORY_NAME = 5, 6, 7, 8
    CODEPAGE_ID, CODEPAGE, SORT_ID, SORT = 9, 10, 11, 12
    DEFAULT_TERRITORY, DEFAULT_CODEPAGE, DEFAULT_SORT = 13, 14, 15
    DAY, SHORT_DAY, MONTH, SHORT_MONTH = 16, 23, 30, 43
    MORNING, AFTERNOON, FLAG_58 = 56, 57, 58
    DECIMAL, THOUSANDS, LIST, GROUPING, DIGITS = 59, 60, 61, 62, 63
    CURRENCY, INTERNATIONAL_CURRENCY = 64, 65
    MONETARY_DECIMAL, MONETARY_THOUSANDS, MONETARY_GROUPING = 66, 67, 68
    CURRENCY_DIGITS, INTERNATIONAL_DIGITS, POSITIVE_SIGN, NEGATIVE_SIGN = 69, 70, 71, 72
    POSITIVE_PRECEDES, POSITIVE_SPACE, NEGATIVE_PRECEDES, NEGATIVE_SPACE = 73, 74, 75, 76
    POSITIVE_POSITION, NEGATIVE_POSITION = 77, 78
    TIME_FORMAT, SHORT_DATE_FORMAT, LONG_DATE_FORMAT = 79, 80, 81
    FLAG_82, FLAG_83, VALUE_84 = 82, 83, 84
    CODEPAGE_WIDTH, CODEPAGE_ASCII, CODEPAGE_SHIFT, LOCALE_STRING = 85, 86, 87, 88


class Option(enum.IntFlag):
    """What does not count in a comparison. CASE and WIDTH exclude each other."""

    BLANKS = 0x00200000
    CASE = 0x80000040
    WIDTH = 0x80000041


class Map(enum.IntEnum):
    """Mappings of a text."""

    FULL_WIDTH, HALF_WIDTH = 0x80000021, 0x80000022
    LOWER, UPPER = 0x80000024, 0x80000025
    LOWER_SIMPLE, UPPER_SIMPLE = 0x80002024, 0x80002025
    DIGITS = 16


_NUMBERS = {1, 5, 9, 11, 58, 63, 69, 70, *range(73, 79), *range(82, 88)}
_INTERNATIONAL, _MONETARY, _NATIONAL_DIGITS = 0x40, 0x20, 0x10
_CATALOG_LOAD = 0x80000061
_EXTREMES = (-(1 << 31), (1 << 31) - 1)
_MOST = 1 << 24
_KEY_BYTES = 512  # of a key that needs no buffer of its own
Moment = Union[datetime.date, datetime.time]


class Locale(_native.Owner):
    """A locale by name: language, then optionally "_" and a territory, "." and a codepage, "@" and a sort. Without a
    name the user's, as LX_LANG or the operating system has it."""

    def __init__(self, name: Optional[str] = None) -> None:
        code = c_int32()
        flags, text = (0x6, b"") if name is None else (0, _native.name_of(name))
        self._take(library().LXGetLocale(text, flags, ctypes.byref(code)), code.value, name or "the user's locale")

    @classmethod
    def native(cls, name: str) -> "Locale":
        """By the operating system's name, its codeset in any spelling: "de_DE.UTF-8", "de_DE.utf8"."""
        code = c_int32()
        made = cls.__new__(cls)
        plain = re.sub(r"\.[^@]*", lambda codeset: re.sub(r"[^.a-z0-9]", "", codeset[0].lower()), name)
        convert = library().LXConvertNativeLocale
        handle = convert(_native.name_of(name), 0, ctypes.byref(code))
        made._take(handle or convert(_native.name_of(plain), 0, ctypes.byref(code)), code.value, name)
        return made

    def _take(self, handle: Optional[int], code: int, name: str) -> None:
        if not handle:
            raise Error(code, name)
        self._handle = handle
        self._lock = threading.RLock()
        self._buffer = ctypes.create_string_buffer(_KEY_BYTES)
        self._binary = library().LXGetLocaleNumInfo(handle, Item.SORT_ID, 0) == 0
        weakref.finalize(self, library().LXReleaseLocale, handle).atexit = False

    def __repr__(self) -> str:
        return f"lexicor.Locale({self.name!r})"

    # A call, and what it leaves as the locale's last error.

    def _call(self, function: Callable[..., Any], *arguments: Any) -> Any:
        _native.check_integers(function, (self._handle, *arguments))
        with self._lock:
            try:
                result = function(self._handle, *arguments)
            except ctypes.ArgumentError as error:
                raise TypeError(str(error)) from None
            code = library().LXGetError(self._handle)
        if code != OK:
            raise Error(code)
        return result

    def _written(self, function: Callable[..., int], before: Tuple[Any, ...], after: Tuple[Any, ...]) -> str:
        """What a function writes, that says when it has no room."""
        size = 128
        while True:
            buffer = _native.unit_buffer(size)
            try:
                count = self._call(function, *before, buffer, size, *after)
            except Error as error:
                if error.code != E_SIZE or size >= _MOST:
                    raise
                size *= 8
                continue
            return _native.text_of(buffer, count)

    # Items.

    @property
    def name(self) -> str:
        return str(self.item(Item.LOCALE_STRING))

    @property
    def codepage(self) -> Codepage:
        return Codepage(str(self.item(Item.CODEPAGE)))

    def item(self, item: int) -> Union[str, int]:
        """The value of an item: `locale.item(Item.DAY + 1)`."""
        if item in _NUMBERS:
            return int(self._call(library().LXGetLocaleNumInfo, item, 0))
        size = 256
        while True:  # a text that does not fit is cut, and nothing says so
            buffer = _native.unit_buffer(size)
            count = int(self._call(library().LXGetLocaleTextInfoU, item, buffer, size, 0))
            if count < size:
                return _native.text_of(buffer, max(count - 1, 0))
            size *= 8

    def set(self, item: int, value: Union[str, int]) -> None:
        """Changes an item of this locale alone."""
        if isinstance(value, str):
            self._call(library().LXSetLocaleTextInfoU, item, *_native.units(value), 0)
        else:
            self._call(library().LXSetLocaleNumInfo, item, value)
        self._binary = self.item(Item.SORT_ID) == 0

    def digest(self, kind: int) -> str:
        """The SHA-256, in hexadecimal, of the data of `lexicor.LANGUAGE`, `TERRITORY`, `CODEPAGE` or `SORT`: stored
        beside keys it tells when they must be made anew."""
        buffer = (ctypes.c_uint8 * 32)()
        self._call(library().LXGetLocaleDigest, kind, buffer, 32)
        return bytes(buffer).hex()

    # Order.

    def compare(self, a: str, b: str, ignore: int = 0) -> int:
        """Below 0, 0 or above 0, as `a` stands to `b` in the order of the locale's sort."""
        if ignore & Option.BLANKS:  # which the library knows by their code in the codepage
            a, b = a.rstrip(" "), b.rstrip(" ")
        return int(self._call(library().LXStrcollU, *_native.units(a), *_native.units(b), ignore))

    def key(self, text: str, ignore: int = 0) -> bytes:
        """Bytes that order as compare() does: `sorted(words, key=locale.key)`."""
        units, count = _native.units(text)
        transform, buffer, size = library().LXStrxfrmU, self._buffer, _KEY_BYTES
        if ignore != 0:
            _native.check_integers(transform, (self._handle, buffer, size, units, count, ignore))
        with self._lock:
            while True:
                length = transform(self._handle, buffer, size, units, count, ignore)
                if length <= size:
                    break
                buffer, size = ctypes.create_string_buffer(length), length
            if length < 0:
                raise Error(library().LXGetError(self._handle))
            key = ctypes.string_at(buffer, length)
        if self._binary and not text:
            return b""
        if self._binary and _native.UTF16 == "utf-16-le":  # there a key is the units, as the machine has them
            key = key.decode(_native.UTF16, "surrogatepass").encode("utf-16-be", "surrogatepass")
        return key

    # Case and width.

    def upper(self, text: str) -> str:
        return self.map(text, Map.UPPER)

    def lower(self, text: str) -> str:
        return self.map(text, Map.LOWER)

    def map(self, text: str, mapping: int) -> str:
        units, count = _native.units(text)
        size = 2 * count + 2  # a character becomes two at most
        buffer = _native.unit_buffer(size)
        return _native.text_of(buffer, self._call(library().LXMapStringU, buffer, size, units, count, mapping))

    # Numbers and money.

    def format_integer(self, value: int) -> str:
        if not -(1 << 31) <= value < 1 << 31:
            raise OverflowError(f"{value} has more than 32 bits")
        return self._written(library().LXLongToStringU, (value,), (0,))

    def format_number(self, value: float) -> str:
        return self._written(library().LXDoubleToStringU, (value,), (0,))

    def format_currency(self, value: float, international: bool = False) -> str:
        flags = _INTERNATIONAL if international else 0
        return self._written(library().LXCurrencyToStringU, (value,), (flags,))

    def parse_integer(self, text: str, base: int = 10) -> int:
        """The number that a text is; ValueError when it is none. Digits of any script count, and thousands separators
        that are blanks, which end a number for the C functions. OverflowError when it has more than 32 bits."""
        value = int(self._parsed(library().LXStringToLongU, text, Item.THOUSANDS, base, _NATIONAL_DIGITS))
        # The library reads the nearest value in place of one that is out of range.
        if value in _EXTREMES and value != (self.parse_number(text) if base == 10 else int(text, base)):
            raise OverflowError(f"{text!r} has more than 32 bits")
        return value

    def parse_number(self, text: str, monetary: bool = False) -> float:
        flags = _NATIONAL_DIGITS | (_MONETARY if monetary else 0)
        thousands = Item.MONETARY_THOUSANDS if monetary else Item.THOUSANDS
        return float(self._parsed(library().LXStringToDoubleU, text, thousands, flags))

    def _parsed(self, function: Callable[..., Any], text: str, thousands: Item, *arguments: int) -> Any:
        separator = str(self.item(thousands))
        text = text.strip()
        units, count = _native.units(text.replace(separator, "") if separator.isspace() else text)
        begin, end = ctypes.cast(ctypes.c_char_p(units), c_void_p).value or 0, c_void_p()
        value = self._call(function, begin, count, ctypes.byref(end), *arguments)
        if count == 0 or (end.value or 0) - begin != 2 * count:
            raise ValueError(f"not a number in {self.name}: {text!r}")
        return value

    # Times.

    def format_time(self, moment: Moment, format: Optional[str] = None) -> str:  # noqa: A002
        """A date, a time or both by a format of directives as in lx/time.h: "%A, %d. %B %Y". Without one the
        locale's date, time or both."""
        text = self._own_format(moment) if format is None else format
        time = _time_of(moment)
        return self._written(library().LXTimeToStringU, (ctypes.byref(time),), (*_native.units(text), 0))

    def parse_time(self, text: str, format: str) -> datetime.datetime:  # noqa: A002
        """The moment that a whole text is; fields that the format lacks are those of 1900-01-01 00:00:00."""
        time = self._read_time(text, format, _native.Time(0, 0, 0, 1, 0, 0, 0, 0))
        moment = datetime.datetime(time.year + 1900, time.month + 1, time.day, time.hours, time.minutes, time.seconds)
        # The library reads a text that ends before its format: the fields that stay are more than those of a whole one.
        if self._fields_of(text, format) != self._fields_of(self.format_time(moment, format), format):
            raise ValueError(f"the time ends before its format {format!r}: {text!r}")
        return moment

    def _read_time(self, text: str, format: str, preset: _native.Time) -> _native.Time:  # noqa: A002
        units, count = _native.units(text)
        read = self._call(library().LXStringToTimeU, ctypes.byref(preset), units, count, *_native.units(format), 0)
        if read != count:
            raise ValueError(f"behind the time stands {units[2 * read : -2].decode(_native.UTF16)!r}")
        return preset

    def _fields_of(self, text: str, format: str) -> list[str]:  # noqa: A002
        """The fields that a text sets, whatever they were before."""
        presets = (1, 1, 1, 2, 1, 1, 1, 1), (2, 2, 2, 3, 2, 2, 2, 2)
        one, other = (self._read_time(text, format, _native.Time(*preset)) for preset in presets)
        return [name for name, _ in _native.Time._fields_ if getattr(one, name) == getattr(other, name)]

    def _own_format(self, moment: Moment) -> str:
        date, time = str(self.item(Item.SHORT_DATE_FORMAT)), str(self.item(Item.TIME_FORMAT))
        if isinstance(moment, datetime.datetime):
            return f"{date} {time}"
        return date if isinstance(moment, datetime.date) else time


def _time_of(moment: Moment) -> _native.Time:
    date = moment if isinstance(moment, datetime.date) else datetime.date(1900, 1, 1)
    time = moment if not isinstance(moment, datetime.date) or isinstance(moment, datetime.datetime) else datetime.time()
    return _native.Time(time.second, time.minute, time.hour, date.day, date.month - 1, date.year - 1900,
                        date.isoweekday() % 7, date.timetuple().tm_yday - 1)


class Catalog(_native.Owner):
    """A message catalog: a path, or a template of one as LXOpenCatalog expands it."""

    def __init__(self, locale: Locale, name: str, directory: Optional[str] = None) -> None:
        self._locale = locale  # whose codepage the messages are in, and who must outlive the catalog
        with locale._lock:
            handle = library().LXOpenCatalog(locale._handle, None if directory is None else _native.name_of(directory),
                                             _native.name_of(name), _CATALOG_LOAD)
            code = library().LXGetError(locale._handle)
        if not handle:
            raise Error(code, name)
        self._handle = handle
        weakref.finalize(self, library().LXCloseCatalog, handle).atexit = False

    @overload
    def message(self, set: int, number: int) -> str: ...  # noqa: A002

    @overload
    def message(self, set: int, number: int, default: str) -> str: ...  # noqa: A002

    def message(self, set: int, number: int, default: Optional[str] = None) -> str:  # noqa: A002
        """A message; without one `default`, or KeyError."""
        size = 512
        _native.check_integers(library().LXGetMessageU, (self._handle, set, number))
        while True:  # a message that does not fit is cut, and nothing says so
            buffer = _native.unit_buffer(size)
            with self._locale._lock:
                code = library().LXGetMessageU(self._handle, set, number, buffer, size, None)
            if code == E_MESSAGE:
                if default is None:
                    raise KeyError((set, number))
                return default
            if code != OK:
                raise Error(code)
            text = _native.text_of(buffer, size).partition("\0")[0]
            if len(text) < size - 8 or size > _MOST:
                return text
            size *= 8
