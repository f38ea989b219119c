// Random edits: after a flush the server's ticket is what the same edits make of a ticket directly.
//
// Left out, since a flush can't send them: holes, infinities, the sign of zero.
#include <random>

#include <gtest/gtest.h>

#include "RealTickets.h"
#include "TicketText.h"
#include "ticket/TicketUpdateList.h"

namespace {

constexpr int type = 3;
constexpr int listed = 1; ///< Changed through a list.
constexpr int direct = 2; ///< Changed directly.

/// Enough to replay a run: contents and edits as RecordTable reads them; "flush" sends.
struct Sequence {
    std::string content;
    std::vector<std::string> edits;
};

std::string text(const Sequence& sequence) {
    std::string all = "content: " + sequence.content;
    for (const std::string& edit : sequence.edits) {
        all += "\n  " + edit;
    }
    return all;
}

class Twins {
  public:
    explicit Twins(const std::string& content)
        : m_engine(std::make_shared<store::MemoryKeep>()), m_list(m_engine.access()) {
        hSTicketInstance = store::ticketFactory();
        for (const int id : {listed, direct}) {
            m_engine.createWithKeys(type, id, nullptr);
            support::RecordTable table(content);
            m_engine.apply(type, id, table.records());
        }
    }

    void edit(const std::string& edit) {
        if (edit == "flush") {
            m_list.FlushToContainer(m_engine.access(), nullptr, {});
            return;
        }
        support::RecordTable table(edit);
        const SETMULTIPAR* r = table.records();
        m_list.xSetParameter(type, listed, r->key, r->type, r->value, r->position, false);
        m_engine.apply(type, direct, table.records());
    }

    std::string content(int id) { return support::ticketText(m_engine.open(type, id)); }

    int count(const std::string& key) {
        unsigned long count = 0;
        m_engine.get(type, direct, key.c_str(), PARAM_COUNT, &count, POSITION_WHOLE);
        return static_cast<int>(count);
    }

  private:
    store::TicketContainer m_engine;
    TICKET_UPDATE_LIST m_list;
};

bool fails(const Sequence& sequence) {
    Twins twins(sequence.content);
    for (const std::string& edit : sequence.edits) {
        twins.edit(edit);
    }
    twins.edit("flush");
    return twins.content(listed) != twins.content(direct);
}

/// The sequence without what it fails without.
Sequence shrunk(Sequence sequence) {
    for (bool smaller = true; smaller;) {
        smaller = false;
        for (std::size_t i = 0; i < sequence.edits.size(); ++i) {
            Sequence less = sequence;
            less.edits.erase(less.edits.begin() + static_cast<std::ptrdiff_t>(i));
            if (fails(less)) {
                sequence = less;
                smaller = true;
                break;
            }
        }
    }
    return sequence;
}

class Maker {
  public:
    explicit Maker(unsigned seed) : m_random(seed) {}

    Sequence make() {
        Sequence sequence;
        for (const char* key : keys) {
            for (int i = upTo(5); i > 0 && upTo(3) != 0; --i) {
                sequence.content += std::string(key) + "[-2]=" + value() + " ";
            }
        }
        Twins model(sequence.content); // Knows how long each key is.
        for (int i = 1 + upTo(12); i > 0; --i) {
            sequence.edits.push_back(upTo(9) == 0 ? "flush" : edit(model));
            model.edit(sequence.edits.back());
        }
        return sequence;
    }

  private:
    static constexpr const char* keys[] = {"a", "b", "ab", "c"};

    int upTo(int highest) { return std::uniform_int_distribution<int>(0, highest)(m_random); }

    /// Few different values, so that many edits change nothing.
    std::string value() {
        const std::string digit = std::to_string(1 + upTo(2));
        switch (upTo(8)) {
        case 0:
            return digit + ".5";
        case 1:
            return "'" + digit;
        case 2:
            return "u" + digit;
        case 3:
            return "l" + digit;
        case 4:
            return "U" + digit;
        case 5:
            return "#0" + digit;
        case 6:
            return upTo(3) == 0 ? "nan" : "p" + digit;
        default:
            return digit;
        }
    }

    std::string edit(Twins& model) {
        const std::string key = keys[upTo(3)];
        const int count = model.count(key);
        int position = upTo(count + 2) - 2; // Up to behind the last element, which leaves no hole.
        const bool deletes = upTo(2) == 0;
        if (deletes && (position == POSITION_APPEND || position >= count)) {
            position = POSITION_WHOLE;
        }
        return key + "[" + std::to_string(position) + "]=" + (deletes ? "-" : value());
    }

    std::mt19937 m_random;
};

TEST(FlushRandom, EqualsTheEditsMadeDirectly) {
    for (unsigned seed = 0; seed < 3000; ++seed) {
        const Sequence sequence = Maker(seed).make();
        if (fails(sequence)) {
            const Sequence small = shrunk(sequence);
            FAIL() << "seed " << seed << "\n" << text(small);
        }
    }
}

} // namespace
