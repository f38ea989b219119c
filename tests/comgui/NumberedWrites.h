// Writes that can be cut off at any moment, and of which one can tell whether they are there whole.
#pragma once

#include <atomic>
#include <climits>
#include <new>
#include <set>
#include <string>

#include <sys/mman.h>
#include <unistd.h>

#include "StoreTest.h"

/// Each write is a table of ticket 3/1 and a file, both of one number.
class NumberedWrites {
  public:
    /// What writers have been told to be done, which must then be there. All processes share it.
    struct Done {
        std::atomic<int> table, file;
        std::atomic<int> started; ///< How many are at work since somebody set it to 0.
    };

    NumberedWrites()
        : done(*new (mmap(nullptr, sizeof(Done), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS,
                          -1, 0)) Done{}) {}
    ~NumberedWrites() { munmap(&done, sizeof(Done)); }
    NumberedWrites(const NumberedWrites&) = delete;
    NumberedWrites& operator=(const NumberedWrites&) = delete;

    /// Writes with this number and those behind it, until the store fails.
    void write(store::StoreEngine& engine, int number, int end = INT_MAX) const {
        ++done.started;
        for (; number < end; ++number) {
            const std::string text = std::to_string(number);
            std::string records = "first=" + text + " array=" + text;
            for (int element = 1; element < arraySize; ++element) {
                records += "," + text;
            }
            if (StoreTest::send(engine, 3, 1, records + " last=" + text)[0] == 'r') {
                engine.ids(3); // Tells why it was refused.
            }
            done.table = number;
            StoreTest::putFile(engine, path, fileText(number));
            done.file = number;
        }
    }

    /// For so many to be at work, but not for ever.
    void waitForStart(int writers) const {
        for (int wait = 0; done.started < writers && wait < 50'000; ++wait) {
            usleep(100);
        }
    }

    /// The number of the table that is there; the file's may be a further one.
    int expectWhole(store::StoreEngine& engine) const {
        std::set<int> numbers;
        int count = 0;
        const auto content = engine.content(3, 1, store::KeyFilter());
        for (const auto& [key, elements] : content->keys()) {
            count += elements->count();
            elements->visit([&](int, const store::Value& value) {
                numbers.insert(std::get<int>(value));
                return true;
            });
        }
        EXPECT_EQ(count, numbers.empty() ? 0 : arraySize + 2);
        EXPECT_LE(numbers.size(), 1u);
        const int table = numbers.empty() ? 0 : *numbers.begin();
        EXPECT_GE(table, done.table);
        if (done.file > 0) {
            EXPECT_GE(expectWholeFile(StoreTest::file(engine, path)), done.file);
        }
        return table;
    }

    void expectWholeVersions(store::StoreEngine& engine) const {
        int last = 0;
        for (const std::string& text : StoreTest::versions(engine, path)) {
            const int number = expectWholeFile(text);
            EXPECT_GE(number, last);
            last = number;
        }
        EXPECT_GT(last, 0);
    }

    Done& done;

  private:
    static constexpr const char* path = "jobs/1/job.jdf";
    static constexpr int arraySize = 1'500;
    static constexpr std::size_t fill = 100'000;

    static std::string fileText(int number) {
        return std::string(fill, static_cast<char>('a' + number % 26)) + std::to_string(number);
    }

    static int expectWholeFile(const std::string& text) {
        const int number = text.size() > fill ? std::stoi(text.substr(fill)) : -1;
        EXPECT_TRUE(number > 0 && text == fileText(number)) << text.size() << " bytes";
        return number;
    }
};
