#include "comgui/TicketElements.h"

#include <gtest/gtest.h>

#include <chrono>
#include <map>
#include <random>
#include <string>

using namespace store;

namespace {

/// A key as a plain map: what Elements must equal, without its ways of saving room and time.
class Model {
  public:
    bool set(int position, int value) {
        if (position == POSITION_WHOLE) {
            m_values.clear();
            position = 0;
        } else if (position == POSITION_APPEND) {
            position = count();
        }
        m_values[position] = value;
        return true;
    }

    bool remove(int position) {
        if (position >= count()) {
            return false;
        }
        std::map<int, int> closed;
        for (const auto& [at, value] : m_values) {
            if (at != position) {
                closed[at < position ? at : at - 1] = value;
            }
        }
        m_values = closed;
        return true;
    }

    int count() const { return m_values.empty() ? 0 : m_values.rbegin()->first + 1; }
    const std::map<int, int>& values() const { return m_values; }

  private:
    std::map<int, int> m_values;
};

std::map<int, int> valuesOf(const std::shared_ptr<Elements>& key) {
    std::map<int, int> values;
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
    for (unsigned seed = 1; seed <= 300; ++seed) {
        std::mt19937 random(seed);
        const int reach = seed % 3 == 0 ? 5000 : 12; // Far and near the elements that are there.
        const auto below = [&](int limit) { return static_cast<int>(random() % limit); };
        std::shared_ptr<Elements> key;
        Model model;
        std::string history;
        for (int step = 0; step < 120; ++step) {
            const int position = below(20) == 0  ? POSITION_WHOLE
                                 : below(6) == 0 ? POSITION_APPEND
                                                 : below(reach);
            bool done = false;
            bool expected = false;
            if (below(3) == 0 && position >= 0) {
                const int nearer = below(2) == 0 ? position : below(model.count() + 1);
                history += " -" + std::to_string(nearer);
                done = setElement(key, PARAM_DELETE, nullptr, nearer);
                expected = model.remove(nearer);
            } else {
                history += " +" + std::to_string(position);
                done = setElement(key, PARAM_INT, &step, position);
                expected = model.set(position, step);
            }
            ASSERT_EQ(done, expected) << "seed " << seed << history;
            ASSERT_EQ(key ? key->count() : 0, model.count()) << "seed " << seed << history;
            ASSERT_EQ(valuesOf(key), model.values()) << "seed " << seed << history;
            ASSERT_EQ(key == nullptr, model.count() == 0) << "seed " << seed << history;
            const int looked = below(reach);
            const auto* value = key ? key->at(looked) : nullptr;
            ASSERT_EQ(value != nullptr, model.values().count(looked) != 0) << history;
        }
    }
}

TEST(TicketElements, AMillionElementsInAnyOrderAreQuick) {
    const int count = 1'000'000;
    std::vector<int> order(count);
    for (int i = 0; i < count; ++i) {
        order[static_cast<std::size_t>(i)] = i;
    }
    const auto start = std::chrono::steady_clock::now();
    for (int round = 0; round < 3; ++round) {
        std::shared_ptr<Elements> key;
        for (const int position : order) {
            ASSERT_TRUE(setElement(key, PARAM_INT, &position, position));
        }
        ASSERT_EQ(key->count(), count);
        ASSERT_EQ(std::get<int>(*key->at(765'432)), 765'432);
        if (round == 0) {
            std::reverse(order.begin(), order.end());
        } else {
            std::shuffle(order.begin(), order.end(), std::mt19937(1));
        }
    }
    // Quadratic work would take hours.
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(30));
}

TEST(TicketElements, LoneElementsFarOutCostNoRoom) {
    // In full each of these keys would take 400 MB.
    std::vector<std::shared_ptr<Elements>> keys(1000);
    for (auto& key : keys) {
        const int value = 7;
        ASSERT_TRUE(setElement(key, PARAM_INT, &value, highestPosition));
        ASSERT_FALSE(setElement(key, PARAM_INT, &value, POSITION_APPEND));
        ASSERT_EQ(key->count(), highestPosition + 1);
        ASSERT_EQ(std::get<int>(*key->first()), 7);
    }
}
