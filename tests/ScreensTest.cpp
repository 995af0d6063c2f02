#include "Operator.h"

#include "netconfig/RestartNetworkingMenu.h"
#include "runtime/MenuContext.h"

namespace {

const std::string port = "E0 (eth0)|10.1.1.5";
const std::string choiceDhcp = "> DHCP|  Static", choiceStatic = "  DHCP|> Static";
const std::string firstItems = "> Set IP Addr|  Set Netmask  v";
const std::string confirm = "ESC   - Cancel|ENTER - Apply";

std::string serverLines(int count) {
    std::string lines;
    for (int k = 1; k <= count; ++k)
        lines += "nameserver 8.8.8." + std::to_string(k) + "\n";
    return lines;
}

// Starts on the page of a port with static settings, or with other lines in its stanza.
Operator atThePort(const std::string &stanza = "static\naddress 10.1.1.5\nnetmask 255.255.255.0\n",
                   int servers = 0) {
    standardAppliance(world());
    world().files["/etc/network/interfaces"] = "iface eth0 inet " + stanza;
    world().files["/etc/resolv.conf"] = serverLines(servers);
    Operator person;
    person.waitForPage("E0 (eth0)");
    return person;
}

std::vector<std::string> applied() {
    return world().commands("run " + applyScript);
}

std::string applyLine(const std::string &options) {
    return applyScript + "iface --name eth0" + options + ";echo $?";
}

} // namespace

TEST(Screens, TheChoiceIsTheModelUntilThePortIsEnteredAgain) {
    Operator person = atThePort();
    walk(person, {{"e", choiceStatic},
                  {"d", choiceStatic},
                  {"u", choiceDhcp},
                  {"u", choiceDhcp},
                  {"e", confirm},
                  {"ud", confirm},
                  {"x", choiceDhcp},
                  {"d", choiceStatic},
                  {"e", firstItems},
                  {"x", choiceStatic},
                  {"u", choiceDhcp},
                  {"x", port},
                  {"e", choiceStatic}});
    world().sent.clear();
    person.press(keyUp); // both markers, row 0 first
    EXPECT_NE(world().sent.find("\xFE\x80>\xFE\x10\xFE\x41\xFE\x10 \xFE\x10"), std::string::npos);
    EXPECT_TRUE(applied().empty());
}

TEST(Screens, TheItemsScrollUnderTheMarkerAndStayWhereTheyWere) {
    Operator person = atThePort();
    walk(person, {{"e", choiceStatic},
                  {"e", firstItems},
                  {"u", firstItems},
                  {"d", "  Set IP Addr|> Set Netmask  v"},
                  {"d", "  Set Netmask  ^|> Set Gateway  v"},
                  {"e", "Enter Gateway:|  0.  0.  0.  0", "1,2"},
                  {"x", "  Set Netmask  ^|> Set Gateway  v"},
                  {"d5", "  Set Gateway  ^|> Add DNS Svr  v"}, // polls 2 to 5 rest
                  {"d7", "  Lst DNS Svrs ^|> Apply Changes"},  // and the sixth and seventh act
                  {"d", "  Lst DNS Svrs ^|> Apply Changes"},
                  {"u", "> Lst DNS Svrs ^|  Apply Changes"},
                  {"u", "> Add DNS Svr  ^|  Lst DNS Svrs v"},
                  {"u9", firstItems},
                  {"ddd", "  Set Gateway  ^|> Add DNS Svr  v"},
                  {"x", choiceStatic},
                  {"e", firstItems}});
}

