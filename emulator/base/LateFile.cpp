#include "emulator/base/LateFile.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <system_error>

namespace emulator {

LateFile::LateFile(const std::string &path) : std::ostream(nullptr), buffer(path) {
    const int created = open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
    int error = created < 0 && errno != EEXIST ? errno : 0;
    std::error_code ignored;
    if (created >= 0) {
        close(created);
        unlink(path.c_str());
    } else if (error == 0 && std::filesystem::is_directory(path, ignored)) {
        error = EISDIR;
    } else if (error == 0 && access(path.c_str(), W_OK) != 0 && errno != ENOENT) {
        error = errno; // but ENOENT, for a link to a file that is not there yet
    }
    if (error != 0)
        throw std::system_error(error, std::generic_category(), "cannot write " + path);
    // To open a pipe may take until somebody reads it, and there is nothing in it to be kept.
    if (std::filesystem::is_other(path, ignored))
        buffer.openOnce();
    rdbuf(&buffer);
}

void LateFile::finish(const std::string &what) {
    flush();
    const bool isClosed = !buffer.is_open() || buffer.close() != nullptr;
    if (!good() || !isClosed)
        throw std::runtime_error("cannot write all of " + what);
}

} // namespace emulator
