// hivelet-host: the host simulator's command.
#include <hivelet/script.h>

#include <iostream>

int main(int argc, char** argv) {
    std::vector<std::string> args(argv + 1, argv + argc);
    return hv::script::commandLine(args, std::cout, std::cerr);
}
