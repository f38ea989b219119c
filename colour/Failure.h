// SPDX-License-Identifier: Apache-2.0
// Why a colour file could not be used. Each cause has one value; the library maps each to its code.
#pragma once

namespace colour {

enum class Failure {
    None,
    Missing,            ///< The file does not exist.
    Unreadable,         ///< No permission, a folder, or a failed read.
    TooLarge,           ///< More bytes, rows or columns than the limits of CgatsText.h allow.
    NotRecognised,      ///< Neither CGATS text, CxF3 nor an ICC profile.
    XmlRefused,         ///< XML with a document type, or nested beyond the limits of CxfXml.h.
    Damaged,            ///< CGATS text or CxF that is truncated or inconsistent.
    NoPatches,          ///< A table without rows.
    NoColourValues,     ///< Colour values are required: no Lab, XYZ or spectra.
    NoDeviceValues,     ///< Device values are required but missing.
    NotNumeric,         ///< Text in place of a colour or device value.
    SpectraUnusable,    ///< Spectra too short or too coarse for XYZ.
    ProfileDamaged,     ///< Can't be opened as a profile.
    ProfileClass,       ///< An unsuitable class: device link, named colour, abstract.
    ProfileColourSpace, ///< A profile for something other than CMYK.
    ProfileUnusable,    ///< It allows no transform to Lab.
    NotWritable,        ///< The output can't be created.
    Incomplete,         ///< The output could not be written completely.
    OutOfMemory,
};

} // namespace colour
