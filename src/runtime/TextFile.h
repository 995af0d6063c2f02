#pragma once

#include <cstdio>
#include <memory>
#include <optional>
#include <string>

/// A file of the appliance, open for reading line by line from construction to destruction. The
/// program reads all its files through this class.
class TextFile {
  public:
    explicit TextFile(const char *path);

    /// False if the file is missing or may not be read. A directory can be opened, but has no
    /// lines.
    [[nodiscard]] bool isOpen() const { return file != nullptr; }

    /// Reads the next line and returns it without its line feed, which the last line need not have.
    /// A line may have any length and contain any other bytes. Returns nothing at the end of the
    /// file, or once reading has failed; a line that a failure cuts short is dropped.
    [[nodiscard]] std::optional<std::string> nextLine();

  private:
    struct Close {
        void operator()(FILE *open) const { fclose(open); }
    };
    std::unique_ptr<FILE, Close> file;
};
