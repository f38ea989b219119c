// SPDX-License-Identifier: Apache-2.0
// A flush that changes one element in each of many vectors: the cost per element for growing
// numbers of elements. If a flush walked a vector once for each change, the figure would rise.
#include <chrono>
#include <cstdio>
#include <memory>
#include <string>

#include "store/tickets/MemoryStorage.h"
#include "store/tickets/TicketContainer.h"
#include "store/tickets/WorkTickets.h"
#include "ticket/TicketFactory.h"
#include "ticket/TicketUpdateList.h"

namespace {

constexpr int type = 3;
constexpr int id = 1;

/// Seconds of one flush that changes the middle element of each vector.
double flushSeconds(int vectors, int elements) {
    store::TicketContainer engine(std::make_shared<store::MemoryStorage>());
    engine.createWithKeys(type, id, nullptr);
    const auto& admin = ticket::as<MTICKET_ADMIN>(*engine.access());
    std::vector<double> values(static_cast<std::size_t>(elements));
    for (std::size_t i = 0; i < values.size(); ++i) {
        values[i] = 0.5 + static_cast<double>(i);
    }
    TICKET_UPDATE_LIST list(engine.access());
    const double changed = -1;
    for (int v = 0; v < vectors; ++v) {
        const std::string key = "Values/" + std::to_string(v);
        admin.SetVectorParameter(type, id, key.c_str(), values);
        list.xSetParameter(type, id, key.c_str(), PARAM_DOUBLE, &changed, elements / 2, false);
    }
    unsigned long sent = 0;
    const auto start = std::chrono::steady_clock::now();
    list.FlushToContainer(engine.access(), &sent, {});
    const std::chrono::duration<double> taken = std::chrono::steady_clock::now() - start;
    if (sent != static_cast<unsigned long>(vectors)) {
        std::printf("%lu records sent for %d vectors\n", sent, vectors);
        std::exit(1);
    }
    return taken.count();
}

} // namespace

int main() {
    hSTicketInstance = store::ticketFactory();
    struct Size {
        int vectors, elements;
    };
    double base = 0;
    std::printf("%8s %9s %10s %14s %6s\n", "vectors", "elements", "ms", "ns an element", "ratio");
    for (const auto [vectors, elements] :
         {Size{1000, 100}, {2000, 100}, {4000, 100}, {8000, 100}, {1000, 400}, {1000, 1600}}) {
        double best = 1e9;
        for (int run = 0; run < 5; ++run) {
            best = std::min(best, flushSeconds(vectors, elements));
        }
        const double each = best / vectors / elements;
        base = base == 0 ? each : base;
        std::printf("%8d %9d %10.2f %14.0f %6.2f\n", vectors, elements, best * 1e3, each * 1e9,
                    each / base);
    }
}
