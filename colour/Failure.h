// SPDX-License-Identifier: Apache-2.0
// Why a colour file could not be used. One word for one cause; the library turns each into its
// code.
#pragma once

namespace colour {

enum class Failure {
    None,
    Missing,            ///< No file there.
    Unreadable,         ///< No permission, a folder, or a failed read.
    TooLarge,           ///< More bytes, rows or columns than the limits of CgatsText.h allow.
    NotRecognised,      ///< Neither CGATS text, CxF3 nor an ICC profile.
    XmlRefused,         ///< XML with a document type, or nested beyond the limits of CxfXml.h.
    Damaged,            ///< CGATS text or CxF that breaks off or contradicts itself.
    NoPatches,          ///< A table without rows.
    NoColourValues,     ///< Colour values are needed: no Lab, XYZ or spectra.
    NoDeviceValues,     ///< Device values are needed and not there.
    NotNumeric,         ///< A text where a colour or device value belongs.
    SpectraUnusable,    ///< Spectra too short or too coarse to give XYZ.
    ProfileDamaged,     ///< Not to be opened as a profile.
    ProfileClass,       ///< A class that can't serve: device link, named colour, abstract.
    ProfileColourSpace, ///< A profile for something else than CMYK.
    ProfileUnusable,    ///< No transform to Lab can be made of it.
    NotWritable,        ///< The output can't be created.
    Incomplete,         ///< The output could not be written to its end.
    OutOfMemory,
};

} // namespace colour
