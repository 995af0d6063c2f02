#include "Operator.h"

#include "editors/IfaceStaticEditIPMenu.h"
#include "netconfig/RestartNetworkingMenu.h"
#include "runtime/MenuContext.h"

using emulator::Key;
using namespace std::chrono_literals;

FRESH_TEST(Screens, TheRestartIsWaitedForUntilAKeyComes) {
    const std::string check =
        "ps aux | egrep '/etc/init.d/networking|/opt/scripts/configureHostname.sh' | grep -v grep";
    standardAppliance();
    world().appliance.prints[check] = "root 1 /etc/init.d/networking restart\n";
    auto *screen = RestartNetworkingMenu::instance();
    MenuContext context(screen);
    const auto checks = [&] { return world().commands("run " + check).size(); };
    context.display();
    EXPECT_EQ(Operator::sees(), "Restarting|Networking");
    EXPECT_EQ(world().pauses.back().what, "1000 ms");
    EXPECT_EQ(checks(), 1U);
    world().now += 1s;
    context.display();
    EXPECT_EQ(checks(), 1U);
    world().now += Micros(1);
    context.display();
    EXPECT_EQ(checks(), 2U);
    world().clockWorks = false;
    context.display();
    world().clockWorks = true;
    EXPECT_EQ(checks(), 2U);
    world().appliance.prints[check] = "";
    world().now += Micros(1'000'001);
    context.display();
    context.display();
    EXPECT_EQ(Operator::sees(), "Kestrova (TM)|cabinetDevice");
    world().appliance.prints[check] = "still running";
    for (const auto key : {&MenuContext::onUp, &MenuContext::onDown, &MenuContext::onEscape,
                           &MenuContext::onEnter}) {
        context.setMenu(screen);
        context.display();
        EXPECT_EQ(Operator::sees(), "Restarting|Networking");
        (context.*key)();
        world().now += 100s;
        context.display();
        EXPECT_NE(Operator::sees(), "Restarting|Networking");
    }
}

FRESH_TEST(Screens, AnEditorWithoutSettingsDoesNothing) {
    auto *screen = IfaceStaticEditIPMenu::instance();
    MenuContext context(screen);
    world().sent.clear();
    context.display();
    EXPECT_EQ(world().sent, "");
    for (int octet = 0; octet < 4; ++octet)
        context.onEnter();
    context.display();
    EXPECT_EQ(Operator::sees(), "> Set IP Addr|  Set Netmask  v");
}

FRESH_TEST(Screens, EnterOnAPortComputesThePageBeforeIt) {
    standardAppliance();
    Operator person;
    person.press(Key::down, 4); // to the first port
    world().appliance.files["/etc/network/interfaces"] = "";
    world().events.clear();
    person.poll(Key::enter);
    EXPECT_EQ(world().commands("open"),
              (std::vector<std::string>{"/etc/network/interfaces", "/etc/resolv.conf",
                                        "/opt/kestrova/seq.site_conn",
                                        "/opt/kestrova/config/nis.config"}));
}

FRESH_TEST(Screens, TheAlphabetGoesRoundBothWays) {
    const std::string alphabet = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789-";
    standardAppliance();
    world().appliance.settings["hostname"] = "a";
    Operator person;
    person.press(Key::down, 2);
    person.press(Key::enter);
    for (std::size_t k = 1; k <= alphabet.length(); ++k) {
        person.press(Key::down);
        EXPECT_EQ(world().display.visibleRow(1)[0], alphabet[k % alphabet.length()]);
    }
    for (std::size_t k = alphabet.length(); k-- > 0;) {
        person.press(Key::up);
        EXPECT_EQ(world().display.visibleRow(1)[0], alphabet[k]);
    }
}
