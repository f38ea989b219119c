// SPDX-License-Identifier: Apache-2.0
// Reports which ticket addresses a flush replaced.
#pragma once

/// Called for each replacement during a flush: a virtual ticket's type or id was replaced. An id of
/// -1 means that the ticket could not be created.
struct TICKET_UPDATE_CALLBACK {
    using Function = void (*)(void* context, bool isId, int from, int to);

    Function function = nullptr; ///< Null: no callback.
    void* context = nullptr;

    void operator()(bool isId, int from, int to) const {
        if (function != nullptr) {
            function(context, isId, from, to);
        }
    }
};
