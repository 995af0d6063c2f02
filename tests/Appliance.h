// The appliance as the tests have it: plain text, what the program's commands print about it, and
// what the configuration script does to it. It knows the same verbs as the box.
#pragma once

#include <array>
#include <chrono>
#include <istream>
#include <map>
#include <ostream>
#include <string>
#include <vector>

class Appliance {
  public:
    using Facts = std::map<std::string, std::string>;
    using Words = std::vector<std::string>;

    /// The appliance that the box starts with.
    static Appliance delivered();

    Facts files;   ///< contents by path
    Facts ports;   ///< by name: address/prefix, or "-" for none
    Facts servers; ///< DHCP servers at the ports' far ends: address/prefix
    Facts prints;  ///< what these command lines print, whatever the rest
    Facts settings = {{"hostname", "monitor"}, {"gateway", ""}, {"script", "works"}};

    /// Does what an `appliance` step says; throws std::runtime_error when a look-up finds something
    /// else. Not for the verbs that are about the program.
    void act(const Words &words);

    /// What a command line of the program prints. One that no appliance knows is a test's failure.
    std::string output(const std::string &command) const;

    /// How long the configuration script takes with these arguments, and, when that time is over,
    /// what it does; the latter returns its exit status.
    std::chrono::milliseconds scriptTime(const Words &arguments) const;
    int runScript(const Words &arguments);

    friend std::ostream &operator<<(std::ostream &out, const Appliance &appliance);
    friend std::istream &operator>>(std::istream &in, Appliance &appliance);

  private:
    static constexpr std::array<Facts Appliance::*, 5> parts = {
        &Appliance::files, &Appliance::ports, &Appliance::servers, &Appliance::prints,
        &Appliance::settings};

    std::string address(const std::string &port) const;
    std::string method(const std::string &port) const;
    void setPort(const std::string &port, const std::string &address, const std::string &stanza);
    int configurePort(const Words &arguments);
};

inline const std::string applyScript = "/opt/kestrova/scripts/ezio/apply.py ";

/// The configuration script's arguments in this command line; none where it is another command.
Appliance::Words scriptArguments(const std::string &command);
/// The pieces of a text between white space.
Appliance::Words wordsOf(const std::string &text);
bool startsWith(const std::string &text, const std::string &beginning);
