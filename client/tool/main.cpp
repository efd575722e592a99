#include <clocale>
#include <csignal>
#include <exception>
#include <iostream>
#include <system_error>

#include "client/tool/CommandLine.h"
#include "client/tool/display/Problem.h"

int main(int argc, char** argv) {
    std::setlocale(LC_CTYPE, ""); // how wide characters are on this terminal
    try {
        return tarn::tool::parseCommandLine(argc, argv)();
    } catch (const tarn::tool::Problem& problem) {
        std::cerr << "tarnctl: " << problem.what() << "\n" << problem.advice() << "\n";
        return problem.exitStatus();
    } catch (const std::system_error& problem) {
        std::cerr << "tarnctl: cannot reach the service: " << problem.what()
                  << "\nStart it: systemctl --user enable --now tarnd.socket\n";
    } catch (const std::exception& problem) {
        std::cerr << "tarnctl: " << problem.what() << "\n";
    }
    return 1;
}
