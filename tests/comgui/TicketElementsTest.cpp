#include "comgui/TicketElements.h"

#include <gtest/gtest.h>

#include <map>
#include <memory>
#include <random>
#include <string>

using namespace store;

namespace {

/// A key without Elements' ways of saving room and time.
using Plain = std::map<int, int>;

int countOf(const Plain& values) {
    return values.empty() ? 0 : values.rbegin()->first + 1;
}

bool remove(Plain& values, int position) {
    if (position >= countOf(values)) {
        return false;
    }
    Plain closed;
    for (const auto& [at, value] : values) {
        if (at != position) {
            closed[at < position ? at : at - 1] = value;
        }
    }
    values = closed;
    return true;
}

Plain valuesOf(const std::shared_ptr<Elements>& key) {
    Plain values;
    if (key) {
        key->visit([&](int position, const Value& value) {
            values[position] = std::get<int>(value);
            return true;
        });
    }
    return values;
}

} // namespace

TEST(TicketElements, EqualsAPlainMapOverRandomChanges) {
    for (unsigned seed = 1; seed <= 100; ++seed) {
        std::mt19937 random(seed);
        const int reach = seed % 3 == 0 ? 5000 : 12; // Far and near the elements that are there.
        const auto below = [&](int limit) { return static_cast<int>(random() % limit); };
        std::shared_ptr<Elements> key;
        Plain model;
        std::string history = "seed " + std::to_string(seed);
        for (int step = 0; step < 120; ++step) {
            if (below(3) == 0) {
                const int position = below(2) == 0 ? below(reach) : below(countOf(model) + 1);
                history += " -" + std::to_string(position);
                ASSERT_EQ(setElement(key, PARAM_DELETE, nullptr, position), remove(model, position))
                    << history;
            } else {
                const int position = below(20) == 0  ? POSITION_WHOLE
                                     : below(6) == 0 ? POSITION_APPEND
                                                     : below(reach);
                history += " +" + std::to_string(position);
                ASSERT_TRUE(setElement(key, PARAM_INT, &step, position));
                if (position == POSITION_WHOLE) {
                    model.clear();
                }
                model[position == POSITION_APPEND ? countOf(model) : std::max(position, 0)] = step;
            }
            ASSERT_EQ(key ? key->count() : 0, countOf(model)) << history;
            ASSERT_EQ(valuesOf(key), model) << history;
            const int looked = below(reach);
            const auto* value = key ? key->at(looked) : nullptr;
            ASSERT_EQ(value != nullptr, model.count(looked) != 0) << history;
        }
    }
}

TEST(TicketElements, LoneElementsFarOutCostNoRoom) {
    // In full each of these keys would take 400 MB.
    std::shared_ptr<Elements> keys[1000];
    for (auto& key : keys) {
        const int value = 7;
        ASSERT_TRUE(setElement(key, PARAM_INT, &value, highestPosition));
        ASSERT_FALSE(setElement(key, PARAM_INT, &value, POSITION_APPEND));
        ASSERT_EQ(key->count(), highestPosition + 1);
        ASSERT_EQ(std::get<int>(*key->first()), 7);
    }
}
