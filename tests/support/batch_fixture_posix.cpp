#include <cstdlib>
#include <stdexcept>
#include <string>

#include "tests/support/batch_fixture.h"

namespace {

std::string Quoted(const std::string& path) { return "'" + path + "'"; }

}  // namespace

// Natively the deltas come from xdelta3 itself, as the publisher makes them.
void MakeDelta(const std::string& oldPath, const std::string& newPath, const std::string& deltaPath) {
    const std::string command =
        "xdelta3 -e -f -A -S none -s " + Quoted(oldPath) + " " + Quoted(newPath) + " " + Quoted(deltaPath);
    if (std::system(command.c_str()) != 0) throw std::runtime_error("xdelta3 failed: " + command);
}
