// How much a process grows while it scans a queue of 1 GB.

#include "bench/benchmarks.h"

#include <array>
#include <cstdio>
#include <fcntl.h>
#include <fileindex/status_mgr.h>
#include <fstream>
#include <stdexcept>
#include <sys/wait.h>
#include <unistd.h>

#include "base/unique_fd.h"
#include "bench/appliance.h"
#include "bench/measure.h"

namespace VANO::BENCH {

namespace {

using FILEINDEX::UniqueFd;

constexpr std::size_t kMegabyte = 1'000'000;

// A line of /proc/self/status, in bytes.
std::size_t MemoryFigure(const std::string &name) {
    std::ifstream status("/proc/self/status");
    std::string word;
    std::size_t kilobytes = 0;
    while (status >> word) {
        if (word == name + ":" && status >> kilobytes) {
            return kilobytes * 1024;
        }
    }
    throw std::runtime_error("the kernel does not tell " + name);
}

// From here on the peak is counted anew.
void ResetPeak() {
    std::ofstream("/proc/self/clear_refs") << '5';
}

void ReplaceByScan(const UniqueFd &output, const std::string &folder) {
    (void)::dup2(output.Get(), STDOUT_FILENO);
    (void)::execl("/proc/self/exe", "fileindex_bench", "--peak-of", folder.c_str(), nullptr);
    ::_exit(127);
}

// A process of its own, so that nothing that was freed before can be used again.
double GrowthOfChild(const std::string &folder) {
    std::array<int, 2> ends{};
    Require(::pipe2(ends.data(), O_CLOEXEC) == 0, "cannot make a pipe");
    const UniqueFd output(ends[0]);
    UniqueFd input(ends[1]);
    const pid_t child = ::fork();
    Require(child >= 0, "cannot start a process");
    if (child == 0) {
        ReplaceByScan(input, folder);
    }
    input = UniqueFd();
    std::array<char, 64> line{};
    const ssize_t got = ::read(output.Get(), line.data(), line.size() - 1);
    int status = 0;
    Require(::waitpid(child, &status, 0) == child && status == 0 && got > 0,
            "the process that scans failed");
    return std::stod(line.data()) / kMegabyte;
}

double PeakMemory() {
    const FilledQueue &queue = FillQueueTo(Size(1000, 16) * kMegabyte);
    const double megabytes = GrowthOfChild(queue.idle.front());
    RemoveQueues();
    return megabytes;
}

} // namespace

int PrintPeakOfScan(const std::string &folder) {
    ResetPeak();
    const std::size_t before = MemoryFigure("VmRSS");
    const std::string status = FILEINDEX::StatusMgr::GetFolderStatus(folder);
    const std::size_t peak = MemoryFigure("VmHWM");
    Require(status == "finished", "wrong answer");
    Require(peak >= before, "the peak was not counted anew");
    (void)std::printf("%zu\n", peak - before);
    return 0;
}

void AddMemoryBenchmarks() {
    AddFigure({"peak_memory", "additional resident memory while a 1 GB queue is scanned", "MB", 16,
               PeakMemory});
}

} // namespace VANO::BENCH
