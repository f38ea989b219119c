// SPDX-License-Identifier: Apache-2.0
#include "store/postgres/Postgres.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <new>
#include <thread>
#include <utility>

#include <poll.h>
#include <pwd.h>
#include <sys/stat.h>
#include <unistd.h>

namespace store::postgres {

namespace {

using Clock = std::chrono::steady_clock;

constexpr int oldestServer = 130'000; // The first version with pg_current_snapshot.

constexpr Statement begin = {"BEGIN ISOLATION LEVEL READ COMMITTED"};
constexpr Statement commit = {"COMMIT"};

/// Faults by the start of the server's five-character codes; the first match counts. Appendix A of
/// PostgreSQL's manual lists the codes.
struct FaultRow {
    std::string_view state;
    Fault fault;
};
constexpr FaultRow faults[] = {
    {"08", Fault::Lost},                                    // connection exceptions
    {"25006", Fault::ReadOnly}, {"25P03", Fault::Lost},     // idle in a transaction for too long
    {"40", Fault::Busy},                                    // deadlocks
    {"23505", Fault::Exists},                               // created by two sessions at once
    {"42P06", Fault::Exists},   {"42501", Fault::ReadOnly}, // insufficient privilege
    {"42", Fault::Damaged},                                 // a missing table or column
    {"3F", Fault::Damaged},                                 // a missing schema
    {"53", Fault::Full},                                    // disk, memory, connections
    {"54", Fault::Full},                                    // too large for the server
    {"55P03", Fault::Busy},                                 // waited too long for a lock
    {"57014", Fault::Busy},                                 // a statement that took too long
    {"57", Fault::Lost},                                    // shut down, or not up yet
    {"XX001", Fault::Damaged},  {"XX002", Fault::Damaged},
};

Fault faultOf(std::string_view state) {
    for (const auto& row : faults) {
        if (state.starts_with(row.state)) {
            return row.fault;
        }
    }
    return Fault::Other;
}

/// A message of the library on one line.
std::string oneLine(std::string text) {
    while (!text.empty() && text.back() == '\n') {
        text.pop_back();
    }
    std::replace(text.begin(), text.end(), '\n', ' ');
    return text;
}

void appendBigEndian(std::string& bytes, std::uint64_t number, int size) {
    for (int shift = 8 * (size - 1); shift >= 0; shift -= 8) {
        bytes += static_cast<char>(number >> shift);
    }
}

/// A number from the service; 0 if there is none, or none that is a limit.
template<class Settings>
int said(const Settings& settings, const char* name) {
    const auto found = settings.find(name);
    return found == settings.end() ? 0 : std::max(std::atoi(found->second.c_str()), 0);
}

/// The library's password file, or a name without a file: the library would complain about an
/// unsuitable file on standard error, which is not ours to write to.
template<class Settings>
std::string passwordFile(const Settings& settings) {
    std::string path;
    if (const auto said = settings.find("passfile"); said != settings.end()) {
        path = said->second;
    } else if (const char* const home = std::getenv("HOME"); home != nullptr && *home != '\0') {
        path = std::string(home) + "/.pgpass";
    } else if (const passwd* const user = getpwuid(geteuid()); user != nullptr) {
        path = std::string(user->pw_dir) + "/.pgpass";
    }
    struct stat status;
    const bool liked = stat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode) &&
                       (status.st_mode & (S_IRWXG | S_IRWXO)) == 0;
    return liked ? path : "/dev/null/none";
}

} // namespace

std::int64_t numberOf(std::string_view bytes) {
    // The first byte has the sign, except for a boolean, which is 0 or 1 anyway.
    std::int64_t number = bytes.empty() ? 0 : static_cast<signed char>(bytes[0]);
    for (std::size_t i = 1; i < bytes.size(); ++i) {
        number = number * 256 + static_cast<unsigned char>(bytes[i]);
    }
    return number;
}

std::int64_t Result::number(int row, int column) const {
    return numberOf(bytes(row, column));
}

int Result::changed() const {
    return std::atoi(m_pq->cmdTuples(m_result.get()));
}

// Number of dimensions, whether there are nulls, type; length and first index of the dimension;
// then the length and bytes of each element.
ArrayReader::ArrayReader(std::string_view value) : m_value(value) {
    constexpr std::size_t header = 20;
    if (value.size() >= header) {
        m_left = static_cast<std::size_t>(std::max<std::int64_t>(numberOf(value.substr(12, 4)), 0));
        m_value.remove_prefix(header);
    }
}