TEST(Screens, EachAddressIsEditedAndStoredAndAppliedOnce) {
    Operator person = atThePort("static\naddress 10.1.1.254\ngateway 1.2\n");
    walk(person, {{"ee", firstItems},
                  {"e", "Enter IP Addr:| 10.  1.  1.254", "1,2"},
                  {"u", "Enter IP Addr:| 11.  1.  1.254", "1,2"},
                  {"eee", "Enter IP Addr:| 11.  1.  1.254", "1,14"},
                  {"u6", "Enter IP Addr:| 11.  1.  1.  2", "1,14"}, // 255, then 255 + 3
                  {"xx", "Enter IP Addr:| 11.  1.  1.  2", "1,6"},
                  {"d7", "Enter IP Addr:| 11.250.  1.  2", "1,6"}, // 0, then 253 and 250
                  {"e9", "Enter IP Addr:| 11.250.  1.  2", "1,10"},
                  {"ee", firstItems},
                  {"de", "Enter Netmask:|  0.  0.  0.  0", "1,2"},
                  {"deeee", "  Set IP Addr|> Set Netmask  v"},
                  {"de", "Enter Gateway:|  1.  2.  2.  2", "1,2"},
                  {"eexd", "Enter Gateway:|  1.  1.  2.  2", "1,6"},
                  {"xx", "  Set Netmask  ^|> Set Gateway  v"}, // left without storing
                  {"de", "DNS Server Addr:|  0.  0.  0.  0", "1,2"},
                  {"eeee", "  Set Gateway  ^|> Add DNS Svr  v"}, // not set: adds nothing
                  {"euuuuuuuueeee", "  Set Gateway  ^|> Add DNS Svr  v"},
                  // Held on, Enter walks from the port's page back in on its second poll.
                  {"dde9", choiceStatic},
                  {"x", port}});
    EXPECT_EQ(applied(),
              std::vector<std::string>{applyLine(" --ipaddress 11.250.1.2 --netmask 255.0.0.0"
                                                 " --gateway 1.2 --dns 8.0.0.0")});
}

TEST(Screens, ValuesOutOfRangeAreLimitedOnThePanelAndWhenStored) {
    Operator person = atThePort("static\naddress 300.99999999999.-5.x\n");
    walk(person, {{"eee", "Enter IP Addr:|255.255.  0.  0", "1,2"},
                  {"u", "Enter IP Addr:| 45.255.  0.  0", "1,2"},
                  {"eu", "Enter IP Addr:| 45.255.  0.  0", "1,6"},
                  {"ed", "Enter IP Addr:| 45.255.250.  0", "1,10"},
                  {"ee", firstItems},
                  {"e", "Enter IP Addr:| 45.255.250.  0", "1,2"}});
}

TEST(Screens, ARefusedApplyIsShownForThreeSecondsAndTheValuesStay) {
    Operator person = atThePort("static\naddress 10.1.1.5\n");
    const std::string atApply = "  Lst DNS Svrs ^|> Apply Changes";
    walk(person, {{"ee", firstItems}, {"ddddd", atApply}});
    const auto refusedWith = [&](const std::string &error) {
        std::string shown;
        world().duringPause = [&] { shown = Operator::sees(); };
        world().pauses.clear();
        person.hold(keyEnter, 9);
        EXPECT_EQ(shown, "Error:|" + error);
        EXPECT_EQ(world().pauses, std::vector<long long>{3'000'000});
        EXPECT_EQ(Operator::sees(), atApply);
    };
    refusedWith("Invalid Netmask");
    EXPECT_TRUE(applied().empty());
    walk(person, {{"uuuu", "> Set Netmask  ^|  Set Gateway  v"},
                  {"edeeee", "> Set Netmask  ^|  Set Gateway  v"},
                  {"dddd", atApply}});
    world().scriptOutput = "1\n";
    refusedWith("Check Logfile");
    world().scriptOutput = "0\n";
    world().duringCommand = [] { EXPECT_EQ(Operator::sees(), "Applying|Static Settings"); };
    walk(person, {{"e", port}});
    EXPECT_EQ(applied().size(), 2U);
    walk(person, {{"ee", firstItems}, {"e", "Enter IP Addr:| 10.  1.  1.  5", "1,2"}});
}

