#pragma once

#include <string>

// Expected XML written with "\n" turned into this platform's line break.
std::string WithPlatformLineBreaks(const std::string& text);
