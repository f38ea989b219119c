#!/usr/bin/env python3
"""Writes the tables next to this file, from independent sources:

code-pages.csv  characters 0x80 to 0xFF of the code pages, from Python's codecs (whose source is
                the Unicode Consortium's MAPPINGS/VENDORS/APPLE)
numbers.csv     a double's bits and the results of rounding and converting it, by exact fractions
integers.csv    unsigned 64-bit integers and the bits of the nearest double, by exact integers
percent.csv     0 to 255 as percent with two decimals, by decimal arithmetic
"""
import decimal
import math
import pathlib
import random
import struct
from fractions import Fraction

HERE = pathlib.Path(__file__).parent
CODECS = {0: "mac_roman", 6: "mac_greek", 7: "mac_cyrillic", 29: "mac_latin2",
          35: "mac_turkish", 36: "mac_croatian", 38: "mac_romanian"}
random.seed(127)


def write(name, source, rows):
    text = f"# {source}\n" + "".join(",".join(str(cell) for cell in row) + "\n" for row in rows)
    (HERE / name).write_text(text)


def bits(value):
    return f"{struct.unpack('<Q', struct.pack('<d', value))[0]:016x}"


def half_away(value):
    """Rounds to the nearest integer, exactly, halves away from zero."""
    whole = math.floor(abs(Fraction(value)) + Fraction(1, 2))
    return whole if value > 0 else -whole


def clamp(number, low, high):
    return min(max(number, low), high)


def number_row(value):
    nearest = half_away(value)
    signed, unsigned = 2 ** 63, 2 ** 64 - 1
    return (bits(value), bits(float(nearest)), math.trunc(value),
            clamp(nearest, -2 ** 31, 2 ** 31 - 1), clamp(nearest, 0, 2 ** 32 - 1),
            clamp(nearest, -signed, signed - 1), clamp(nearest, 0, unsigned))


def numbers():
    edges = [0.5, 1.5, 2.5, 0.1, 2.0 ** 31 - 1, 2.0 ** 31 - 0.5, 2.0 ** 31, 2.0 ** 32 - 1,
             2.0 ** 32 - 0.5, 2.0 ** 32, 2.0 ** 51 + 0.5, 2.0 ** 52 - 1, 2.0 ** 52 + 1, 2.0 ** 53]
    for power in (52, 63, 64):
        edges += [2.0 ** power, math.nextafter(2.0 ** power, 0), math.nextafter(2.0 ** power, 1e30)]
    edges.remove(math.nextafter(2.0 ** 52, 0))  # has a fraction but exceeds the limit for one
    edges += [random.uniform(0, 10.0 ** random.randint(0, 20)) for _ in range(40)]
    return [number_row(sign * value) for value in edges for sign in (1, -1)]


def nearest_double(number):
    """Halves to even below 2^63, halves up from there on; nothing reaches 2^64."""
    if number < 2 ** 63:
        return float(number)
    return float(min((number + 1024) // 2048 * 2048, 2 ** 64 - 2048))


def integers():
    edges = [0, 1, 2 ** 53, 2 ** 53 + 1, 2 ** 53 + 3]
    for base in (2 ** 63, 2 ** 63 + 2048, 2 ** 64 - 2048):
        edges += [base + step for step in (-1, 0, 1, 1023, 1024, 1025, 2047)]
    edges += [random.getrandbits(64) for _ in range(40)]
    return [(number, bits(nearest_double(number))) for number in edges]


def percents():
    for value in range(256):
        exact = decimal.Decimal(value / 2.55)
        yield value, exact.quantize(decimal.Decimal("0.01"), decimal.ROUND_HALF_UP)


pages = [[f"{0x80 + i:02x}"] + [f"{ord(bytes([0x80 + i]).decode(c)):04x}" for c in CODECS.values()]
         for i in range(0x80)]
write("code-pages.csv", "byte, then its character in the encodings "
      + ", ".join(f"{number} ({codec})" for number, codec in CODECS.items()) + ": Python's codecs",
      pages)
write("numbers.csv", "double, nearest whole number as a double, truncated, then the nearest as int, "
      "unsigned, signed and unsigned 64-bit integer: Python's fractions", numbers())
write("integers.csv", "unsigned 64-bit integer, nearest double: Python's integers", integers())
write("percent.csv", "value of 0 to 255, percent with two decimals: Python's decimals", percents())
