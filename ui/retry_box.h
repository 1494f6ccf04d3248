#pragma once

#include <string>

#include "patch/patch_applier.h"

// The question the player sees when a file of the game cannot be replaced
// or deleted (usually because the game or a tool still has it open): a
// warning box with Retry and Cancel, in the player's language.
class RetryBox final : public IRetryQuestion {
public:
    bool AskRetryMove(const std::string& source, const std::string& destination) override;
    bool AskRetryDelete(const std::string& path) override;

private:
    static bool Ask(const std::wstring& failure);
};
