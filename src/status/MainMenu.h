#pragma once

#include "runtime/Menu.h"
#include "status/PlatformCode.h"

#include <ace/Time_Value.h>

#include <csignal>
#include <cstdint>
#include <list>
#include <string>

/// The status display that the panel shows when nobody works on it, and to which every other screen
/// returns: one page after the other, by itself or with Up and Down. Enter leads from the host
/// name's and the ports' pages into their settings.
class MainMenu : public Menu {
  public:
    static MainMenu *instance();

    /// Asks the next `display` to look for ports anew and to start again at the first page. Safe in
    /// a signal handler at any time, also before the main menu exists.
    static void requestRefresh();

    void display(MenuContext *context) override;
    void onUp(MenuContext *context) override;
    void onDown(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

  private:
    MainMenu();

    void refresh();
    void rebuildPages();
    void appendInterfacePages();
    std::string pageText(const std::string &name) const;
    std::string nextPage();
    std::string previousPage();
    void showPageAskedFor(const std::string &text);
    void enterSubmenu(MenuContext *context, Menu *menu);

    static const ACE_Time_Value autoPageInterval;
    static const ACE_Time_Value manualPageInterval;
    static const ACE_Time_Value firstScrollDelay;
    static const ACE_Time_Value scrollStepInterval;

    ACE_Time_Value pageInterval = autoPageInterval;
    ACE_Time_Value lastPageChange; ///< zero makes the next `display` advance
    ACE_Time_Value lastScroll;
    std::list<std::string> pages;
    std::list<std::string>::const_iterator currentPage; ///< always an element
    std::uint32_t scrollSteps = 0; ///< steps still to be made that keep the page on screen
    ACE_Time_Value scrollInterval = firstScrollDelay;
    static volatile std::sig_atomic_t refreshRequested;
    PlatformCode platform;

    static MainMenu *theInstance;
};
