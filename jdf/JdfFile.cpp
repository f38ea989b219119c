// SPDX-License-Identifier: Apache-2.0
#include "jdf/JdfFile.h"

#include <new>

#include <fcntl.h>
#include <sys/stat.h>

#include "base/Descriptor.h"
#include "base/FileDraft.h"
#include "base/WholeFile.h"

namespace jdf {
Contents readFile(const std::string& path, long smallest, long more) {
    // Non-blocking, so that a pipe in the file's place is refused at once.
    const base::Descriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    struct stat status = {};
    if (!file.isOpen() || fstat(file.get(), &status) != 0 || !S_ISREG(status.st_mode) ||
        status.st_size < smallest) {
        return {};
    }
    const long capacity = status.st_size + more;
    Contents contents;
    contents.block.reset(new (std::nothrow) char[static_cast<std::size_t>(capacity) + 2]);
    if (contents.block == nullptr) {
        return {};
    }
    contents.block[0] = '\0';
    contents.start = contents.block.get() + 1;
    contents.limit = contents.start + capacity;
    contents.length = status.st_size;
    if (base::readAll(file, contents.start, static_cast<std::size_t>(contents.length)) !=
        contents.length) {
        return {};
    }
    *contents.end() = '\0';
    return contents;
}

bool replaceFile(const std::string& path, const Contents& contents) {
    const std::string target = base::withoutLinks(path);
    if (!base::Descriptor(open(target.c_str(), O_WRONLY | O_CLOEXEC)).isOpen()) {
        return false;
    }
    base::FileDraft draft(target);
    return draft.isOpen() &&
           draft.write({contents.start, static_cast<std::size_t>(contents.length)}) &&
           draft.keepAccessOf(target) && draft.replace(target, base::Flush::No);
}

} // namespace jdf
