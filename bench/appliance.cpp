#include "bench/appliance.h"

#include <fileindex/folders.h>
#include <filesystem>
#include <fstream>
#include <json/writer.h>
#include <limits>
#include <sstream>
#include <stdexcept>
#include <unistd.h>

#include "bench/input.h"
#include "core/paths.h"

namespace VANO::BENCH {

namespace {

namespace fs = std::filesystem;

constexpr std::size_t kNoLimit = std::numeric_limits<std::size_t>::max();
constexpr std::size_t kIdleFolders = 10;
constexpr std::size_t kPieceBytes = std::size_t{1} << 20U;

// What the first share's queue holds now.
FilledQueue &Filled() {
    static FilledQueue &queue = *new FilledQueue;
    return queue;
}

// How many of the generated folders the settings hold now; 0 when they were changed otherwise.
std::size_t g_folders = 0;

FilledQueue EmptyQueueOfFirstShare() {
    FilledQueue queue;
    queue.share = ShareNames().front();
    queue.file = QueueFileOf(queue.share);
    std::vector<std::string> paths;
    for (const std::string &path : FolderPaths(kMaxFolders)) {
        if (path.compare(1, queue.share.size() + 1, queue.share + "/") == 0) {
            fs::create_directories(FullPathOf(path));
            paths.push_back(path);
        }
    }
    const auto firstIdle = paths.end() - kIdleFolders;
    queue.waiting.assign(paths.begin(), firstIdle);
    queue.idle.assign(firstIdle, paths.end());
    return queue;
}

const FilledQueue &Fill(std::size_t maxEvents, std::size_t maxBytes) {
    RemoveQueues();
    FilledQueue queue = EmptyQueueOfFirstShare();
    std::vector<std::string> folders;
    for (const std::string &path : queue.waiting) {
        folders.push_back(FullPathOf(path));
    }
    EventLines lines(folders);
    std::ofstream file(queue.file, std::ios::binary);
    std::string piece;
    while (queue.events < maxEvents && queue.bytes + piece.size() < maxBytes) {
        lines.AppendTo(piece);
        ++queue.events;
        if (piece.size() >= kPieceBytes) {
            file << piece;
            queue.bytes += piece.size();
            piece.clear();
        }
    }
    file << piece;
    queue.bytes += piece.size();
    file.close();
    if (!file) {
        throw std::runtime_error("cannot write " + queue.file);
    }
    return Filled() = queue;
}

// For programs that run on the plain-Linux provider.
void WriteShareTable() {
    Json::Value table(Json::objectValue);
    for (const auto &[name, directory] : ShareDirectories()) {
        table[name] = directory;
    }
    std::ofstream file("/usr/vano/etc/shares.json");
    file << table;
    file.close();
    if (!file) {
        throw std::runtime_error("cannot write the share table");
    }
}

} // namespace

const std::map<std::string, std::string, std::less<>> &ShareDirectories() {
    static const auto &directories = *[] {
        auto *made = new std::map<std::string, std::string, std::less<>>;
        for (const std::string &name : ShareNames()) {
            (*made)[name] = (made->empty() ? "/volume2/" : "/volume1/") + name;
        }
        return made;
    }();
    return directories;
}

std::string FullPathOf(const std::string &sharePath) {
    const std::string share = sharePath.substr(1, sharePath.find('/', 1) - 1);
    return ShareDirectories().at(share) + sharePath.substr(share.size() + 1);
}

std::string QueueFileOf(const std::string &share) {
    return ShareDirectories().at(share) + "/" + FILEINDEX::kMetadataDirName + "/" +
           FILEINDEX::kEventQueueName;
}

void MakeAppliance() {
    if (::access("/.fileindex-sandbox", F_OK) != 0) {
        throw std::runtime_error("this changes system paths; run it through scripts/sandbox");
    }
    for (const auto &[name, directory] : ShareDirectories()) {
        fs::create_directories(directory + "/" + FILEINDEX::kMetadataDirName);
    }
    WriteShareTable();
    RemoveSettings();
    RemoveQueues();
}

void RemoveSettings() {
    fs::remove(FILEINDEX::kFolderConfPath);
    fs::remove(FILEINDEX::kStatusConfPath);
    g_folders = 0;
}

void RemoveQueues() {
    for (const std::string &name : ShareNames()) {
        fs::remove(QueueFileOf(name));
    }
    Filled() = {};
}

void SetFolders(std::size_t count) {
    if (g_folders == count) {
        return;
    }
    RemoveSettings();
    FILEINDEX::Folders settings;
    for (const std::string &path : FolderPaths(count)) {
        Json::Value folder(Json::objectValue);
        folder["name"] = path.substr(path.rfind('/') + 1);
        folder["document"] = true;
        folder["photo"] = path.size() % 2 == 0;
        (void)settings.folders[path].Reload(path, folder);
    }
    if (!settings.Save()) {
        throw std::runtime_error("cannot write the folder settings");
    }
    g_folders = count;
}

const FilledQueue &FillQueue(std::size_t events) {
    SetFolders(kMaxFolders);
    return Filled().events == events ? Filled() : Fill(events, kNoLimit);
}

const FilledQueue &FillQueueTo(std::size_t bytes) {
    SetFolders(kMaxFolders);
    return Fill(kNoLimit, bytes);
}

std::string ContentOf(const std::string &path) {
    std::ifstream file(path, std::ios::binary);
    std::ostringstream content;
    content << file.rdbuf();
    if (!file) {
        throw std::runtime_error("cannot read " + path);
    }
    return content.str();
}

} // namespace VANO::BENCH
