#pragma once

#include "runtime/DrawnOnce.h"
#include "runtime/Menu.h"

#include <cstdint>
#include <string>

/// Changes the host name, one character under the blinking cursor at a time. Up and Down walk
/// through the alphabet; Enter goes on to the next position and, on a blank one or when held long,
/// finishes; Escape erases the character under the cursor and goes back, when held long erases all,
/// and at the first position leaves. Every visit starts from the name that the system has.
class HostnameEditMenu : public Menu {
  public:
    static HostnameEditMenu *instance() {
        static auto *const only = new HostnameEditMenu;
        return only;
    }

    void display(MenuContext *context) override;
    void onUp(MenuContext *context) override;
    void onDown(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

  private:
    HostnameEditMenu() = default;

    char &characterUnderCursor();
    void findCharacterUnderCursor();
    void putLetter(std::int32_t index);
    void eraseAll();
    void eraseAndStepBack();
    void stepOn();
    void finish(MenuContext *context);

    DrawnOnce drawn{this};
    std::int32_t charIndex = -1; ///< in the alphabet; -1 for a character that is not in it
    std::string hostname;        ///< 40 characters once drawn: the name, then blanks
    std::int32_t cursorPos = 0;  ///< 0 to 39
};
