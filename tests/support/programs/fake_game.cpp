// fake_game: stands in for the game's executable. Appends the command line
// it was started with to the file the environment names
// (IRONVALE_TEST_GAME_LOG), so a test can see that and how it was started.
#include <windows.h>

#include <cstdio>
#include <cstdlib>

int main() {
    const char* log = std::getenv("IRONVALE_TEST_GAME_LOG");
    if (log == nullptr) return 2;
    FILE* out = std::fopen(log, "ab");
    if (out == nullptr) return 1;
    std::fprintf(out, "%s\n", GetCommandLineA());
    std::fclose(out);
    return 0;
}
