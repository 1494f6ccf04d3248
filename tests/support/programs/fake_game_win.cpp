// fake_game: stands in for the game's executable. Appends the command line
// it was started with to the file IRONVALE_TEST_GAME_LOG names.
#include <windows.h>

#include <cstdio>
#include <cstdlib>

int main() {
    const char* log = std::getenv("IRONVALE_TEST_GAME_LOG");
    FILE* out = log != nullptr ? std::fopen(log, "ab") : nullptr;
    if (out == nullptr) return 1;
    std::fprintf(out, "%s\n", GetCommandLineA());
    std::fclose(out);
    return 0;
}
