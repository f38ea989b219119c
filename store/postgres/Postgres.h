// SPDX-License-Identifier: Apache-2.0
// A connection to a PostgreSQL server, its statements, and failures as StoreFailure.
//
// Statements that don't need each other's results are sent together, so that they cost one round
// trip (libpq's pipeline mode). Arguments and results are in binary form.
//
// Each call has a time limit: see below. A lost connection is restored as long as a session may be
// without its server. After that it stays lost, and every call fails at once.
#pragma once

#include <chrono>
#include <cstdint>
#include <deque>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

#include "store/StoreEngine.h"
#include "store/postgres/LibPq.h"

namespace store::postgres {

// Limits. Each applies unless the connection service or the server's settings specify another one,
// under the name in parentheses.

/// Time to reach one host (connect_timeout).
inline constexpr std::chrono::seconds longestConnect{10};
/// The server's time for one statement (statement_timeout).
inline constexpr std::chrono::seconds longestStatement{20};
/// Network time (tcp_user_timeout). If a statement's time plus this passes without a sign of life
/// from the server, the connection is given up, whatever its kind.
inline constexpr std::chrono::seconds longestWay{10};
/// How long a client that vanishes during a change can prevent others from changing the same ticket
/// (idle_in_transaction_session_timeout).
inline constexpr std::chrono::seconds longestPause{60};

/// How long a session may be without its server, adding up all waits of its calls. After that it is
/// permanently lost.
inline constexpr std::chrono::milliseconds longestAbsence{30'000};

/// A text with $1 and so on, which must live as long as the program. It is prepared when it is
/// first sent, so the server parses it once per connection.
struct Statement {
    const char* text;
};

/// The result of a statement. Its data is valid as long as it lives.
class Result {
  public:
    Result(const LibPq& pq, PGresult* result) : m_pq(&pq), m_result(result, pq.clear) {}

    int rows() const { return m_pq->ntuples(m_result.get()); }
    bool isNull(int row, int column) const {
        return m_pq->getisnull(m_result.get(), row, column) != 0;
    }
    std::string_view bytes(int row, int column) const {
        return {m_pq->getvalue(m_result.get(), row, column),
                static_cast<std::size_t>(m_pq->getlength(m_result.get(), row, column))};
    }
    std::string text(int row, int column) const { return std::string(bytes(row, column)); }
    /// The value of an int, a bigint or a boolean; 0 for null.
    std::int64_t number(int row, int column) const;
    /// The number of rows that the statement changed.
    int changed() const;

    PGresult* get() const { return m_result.get(); }

  private:
    const LibPq* m_pq;
    std::unique_ptr<PGresult, void (*)(PGresult*)> m_result;
};

/// Throws StoreFailure (Damaged): data from the server is not trusted.
[[noreturn]] void failDamaged();

/// Reads the elements of an array without holes in order. The array must outlive the reader.
class ArrayReader {
  public:
    /// A null value counts as an array without elements.
    explicit ArrayReader(std::string_view value);

    std::size_t left() const { return m_left; }
    /// Throws StoreFailure (Damaged).
    std::string_view next();

  private:
    std::string_view m_value;
    std::size_t m_left = 0;
};

/// Big-endian, as in the server's format.
std::int64_t numberOf(std::string_view bytes);

/// The arguments of a statement: int for an int, std::int64_t for a bigint, bool for a boolean,
/// bytes for a bytea, and lists of bytes for a bytea[]. Bytes are not copied and must be valid
/// until the statement is sent.
class Arguments {
  public:
    template<class... Each>
    explicit Arguments(const Each&... each) {
        (add(each), ...);
    }

    void add(int number);
    void add(std::int64_t number);
    void add(bool value);
    void add(std::string_view bytes);
    void add(const std::string& bytes) { add(std::string_view(bytes)); }
    void add(const std::vector<std::string_view>& list);

    int count() const { return static_cast<int>(m_views.size()); }
    std::vector<const char*> values() const;
    std::vector<int> lengths() const;

  private:
    void addOwn(std::string bytes);

    std::deque<std::string> m_own; ///< A deque, because addresses must not change.
    std::vector<std::string_view> m_views;
};

class Connection {
  public:
    /// Connects by a libpq connection service. Throws StoreFailure (Missing) if the service is
    /// unknown, can't be reached or refuses this user. `absence` is how long it may be without its
    /// server. `check` is called with each later connection before it is used, and may throw.
    explicit Connection(const std::string& service,
                        std::chrono::milliseconds absence = longestAbsence,
                        std::function<void(Connection&)> check = {});
    Connection(Connection&&) = default;

    bool lost() const { return m_connection == nullptr; }
    /// Whether the server is there, as far as known without asking it. Restores a lost connection.
    /// False if the session is permanently lost.
    bool isThere();
    /// Counts reconnections. Data fetched before may come from another server.
    unsigned generation() const { return m_generation; }
    /// Whether there is a pooler in between, which may assign each transaction to another session
    /// of the server. Then nothing is prepared, and settings are sent with each transaction.
    bool pooled() const { return m_pooled; }
    /// From now on, a loss is permanent.
    void stayWithThisServer() { m_absenceLeft = {}; }

    /// Runs `work`, which must be repeatable. If the connection is lost meanwhile, it is restored
    /// and `work` starts again.
    template<class Work>
    auto repeating(Work work) {
        return attending(true, work);
    }
    /// Same for work that must not be repeated: once it has started, a loss is a failure.
    template<class Work>
    auto once(Work work) {
        return attending(false, work);
    }

    /// Runs one statement in the open transaction, or in its own.
    template<class... Each>
    Result run(const Statement& statement, const Each&... each) {
        send(statement, each...);
        return std::move(finish().back());
    }

    /// Sends a statement whose result the next finish returns. Without a transaction, all
    /// statements up to finish form one.
    template<class... Each>
    void send(const Statement& statement, const Each&... each) {
        sendArguments(statement, Arguments(each...));
    }
    /// The results of all statements sent, in order. Throws for the first failed one; those after
    /// it were not executed.
    std::vector<Result> finish();

    /// Runs several statements in one text, without arguments and results, in the open transaction
    /// or on their own. They may take as long as the server permits.
    void script(const std::string& statements);

    /// For destructors: undoes the open transaction. If that fails, gives up the connection.
    void rollBack() noexcept;

  private:
    /// One call from outside, during which the time without the server is counted.
    class Call {
      public:
        explicit Call(Connection& connection) : m_connection(connection) {
            m_connection.m_inCall = true;
        }
        ~Call();
        Call(const Call&) = delete;
        Call& operator=(const Call&) = delete;

        void noteLoss();
        /// Ensures that the connection is there. Throws StoreFailure (Lost).
        void attend();

      private:
        Connection& m_connection;
        std::optional<std::chrono::steady_clock::time_point> m_lostSince;
    };

    template<class Work>
    auto attending(bool repeats, Work work) {
        if (m_inCall) {
            return work(); // For example within a transaction, which ends with the connection.
        }
        Call call(*this);
        for (;;) {
            call.attend();
            try {
                return work();
            } catch (const StoreFailure& failure) {
                if (failure.status != Fault::Lost) {
                    throw;
                }
                call.noteLoss();
                if (!repeats) {
                    throw;
                }
            }
        }
    }

    using Handle = std::unique_ptr<PGconn, void (*)(PGconn*)>;
    using Settings = std::map<std::string, std::string>;

    static Settings settingsOf(const LibPq& pq, const std::string& service);
    static PGconn* connect(const LibPq& pq, const std::string& service, const Settings& said);
    void settle(const Settings& said);
    void dropIfClosed();
    void connectAnew(std::chrono::steady_clock::time_point end);
    void sendSettings();
    void sendNow(const char* text, const char* name, const Arguments& arguments);
    void sendArguments(const Statement& statement, const Arguments& arguments);
    void checkSent(int done);
    void beThere() const;
    void waitForServer();
    PGresult* nextResult();
    std::vector<Result> collect(bool untilSync);
    [[noreturn]] void lose(const std::string& why);
    [[noreturn]] void fail(const PGresult* result);

    const LibPq* m_pq;
    std::string m_service;
    std::chrono::milliseconds m_absenceLeft;
    std::function<void(Connection&)> m_check;
    Handle m_connection;
    unsigned m_generation = 0;
    bool m_pooled = true; ///< Until known otherwise.
    bool m_inCall = false;
    std::chrono::milliseconds m_longestSilence = longestStatement + longestWay;
    std::set<const char*> m_prepared;
    /// For what was sent since the last finish: whether its result is not wanted, and the text that
    /// it prepares, if any.
    struct Sent {
        const char* prepares;
        bool isAside;
    };
    std::vector<Sent> m_sent;
};

/// A transaction in which each statement sees what others have committed before it. Rolled back
/// unless committed. Its start is sent together with the first statements.
class Transaction {
  public:
    explicit Transaction(Connection& connection);
    ~Transaction();
    Transaction(const Transaction&) = delete;
    Transaction& operator=(const Transaction&) = delete;

    /// The results of what was sent, without those of the transaction itself.
    std::vector<Result> finish();
    /// Same, and then commits the transaction.
    std::vector<Result> commit();

  private:
    Connection& m_connection;
    bool m_begun = false; ///< The server has confirmed the start.
    bool m_open = true;
};

} // namespace store::postgres
