"""Text of every codepage and locale, by the Lexicor library.

Importing it gives Python the codecs of all codepages of the locale directory: `open("host.dat", encoding="ibm-930")`.
"""
from ._codepage import Codepage, convert
from ._codepage import open_text as open  # noqa: A001
from ._locale import Catalog, Item, Locale, Map, Option
from ._native import CODEPAGE, LANGUAGE, SORT, TERRITORY, Error, init, names, version

__all__ = ["CODEPAGE", "LANGUAGE", "SORT", "TERRITORY", "Catalog", "Codepage", "Error", "Item", "Locale", "Map",
           "Option", "convert", "init", "names", "open", "version"]
