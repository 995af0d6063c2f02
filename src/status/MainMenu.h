#pragma once

#include "runtime/Menu.h"
#include "status/PlatformCode.h"
#include "status/RotationTimer.h"

#include <csignal>
#include <list>
#include <string>

/// The status display that the panel shows when nobody works on it, and to which every other screen
/// returns: one page after the other, by itself or with Up and Down. Enter leads from the host
/// name's and the ports' pages into their settings. The table in `StatusPage` says which pages
/// there are, what they show, and what Enter opens on them.
class MainMenu : public Menu {
  public:
    static MainMenu *instance() {
        static auto *const only = new MainMenu;
        return only;
    }

    /// Asks the next `display` to look for ports anew and to start again at the first page. Safe in
    /// a signal handler at any time, also before the main menu exists.
    static void requestRefresh();
    void refresh();

    void display(MenuContext *context) override;
    void onUp(MenuContext *context) override;
    void onDown(MenuContext *context) override;
    void onEscape(MenuContext *context) override;
    void onEnter(MenuContext *context) override;

    /// Lists the pages again. The last page becomes the current one, so that the first is shown
    /// next.
    void rebuildPages();
    /// Adds the pages of the network ports that have one.
    void appendInterfacePages();
    /// The two lines of the page of this name, computed afresh.
    [[nodiscard]] std::string pageText(const std::string &name) const;
    /// Move on by one page, round and round, and return its text.
    std::string nextPage();
    std::string previousPage();
    /// Leaves the status display for `menu` so that the page that is left is drawn on return.
    void enterSubmenu(MenuContext *context, Menu *menu);

  private:
    MainMenu();

    void showPageAskedFor(const std::string &text);

    RotationTimer rotation;
    std::list<std::string> pages;                       ///< their names
    std::list<std::string>::const_iterator currentPage; ///< always an element
    static volatile std::sig_atomic_t refreshRequested;
    PlatformCode platform;
};