void failDamaged() {
    throw StoreFailure(Fault::Damaged, "what the store's server sent can't be read");
}

std::string_view ArrayReader::next() {
    constexpr std::size_t sizeBytes = 4;
    const std::int64_t given = m_value.size() < sizeBytes ? -1 : numberOf(m_value.substr(0, 4));
    if (m_left == 0 || given < 0 ||
        static_cast<std::uint64_t>(given) > m_value.size() - sizeBytes) {
        failDamaged();
    }
    --m_left;
    const auto size = static_cast<std::size_t>(given);
    const std::string_view element = m_value.substr(4, size);
    m_value.remove_prefix(4 + size);
    return element;
}

void Arguments::addOwn(std::string bytes) {
    m_own.push_back(std::move(bytes));
    m_views.push_back(m_own.back());
}

void Arguments::add(int number) {
    std::string bytes;
    appendBigEndian(bytes, static_cast<std::uint64_t>(std::int64_t{number}), 4);
    addOwn(std::move(bytes));
}

void Arguments::add(std::int64_t number) {
    std::string bytes;
    appendBigEndian(bytes, static_cast<std::uint64_t>(number), 8);
    addOwn(std::move(bytes));
}

void Arguments::add(bool value) {
    addOwn(std::string(1, value ? '\1' : '\0'));
}

void Arguments::add(std::string_view bytes) {
    m_views.push_back(bytes.data() == nullptr ? std::string_view("") : bytes);
}

void Arguments::add(const std::vector<std::string_view>& list) {
    constexpr int byteaType = 17;
    std::size_t size = 20;
    for (const auto element : list) {
        size += 4 + element.size();
    }
    if (size > std::size_t{1} << 30) {
        throw StoreFailure(Fault::Full, "the server takes no more than 1 GB in one piece");
    }
    std::string bytes;
    bytes.reserve(size);
    for (const std::uint64_t word :
         {std::uint64_t{!list.empty()}, std::uint64_t{0}, std::uint64_t{byteaType}}) {
        appendBigEndian(bytes, word, 4);
    }
    if (!list.empty()) {
        appendBigEndian(bytes, list.size(), 4);
        appendBigEndian(bytes, 1, 4);
    }
    for (const auto element : list) {
        appendBigEndian(bytes, element.size(), 4);
        bytes += element;
    }
    addOwn(std::move(bytes));
}

std::vector<const char*> Arguments::values() const {
    std::vector<const char*> values;
    for (const auto view : m_views) {
        values.push_back(view.data());
    }
    return values;
}

std::vector<int> Arguments::lengths() const {
    std::vector<int> lengths;
    for (const auto view : m_views) {
        lengths.push_back(static_cast<int>(view.size()));
    }
    return lengths;
}

/// The settings of the service and of the user's environment. Only the library reads the service,
/// during a connection. Two hosts for one address make that connection fail before the library
/// contacts a server or reads a password file.
Connection::Settings Connection::settingsOf(const LibPq& pq, const std::string& service) {
    const char* const names[] = {"service", "host", "hostaddr", nullptr};
    const char* const values[] = {service.c_str(), "/dev/null,/dev/null", "127.0.0.1", nullptr};
    const Handle nowhere(pq.connectStartParams(names, values, 0), pq.finish);
    const std::unique_ptr<PQconninfoOption, void (*)(PQconninfoOption*)> options(
        pq.conninfo(nowhere.get()), pq.conninfoFree);
    Settings settings;
    for (const auto* option = options.get(); option != nullptr && option->keyword != nullptr;
         ++option) {
        if (option->val != nullptr) {
            settings[option->keyword] = option->val;
        }
    }
    return settings;
}

