// A file that appears whole or not at all.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace cli {

/// Collects output in a temporary file beside the wanted one and gives it its name at the end. Without commit(),
/// at a thrown exception and at SIGINT, SIGTERM or SIGHUP, nothing is left behind and an older file stays.
class output_file {
public:
    /// Refuses a name that exists and is no regular file; a symbolic link is followed. Creates nothing yet.
    explicit output_file(const std::string& path);
    ~output_file();
    output_file(const output_file&) = delete;
    output_file& operator=(const output_file&) = delete;

    /// Where to write. write() creates it; a writer that opens files itself finds the name free.
    const std::string& temporary() const noexcept { return temporary_; }
    void write(const void* data, size_t size);
    void write_at(uint64_t offset, const void* data, size_t size);
    uint64_t size() const noexcept { return size_; }

    /// Onto the disk, then into place.
    void commit();

private:
    void open(int flags);
    [[noreturn]] void fail() const;

    std::string path_;
    std::string temporary_;
    int slot_ = -1;
    int file_ = -1;
    uint64_t size_ = 0;
};

/// Removes unfinished output when one of the signals ends the process. Call once, before the first output_file.
void remove_unfinished_output_on_signals();

} // namespace cli
