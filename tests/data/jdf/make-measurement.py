#!/usr/bin/env python3
"""Writes measurement.txt next to this file: the element for two patches, formatted by Python.

The patches are those of tests/jdf/JdfMeasurementTest.cpp. A value that does not fit an integer
gives the smallest integer.
"""
import math
import pathlib
from decimal import ROUND_HALF_UP, Decimal

XYZ = [(1.239, 20.0, -0.019), (95.05, 100.0, 1e30)]
CMYK = [(255, 0, 1.274, 1.276), (-2.55, 127.5, 254.9, 1e30)]
SPECTRA = [[0.5] * 36, [-0.0000125, 1e9, math.nan] + [0.0] * 33]


def truncated(value):
    return int(value) if abs(value) < 2 ** 63 else -2 ** 63


def micro(value):
    return truncated(value * 1000000)


def percent(value):
    return micro(float(truncated(math.floor(value / 2.55 + 0.5)) & 0xFFFF))


def reflectance(value):
    if math.isnan(value) or abs(value * 1000000) >= 2 ** 31:
        return -2 ** 31
    return int(Decimal(value * 1000000).quantize(Decimal(1), ROUND_HALF_UP))


lines = [
    '<tazo:Measurement Date="2024-05-31" Time="13:37:00" Comment="Proof 100%s" '
    f'Approval="true" MaxDeltaE="{micro(3.1234567)}" TotalPass="false" CMMVersion="1.1.2.3" '
    f'MaxToleranc="{micro(5)}" TypeOfDeltaE="CIE Lab" AverageDeltaE="{micro(1.0000009)}" '
    f'SpectralCount="2" PaperWhitePass="true" AverageToleranc="{micro(-0.0000019)}">'
    '<FileSpec URL="cid:" MimeType="application/icc" UserFileName="" '
    'DescriptiveName="EmbeddedProfileName"/>\n']
for i, (c, m, y, k) in enumerate(CMYK):
    lines.append(f'<tazo:PatchDefinitionData{i} CValue="{percent(c)}" KValue="{percent(k)}" '
                 f'MValue="{percent(m)}" YValue="{percent(y)}"/>\r\n')
for x, y, z in XYZ:
    lines.append(f'<tazo:PatchData XValue="{truncated(x * 100)}" YValue="{truncated(y * 100)}" '
                 f'ZValue="{truncated(z * 100)}"/>\r\n')
for i, values in enumerate(SPECTRA):
    values = "".join(f'dvalue{j}="{reflectance(value)}"' for j, value in enumerate(values))
    lines.append(f"<tazo:SpectralData{i} {values}/>\r\n")
lines.append("</tazo:Measurement>\n")
(pathlib.Path(__file__).parent / "measurement.txt").write_bytes("".join(lines).encode())
