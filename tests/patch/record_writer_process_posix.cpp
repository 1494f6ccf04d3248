#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <stdexcept>

#include "tests/patch/record_writer_process.h"

RecordWriterProcess::RecordWriterProcess(const std::string& folder) {
    const pid_t child = fork();
    if (child < 0) throw std::runtime_error("fork failed");
    if (child == 0) WriteRecordsForever(folder);
    process = child;
}

RecordWriterProcess::~RecordWriterProcess() {
    kill(static_cast<pid_t>(process), SIGKILL);
    int status = 0;
    waitpid(static_cast<pid_t>(process), &status, 0);
}
