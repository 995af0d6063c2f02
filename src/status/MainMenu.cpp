#include "status/MainMenu.h"

#include "runtime/KeyFilters.h"
#include "runtime/LcdPanel.h"
#include "status/NetworkPorts.h"
#include "status/StatusPage.h"

#include <ace/OS_NS_sys_time.h>

#include <iterator>

volatile std::sig_atomic_t MainMenu::refreshRequested = 0;

MainMenu::MainMenu() : platform(detectPlatform()) {
    rebuildPages();
}

void MainMenu::requestRefresh() {
    refreshRequested = 1;
}

void MainMenu::refresh() {
    rotation.startAgain();
    refreshRequested = 0; // before the rebuild, so that a request that comes during it is not lost
    rebuildPages();
}

void MainMenu::rebuildPages() {
    pages = fixedPages(platform);
    appendInterfacePages();
    currentPage = std::prev(pages.end());
}

void MainMenu::appendInterfacePages() {
    for (const auto &name : listPortsWithPage())
        pages.push_back(name);
}

std::string MainMenu::pageText(const std::string &name) const {
    return statusPageOf(name).text(name, platform);
}

std::string MainMenu::nextPage() {
    if (++currentPage == pages.end())
        currentPage = pages.begin();
    return pageText(*currentPage);
}

std::string MainMenu::previousPage() {
    if (currentPage == pages.begin())
        currentPage = pages.end();
    return pageText(*--currentPage);
}

void MainMenu::display(MenuContext *) {
    if (refreshRequested != 0)
        refresh();

    const ACE_Time_Value now = ACE_OS::gettimeofday();
    if (rotation.isPageDue(now)) {
        rotation.pageTurned(panel->showText(nextPage()), now);
    } else if (rotation.isScrollDue(now)) {
        panel->scrollMarqueeForward();
        rotation.scrolled(now);
    }
}

void MainMenu::onUp(MenuContext *) {
    if (actsRestsAndRepeats(panel, keyUp))
        showPageAskedFor(previousPage());
}

void MainMenu::onDown(MenuContext *) {
    if (actsRestsAndRepeats(panel, keyDown))
        showPageAskedFor(nextPage());
}

void MainMenu::showPageAskedFor(const std::string &text) {
    rotation.pageChosen(panel->showText(text));
}

// No hold filter is needed: doing this again changes nothing.
void MainMenu::onEscape(MenuContext *) {
    rotation.resume();
}

// The filter stops only long holds, so each of the first five polls of a hold opens the page. A
// press that begins here opens it on its first poll. An Enter that is still down after an apply
// opens the port again on its second poll. A key that is held for longer opens nothing more.
void MainMenu::onEnter(MenuContext *context) {
    if (panel->isHeldLong(keyEnter))
        return;
    const std::string name = *currentPage;
    const StatusPage &page = statusPageOf(name);
    if (page.settings != nullptr)
        enterSubmenu(context, page.settings(name));
}

// Goes back by one page, so that the operator's return advances to the page that was left, and
// shows it afresh. Stepping always computes a text, so that of the page before is computed and
// thrown away; its commands delay the operator only for a moment after the key.
void MainMenu::enterSubmenu(MenuContext *context, Menu *menu) {
    rotation.startAgain();
    previousPage();
    setMenu(context, menu);
}
