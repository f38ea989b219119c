// SPDX-License-Identifier: Apache-2.0
#include "jdf/JdfBuffer.h"

#include <algorithm>
#include <cstring>

namespace {

bool isLineEnd(char c) {
    return c == '\n' || c == '\r';
}

} // namespace

int SkipToNextLine(char* start, char* end, char** out) {
    char* p = start;
    while (p < end && !isLineEnd(*p)) {
        ++p;
    }
    while (p < end && isLineEnd(*p)) {
        ++p;
    }
    *out = p;
    return jdf::Done;
}

void SkipWhiteSpacesToStartOfLine(char* start, char** out) {
    char* p = start;
    while (p[-1] == ' ' || p[-1] == '\t') {
        --p;
    }
    *out = p;
}

int FindToken(const char* token, char* start, char* end, char** found, long* foundLength) {
    *found = start;
    *foundLength = 0;
    const std::size_t length = std::strlen(token);
    // Leaving the last byte out of the search prevents a match that ends there.
    if (start < end) {
        const auto size = static_cast<std::size_t>(end - start) - 1;
        if (void* const at = memmem(start, size, token, length)) {
            *found = static_cast<char*>(at);
            *foundLength = static_cast<long>(length);
        }
    }
    return jdf::Done;
}

int DeleteCharactersFromBuffer(long count, char* at, char* buffer, char*, long* length) {
    const long behind = *length - (at - buffer);
    if (at < buffer || count < 0 || count > *length || count > behind) {
        return jdf::NothingToDelete;
    }
    std::memmove(at + count, at, static_cast<std::size_t>(behind - count));
    *length -= count;
    return jdf::Done;
}

int InsertCStringIntoBuffer(const char* text, char* at, char* buffer, char* limit, long* length) {
    const auto size = static_cast<long>(std::strlen(text));
    if (*length + size >= limit - buffer) {
        return jdf::BufferFull;
    }
    char* const end = buffer + *length;
    at = std::min(at, end);
    std::memmove(at + size, at, static_cast<std::size_t>(end - at));
    std::memcpy(at, text, static_cast<std::size_t>(size));
    *length += size;
    return jdf::Done;
}
