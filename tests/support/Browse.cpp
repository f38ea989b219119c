#include "Browse.h"

#include <iterator>
#include <sstream>

#include <unistd.h>

namespace support {

Outcome browse(const std::string& page, const std::string& profile,
               const std::vector<std::string>& options) {
    std::istringstream words("chromium --headless --disable-gpu --disable-quic --no-first-run "
                             "--disable-background-networking --disable-component-update "
                             "--disable-sync --enable-logging=stderr --virtual-time-budget=5000 "
                             "--dump-dom");
    std::vector<std::string> command(std::istream_iterator<std::string>(words), {});
    command.push_back("--user-data-dir=" + profile);
    if (geteuid() == 0)
        command.emplace_back("--no-sandbox");
    command.insert(command.end(), options.begin(), options.end());
    command.push_back("file://" + page);
    return run(command);
}

} // namespace support
