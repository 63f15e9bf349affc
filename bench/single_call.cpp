// Makes one call of the library and nothing else that matters, for counting its system calls.
// scripts/bench-syscalls runs this.

#include <cstdio>
#include <cstring>
#include <exception>
#include <fileindex/event_queue.h>
#include <fileindex/fileindex.h>
#include <fileindex/index_mgr.h>
#include <unistd.h>

#include "bench/appliance.h"
#include "bench/input.h"
#include "bench/peer.h"
#include "core/event.h"

using namespace VANO::BENCH;

namespace {

using VANO::FILEINDEX::AddCustomEvent;
using VANO::FILEINDEX::IndexMgr;
using VANO::FILEINDEX::kEventSettingChanged;

std::string SomeFolder() {
    return FolderPaths(2).back();
}

// What the calls start from: 1,000 folders and empty queues.
bool Prepare() {
    MakeAppliance();
    SetFolders(kMaxFolders);
    return true;
}

// The daemon's side of the socket, until standard input ends.
bool Serve() {
    const Peer peer;
    (void)std::puts("ready");
    (void)std::fflush(stdout);
    char ignored = 0;
    return ::read(STDIN_FILENO, &ignored, 1) == 0;
}

bool Query() {
    const std::string path = FullPathOf(SomeFolder()) + "/IMG_2041.JPG";
    return FILEIDXIsFullPathIndexed(path.c_str()) == 1;
}

bool UpsertFolder() {
    Json::Value folder(Json::objectValue);
    folder["path"] = SomeFolder();
    folder["video"] = true;
    Json::Value request(Json::arrayValue);
    request.append(folder);
    return IndexMgr::Upsert(request);
}

bool AddEvent() {
    return AddCustomEvent(kEventSettingChanged, FullPathOf(SomeFolder()),
                          Json::Value(Json::objectValue));
}

// What every process does that makes one of the calls above, without the call.
bool Nothing() {
    return !FullPathOf(SomeFolder()).empty();
}

struct Command {
    const char *name;
    bool (*run)();
};

constexpr Command kCommands[] = {{"prepare", Prepare},     {"serve", Serve},
                                 {"nothing", Nothing},     {"query", Query},
                                 {"upsert", UpsertFolder}, {"event", AddEvent}};

int Run(const char *name) {
    for (const Command &command : kCommands) {
        if (std::strcmp(command.name, name) == 0) {
            return command.run() ? 0 : 1;
        }
    }
    return 2;
}

} // namespace

int main(int argc, char **argv) {
    try {
        return argc == 2 ? Run(argv[1]) : 2;
    } catch (const std::exception &problem) {
        (void)std::fprintf(stderr, "single_call: %s\n", problem.what());
        return 1;
    }
}
