#include "emulator/base/LateFile.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <system_error>

namespace emulator {

LateFile::LateFile(const std::string &itsPath)
    : std::ostream(nullptr), path(itsPath), buffer(itsPath) {
    const int created = open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
    if (created >= 0) {
        close(created);
        unlink(path.c_str());
    } else if (std::filesystem::is_directory(path)) {
        errno = EISDIR;
    } else if (errno == EEXIST && (access(path.c_str(), W_OK) == 0 || errno == ENOENT)) {
        errno = 0; // ENOENT for a link to a file that is not there yet
    }
    if (created < 0 && errno != 0)
        throw std::system_error(errno, std::generic_category(), "cannot write " + path);
    rdbuf(&buffer);
}

void LateFile::finish(const std::string &what) {
    flush();
    const bool isClosed = !buffer.is_open() || buffer.close() != nullptr;
    if (!good() || !isClosed)
        throw std::runtime_error("cannot write all of " + what);
}

} // namespace emulator
