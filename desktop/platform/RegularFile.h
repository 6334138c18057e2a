// A regular file, read with bounds.
#ifndef TELIX_DESKTOP_PLATFORM_REGULARFILE_H
#define TELIX_DESKTOP_PLATFORM_REGULARFILE_H

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>

namespace desktop {

// A file may shrink or change while it is open: read() then returns fewer or other bytes. A mapping of it
// would end the process with SIGBUS. Any thread.
class RegularFile {
public:
    // Null, with the reason in `error`, if the file cannot be opened or is not a regular file: a device or a
    // pipe could be read without end, or block. The reason does not name the file.
    static std::unique_ptr<RegularFile> open(const std::string& file, std::string& error);

    ~RegularFile();
    RegularFile(const RegularFile&) = delete;
    RegularFile& operator=(const RegularFile&) = delete;

    uint64_t size() const; // at the moment, in bytes

    // Reads up to `length` bytes from `offset` on. Returns how many were read: fewer at the end of the file
    // or after an error.
    size_t read(void* buffer, size_t length, uint64_t offset) const;

private:
    explicit RegularFile(int descriptor) : m_descriptor(descriptor) {}

    int m_descriptor;
};

// The contents of a regular file of at most `maxSize` bytes; nothing, with the reason in `error`, if it is
// larger or cannot be read. The reason does not name the file.
std::optional<std::string> contentsOf(const std::string& file, size_t maxSize, std::string& error);

} // namespace desktop

#endif
