// SPDX-License-Identifier: Apache-2.0
// A connection to a PostgreSQL server, its statements, and failures as StoreFailure.
//
// Statements are sent several at a time where one does not need what another gives, so that they
// cost one round trip (libpq's pipeline mode). Arguments and results are in binary form.
//
// Each call ends: see the limits below. A connection that was lost is made anew, for as long as a
// session may be without its server; then it stays lost, and whatever is asked of it fails at once.
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

// Limits, each where neither the connection service nor the server's settings say another one. The
// name in brackets is the one that they have for it.

/// To reach one host (connect_timeout).
inline constexpr std::chrono::seconds longestConnect{10};
/// What a statement may take the server (statement_timeout).
inline constexpr std::chrono::seconds longestStatement{20};
/// For the way there and back (tcp_user_timeout). When a statement's time and this have gone by
/// without a sign of life from the server, the connection is given up, whatever kind it is of.
inline constexpr std::chrono::seconds longestWay{10};
/// For how long a client that has vanished in the middle of a change can keep others from changing
/// the same ticket (idle_in_transaction_session_timeout).
inline constexpr std::chrono::seconds longestPause{60};

/// For how long a session may be without its server, all waits of its calls together. Then it is
/// lost for good.
inline constexpr std::chrono::milliseconds longestAbsence{30'000};

/// A text with $1 and so on, which lives as long as the program. It is prepared when it is first
/// sent, so that the server parses it once for a connection.
struct Statement {
    const char* text;
};

/// What a statement gave. Good as long as it lives.
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
    /// Of an int, a bigint or a boolean; 0 for null.
    std::int64_t number(int row, int column) const;
    /// How many rows the statement changed.
    int changed() const;

    PGresult* get() const { return m_result.get(); }

  private:
    const LibPq* m_pq;
    std::unique_ptr<PGresult, void (*)(PGresult*)> m_result;
};

/// Throws StoreFailure (Damaged): nothing of what comes from the server is trusted.
[[noreturn]] void failDamaged();

/// Elements of an array without holes, one after the other. The array outlives it.
class ArrayReader {
  public:
    /// A null value has no elements.
    explicit ArrayReader(std::string_view value);

    std::size_t left() const { return m_left; }
    /// Throws StoreFailure (Damaged).
    std::string_view next();

  private:
    std::string_view m_value;
    std::size_t m_left = 0;
};

/// Big-endian, as the server has it.
std::int64_t numberOf(std::string_view bytes);

/// The arguments of a statement: int for an int, std::int64_t for a bigint, bool for a boolean,
/// bytes for a bytea, and lists of bytes for a bytea[]. Bytes stay the caller's; they must be good
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

    std::deque<std::string> m_own; ///< Keeps addresses.
    std::vector<std::string_view> m_views;
};

class Connection {
  public:
    /// Connects by a libpq connection service. Throws StoreFailure: Missing for one that is not
    /// known, can't be reached or refuses this user. Absence is how long it may be without its
    /// server; check is called with each later connection before it is used, and may throw.
    explicit Connection(const std::string& service,
                        std::chrono::milliseconds absence = longestAbsence,
                        std::function<void(Connection&)> check = {});
    Connection(Connection&&) = default;

    bool lost() const { return m_connection == nullptr; }
    /// Whether the server is there, as far as can be told without asking it; a connection that was
    /// lost is made anew. False once the session is lost for good.
    bool isThere();
    /// Counts the times that it was made anew. What was fetched before may be another server's.
    unsigned generation() const { return m_generation; }
    /// Whether a pooler is between this and the server, which may hand each transaction to another
    /// of its sessions. Then nothing is prepared, and settings go with each transaction.
    bool pooled() const { return m_pooled; }
    /// From now on a loss is for good.
    void stayWithThisServer() { m_absenceLeft = {}; }

    /// Runs work, which may be done again, on a connection that is there: when the connection is
    /// lost on the way, it is made anew and work starts from its beginning.
    template<class Work>
    auto repeating(Work work) {
        return attending(true, work);
    }
    /// The same for work that must not be done twice: once it has begun, a loss is a failure.
    template<class Work>
    auto once(Work work) {
        return attending(false, work);
    }

    /// One statement, in the transaction that is open or in one of its own.
    template<class... Each>
    Result run(const Statement& statement, const Each&... each) {
        send(statement, each...);
        return std::move(finish().back());
    }

    /// Sends a statement whose result the next finish fetches. Statements without a transaction
    /// around them, up to finish, are one.
    template<class... Each>
    void send(const Statement& statement, const Each&... each) {
        sendArguments(statement, Arguments(each...));
    }
    /// The results of all statements sent, in their order. Throws for the first that failed; those
    /// behind it were not carried out.
    std::vector<Result> finish();

    /// Several statements in one text, without arguments and results, on their own or in the
    /// transaction that is open. They may take as long as the server lets them.
    void script(const std::string& statements);

    /// For a destructor: undoes what is open, and gives up the connection where that fails.
    void rollBack() noexcept;

  private:
    /// One call from outside, in which the time without the server is taken.
    class Call {
      public:
        explicit Call(Connection& connection) : m_connection(connection) {
            m_connection.m_inCall = true;
        }
        ~Call();
        Call(const Call&) = delete;
        Call& operator=(const Call&) = delete;

        void noteLoss();
        /// Makes sure that the connection is there. Throws StoreFailure (Lost).
        void attend();

      private:
        Connection& m_connection;
        std::optional<std::chrono::steady_clock::time_point> m_lostSince;
    };

    template<class Work>
    auto attending(bool repeats, Work work) {
        if (m_inCall) {
            return work(); // Within a transaction, say, which ends with the connection.
        }
        Call call(*this);
        for (;;) {
            call.attend();
            try {
                return work();
            } catch (const StoreFailure& failure) {
                if (failure.fault != Fault::Lost) {
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
    bool m_pooled = true; ///< Until it is known.
    bool m_inCall = false;
    std::chrono::milliseconds m_longestSilence = longestStatement + longestWay;
    std::set<const char*> m_prepared;
    /// Of what was sent since the last finish: whether it is something whose result nobody wants,
    /// and the text that it prepares, if it does.
    struct Sent {
        const char* prepares;
        bool isAside;
    };
    std::vector<Sent> m_sent;
};

/// A transaction that sees what others have committed up to each of its statements. Rolled back
/// unless committed. Its start goes with the first statements that are sent in it.
class Transaction {
  public:
    explicit Transaction(Connection& connection);
    ~Transaction();
    Transaction(const Transaction&) = delete;
    Transaction& operator=(const Transaction&) = delete;

    /// The results of what was sent, but for those of the transaction itself.
    std::vector<Result> finish();
    /// The same, and the transaction is committed behind it.
    std::vector<Result> commit();

  private:
    Connection& m_connection;
    bool m_begun = false; ///< Its start has been answered.
    bool m_open = true;
};

} // namespace store::postgres
