// The appliance of the tests: plain text that describes it, what the program's commands print about
// it, and what its configuration script does. It has the verbs of the box and two more: `server
// PORT ADDRESS/PREFIX` puts a DHCP server at the port's far end, and `prints COMMAND OUTPUT` fixes
// what this command line prints.
#pragma once

#include <boost/algorithm/string/predicate.hpp>

#include <chrono>
#include <filesystem>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

class Appliance {
  public:
    using Words = std::vector<std::string>;

    std::map<std::string, std::string> facts; ///< values by name, as `fact` tells them

    /// The appliance that the box starts with.
    static Appliance delivered();

    /// Does what an `appliance` step says; throws std::runtime_error if a check fails. The verbs
    /// that are about the program are handled elsewhere.
    void act(const Words &words);

    /// The value that `act` has last given to, for example, "hostname", "port eth0" or
    /// "file /etc/hostname".
    std::optional<std::string> fact(const std::string &name) const;

    /// What a command line of the program prints. An unknown command line makes the test fail.
    std::string output(const std::string &command) const;

    /// How long the configuration script takes, and, when that time is over, what it does with
    /// these arguments; the latter returns its exit status.
    std::chrono::milliseconds scriptTime() const;
    int runScript(const Words &arguments);

  private:
    void lookUp(const Words &words) const;
    std::set<std::string> ports() const;
    std::string address(const std::string &port) const;
    std::string method(const std::string &port) const;
    int configurePort(const Words &arguments);
};

inline const std::string applyScript = "/opt/kestrova/scripts/ezio/apply.py ";

/// The configuration script's arguments in this command line, or none if it runs another command.
Appliance::Words scriptArguments(const std::string &command);
std::string contents(const std::filesystem::path &path);
