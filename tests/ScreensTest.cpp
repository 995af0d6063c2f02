#include "RunningProgram.h"

#include "netconfig/RestartNetworkingMenu.h"
#include "runtime/MenuContext.h"

using emulator::Key;
using namespace std::chrono_literals;

FRESH_TEST(Screens, TheRestartIsWaitedForUntilAKeyComes) {
    const std::string check =
        "ps aux | egrep '/etc/init.d/networking|/opt/scripts/configureHostname.sh' | grep -v grep";
    standardAppliance();
    world().appliance.act({"prints", check, "root 1 /etc/init.d/networking restart\n"});
    auto *screen = RestartNetworkingMenu::instance();
    MenuContext context(screen);
    const auto checks = [&] {
        return std::count(world().events.begin(), world().events.end(), "run " + check);
    };
    context.display();
    EXPECT_EQ(world().shown(), "Restarting|Networking");
    EXPECT_EQ(world().pauses.back().what, "1000 ms");
    EXPECT_EQ(checks(), 1);
    world().now += 1s;
    context.display();
    EXPECT_EQ(checks(), 1);
    world().now += Micros(1);
    context.display();
    EXPECT_EQ(checks(), 2);
    world().appliance.act({"prints", check, ""});
    world().now += Micros(1'000'001);
    context.display();
    context.display();
    EXPECT_EQ(world().shown(), "Kestrova (TM)|cabinetDevice");
    world().appliance.act({"prints", check, "still running"});
    for (const auto key : {&MenuContext::onUp, &MenuContext::onDown, &MenuContext::onEscape,
                           &MenuContext::onEnter}) {
        context.setMenu(screen);
        context.display();
        EXPECT_EQ(world().shown(), "Restarting|Networking");
        (context.*key)();
        world().now += 100s;
        context.display();
        EXPECT_NE(world().shown(), "Restarting|Networking");
    }
}

FRESH_TEST(Screens, EnterOnAPortComputesThePageBeforeIt) {
    standardAppliance();
    RunningProgram program;
    while (!boost::starts_with(world().shown(), "E4 (eth4)"))
        program.press(Key::down);
    world().appliance.act({"file", "/etc/network/interfaces", ""});
    world().events.clear();
    program.poll(Key::enter);
    const std::string address = "run ifconfig eth0 | grep 'inet' | awk '{ print $2 }' | head -n1";
    EXPECT_EQ(world().events,
              (std::vector<std::string>{"open /etc/network/interfaces", "open /etc/resolv.conf",
                                        address, "run ifconfig | grep 'eth0'", "row", "row"}));
}
