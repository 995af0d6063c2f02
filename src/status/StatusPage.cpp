#include "status/StatusPage.h"

#include "hostname/HostnameEditMenu.h"
#include "netconfig/IfaceTypeMenu.h"
#include "runtime/beginsWith.h"
#include "status/PageTexts.h"

#include <array>

namespace {

std::string product(const std::string &, PlatformCode platform) {
    return productText(platform);
}
std::string hostname(const std::string &, PlatformCode) {
    return hostnameText();
}
std::string connection(const std::string &, PlatformCode) {
    return connectionText();
}
std::string port(const std::string &name, PlatformCode) {
    return interfaceText(name);
}

constexpr StatusPage::Settings nothing = nullptr;

Menu *hostnameEditor(const std::string &) {
    return HostnameEditMenu::instance();
}
Menu *portSettings(const std::string &name) {
    IfaceTypeMenu::instance()->selectInterface(name);
    return IfaceTypeMenu::instance();
}

using Names = StatusPage::Names;
constexpr std::array table = {
    StatusPage{Names::one, "product", product, nothing},
    StatusPage{Names::one, "hostname", hostname, hostnameEditor},
    StatusPage{Names::oneOnHardware, "connection", connection, nothing},
    StatusPage{Names::ports, "bridge", port, nothing}, // is not configured from the panel
    StatusPage{Names::ports, "eth", port, portSettings},
};

bool isOf(const StatusPage &page, const std::string &name) {
    return page.names == Names::ports ? beginsWith(name, page.name) : name == page.name;
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

const StatusPage *findStatusPage(const std::string &name) {
    for (const auto &page : table) {
        if (isOf(page, name))
            return &page;
    }
    return nullptr;
}
