// The move of a prepared file that something blocks: the question is put
// again for every Retry, and Cancel ends stage two with StepFailed. The
// console form of the question reads its answers from standard input.

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
class StreamSwap {
public:
    StreamSwap(std::ios& swapped, std::streambuf* replacement) : stream(swapped), saved(swapped.rdbuf(replacement)) {}
    ~StreamSwap() { stream.rdbuf(saved); }

private:
    std::ios& stream;
    std::streambuf* saved;
};

size_t Count(const std::string& text, const std::string& what) {
    size_t count = 0;
    for (size_t at = text.find(what); at != std::string::npos; at = text.find(what, at + 1)) ++count;
    return count;
}

TEST(ApplierMoveRetry, RetryAsksAgainAndCancelEndsWithStepFailed) {
    Localization::Initialize();
    TestBatch batch(Tree().File("old.txt", "o"), Tree().File("old.txt", "o").File("blocked.bin", "new content"));
    BatchRun run(batch);
    MoveRetryBox retryBox;
    run.applier.SetRetryQuestion(&retryBox);
    run.StartFileDownloads();
    run.Prepare();
    // A non-empty folder where the file must go cannot be replaced by a move.
    WriteTree(batch.Installation(), Tree().File("blocked.bin/inside.txt", "in the way"));

    std::istringstream answers("r\nc\n");
    std::ostringstream shown;
    StreamSwap input(std::cin, answers.rdbuf());
    StreamSwap output(std::cerr, shown.rdbuf());
    const std::string source = PathJoin(batch.PatchedFiles(), "blocked.bin");
    const std::string destination = PathJoin(batch.Installation(), "blocked.bin");
    try {
        run.ApplyStageTwo();
        FAIL() << "the move succeeded";
    } catch (const Exception& error) {
        EXPECT_EQ(error.Code(), ErrorCode::StepFailed);
        EXPECT_EQ(error.message, "Failed to move file from " + source + " to " + destination);
    }
    EXPECT_EQ(Count(shown.str(), "Failed to move the file:"), 2u) << shown.str();
    EXPECT_NE(shown.str().find(source), std::string::npos);
    EXPECT_NE(shown.str().find("If you have any of these files open, please close them and retry."), std::string::npos);
    EXPECT_TRUE(PathExists(source));
    EXPECT_EQ(ReadTextFile(PathJoin(destination, "inside.txt")), "in the way");
}

}  // namespace
