#pragma once

#include "emulator/base/FileDescriptor.h"

#include <cstdio>
#include <memory>
#include <string>
#include <termios.h>

struct screen; // of ncurses

namespace emulator {

/// The terminal as a screen to draw on, with the functions of ncurses, for which there is one at a
/// time.
///
/// ncurses would wait for a terminal that takes nothing, because nobody reads it. It therefore
/// writes into memory, and what it has written goes from there to the terminal as far as that takes
/// it.
class TerminalScreen {
  public:
    /// Takes over the terminal of standard input and output, which reports pasted texts as such
    /// and, if `hasMouse`, the mouse. Throws std::runtime_error if it cannot be opened, or ncurses
    /// cannot draw on it.
    explicit TerminalScreen(bool hasMouse);
    TerminalScreen(const TerminalScreen &) = delete;
    TerminalScreen &operator=(const TerminalScreen &) = delete;
    /// Gives the terminal back. What it has not taken by then is lost.
    ~TerminalScreen();

    /// True when the terminal has taken everything, so that the next frame can be drawn.
    [[nodiscard]] bool isReady();
    /// Sends what has been drawn.
    void refresh();
    /// Takes over the terminal's present size, or as much of it as the panel has a use for.
    void resize();
    /// Gives the terminal back for a while, and takes it over again. What it has not taken yet of
    /// what was drawn is lost.
    void leave();
    void enter();

  private:
    struct CloseFile {
        void operator()(std::FILE *file) const { std::fclose(file); }
    };

    void push();
    void collect();
    void setInput();
    void setModes();

    bool hasMouse;
    FileDescriptor terminal; // opened anew, because the shell must not get one that does not block
    termios formerSettings{};
    std::unique_ptr<std::FILE, CloseFile> written; // what ncurses has written
    screen *drawing = nullptr;
    std::string pending; // for the terminal
};

} // namespace emulator
