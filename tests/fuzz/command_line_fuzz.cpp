// The command line is untrusted: any text must parse without a crash, and joining and splitting again must give the
// words back whenever no word holds a double quote (which a joined line cannot carry); any text quoted as one argument
// is read back as that one argument.
#include "app/updater_arguments.h"
#include "base/command_line.h"
#include "tests/fuzz/fuzz_files.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    UpdaterArguments arguments;
    arguments.Parse(text);
    arguments.Describe();
    const std::vector<std::string> words = SplitCommandLine(text);
    bool quoted = false;
    for (const std::string& word : words) quoted = quoted || word.find('"') != std::string::npos;
    if (!quoted && SplitCommandLine(JoinCommandLine(words)) != words) __builtin_trap();
    // A quoted argument is read back as exactly itself by the C runtime's rules.
    if (SplitArguments("x " + QuoteArgument(text)) != std::vector<std::string>{"x", text}) __builtin_trap();
    return 0;
}
