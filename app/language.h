#pragma once

#include <string>

// Selects the language a stored name names: its first word ("German" of
// "German (Deutsch)"), the whole name when it has no space. The entry
// point does it for the name in the game's key, before any box can appear.
void SelectStoredLanguage(const std::string& storedName);
