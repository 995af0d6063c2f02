#include "status/PlatformCode.h"

#include "runtime/TextFile.h"
#include "runtime/beginsWith.h"

PlatformCode detectPlatform() {
    const std::string line = TextFile("/etc/ma-platform").nextLine().value_or("");

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
