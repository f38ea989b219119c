// SPDX-License-Identifier: Apache-2.0
// PostgreSQL's client library, loaded when a store on a server is opened: with all that it brings,
// it takes three times as long to load as the rest of the plug-in, and who works with a folder has
// no use for it.
#pragma once

#include <libpq-fe.h>

namespace store::postgres {

// clang-format off
#define TINTGATE_LIBPQ_FUNCTIONS(X)                                                               \
    X(backendPID) X(clear) X(cmdTuples) X(connectStartParams) X(connectdbParams) X(conninfo)      \
    X(conninfoFree) X(consumeInput) X(enterPipelineMode) X(errorMessage) X(exitPipelineMode)      \
    X(finish) X(flush) X(getResult) X(getisnull) X(getlength) X(getvalue) X(isBusy) X(ntuples)    \
    X(pipelineSync) X(resultErrorField) X(resultErrorMessage) X(resultStatus) X(sendPrepare)      \
    X(sendQuery) X(sendQueryParams) X(sendQueryPrepared) X(serverVersion) X(setNoticeProcessor)   \
    X(setnonblocking) X(socket) X(status) X(transactionStatus)
// clang-format on

/// The functions that are used of it, without their PQ in front.
struct LibPq {
#define TINTGATE_LIBPQ_MEMBER(name) decltype(&::PQ##name) name = nullptr;
    TINTGATE_LIBPQ_FUNCTIONS(TINTGATE_LIBPQ_MEMBER)
#undef TINTGATE_LIBPQ_MEMBER
};

/// Throws StoreFailure (Missing) where the library is not installed.
const LibPq& libPq();

} // namespace store::postgres
