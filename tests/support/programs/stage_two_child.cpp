// stage_two_child ROOT: stage two of the batch a test laid out below ROOT,
// in a process of its own, so that the test can kill it at any moment.
#include "tests/support/batch_fixture.h"

int main(int argc, char** argv) {
    if (argc != 2) return 2;
    BatchRun(argv[1]).Apply();  // an error ends the process with a failure
    return 0;
}
