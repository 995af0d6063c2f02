#include "status/PlatformCode.h"

#include "runtime/beginsWith.h"

#include <fstream>
#include <string>

PlatformCode detectPlatform() {
    std::ifstream file("/etc/ma-platform");
    std::string line;
    std::getline(file, line);

    // A q700 counts as a q70, because its name begins with "q70". The order of these lines must
    // stay.
    if (beginsWith(line, "q70"))
        return platformQ70;
    if (beginsWith(line, "zvm"))
        return platformCloud;
    if (beginsWith(line, "q75"))
        return platformQ75;
    if (beginsWith(line, "q700"))
        return platformQ700;
    return platformUnknown;
}
