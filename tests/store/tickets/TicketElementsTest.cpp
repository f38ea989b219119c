// SPDX-License-Identifier: Apache-2.0
#include "store/tickets/TicketElements.h"

#include <gtest/gtest.h>

#include <memory>
#include <optional>
#include <random>
#include <string>
#include <vector>

using namespace store;

namespace {

/// The elements and gaps of a key, without the optimizations of Elements.
using Plain = std::vector<std::optional<int>>;

bool remove(Plain& values, int position) {
    if (position >= std::ssize(values)) {
        return false;
    }
    values.erase(values.begin() + position);
    while (!values.empty() && !values.back()) {
        values.pop_back();
    }
    return true;
}

Plain valuesOf(const std::shared_ptr<Elements>& key) {
    Plain values(key ? key->count() : 0);
    if (key) {
        key->visit([&](int position, const Value& value) {
            values.at(position) = std::get<int>(value);
            return true;
        });
    }
    return values;
}

} // namespace

TEST(TicketElements, EqualsAPlainVectorOverRandomChanges) {
    for (int round = 1; round <= 100; ++round) {
        std::mt19937 random(round);
        const auto below = [&](int limit) { return static_cast<int>(random() % unsigned(limit)); };
        const int reach = round % 3 == 0 ? 5000 : 12; // Far from the elements or near them.
        std::shared_ptr<Elements> key;
        Plain model;
        std::string history = "round " + std::to_string(round);
        for (int step = 0; step < 120; ++step) {
            const int size = static_cast<int>(model.size());
            if (below(3) == 0) {
                const int position = below(below(2) == 0 ? reach : size + 1);
                history += " -" + std::to_string(position);
                ASSERT_EQ(setElement(key, PARAM_DELETE, nullptr, position), remove(model, position))
                    << history;
            } else {
                const int position = below(20) == 0  ? POSITION_WHOLE
                                     : below(6) == 0 ? POSITION_APPEND
                                                     : below(reach);
                history += " +" + std::to_string(position);
                ASSERT_TRUE(setElement(key, PARAM_INT, &step, position));
                const int place = position == POSITION_APPEND ? size : std::max(position, 0);
                model.resize(position == POSITION_WHOLE ? 1 : std::max(size, place + 1));
                model[place] = step;
            }
            ASSERT_EQ(valuesOf(key), model) << history;
            const int looked = below(reach);
            ASSERT_EQ(key != nullptr && key->at(looked) != nullptr,
                      looked < std::ssize(model) && model[looked])
                << history;
        }
    }
}

TEST(TicketElements, LoneElementsFarOutCostNoRoom) {
    // Stored in full, each of these keys would take 400 MB.
    std::shared_ptr<Elements> keys[1000];
    for (auto& key : keys) {
        const int value = 7;
        ASSERT_TRUE(setElement(key, PARAM_INT, &value, highestPosition));
        ASSERT_FALSE(setElement(key, PARAM_INT, &value, POSITION_APPEND));
        ASSERT_EQ(key->count(), highestPosition + 1);
        ASSERT_EQ(std::get<int>(*key->first()), 7);
    }
}
