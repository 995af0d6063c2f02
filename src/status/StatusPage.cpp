#include "status/StatusPage.h"

#include "hostname/HostnameEditMenu.h"
#include "netconfig/IfaceTypeMenu.h"
#include "runtime/beginsWith.h"
#include "status/PageTexts.h"

#include <algorithm>
#include <iterator>

namespace {

// Enter opens nothing. Bridges, too, cannot be configured from the panel.
constexpr StatusPage::Settings nothing = nullptr;

Menu *hostnameEditor(const std::string &) {
    return HostnameEditMenu::instance();
}
Menu *portSettings(const std::string &name) {
    IfaceTypeMenu::instance()->selectInterface(name);
    return IfaceTypeMenu::instance();
}

using Names = StatusPage::Names;
using Name = const std::string &;
constexpr StatusPage table[] = {
    {Names::one, "product", [](Name, PlatformCode model) { return productText(model); }, nothing},
    {Names::one, "hostname", [](Name, PlatformCode) { return hostnameText(); }, hostnameEditor},
    {Names::oneOnHardware, "connection", [](Name, PlatformCode) { return connectionText(); },
     nothing},
    {Names::beginningSo, "bridge", [](Name port, PlatformCode) { return interfaceText(port); },
     nothing},
    {Names::beginningSo, "eth", [](Name port, PlatformCode) { return interfaceText(port); },
     portSettings},
    {Names::beginningSo, "", [](Name, PlatformCode) { return std::string("undefined"); }, nothing},
};

bool isOf(const StatusPage &page, const std::string &name) {
    return page.names == Names::beginningSo ? beginsWith(name, page.name) : name == page.name;
}

bool isFixed(const StatusPage &page, PlatformCode platform) {
    return page.names == Names::one || (page.names == Names::oneOnHardware && isHardware(platform));
}

} // namespace

std::list<std::string> fixedPages(PlatformCode platform) {
    std::list<std::string> names;
    for (const auto &page : table) {
        if (isFixed(page, platform))
            names.emplace_back(page.name);
    }
    return names;
}

const StatusPage &statusPageOf(const std::string &name) {
    return *std::find_if(std::begin(table), std::end(table),
                         [&](const StatusPage &page) { return isOf(page, name); });
}
