#pragma once

#include <string>

#include "patch/patch_applier.h"

// The question the player sees when a file of the game cannot be replaced
// (usually because the game or a tool still has it open): a warning box
// with Retry and Cancel, in the player's language.
class MoveRetryBox final : public IMoveRetryQuestion {
public:
    bool AskRetryMove(const std::string& source, const std::string& destination) override;
};
