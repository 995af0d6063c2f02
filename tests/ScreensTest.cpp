#include "Operator.h"

#include "editors/IfaceStaticEditIPMenu.h"
#include "netconfig/RestartNetworkingMenu.h"
#include "runtime/MenuContext.h"

TEST(Screens, TheRestartIsWaitedForUntilItsProcessesAreGoneOrAKeyComes) {
    const std::string check =
        "ps aux | egrep '/etc/init.d/networking|/opt/scripts/configureHostname.sh' | grep -v grep";
    standardAppliance(world());
    world().outputs[check] = "root 1 /etc/init.d/networking restart\n";
    auto *screen = RestartNetworkingMenu::instance();
    MenuContext context(screen);
    const auto checks = [&] { return world().commands("run " + check).size(); };
    context.display();
    EXPECT_EQ(Operator::sees(), "Restarting|Networking");
    EXPECT_EQ(world().pauses, std::vector<std::string>{"1 s Restarting|Networking"});
    EXPECT_EQ(checks(), 1U);
    world().microseconds += 1'000'000;
    context.display();
    EXPECT_EQ(checks(), 1U);
    world().microseconds += 1;
    context.display();
    EXPECT_EQ(checks(), 2U);
    world().clockWorks = false;
    context.display();
    world().clockWorks = true;
    EXPECT_EQ(checks(), 2U);
    world().outputs[check] = "";
    world().microseconds += 1'000'001;
    context.display();
    context.display();
    EXPECT_EQ(Operator::sees(), "Kestrova (TM)|cabinetDevice");
    world().outputs[check] = "still running";
    for (const auto key : {&MenuContext::onUp, &MenuContext::onDown, &MenuContext::onEscape,
                           &MenuContext::onEnter}) {
        context.setMenu(screen);
        context.display();
        EXPECT_EQ(Operator::sees(), "Restarting|Networking");
        (context.*key)();
        world().microseconds += 100'000'000;
        context.display();
        EXPECT_NE(Operator::sees(), "Restarting|Networking");
    }
}

TEST(Screens, AnEditorWithoutSettingsDrawsAndStoresNothing) {
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

TEST(Screens, EnterOnAPortComputesThePageBeforeItAndReadsBothFiles) {
    standardAppliance(world());
    Operator person;
    person.waitForPage("Connected to:");
    person.press(keyDown);
    world().files["/etc/network/interfaces"] = "";
    world().events.clear();
    person.poll(keyEnter);
    EXPECT_EQ(world().commands("open"),
              (std::vector<std::string>{"/etc/network/interfaces", "/etc/resolv.conf",
                                        "/opt/kestrova/seq.site_conn",
                                        "/opt/kestrova/config/nis.config"}));
}
