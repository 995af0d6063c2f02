#pragma once

#include <string>

/// Hands a command line to the shell as it stands; nothing is quoted or escaped.
///
/// With `capture` the call blocks until the command closes its standard output and returns all of
/// it, line feeds included, or "ERROR" when no pipe can be opened; the exit status is lost, so a
/// caller that needs it lets the command line print it. Without `capture` the command is started in
/// the background, its outcome is unknown, and "" is returned at once.
std::string runCommand(const char *command, bool capture);
