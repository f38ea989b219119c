// SPDX-License-Identifier: Apache-2.0
// Who wants to know which addresses of tickets a flush replaced.
#pragma once

/// Told of each substitution of a flush: a virtual ticket's type or id became another one. An id
/// that became -1 could not be made.
struct TICKET_UPDATE_CALLBACK {
    using Function = void (*)(void* context, bool isId, int from, int to);

    Function function = nullptr; ///< Null: nobody wants to know.
    void* context = nullptr;

    void operator()(bool isId, int from, int to) const {
        if (function != nullptr) {
            function(context, isId, from, to);
        }
    }
};
