#pragma once

#include <fstream>
#include <ostream>
#include <string>

namespace emulator {

/// A file to be written, which keeps what it contains until the first byte is written to it. What
/// ends before then, such as a command that cannot be run, costs nobody an older recording.
class LateFile : public std::ostream {
  public:
    /// Throws std::runtime_error if nothing can be written to the file. Creates none. What is no
    /// ordinary file is opened at once.
    explicit LateFile(const std::string &path);

    /// To be called at the end. Throws std::runtime_error when not all could be written of
    /// `what` the file is.
    void finish(const std::string &what);

  private:
    class Buffer : public std::filebuf {
      public:
        explicit Buffer(std::string itsPath) : path(std::move(itsPath)) {}
        void openOnce() {
            if (!is_open())
                open(path, std::ios::out);
        }

      protected:
        int_type overflow(int_type character) override {
            openOnce();
            return std::filebuf::overflow(character);
        }
        std::streamsize xsputn(const char *text, std::streamsize length) override {
            openOnce();
            return std::filebuf::xsputn(text, length);
        }

      private:
        std::string path;
    };

    Buffer buffer;
};

} // namespace emulator
