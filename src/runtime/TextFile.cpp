#include "runtime/TextFile.h"

TextFile::TextFile(const char *path) : file(fopen(path, "r")) {}

std::optional<std::string> TextFile::nextLine() {
    if (!isOpen())
        return std::nullopt;

    std::string line;
    int byte = getc(file.get());
    for (; byte != EOF && byte != '\n'; byte = getc(file.get()))
        line += static_cast<char>(byte);

    const bool isAtEnd = byte == EOF && line.empty();
    return isAtEnd || ferror(file.get()) != 0 ? std::nullopt : std::optional(line);
}
