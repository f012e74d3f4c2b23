#include "fn/whole_file.h"

#include "fn/exception.h"

#include <cerrno>
#include <filesystem>
#include <fstream>
#include <random>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace Fn {

namespace {

namespace fs = std::filesystem;

[[noreturn]] void refuse(const std::string& fileName, int error) {
    const std::string reason = error ? ": " + std::generic_category().message(error) : std::string();
    FN_THROW(FNEIOError, fileName + ": cannot be written" + reason);
}

/// An empty file of a new name in a folder, gone again unless it is given another name.
class UnfinishedFile {
public:
    /// @param permissions of the file that it will replace, 0 if there is none
    UnfinishedFile(const fs::path& folder, mode_t permissions, const std::string& fileName) {
        constexpr int mostAttempts = 100;
        std::random_device random;
        int descriptor = -1;
        for (int attempt = 0; descriptor < 0 && attempt < mostAttempts; ++attempt) {
            path_ = folder / (".orbek-" + std::to_string(random()) + ".part");
            descriptor = ::open(path_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
            if (descriptor < 0 && errno != EEXIST) break;
        }
        if (descriptor < 0) refuse(fileName, errno);
        if (permissions != 0) (void)!::fchmod(descriptor, permissions); // the content counts for more
        ::close(descriptor);
    }
    ~UnfinishedFile() {
        if (!path_.empty()) ::unlink(path_.c_str());
    }
    UnfinishedFile(const UnfinishedFile&) = delete;
    UnfinishedFile& operator=(const UnfinishedFile&) = delete;

    const fs::path& path() const { return path_; }
    /// @return whether it has that name now; errno tells why not
    bool rename(const fs::path& to) {
        if (::rename(path_.c_str(), to.c_str()) != 0) return false;
        path_.clear();
        return true;
    }

private:
    fs::path path_;
};

/// Opens, lets `write` fill the file and closes it.
void fill(const fs::path& path, const std::string& fileName,
          const std::function<void(std::ostream&)>& write) {
    errno = 0; // a stream does not tell why it failed
    std::ofstream stream(path, std::ios::binary);
    if (!stream) refuse(fileName, errno);
    try {
        write(stream);
    } catch (...) {
        if (!stream) refuse(fileName, errno);
        throw;
    }
    stream.close();
    if (!stream) refuse(fileName, errno);
}

} // namespace

void writeWholeFile(const std::string& fileName, const std::function<void(std::ostream&)>& write) {
    fs::path target = fileName;
    struct stat present {};
    mode_t permissions = 0;
    if (::stat(fileName.c_str(), &present) == 0) {
        if (!S_ISREG(present.st_mode)) return fill(target, fileName, write);
        if (::access(fileName.c_str(), W_OK) != 0) refuse(fileName, errno);
        permissions = present.st_mode & 0777;
    } else if (errno == ELOOP) {
        refuse(fileName, errno);
    }
    std::error_code noLink;
    for (fs::path next; next = fs::read_symlink(target, noLink), !noLink;)
        target = target.parent_path() / next;
    UnfinishedFile unfinished(target.has_parent_path() ? target.parent_path() : ".", permissions, fileName);
    fill(unfinished.path(), fileName, write);
    if (!unfinished.rename(target)) refuse(fileName, errno);
}

} // namespace Fn
