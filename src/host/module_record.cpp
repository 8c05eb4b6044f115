#include "host/module_record.h"

#include "zelt/error.h"
#include "zelt/module_record.h"

#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <sys/stat.h>
#include <system_error>
#include <unistd.h>

namespace Qor::Luxar::ZELT {
namespace {

[[noreturn]] void cannot(const char* what, const std::string& name, int error)
{
    throw HResultException(REGDB_E_WRITEREGDB,
                           std::string(what) + ' ' + name + ": " + std::generic_category().message(error));
}

/// A file that is being written beside its final place; gone when it does not get there.
class unfinished_file {
public:
    explicit unfinished_file(const std::string& final_name) : name_(final_name + ".XXXXXX")
    {
        file_ = mkostemp(name_.data(), O_CLOEXEC);
        if (file_ < 0) cannot("cannot write", final_name, errno);
    }
    ~unfinished_file()
    {
        if (file_ >= 0) close(file_);
        if (!name_.empty()) unlink(name_.c_str());
    }
    unfinished_file(const unfinished_file&) = delete;
    unfinished_file& operator=(const unfinished_file&) = delete;

    void write(const std::string& content)
    {
        for (size_t done = 0; done < content.size();) {
            const ssize_t n = ::write(file_, content.data() + done, content.size() - done);
            if (n < 0 && errno == EINTR) continue;
            if (n < 0) cannot("cannot write", name_, errno);
            done += static_cast<size_t>(n);
        }
    }
    /// Everybody may read it. On disk before it gets its name: a crash leaves the old file or the new one.
    void become(const std::string& final_name)
    {
        if (fchmod(file_, 0644) != 0 || fsync(file_) != 0 || rename(name_.c_str(), final_name.c_str()) != 0)
            cannot("cannot write", final_name, errno);
        name_.clear();
    }

private:
    std::string name_;
    int file_;
};

} // namespace

std::string record_to_write()
{
    const bool for_machine = geteuid() == 0 && !secure_getenv("XDG_DATA_HOME");
    const std::string folder = for_machine ? std::string(zelt::machine_data) : zelt::user_data();
    if (folder.empty())
        throw HResultException(REGDB_E_WRITEREGDB, "neither XDG_DATA_HOME nor HOME names a folder");
    return folder + '/' + std::string(zelt::record_name);
}

void replace_file(const std::string& name, const std::string& content)
{
    std::error_code error;
    const std::filesystem::path folder = std::filesystem::path(name).parent_path();
    std::filesystem::create_directories(folder, error);
    if (error) cannot("cannot make", folder.string(), error.value());
    unfinished_file file(name);
    file.write(content);
    file.become(name);
}

void remove_file(const std::string& name)
{
    if (unlink(name.c_str()) != 0 && errno != ENOENT && errno != ENOTDIR)
        cannot("cannot remove", name, errno);
}

} // namespace Qor::Luxar::ZELT