PGconn* Connection::connect(const LibPq& pq, const std::string& service, const Settings& said) {
    const std::string connectLimit = std::to_string(longestConnect.count());
    const std::string wayLimit = std::to_string(std::chrono::milliseconds(longestWay).count());
    const std::string passwords = passwordFile(said);
    std::vector<const char*> names = {"service", "fallback_application_name", "passfile"};
    std::vector<const char*> values = {service.c_str(), "tintgate", passwords.c_str()};
    // The value must live until the connection is established.
    const auto unlessSaid = [&](const char* name, const char* value) {
        if (postgres::said(said, name) == 0) {
            names.push_back(name);
            values.push_back(value);
        }
    };
    unlessSaid("connect_timeout", connectLimit.c_str());
    unlessSaid("tcp_user_timeout", wayLimit.c_str());
    // Prevents firewalls from dropping a connection that waits for a measurement.
    unlessSaid("keepalives_idle", "60");
    unlessSaid("keepalives_interval", "10");
    unlessSaid("keepalives_count", "3");
    names.push_back(nullptr);
    values.push_back(nullptr);
    return pq.connectdbParams(names.data(), values.data(), 0);
}

Connection::Connection(const std::string& service, std::chrono::milliseconds absence,
                       std::function<void(Connection&)> check)
    : m_pq(&libPq()), m_service(service), m_absenceLeft(absence), m_check(std::move(check)),
      m_connection(nullptr, m_pq->finish) {
    const Settings said = settingsOf(*m_pq, service);
    m_connection.reset(connect(*m_pq, service, said));
    if (lost()) {
        throw std::bad_alloc();
    }
    if (m_pq->status(m_connection.get()) != CONNECTION_OK) {
        throw StoreFailure(Fault::Missing,
                           service + ": " + oneLine(m_pq->errorMessage(m_connection.get())));
    }
    if (m_pq->serverVersion(m_connection.get()) < oldestServer) {
        throw StoreFailure(Fault::Missing, service + " is a server before PostgreSQL 13");
    }
    settle(said);
}

void Connection::settle(const Settings& said) {
    m_pq->setNoticeProcessor(
        m_connection.get(), [](void*, const char*) {}, nullptr);
    m_pq->setnonblocking(m_connection.get(), 1);
    m_pq->enterPipelineMode(m_connection.get());
    static constexpr Statement limit = {"SELECT setting::bigint, pg_backend_pid() FROM pg_settings"
                                        " WHERE name = 'statement_timeout'"};
    send(limit); // The settings are sent before it.
    const auto results = finish();
    const int way = postgres::said(said, "tcp_user_timeout");
    m_longestSilence = std::chrono::milliseconds(results[0].number(0, 0)) +
                       (way > 0 ? std::chrono::milliseconds(way) : longestWay);
    // A pooler has a different process id.
    m_pooled = results[0].number(0, 1) != m_pq->backendPID(m_connection.get());
}

/// Only for the transaction if the session may be used by others next.
void Connection::sendSettings() {
    static const std::string settings =
        "SELECT set_config(name, value, pg_backend_pid() <> $1) FROM (VALUES ('lock_timeout', '" +
        std::to_string(longestWaitMilliseconds) +
        "', true),"
        " ('jit', 'off', true)," // Compilation takes longer than it saves.
        " ('idle_session_timeout', '0', true),"
        " ('statement_timeout', '" +
        std::to_string(longestStatement.count()) +
        "s', false), ('idle_in_transaction_session_timeout', '" +
        std::to_string(longestPause.count()) +
        "s', false)) AS setting (name, value, always)"
        // Some servers lack some of them.
        " WHERE current_setting(name, true) = '0' OR"
        " (always AND current_setting(name, true) IS NOT NULL)";
    sendNow(settings.c_str(), "", Arguments(m_pq->backendPID(m_connection.get())));
    m_sent.push_back({nullptr, true});
}

bool Connection::isThere() {
    try {
        repeating([] {});
        return true;
    } catch (const StoreFailure&) {
        return false;
    }
}

/// Detects that the server closed the connection since the last call. Nothing is sent at this time.
void Connection::dropIfClosed() {
    if (lost()) {
        return;
    }
    pollfd closed = {m_pq->socket(m_connection.get()), POLLRDHUP, 0};
    if (poll(&closed, 1, 0) > 0 && closed.revents != 0) {
        m_connection.reset();
        m_sent.clear();
    }
}

