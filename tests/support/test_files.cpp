#include "tests/support/test_files.h"

#include <atomic>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>
#include <stdexcept>

#include "base/exception.h"
#include "base/paths.h"

namespace fs = std::filesystem;

TempFolder::TempFolder(const std::string& base) {
    static std::atomic<unsigned> counter{0};
    const std::string name = "ivl-test-" + std::to_string(std::random_device()()) + "-" + std::to_string(counter++);
    path = ((base.empty() ? fs::temp_directory_path() : fs::path(base)) / name).string();
    fs::create_directories(path);
}

TempFolder::~TempFolder() {
    std::error_code ignored;
    fs::remove_all(path, ignored);
}

std::string TempFolder::operator/(const std::string& name) const { return PathJoin(path, name); }

void WriteTextFile(const std::string& path, const std::string& content) {
    std::ofstream out(path, std::ios::binary | std::ios::trunc);
    if (!(out << content)) throw std::runtime_error("cannot write fixture " + path);
}

std::string ReadTextFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    if (!in) throw std::runtime_error("cannot read " + path);
    return std::string(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
}

bool PathExists(const std::string& path) { return fs::exists(path); }

std::string ErrorOf(const std::function<void()>& action) {
    try {
        action();
    } catch (const Exception& error) {
        return error.message + " (" + std::to_string(error.code) + ")";
    }
    return "";
}
