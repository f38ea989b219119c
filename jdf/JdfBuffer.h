// SPDX-License-Identifier: Apache-2.0
// Searching and changing a text in one fixed buffer. A JDF file is updated as text, so that all
// that the update does not understand stays byte for byte.
//
// Four values travel together: the buffer's start, a limit behind its last usable byte, the length
// of the contents, and a position in them.
#pragma once

namespace jdf {

/// Results of the update. A caller learns no more than these.
enum Code : int {
    Done = 0,
    NoFile = -1,           ///< Missing, shorter than 5000 bytes, or not to be read or written.
    NoPatches = -12,       ///< The job has none: nothing was done.
    NoResourceLinks = -13, ///< No "</ResourceLinkPool>"; does not end the update.
    NoResources = -14,     ///< No "</ResourcePool>"; does not end the update.
    BufferFull = -30,      ///< The insert would reach the buffer's limit.
    NothingToDelete = -31, ///< The range is not within the contents.
};

} // namespace jdf

/// Behind the line that start is in, and behind all line feeds and carriage returns that follow;
/// never behind end. Returns 0.
int SkipToNextLine(char* start, char* end, char** out);

/// Back over the blanks and tabs in front of start. It does not stop at the buffer's start (C73):
/// the buffer needs a byte in front of it that is neither.
void SkipWhiteSpacesToStartOfLine(char* start, char** out);

/// Looks for a token that ends before end; one that ends exactly there is not found (C72).
/// Gives its position and length, or start and 0. Returns 0.
int FindToken(const char* token, char* start, char* end, char** found, long* foundLength);

/// Not a delete at all (C71): the text after the position moves up by count and the length falls
/// by count. What was at the position stays and follows once more, and twice count bytes are lost
/// at the end. Deleting 2 at position 1 of `abcdefghijkl` gives `abcbcdefgh`.
///
/// 0, or -31 with nothing changed for a negative count or a range that is not within the contents.
int DeleteCharactersFromBuffer(long count, char* at, char* buffer, char* limit, long* length);

/// 0, or -30 with nothing changed where the contents would reach the limit. A position behind the
/// contents counts as their end.
int InsertCStringIntoBuffer(const char* text, char* at, char* buffer, char* limit, long* length);
