"""The shared library: where it and the locale directory are, its functions, its errors."""
from __future__ import annotations

import ctypes
import operator
import os
import sys
import threading
from ctypes import CFUNCTYPE, POINTER, c_char_p, c_double, c_int32, c_uint16, c_uint32, c_void_p
from pathlib import Path
from typing import Any, Optional, Tuple

NAME = "liblexicor.so.1"
OK, W_DEFAULTS, E_SIZE, E_MESSAGE = 0, 10, 40, 72
TERMINATE, CHARACTERS = 0x8, 0x4000
NO_DEFAULTS = 0x80000001
LANGUAGE, TERRITORY, CODEPAGE, SORT = range(4)
# 16-bit Unicode as the machine has it. Half a surrogate pair is a unit like any other.
UTF16 = "utf-16-le" if sys.byteorder == "little" else "utf-16-be"


class Error(Exception):
    """A return code of the library, in `code`."""

    def __init__(self, code: int, what: str = "") -> None:
        text = _library.LXGetErrorText(code).decode("ascii")
        super().__init__(f"{what}: {text}" if what else text)
        self.code = code


class Owner:
    """What owns a handle of the library, which a copy would free too."""

    def __reduce__(self) -> Any:
        raise TypeError(f"a {type(self).__name__} can be neither copied nor pickled: open it again by its name")


class Time(ctypes.Structure):
    """LXTime."""

    _fields_ = [(name, c_int32) for name in
                ("seconds", "minutes", "hours", "day", "month", "year", "weekday", "day_of_year")]


ObjectCallback = CFUNCTYPE(c_int32, c_void_p, c_int32, c_char_p)
AliasCallback = CFUNCTYPE(c_int32, c_void_p, c_char_p, c_char_p)

# Results and arguments. Texts are pointers: to the bytes of a Python object, or into it.
_I, _U, _P, _S, _D = c_int32, c_uint32, c_void_p, c_char_p, c_double
_TEXT_TO_NUMBER = [_P, _P, _I, POINTER(_P)]
_SIGNATURES: dict[str, Tuple[Any, list[Any]]] = {
    "LXVersion": (_U, [POINTER(_S)]),
    "LXGetErrorText": (_S, [_I]),
    "LXInit": (_I, [_S, _P, _P, _P, _U]),
    "LXGetError": (_I, [_P]),
    "LXGetLocale": (_P, [_S, _I, POINTER(_I)]),
    "LXConvertNativeLocale": (_P, [_S, _I, POINTER(_I)]),
    "LXReleaseLocale": (_I, [_P]),
    "LXGetLocaleDigest": (_I, [_P, _I, _P, _I]),
    "LXEnumLocales": (_I, [ObjectCallback, _P]),
    "LXEnumAliases": (_I, [_P, AliasCallback, _P]),
    "LXGetLocaleNumInfo": (_I, [_P, _I, _I]),
    "LXSetLocaleNumInfo": (_I, [_P, _I, _I]),
    "LXGetLocaleTextInfoU": (_I, [_P, _I, _P, _I, _I]),
    "LXSetLocaleTextInfoU": (_I, [_P, _I, _P, _I, _I]),
    "LXStrcollU": (_I, [_P, _P, _I, _P, _I, _U]),
    "LXStrxfrmU": (_I, [_P, _P, _I, _P, _I, _U]),
    "LXMapStringU": (_I, [_P, _P, _I, _P, _I, _U]),
    "LXLongToStringU": (_I, [_P, _I, _P, _I, _U]),
    "LXDoubleToStringU": (_I, [_P, _D, _P, _I, _U]),
    "LXCurrencyToStringU": (_I, [_P, _D, _P, _I, _U]),
    "LXTimeToStringU": (_I, [_P, POINTER(Time), _P, _I, _P, _I, _U]),
    "LXStringToLongU": (_I, _TEXT_TO_NUMBER + [_I, _U]),
    "LXStringToDoubleU": (_D, _TEXT_TO_NUMBER + [_U]),
    "LXStringToTimeU": (_I, [_P, POINTER(Time), _P, _I, _P, _I, _U]),
    "LXOpenCatalog": (_P, [_P, _S, _S, _U]),
    "LXGetMessageU": (_I, [_P, _U, _U, _P, _I, _P]),
    "LXCloseCatalog": (_I, [_P]),
    "LXStringToUnicodeEx": (_I, [_P, _I, _P, _P, _U, _I, _I]),
    "LXStringToUnicodeW": (_I, [_P, _I, _P, _P, _I, _I]),
    "LXUnicodeToStringEx": (_I, [_P, _P, _U, _I, _P, _I, _I]),
    "LXUnicodeToStringW": (_I, [_P, _P, _I, _P, _I, _I]),
    "LXMoveStringPointerEx": (_P, [_P, _P, _U, _I, POINTER(_U), _I]),
    "LXTerminateStringEx": (_I, [_P, _P, _U, _U]),
}


