// SPDX-License-Identifier: Apache-2.0
// The diagnostic sink of a ticket update list.
#pragma once

/// Takes the texts that tell what a list and its flush do, one line for each event. As built here
/// it keeps nothing and writes nothing (C141); arguments are evaluated all the same. It stands in a
/// source file of its own so that a program can be linked with a sink that listens.
class clTICKET_UPDATE_LOG {
  public:
    explicit clTICKET_UPDATE_LOG(const char* name);

    void printf(const char* format, ...) __attribute__((format(printf, 2, 3)));
    void close();
};
