// Regular files.
#include "desktop/platform/RegularFile.h"

#include <fcntl.h>
#include <glib.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

namespace desktop {

std::unique_ptr<RegularFile> RegularFile::open(const std::string& file, std::string& error) {
    // A pipe would block until somebody writes to it.
    const int descriptor = ::open(file.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY);
    if (descriptor < 0) {
        error = g_strerror(errno);
        return nullptr;
    }
    std::unique_ptr<RegularFile> opened(new RegularFile(descriptor));
    struct stat status {};
    if (fstat(descriptor, &status) != 0 || !S_ISREG(status.st_mode)) {
        error = "Not a regular file";
        return nullptr;
    }
    return opened;
}

RegularFile::~RegularFile() {
    close(m_descriptor);
}

uint64_t RegularFile::size() const {
    struct stat status {};
    return fstat(m_descriptor, &status) == 0 ? static_cast<uint64_t>(status.st_size) : 0;
}

size_t RegularFile::read(void* buffer, size_t length, uint64_t offset) const {
    size_t count = 0;
    while (count < length) {
        const ssize_t result = pread(m_descriptor, static_cast<char*>(buffer) + count, length - count,
                                     static_cast<off_t>(offset + count));
        if (result < 0 && errno == EINTR) {
            continue;
        }
        if (result <= 0) {
            break;
        }
        count += static_cast<size_t>(result);
    }
    return count;
}

std::optional<std::string> contentsOf(const std::string& file, size_t maxSize, std::string& error) {
    const auto opened = RegularFile::open(file, error);
    if (!opened) {
        return std::nullopt;
    }
    if (opened->size() > maxSize) {
        error = "Larger than " + std::to_string(maxSize) + " bytes";
        return std::nullopt;
    }
    std::string contents(opened->size(), '\0');
    contents.resize(opened->read(contents.data(), contents.size(), 0));
    return contents;
}

} // namespace desktop
