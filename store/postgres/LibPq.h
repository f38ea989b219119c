// SPDX-License-Identifier: Apache-2.0
// PostgreSQL's client library, loaded when a store on a server is opened: with its dependencies it
// takes three times as long to load as the rest of the plug-in, and stores in folders don't need
// it.
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

/// The libpq functions in use, without the PQ prefix.
struct LibPq {
#define TINTGATE_LIBPQ_MEMBER(name) decltype(&::PQ##name) name = nullptr;
    TINTGATE_LIBPQ_FUNCTIONS(TINTGATE_LIBPQ_MEMBER)
#undef TINTGATE_LIBPQ_MEMBER
};

/// Throws StoreFailure (Missing) if the library is not installed.
const LibPq& libPq();

} // namespace store::postgres
