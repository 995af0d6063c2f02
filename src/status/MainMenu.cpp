#include "status/MainMenu.h"

#include "hostname/HostnameEditMenu.h"
#include "netconfig/IfaceTypeMenu.h"
#include "runtime/LcdPanel.h"
#include "runtime/beginsWith.h"
#include "status/Interfaces.h"
#include "status/PageTexts.h"

#include <ace/OS_NS_sys_time.h>

#include <iterator>

namespace {

const std::string productPage = "product";
const std::string hostnamePage = "hostname";
const std::string connectionPage = "connection";

bool isBridge(const std::string &name) {
    return beginsWith(name, "bridge");
}
bool isEthernet(const std::string &name) {
    return beginsWith(name, "eth");
}

} // namespace

const ACE_Time_Value MainMenu::autoPageInterval(5);
const ACE_Time_Value MainMenu::manualPageInterval(60);
const ACE_Time_Value MainMenu::firstScrollDelay(2);
const ACE_Time_Value MainMenu::scrollStepInterval(0, 900000);

volatile std::sig_atomic_t MainMenu::refreshRequested = 0;
MainMenu *MainMenu::theInstance = nullptr;

MainMenu *MainMenu::instance() {
    if (theInstance == nullptr)
        theInstance = new MainMenu;
    return theInstance;
}

MainMenu::MainMenu() : platform(detectPlatform()) {
    rebuildPages();
}

void MainMenu::requestRefresh() {
    refreshRequested = 1;
}

void MainMenu::refresh() {
    lastPageChange = ACE_Time_Value();
    lastScroll = ACE_Time_Value();
    scrollInterval = firstScrollDelay;
    scrollSteps = 0;
    refreshRequested = 0; // before the rebuild: a request that comes during it is not lost
    rebuildPages();
}

void MainMenu::rebuildPages() {
    pages.assign({productPage, hostnamePage});
    if (isHardware(platform))
        pages.push_back(connectionPage);
    appendInterfacePages();
    currentPage = std::prev(pages.end()); // the next advance shows the first page
}

void MainMenu::appendInterfacePages() {
    for (const auto &name : listPagedInterfaces())
        pages.push_back(name);
}

std::string MainMenu::pageText(const std::string &name) const {
    if (name == productPage)
        return productText(platform);
    if (name == hostnamePage)
        return hostnameText();
    if (name == connectionPage)
        return connectionText();
    if (isBridge(name) || isEthernet(name))
        return interfaceText(name);
    return "undefined";
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
    if (now - lastPageChange > pageInterval) {
        scrollSteps = static_cast<std::uint32_t>(panel->showText(nextPage()));
        pageInterval = autoPageInterval;
        lastPageChange = now;
        lastScroll = now;
        scrollInterval = firstScrollDelay;
    } else if (now - lastScroll > scrollInterval && scrollSteps != 0) {
        panel->scrollMarqueeForward();
        if (scrollSteps >= 2) {
            --scrollSteps;
            lastPageChange = now;
        }
        lastScroll = now;
        scrollInterval = scrollStepInterval;
    }
}

void MainMenu::onUp(MenuContext *) {
    if (panel->isHeldShort(keyUp))
        return;
    showPageAskedFor(previousPage());
}

void MainMenu::onDown(MenuContext *) {
    if (panel->isHeldShort(keyDown))
        return;
    showPageAskedFor(nextPage());
}

// An operator who pages by hand gets a minute to read before the rotation goes on.
void MainMenu::showPageAskedFor(const std::string &text) {
    scrollSteps = static_cast<std::uint32_t>(panel->showText(text));
    pageInterval = manualPageInterval;
    lastPageChange = ACE_OS::gettimeofday();
    lastScroll = ACE_OS::gettimeofday();
    scrollInterval = firstScrollDelay;
}

void MainMenu::onEscape(MenuContext *) {
    pageInterval = autoPageInterval;
}

void MainMenu::onEnter(MenuContext *context) {
    if (panel->isHeldLong(keyEnter))
        return;
    const std::string name = *currentPage;
    if (name == hostnamePage) {
        enterSubmenu(context, HostnameEditMenu::instance());
    } else if (isEthernet(name)) {
        IfaceTypeMenu::instance()->selectInterface(name);
        enterSubmenu(context, IfaceTypeMenu::instance());
    }
}

// One page back, so that the operator's return advances to the page that was left and shows it
// afresh.
void MainMenu::enterSubmenu(MenuContext *context, Menu *menu) {
    lastPageChange = ACE_Time_Value();
    lastScroll = ACE_Time_Value();
    scrollInterval = firstScrollDelay;
    scrollSteps = 0;
    previousPage();
    setMenu(context, menu);
}
