// SPDX-License-Identifier: Apache-2.0
#include "ticket/TicketDifference.h"

#include <cstring>

namespace ticket {
namespace {

/// The sign of strcmp: -1, 0 or 1.
int KeyCompare(const char* a, const char* b) {
    const int order = std::strcmp(a, b);
    return (order > 0) - (order < 0);
}

template<class T>
bool numbersDiffer(const SETMULTIPAR& x, const SETMULTIPAR& y) {
    return *static_cast<const T*>(x.value) != *static_cast<const T*>(y.value);
}

bool ValueDiffers(const SETMULTIPAR& x, const SETMULTIPAR& y) {
    if (x.type != y.type || x.position != y.position) {
        return true;
    }
    switch (x.type) {
    case PARAM_DELETE:
        return false;
    case PARAM_POINTER:
        return x.value != y.value;
    case PARAM_INT:
    case PARAM_UINT:
        return numbersDiffer<std::int32_t>(x, y);
    case PARAM_DOUBLE:
        return numbersDiffer<double>(x, y);
    case PARAM_STRING:
        return std::strcmp(static_cast<const char*>(x.value), static_cast<const char*>(y.value)) !=
               0;
    case PARAM_INT64:
    case PARAM_UINT64:
        return numbersDiffer<std::int64_t>(x, y);
    default:
        return true; // Binary values are never compared, so they are always sent (C144).
    }
}

/// The records of one key. Within a table, equal keys have one address, which ends the run.
struct Run {
    const SETMULTIPAR* first;
    const SETMULTIPAR* end;

    explicit Run(const SETMULTIPAR* record) : first(record), end(record) {
        while (end->key == first->key) {
            ++end;
        }
    }

    int HighestPos() const { return end[-1].position; }
};

SETMULTIPAR deletion(const char* key, int position) {
    SETMULTIPAR record;
    record.key = key;
    record.position = position;
    return record;
}

using Records = std::vector<SETMULTIPAR>;

void append(Records& out, const SETMULTIPAR* first, const SETMULTIPAR* end) {
    out.insert(out.end(), first, end);
}

/// Sends single elements of a key if that takes fewer records than the whole run.
void appendChanges(Records& out, const Run& present, const Run& wanted) {
    const SETMULTIPAR* a = present.first;
    const SETMULTIPAR* b = wanted.first;
    while (a != present.end && b != wanted.end && !ValueDiffers(*b, *a)) {
        ++a;
        ++b;
    }
    if (a == present.end && b == wanted.end) {
        return;
    }
    const int highOld = present.HighestPos();
    const int highNew = wanted.HighestPos();
    if (highOld < 1 || highNew < 1) { // A scalar, or a vector with one element.
        append(out, wanted.first, wanted.end);
        return;
    }

    Records changes;
    for (; a != present.end && b != wanted.end; ++a, ++b) {
        if (ValueDiffers(*b, *a)) {
            changes.push_back(*b);
        }
    }
    append(changes, b, wanted.end);
    // Counts deletions before creating them: there can be two billion positions after a hole.
    const long long surplus = highNew < highOld ? static_cast<long long>(highOld) - highNew : 0;
    if (static_cast<long long>(changes.size()) + surplus >= static_cast<long long>(highNew) + 1) {
        append(out, wanted.first, wanted.end);
        return;
    }
    for (int position = highOld; position > highNew; --position) {
        changes.push_back(deletion(wanted.first->key, position));
    }
    // Can be empty if a plug-in shows an element twice.
    if (!changes.empty() && changes.front().position == POSITION_WHOLE) {
        changes.front().position = 0; // POSITION_WHOLE would replace the other elements.
    }
    append(out, changes.data(), changes.data() + changes.size());
}

} // namespace

std::vector<SETMULTIPAR> difference(const SETMULTIPAR* present, const SETMULTIPAR* wanted) {
    Records out;
    while (present->key != nullptr || wanted->key != nullptr) {
        const int order = wanted->key == nullptr    ? 1
                          : present->key == nullptr ? -1
                                                    : KeyCompare(wanted->key, present->key);
        if (order > 0) {
            out.push_back(deletion(present->key, POSITION_WHOLE));
            present = Run(present).end;
            continue;
        }
        const Run run(wanted);
        if (order < 0) {
            append(out, run.first, run.end);
        } else {
            const Run old(present);
            appendChanges(out, old, run);
            present = old.end;
        }
        wanted = run.end;
    }
    return out;
}

} // namespace ticket
