// SPDX-License-Identifier: Apache-2.0
// Searches and changes text in one fixed buffer. A JDF file is updated as text, so that everything
// the update does not understand keeps its bytes.
//
// Four values belong together: the buffer's start, a limit one past its last usable byte, the
// length of the contents, and a position in them.
#pragma once

namespace jdf {

/// Results of the update. Callers get no further details.
enum Code : int {
    Done = 0,
    NoFile = -1,           ///< Missing, shorter than 5000 bytes, not readable or not writable.
    NoPatches = -12,       ///< The job has none; nothing was done.
    NoResourceLinks = -13, ///< No "</ResourceLinkPool>"; does not end the update.
    NoResources = -14,     ///< No "</ResourcePool>"; does not end the update.
    BufferFull = -30,      ///< The insert would reach the buffer's limit.
    NothingToDelete = -31, ///< The range is not within the contents.
};

} // namespace jdf

/// Finds the end of the line at `start` and skips all line feeds and carriage returns that follow.
/// Never goes past `end`. Returns 0.
int SkipToNextLine(char* start, char* end, char** out);

/// Goes back over the blanks and tabs that precede `start`. It does not stop at the buffer's start
/// (C73): a byte that is neither must precede the buffer.
void SkipWhiteSpacesToStartOfLine(char* start, char** out);

/// Searches for a token that ends before `end`; a token that ends exactly there is not found (C72).
/// Stores its position and length, or start and 0. Returns 0.
int FindToken(const char* token, char* start, char* end, char** found, long* foundLength);

/// Despite its name, this does not delete (C71). The text from the position on moves towards the
/// end by `count`, and the length shrinks by `count`. So the text there appears twice, and twice
/// `count` bytes are lost at the end. Deleting 2 at position 1 of `abcdefghijkl` gives
/// `abcbcdefgh`.
///
/// Returns 0. Returns -31 and changes nothing for a negative count or a range outside the contents.
int DeleteCharactersFromBuffer(long count, char* at, char* buffer, char* limit, long* length);

/// Returns 0. If the contents would reach the limit, returns -30 and changes nothing. A position
/// after the contents means their end.
int InsertCStringIntoBuffer(const char* text, char* at, char* buffer, char* limit, long* length);
