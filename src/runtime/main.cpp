#include "runtime/MainLoop.h"

int main() {
    MainLoop loop;
    for (;;)
        loop.turn();
}