TEST(Screens, DhcpIsAppliedOnceAndItsFailureIsNotShown) {
    Operator person = atThePort("dhcp\n", 1);
    world().scriptOutput = "1\n";
    world().duringCommand = nullptr;
    walk(person, {{"e", choiceDhcp}, {"e9", confirm}, {"x9", choiceDhcp}, {"e", confirm}});
    world().duringCommand = [] { EXPECT_EQ(Operator::sees(), "Applying|DHCP Settings"); };
    person.poll(keyEnter);
    EXPECT_EQ(Operator::sees(), port);
    person.poll(keyEnter); // still down: back into the port, and no further
    EXPECT_EQ(Operator::sees(), choiceDhcp);
    person.hold(keyEnter, 9);
    EXPECT_EQ(Operator::sees(), choiceDhcp);
    EXPECT_EQ(applied(), std::vector<std::string>{applyLine(" --dhcp --dns 8.8.8.1")});
    EXPECT_TRUE(world().pauses.empty());
    walk(person, {{"x", port}});
    person.poll(keyEscape);
    person.hold(keyEnter, 9); // on the page the first five polls act, in the port only the first
    EXPECT_EQ(Operator::sees(), choiceDhcp);
}

TEST(Screens, ServersAreListedWithinTheStoredTenAndTheMarkerStartsAgainAtTheLast) {
    struct Case {
        int servers;
        std::string first, afterDown, atTheEnd, back;
    };
    const std::string one = ">  8.  8.  8.  1", two = "   8.  8.  8.  2";
    const std::string downToTwo = "   8.  8.  8.  1|>  8.  8.  8.  2", top = one + "|" + two;
    const std::string actions = "> Edit Svr|  Delete Svr";
    const std::string lastOfTen = "   8.  8.  8.  9|>  8.  8.  8. 10";
    const std::vector<Case> cases = {
        {0, "No DNS Svr found|", "No DNS Svr found|", "No DNS Svr found|", "No DNS Svr found|"},
        {1, one + "|", one + "|", one + "|", one + "|"},
        {2, top, downToTwo, downToTwo, top},
        {3, top, downToTwo, "   8.  8.  8.  2|>  8.  8.  8.  3", top},
        {10, top, downToTwo, lastOfTen, top},
        {14, top, downToTwo, lastOfTen, lastOfTen},
    };
    for (const auto &test : cases) {
        inFreshProgram([&] {
            Operator person = atThePort("static\n", test.servers);
            walk(person, {{"eedddde", test.first}, {"u", test.first}, {"d", test.afterDown}});
            person.hold(keyDown, 30);
            EXPECT_EQ(Operator::sees(), test.atTheEnd);
            if (test.servers == 0)
                person.press(keyEnter);
            if (test.servers > 0)
                walk(person, {{"e", "> Edit Svr|  Delete Svr"}, {"x", test.back}});
            walk(person, {{"u30", test.first}, {"x", "  Add DNS Svr  ^|> Lst DNS Svrs v"}});
        });
    }
}

TEST(Screens, AServerIsEditedOrDeletedAtOnce) {
    Operator person = atThePort("static\naddress 10.1.1.5\nnetmask 255.0.0.0\n", 3);
    const std::string actions = "> Edit Svr|  Delete Svr", deletion = "  Edit Svr|> Delete Svr";
    walk(person,
         {{"eedddde", ">  8.  8.  8.  1|   8.  8.  8.  2"},
          {"de", actions},
          {"d3", deletion},
          {"u", actions},
          {"d", deletion},
          {"x", "   8.  8.  8.  1|>  8.  8.  8.  2"},
          {"e", actions},
          {"e", "DNS Server Addr:|  8.  8.  8.  2", "1,2"},
          {"u", "DNS Server Addr:|  9.  8.  8.  2", "1,2"},
          {"x", actions},
          {"e", "DNS Server Addr:|  8.  8.  8.  2", "1,2"},
          {"ueeee", "   8.  8.  8.  1|>  9.  8.  8.  2"},
          {"u", ">  8.  8.  8.  1|   9.  8.  8.  2"},
          {"ede9", ">  9.  8.  8.  2|   8.  8.  8.  3"},
          {"de", actions}, // the last of two
          {"d", deletion},
          {"e", ">  9.  8.  8.  2|"},
          {"edee", "No DNS Svr found|"},
          {"x", "  Add DNS Svr  ^|> Lst DNS Svrs v"},
          {"ue", "DNS Server Addr:|  0.  0.  0.  0", "1,2"}}); // adds, though it edited before
}

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
    EXPECT_EQ(world().pauses, std::vector<long long>{1'000'000});
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