def _load() -> ctypes.CDLL:
    given = os.environ.get("LEXICOR_LIBRARY")
    try:
        library = ctypes.CDLL(given or NAME)
    except OSError as error:
        raise ImportError(f"{given or NAME} cannot be loaded ({error}); LEXICOR_LIBRARY can name its file") from None
    for name, (result, arguments) in _SIGNATURES.items():
        function = getattr(library, name)
        function.restype, function.argtypes = result, arguments
    return library


_library = _load()
_lock = threading.Lock()
_initialised = False


def _directories() -> list[Path]:
    """Where a locale directory lies beside the library: installed, and in its build directory."""
    with open("/proc/self/maps", encoding="utf-8", errors="surrogateescape") as maps:
        files = [line.split(maxsplit=5)[5].strip() for line in maps if "/liblexicor.so" in line]
    places: list[Path] = []
    for folder in Path(files[0]).resolve().parents[:3] if files else []:
        places += [folder.parent / "share/lexicor/locale", folder.parent / "locale"]
    return [place for place in places if (place / "control.nls").is_file()]


def init(directory: Optional[str] = None) -> None:
    """Initialises the library, which the first use does otherwise. The locale directory is `directory`, that of the
    environment variable LX_LOCALEDIR, or the one that was installed with the library. Once is enough: a further call
    changes nothing."""
    global _initialised
    with _lock:
        if _initialised:
            return
        if directory is None and "LX_LOCALEDIR" not in os.environ:
            directory = next((str(place) for place in _directories()), None)
        code = _library.LXInit(None if directory is None else os.fsencode(directory), None, None, None, NO_DEFAULTS)
        if code != OK:
            if code == W_DEFAULTS:
                _library.LXTerm()
            raise Error(code, directory or os.environ.get("LX_LOCALEDIR") or "LX_LOCALEDIR is not set")
        _initialised = True


def library() -> ctypes.CDLL:
    """The library, initialised."""
    if not _initialised:
        init()
    return _library


def version() -> str:
    """The version of the library."""
    text = c_char_p()
    _library.LXVersion(ctypes.byref(text))
    return (text.value or b"").decode("ascii")


def units(text: str) -> Tuple[bytes, int]:
    """A text as 16-bit Unicode with a null behind it, and its units."""
    data = text.encode(UTF16, "surrogatepass")
    return data + b"\0\0", len(data) // 2


_RANGES = {c_int32: (-(1 << 31), 1 << 31), c_uint32: (0, 1 << 32)}


def check_integers(function: Any, arguments: Tuple[Any, ...]) -> None:
    """Integers that do not fit the parameters of a function, which ctypes would cut, are an OverflowError; what is no
    integer is a TypeError."""
    for kind, argument in zip(function.argtypes, arguments):
        if kind in _RANGES and not _RANGES[kind][0] <= operator.index(argument) < _RANGES[kind][1]:
            raise OverflowError(f"{argument} does not fit 32 bits")


def name_of(text: str) -> bytes:
    """A name as the library takes it, which would end it at a null."""
    if "\0" in text:
        raise ValueError(f"a name with a null in it: {text!r}")
    return text.encode("utf-8")


def text_of(buffer: Any, count: int) -> str:
    """The text of `count` units of a buffer."""
    return bytes(memoryview(buffer).cast("B")[: 2 * count]).decode(UTF16, "surrogatepass")


def unit_buffer(count: int) -> Any:
    return (c_uint16 * count)()


def names(kind: int) -> list[str]:
    found: list[str] = []

    def add(_user: Any, of: int, name: bytes) -> int:
        if of == kind:
            found.append(name.decode("ascii"))
        return 1

    library().LXEnumLocales(ObjectCallback(add), None)
    return found


def aliases() -> list[Tuple[str, str]]:
    """Codepages and other names of them."""
    found: list[Tuple[str, str]] = []

    def add(_user: Any, codepage: bytes, alias: bytes) -> int:
        found.append((codepage.decode("ascii"), alias.decode("ascii")))
        return 1

    library().LXEnumAliases(None, AliasCallback(add), None)
    return found