void Connection::connectAnew(Clock::time_point end) {
    std::string why = "the connection to the server was lost";
    for (auto pause = std::chrono::milliseconds(20); Clock::now() < end;
         pause = std::min(2 * pause, std::chrono::milliseconds(1'000))) {
        try {
            Connection fresh(m_service, {});
            if (m_check) {
                m_check(fresh);
            }
            m_connection = std::move(fresh.m_connection);
            m_prepared.clear();
            m_sent.clear();
            m_longestSilence = fresh.m_longestSilence;
            m_pooled = fresh.m_pooled;
            ++m_generation;
            return;
        } catch (const StoreFailure& failure) {
            why = failure.what();
            if (failure.status == Fault::Newer || failure.status == Fault::Older) {
                break; // It is another store now.
            }
        }
        std::this_thread::sleep_for(
            std::min<Clock::duration>(pause, std::max(end - Clock::now(), Clock::duration())));
    }
    m_absenceLeft = {};
    throw StoreFailure(Fault::Lost, why);
}

Connection::Call::~Call() {
    m_connection.m_inCall = false;
    if (m_lostSince) {
        const auto left = m_connection.m_absenceLeft - (Clock::now() - *m_lostSince);
        m_connection.m_absenceLeft =
            std::max(std::chrono::duration_cast<std::chrono::milliseconds>(left),
                     std::chrono::milliseconds());
    }
}

void Connection::Call::noteLoss() {
    if (!m_lostSince) {
        m_lostSince = Clock::now();
    }
}

void Connection::Call::attend() {
    m_connection.dropIfClosed();
    if (m_connection.lost()) {
        noteLoss();
        m_connection.connectAnew(*m_lostSince + m_connection.m_absenceLeft);
    }
}

void Connection::beThere() const {
    if (lost()) {
        throw StoreFailure(Fault::Lost, "the connection to the server was lost");
    }
}

void Connection::lose(const std::string& why) {
    m_connection.reset();
    m_sent.clear();
    throw StoreFailure(Fault::Lost, "the connection to the server was lost: " + why);
}

void Connection::fail(const PGresult* result) {
    const char* const state = m_pq->resultErrorField(result, PG_DIAG_SQLSTATE);
    const char* const primary = m_pq->resultErrorField(result, PG_DIAG_MESSAGE_PRIMARY);
    const std::string text =
        oneLine(primary != nullptr ? primary : m_pq->resultErrorMessage(result));
    const Fault fault = faultOf(state == nullptr ? "" : state);
    if (fault == Fault::Lost || m_pq->status(m_connection.get()) != CONNECTION_OK) {
        lose(text);
    }
    throw StoreFailure(fault, "the store's server: " + text);
}

void Connection::checkSent(int done) {
    if (done != 1) {
        lose(oneLine(m_pq->errorMessage(m_connection.get())));
    }
}

void Connection::sendNow(const char* text, const char* name, const Arguments& arguments) {
    const std::vector<int> binary(static_cast<std::size_t>(arguments.count()), 1);
    const auto values = arguments.values();
    const auto lengths = arguments.lengths();
    if (name[0] == '\0') {
        checkSent(m_pq->sendQueryParams(m_connection.get(), text, arguments.count(), nullptr,
                                        values.data(), lengths.data(), binary.data(), 1));
    } else {
        checkSent(m_pq->sendQueryPrepared(m_connection.get(), name, arguments.count(),
                                          values.data(), lengths.data(), binary.data(), 1));
    }
}

void Connection::sendArguments(const Statement& statement, const Arguments& arguments) {
    beThere();
    if (m_pooled) {
        const bool starts =
            m_sent.empty() && m_pq->transactionStatus(m_connection.get()) == PQTRANS_IDLE;
        const bool isBegin = statement.text == begin.text;
        if (starts && !isBegin) {
            sendSettings();
        }
        sendNow(statement.text, "", arguments);
        m_sent.push_back({nullptr, false});
        if (starts && isBegin) {
            sendSettings();
        }
        return;
    }
    const std::string name = std::to_string(reinterpret_cast<std::uintptr_t>(statement.text));
    if (m_prepared.count(statement.text) == 0) {
        checkSent(m_pq->sendPrepare(m_connection.get(), name.c_str(), statement.text, 0, nullptr));
        m_sent.push_back({statement.text, true});
        m_prepared.insert(statement.text);
    }
    sendNow(statement.text, name.c_str(), arguments);
    m_sent.push_back({nullptr, false});
}

/// Waits until there is something to read.
void Connection::waitForServer() {
    const auto end = Clock::now() + m_longestSilence;
    for (;;) {
        const int unsent = m_pq->flush(m_connection.get());
        if (unsent < 0) {
            lose(oneLine(m_pq->errorMessage(m_connection.get())));
        }
        pollfd wait = {m_pq->socket(m_connection.get()),
                       static_cast<short>(POLLIN | (unsent > 0 ? POLLOUT : 0)), 0};
        const auto left =
            std::chrono::duration_cast<std::chrono::milliseconds>(end - Clock::now()).count();
        const int ready = left > 0 ? poll(&wait, 1, static_cast<int>(left)) : 0;
        if (ready == 0) {
            lose("it has not answered for " + std::to_string(m_longestSilence.count() / 1'000) +
                 " seconds");
        }
        if (ready > 0 && (wait.revents & ~POLLOUT) != 0) {
            break;
        }
        if (ready > 0) {
            return; // The server accepted data: a sign of life.
        }
        if (errno != EINTR) {
            lose("it can't be waited for");
        }
    }
    if (m_pq->consumeInput(m_connection.get()) == 0) {
        lose(oneLine(m_pq->errorMessage(m_connection.get())));
    }
}

PGresult* Connection::nextResult() {
    while (m_pq->isBusy(m_connection.get()) != 0) {
        waitForServer();
    }
    return m_pq->getResult(m_connection.get());
}

std::vector<Result> Connection::finish() {
    beThere();
    checkSent(m_pq->pipelineSync(m_connection.get()));
    const std::vector<Sent> sent = std::move(m_sent);
    m_sent.clear();
    std::vector<Result> results;
    std::unique_ptr<Result> failed;
    for (const auto& each : sent) {
        Result result(*m_pq, nextResult());
        const ExecStatusType status = m_pq->resultStatus(result.get());
        if (status == PGRES_COMMAND_OK || status == PGRES_TUPLES_OK) {
            if (!each.isAside) {
                results.push_back(std::move(result));
            }
        } else {
            if (each.prepares != nullptr) {
                m_prepared.erase(each.prepares);
            }
            if (!failed) {
                failed = std::make_unique<Result>(std::move(result));
            }
        }
        if (m_pq->status(m_connection.get()) != CONNECTION_OK) {
            fail(failed ? failed->get() : nullptr);
        }
        m_pq->clear(nextResult()); // The null after each result.
    }
    m_pq->clear(nextResult()); // The result of the synchronisation.
    if (failed) {
        fail(failed->get());
    }
    return results;
}

void Connection::script(const std::string& statements) {
    beThere();
    const std::chrono::milliseconds former =
        std::exchange(m_longestSilence, std::chrono::hours(24));
    checkSent(m_pq->exitPipelineMode(m_connection.get()));
    checkSent(m_pq->sendQuery(m_connection.get(), statements.c_str()));
    std::unique_ptr<Result> failed;
    while (PGresult* const next = nextResult()) {
        Result result(*m_pq, next);
        if (m_pq->resultStatus(next) == PGRES_FATAL_ERROR && !failed) {
            failed = std::make_unique<Result>(std::move(result));
        }
    }
    m_longestSilence = former;
    if (!failed) {
        checkSent(m_pq->enterPipelineMode(m_connection.get()));
        return;
    }
    if (m_pq->status(m_connection.get()) == CONNECTION_OK) {
        m_pq->enterPipelineMode(m_connection.get());
    }
    fail(failed->get());
}

void Connection::rollBack() noexcept {
    static constexpr Statement rollback = {"ROLLBACK"};
    if (lost()) {
        return;
    }
    try {
        if (!m_sent.empty()) {
            try {
                finish();
            } catch (const StoreFailure&) { // The transaction is undone anyway.
            }
        }
        if (!lost() && m_pq->transactionStatus(m_connection.get()) != PQTRANS_IDLE) {
            run(rollback);
        }
    } catch (...) {
        m_connection.reset(); // This undoes the transaction too.
    }
}

Transaction::Transaction(Connection& connection) : m_connection(connection) {
    m_connection.send(begin);
}

Transaction::~Transaction() {
    if (m_open) {
        m_connection.rollBack();
    }
}

std::vector<Result> Transaction::finish() {
    auto results = m_connection.finish();
    if (!m_begun) {
        results.erase(results.begin());
        m_begun = true;
    }
    return results;
}

std::vector<Result> Transaction::commit() {
    m_connection.send(store::postgres::commit);
    auto results = finish();
    results.pop_back();
    m_open = false;
    return results;
}

} // namespace store::postgres
