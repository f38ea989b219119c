// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/Credentials.h"

#include <cerrno>
#include <csignal>
#include <istream>

#include <fcntl.h>
#include <termios.h>
#include <unistd.h>

#include "base/Utf8.h"
#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/LocalFile.h"

namespace admin {

namespace {

/// Converts UTF-8 to one byte per character. `what` names the text in messages, which never show
/// it, because it may be a password.
std::string narrowed(const std::string& typed, const std::string& what) {
    if (typed.empty()) {
        throw Failure(Status::BadInput, what + " is empty");
    }
    if (!base::isUtf8(typed)) {
        throw Failure(Status::BadInput, what + " is no UTF-8");
    }
    std::string bytes;
    for (std::size_t i = 0; i < typed.size(); ++i) {
        auto character = static_cast<unsigned char>(typed[i]);
        if (character >= 0xC4) {
            throw Failure(Status::BadInput,
                          what + " has a character above U+00FF, which no login can bring");
        }
        if (character >= 0xC2) {
            character = static_cast<unsigned char>((character & 3) << 6 | (typed[++i] & 0x3F));
        }
        if (character < 0x20 || (character >= 0x7F && character < 0xA0)) {
            throw Failure(Status::BadInput, what + " has a control character");
        }
        bytes += static_cast<char>(character);
    }
    if (bytes.size() > store::longestCredential) {
        throw Failure(Status::BadInput, what + " is longer than " +
                                            std::to_string(store::longestCredential) +
                                            " characters");
    }
    return bytes;
}

volatile std::sig_atomic_t caughtSignal = 0;

void noteSignal(int signal) {
    caughtSignal = signal;
}

/// Turns the terminal's echo off. Signals that terminate or stop the program are delivered after
/// the echo is restored.
class SilentTerminal {
  public:
    explicit SilentTerminal(int terminal) : m_terminal(terminal) {
        caughtSignal = 0;
        struct sigaction note = {};
        note.sa_handler = noteSignal; // No SA_RESTART, because a signal must interrupt read.
        for (std::size_t i = 0; i < std::size(signals); ++i) {
            sigaction(signals[i], &note, &m_former[i]);
        }
        tcgetattr(m_terminal, &m_settings);
        termios silent = m_settings;
        silent.c_lflag &= ~static_cast<tcflag_t>(ECHO);
        silent.c_lflag |= ECHONL;
        tcsetattr(m_terminal, TCSAFLUSH, &silent);
    }
    ~SilentTerminal() {
        tcsetattr(m_terminal, TCSAFLUSH, &m_settings);
        for (std::size_t i = 0; i < std::size(signals); ++i) {
            sigaction(signals[i], &m_former[i], nullptr);
        }
        if (caughtSignal != 0) {
            raise(caughtSignal);
        }
    }
    SilentTerminal(const SilentTerminal&) = delete;
    SilentTerminal& operator=(const SilentTerminal&) = delete;

  private:
    static constexpr int signals[] = {SIGINT, SIGTERM, SIGHUP, SIGQUIT, SIGTSTP};

    const int m_terminal;
    termios m_settings = {};
    struct sigaction m_former[std::size(signals)] = {};
};

std::string readHidden(int terminal, const std::string& question) {
    std::string line;
    {
        const SilentTerminal silent(terminal);
        if (write(terminal, question.data(), question.size()) < 0) {
            throw Failure(Status::LocalFile, "can't write to the terminal");
        }
        char byte = 0;
        while (caughtSignal == 0) {
            const ssize_t count = read(terminal, &byte, 1);
            if (count <= 0 || byte == '\n') {
                break;
            }
            line += byte;
        }
    }
    if (caughtSignal != 0) { // The program was stopped and now continues.
        throw Failure(Status::BadInput, "no password was typed");
    }
    return line;
}

/// -1 if there is no terminal.
int openTerminal() {
    return isatty(STDIN_FILENO) != 0 ? open("/dev/tty", O_RDWR | O_CLOEXEC | O_NOCTTY) : -1;
}

std::string firstLine(const std::string& path) {
    LocalInput input(path);
    std::string line;
    std::getline(input.stream(), line);
    if (!line.empty() && line.back() == '\r') {
        line.pop_back();
    }
    return line;
}

std::string typedTwice(int terminal, const std::string& user) {
    const std::string first = readHidden(terminal, "Password for " + user + ": ");
    const std::string second = readHidden(terminal, "Again: ");
    close(terminal);
    if (first != second) {
        throw Failure(Status::BadInput, "the two passwords differ");
    }
    return first;
}

} // namespace

std::string userName(const std::string& typed) {
    return narrowed(typed, "the user's name");
}

void refuseColon(const std::string& text, const std::string& what) {
    if (text.find(':') != std::string::npos) {
        throw Failure(Status::BadInput, what +
                                            " has a \":\", so no job could use it: of a job's "
                                            "arguments, only the text after the last \":\" counts");
    }
}

std::string newUserName(const std::string& typed) {
    refuseColon(typed, "the user's name");
    return userName(typed);
}

std::string askPassword(const std::string& path, const std::string& user) {
    const int terminal = path.empty() ? openTerminal() : -1;
    const std::string typed =
        terminal >= 0 ? typedTwice(terminal, user) : firstLine(path.empty() ? "-" : path);
    refuseColon(typed, "the password");
    return narrowed(typed, "the password");
}

} // namespace admin
