#pragma once

#include <unistd.h>

#include <utility>

namespace emulator {

/// Owns a file descriptor and closes it.
class FileDescriptor {
  public:
    FileDescriptor() = default;
    explicit FileDescriptor(int fd) : descriptor(fd) {}
    FileDescriptor(FileDescriptor &&other) noexcept
        : descriptor(std::exchange(other.descriptor, -1)) {}
    FileDescriptor &operator=(FileDescriptor &&other) noexcept {
        std::swap(descriptor, other.descriptor);
        return *this;
    }
    FileDescriptor(const FileDescriptor &) = delete;
    FileDescriptor &operator=(const FileDescriptor &) = delete;
    ~FileDescriptor() { reset(); }

    /// The descriptor, or -1 (which poll passes over).
    [[nodiscard]] int get() const { return descriptor; }
    void reset() {
        if (descriptor >= 0)
            close(std::exchange(descriptor, -1));
    }

  private:
    int descriptor = -1;
};

} // namespace emulator
