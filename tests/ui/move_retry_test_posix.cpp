// A prepared file that something blocks: Retry puts the question again,
// Cancel ends stage two with StepFailed. The console box reads stdin.
#include <gtest/gtest.h>

#include <iostream>
#include <sstream>

#include "base/exception.h"
#include "base/paths.h"
#include "tests/support/batch_fixture.h"
#include "text/localization.h"
#include "ui/move_retry_box.h"

namespace {

// Swaps a stream's buffer for the lifetime of the object.
struct StreamSwap {
    StreamSwap(std::ios& swapped, std::streambuf* replacement) : stream(swapped), saved(swapped.rdbuf(replacement)) {}
    ~StreamSwap() { stream.rdbuf(saved); }
    std::ios& stream;
    std::streambuf* saved;
};

TEST(MoveRetry, RetryAsksAgainAndCancelEndsWithStepFailed) {
    Localization::Initialize();
    TestBatch batch(Tree(), TreeOf("blocked.bin=new content"));
    BatchRun run(batch);
    MoveRetryBox retryBox;
    run.applier.SetRetryQuestion(&retryBox);
    run.Prepare();
    WriteTree(batch.Installation(), TreeOf("blocked.bin/inside.txt=a folder that a move cannot replace"));
    std::istringstream answers("r\nc\nleft over\n");  // asked twice, the last line stays unread
    std::ostringstream shown;
    StreamSwap input(std::cin, answers.rdbuf());
    StreamSwap output(std::cerr, shown.rdbuf());
    try {
        run.Apply();
        ADD_FAILURE() << "the move succeeded";
    } catch (const Exception& error) {
        EXPECT_EQ(error.Code(), ErrorCode::StepFailed);
    }
    std::string rest;
    EXPECT_TRUE(std::getline(answers, rest) && rest == "left over") << shown.str();
    EXPECT_TRUE(PathExists(PathJoin(batch.PatchedFiles(), "blocked.bin")));
}

}  // namespace
