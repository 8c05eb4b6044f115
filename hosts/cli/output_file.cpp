#include "output_file.h"

#include "failure.h"

#include <atomic>
#include <cerrno>
#include <climits>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <memory>
#include <sys/stat.h>
#include <unistd.h>

namespace cli {
namespace {

// What a signal handler may touch: fixed storage, and a flag that is set when a name is complete.
struct unfinished_name {
    std::atomic<int> state{0}; // 0 free, 1 being filled, 2 to be removed
    char path[PATH_MAX];
};
constexpr int most_names = 16;
unfinished_name unfinished[most_names];

extern "C" void remove_and_die(int signal_number)
{
    for (unfinished_name& name : unfinished)
        if (name.state.load() == 2) unlink(name.path);
    raise(signal_number); // the default action, since the handler was reset
}

int remember(const std::string& path)
{
    for (int i = 0; i < most_names; ++i) {
        int expected = 0;
        if (!unfinished[i].state.compare_exchange_strong(expected, 1)) continue;
        path.copy(unfinished[i].path, PATH_MAX - 1);
        unfinished[i].path[path.size()] = 0;
        unfinished[i].state = 2;
        return i;
    }
    throw failure("too many output files at once");
}

std::string folder_of(const std::string& path)
{
    const size_t slash = path.rfind('/');
    return slash == std::string::npos ? "." : slash == 0 ? "/" : path.substr(0, slash);
}

} // namespace

void remove_unfinished_output_on_signals()
{
    struct sigaction action = {};
    action.sa_handler = remove_and_die;
    // Raised anew inside the handler, so it must not stay blocked there.
    action.sa_flags = static_cast<int>(SA_RESETHAND | SA_NODEFER);
    for (int number : {SIGINT, SIGTERM, SIGHUP}) {
        struct sigaction before = {};
        // A caller that ignores a signal (nohup) means it for this process as well.
        if (sigaction(number, nullptr, &before) == 0 && before.sa_handler == SIG_IGN) continue;
        sigaction(number, &action, nullptr);
    }
    std::signal(SIGXFSZ, SIG_IGN); // a write beyond the size limit fails like one to a full disk
}

output_file::output_file(const std::string& path) : path_(path)
{
    struct stat existing = {};
    if (stat(path.c_str(), &existing) == 0) {
        if (!S_ISREG(existing.st_mode)) throw failure(path + ": is not a regular file");
        const std::unique_ptr<char, decltype(&std::free)> target(realpath(path.c_str(), nullptr), &std::free);
        if (target) path_ = target.get();
    }
    static std::atomic<int> number{0};
    const std::string folder = folder_of(path_);
    do {
        temporary_ = folder + "/.zelt-" + std::to_string(getpid()) + "-" + std::to_string(number++) + ".tmp";
        if (temporary_.size() >= PATH_MAX) throw failure(path + ": " + std::strerror(ENAMETOOLONG));
    } while (access(temporary_.c_str(), F_OK) == 0);
    if (access(folder.c_str(), W_OK) != 0) fail();
    slot_ = remember(temporary_);
}

output_file::~output_file()
{
    if (file_ >= 0) close(file_);
    if (slot_ < 0) return;
    unlink(temporary_.c_str());
    unfinished[slot_].state = 0;
}

void output_file::fail() const { throw failure(path_ + ": " + std::strerror(errno)); }

void output_file::open(int flags)
{
    if (file_ < 0) file_ = ::open(temporary_.c_str(), O_WRONLY | O_CLOEXEC | O_NOFOLLOW | flags, 0666);
    if (file_ < 0) fail();
}

void output_file::write_at(uint64_t offset, const void* data, size_t size)
{
    open(O_CREAT | O_EXCL);
    const auto* bytes = static_cast<const char*>(data);
    while (size > 0) {
        const ssize_t written = pwrite(file_, bytes, size, static_cast<off_t>(offset));
        if (written < 0 && errno == EINTR) continue;
        if (written < 0) fail();
        bytes += written;
        offset += static_cast<uint64_t>(written);
        size -= static_cast<size_t>(written);
    }
    if (offset > size_) size_ = offset;
}

void output_file::write(const void* data, size_t size) { write_at(size_, data, size); }

void output_file::commit()
{
    open(0);
    struct stat existing = {};
    if (stat(path_.c_str(), &existing) == 0 && fchmod(file_, existing.st_mode & 0777) != 0) fail();
    if (fsync(file_) != 0) fail();
    const int closed = close(file_);
    file_ = -1;
    if (closed != 0 || rename(temporary_.c_str(), path_.c_str()) != 0) fail();
    unfinished[slot_].state = 0;
    slot_ = -1;
    // The new name is on the disk too; a file system that cannot sync folders is no reason to fail.
    if (const int folder = ::open(folder_of(path_).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
        folder >= 0) {
        fsync(folder);
        close(folder);
    }
}

} // namespace cli
