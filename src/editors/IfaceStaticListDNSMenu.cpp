#include "editors/IfaceStaticListDNSMenu.h"

#include "editors/DottedQuad.h"
#include "editors/IfaceStaticDNSActionMenu.h"
#include "netconfig/IfaceStaticMenu.h"
#include "netconfig/NetworkConfig.h"
#include "runtime/KeyFilters.h"
#include "runtime/LcdPanel.h"

#include <algorithm>

namespace {

std::string padded(std::string server) {
    Octets octets{};
    parseDottedQuad(server, octets);
    return formatDottedQuad(octets, true);
}

} // namespace

void IfaceStaticListDNSMenu::readServers() {
    serverCount = config->getDnsCount();
    for (std::int32_t k = 0; k < storedCount(); ++k)
        servers[static_cast<std::size_t>(k)] = config->getDns(static_cast<std::uint32_t>(k));
}

std::int32_t IfaceStaticListDNSMenu::storedCount() const {
    return std::min(serverCount, static_cast<std::int32_t>(servers.size()));
}

std::string IfaceStaticListDNSMenu::renderList() const {
    if (serverCount == 0)
        return "No DNS Svr found";

    std::string text;
    for (int row = 0; row < LcdPanel::rows && window.entryOn(row) < storedCount(); ++row) {
        const auto &server = servers.at(static_cast<std::size_t>(window.entryOn(row)));
        text += (row > 0 ? "\n" : "") + (window.marker(row) + padded(server));
    }
    return text;
}

void IfaceStaticListDNSMenu::display(MenuContext *) {
    if (!drawn.claimDrawing() || config == nullptr)
        return;
    readServers();
    // A server that has been deleted may leave the selection past the end. Whoever comes back to
    // the last server also starts again at the first: operators know the list that way, so it
    // stays.
    if (window.selected() >= serverCount - 1)
        window.selectFirst();
    panel->showText(renderList());
}

void IfaceStaticListDNSMenu::onUp(MenuContext *) {
    if (actsRestsAndRepeats(panel, keyUp) && window.up())
        panel->showText(renderList());
}

void IfaceStaticListDNSMenu::onDown(MenuContext *) {
    if (actsRestsAndRepeats(panel, keyDown) && window.down(storedCount()))
        panel->showText(renderList());
}

void IfaceStaticListDNSMenu::onEscape(MenuContext *context) {
    if (!actsOncePerPress(panel, keyEscape))
        return;
    window.selectFirst();
    drawn.leaveFor(context, IfaceStaticMenu::instance());
}

void IfaceStaticListDNSMenu::onEnter(MenuContext *context) {
    if (!actsOncePerPress(panel, keyEnter) || serverCount < 1)
        return;
    auto *actions = IfaceStaticDNSActionMenu::instance();
    actions->setConfig(config);
    actions->setServerIndex(window.selected());
    drawn.leaveFor(context, actions);
}
