#include "workload.h"

#include <array>
#include <cstdint>
#include <fileindex/folders.h>
#include <filesystem>
#include <fstream>
#include <random>
#include <stdexcept>

#include "support/appliance.h"
#include "support/fake_platform.h"
#include "support/files.h"

namespace VANO::BENCH {

namespace {

namespace fs = std::filesystem;
using Random = std::mt19937_64;

constexpr std::uint64_t kSeed = 20160229;
constexpr std::size_t kIdleFolders = 10;
constexpr std::size_t kPieceBytes = std::size_t{1} << 20U;

// The first one sorts first.
constexpr std::array kShares = {"archive",  "backup", "bücher",   "design", "documents",
                                "familie",  "fotos",  "homes",    "music",  "photos",
                                "privat",   "scans",  "projekte", "public", "software",
                                "vertrieb", "video",  "team",     "web",    "写真"};
constexpr std::array kWords = {"2014",       "2015",           "Aufnahmen",     "Bücher",
                               "Contracts",  "Camera Uploads", "Fotos",         "From Anna's phone",
                               "Großeltern", "Holidays",       "Invoices",      "Originals",
                               "Reisen",     "Project Alpha",  "Video-Schnitt", "Weihnachten",
                               "données",    "vacances d'été", "家族写真",      "документы"};
constexpr std::array kFileNames = {"IMG_",       "scan-",  "Rechnung ", "report_",
                                   "Übersicht ", "notes-", "会議メモ ", "Entwurf \\\"v2\\\" "};
constexpr std::array kSuffixes = {".jpg", ".JPG", ".pdf", ".docx", ".mp3", ".mp4", ".txt"};
// A file's events as the monitor reports them.
constexpr std::array kFileEvents = {4, 8, 8, 8, 256, 512};

template <typename Table>
auto Pick(const Table &table, Random &random) {
    return table[random() % table.size()];
}

std::string ShareOf(const std::string &sharePath) {
    return sharePath.substr(1, sharePath.find('/', 1) - 1);
}

std::string DirectoryOf(const std::string &share) {
    return (share == kShares.front() ? "/volume2/" : "/volume1/") + share;
}

// A file below one of the folders, as it stands in a JSON text.
std::string FileBelow(const std::vector<std::string> &folders, Random &random) {
    // Names with a quotation mark, the last of the table, are rare.
    const std::size_t names = kFileNames.size() - (random() % 64 == 0 ? 0 : 1);
    return Pick(folders, random) + "/" + kFileNames[random() % names] +
           std::to_string(random() % 10000) + Pick(kSuffixes, random);
}

// Mostly files that were created, changed, moved or deleted, and now and then a setting that
// changed or a folder to index again.
std::string EventLine(const std::vector<std::string> &folders, Random &random) {
    const std::uint64_t kind = random() % 1000;
    if (kind == 0) {
        return TESTS::EventLine(Pick(folders, random), TESTS::kReindexEvent);
    }
    if (kind < 10) {
        return R"({"data":{"audio":false,"document":true,"photo":true,"video":false},"event":)" +
               std::to_string(TESTS::kSettingEvent) + R"(,"path":")" + Pick(folders, random) +
               "\"}\n";
    }
    if (kind < 150) {
        return R"({"event":256,"path":")" + FileBelow(folders, random) + R"(","path_old":")" +
               FileBelow(folders, random) + "\"}\n";
    }
    return R"({"event":)" + std::to_string(Pick(kFileEvents, random)) + R"(,"path":")" +
           FileBelow(folders, random) + "\"}\n";
}

FilledQueue FoldersOfFirstShare() {
    FilledQueue queue;
    for (const std::string &path : FolderPaths(kMaxFolders)) {
        if (ShareOf(path) == kShares.front()) {
            fs::create_directories(FullPathOf(path));
            queue.waiting.push_back(path);
        }
    }
    queue.file = QueueFileOf(queue.waiting.front());
    const auto firstIdle = queue.waiting.end() - kIdleFolders;
    queue.idle.assign(firstIdle, queue.waiting.end());
    queue.waiting.erase(firstIdle, queue.waiting.end());
    return queue;
}

FilledQueue &Filled() {
    static FilledQueue queue;
    return queue;
}

} // namespace

void Require(bool condition, const std::string &what) {
    if (!condition) {
        throw std::runtime_error(what);
    }
}

void MakeAppliance() {
    TESTS::RequireSandbox();
    TESTS::EmptyAppliance();
    TESTS::FakePlatform &platform = TESTS::FakePlatform::Get();
    platform.quiet = true;
    for (const std::string share : kShares) {
        platform.AddShare(share, DirectoryOf(share));
        TESTS::MakeDirs(DirectoryOf(share) + "/@eaDir");
    }
}

std::vector<std::string> FolderPaths(std::size_t count) {
    constexpr std::size_t kFewestBytes = 55;
    constexpr std::size_t kSpread = 22;
    Random random(kSeed);
    std::vector<std::string> paths;
    for (std::size_t i = 0; i < count; ++i) {
        std::string path = std::string("/") + kShares[i % kShares.size()];
        for (const std::size_t bytes = kFewestBytes + random() % kSpread; path.size() < bytes;) {
            path += std::string("/") + Pick(kWords, random);
        }
        // The number keeps any folder from lying below another.
        paths.push_back(path + " " + std::to_string(10000 + i));
    }
    return paths;
}

std::string FullPathOf(const std::string &sharePath) {
    const std::string share = ShareOf(sharePath);
    return DirectoryOf(share) + sharePath.substr(share.size() + 1);
}

std::string QueueFileOf(const std::string &sharePath) {
    return TESTS::QueueOf(DirectoryOf(ShareOf(sharePath)));
}

void SetFolders(std::size_t count) {
    TESTS::RemoveTree(TESTS::kFolderFile);
    FILEINDEX::Folders settings;
    for (const std::string &path : FolderPaths(count)) {
        Json::Value folder(Json::objectValue);
        folder["name"] = path.substr(path.rfind('/') + 1);
        folder["document"] = true;
        folder["photo"] = path.size() % 2 == 0;
        (void)settings.folders[path].Reload(path, folder);
    }
    Require(count == 0 || settings.Save(), "cannot write the folder settings");
}

void RemoveQueues() {
    for (const std::string share : kShares) {
        TESTS::RemoveTree(TESTS::QueueOf(DirectoryOf(share)));
    }
    Filled() = {};
}

const FilledQueue &FillQueue(std::size_t events, std::size_t bytes) {
    SetFolders(kMaxFolders);
    if (Filled().events == events) {
        return Filled();
    }
    RemoveQueues();
    FilledQueue queue = FoldersOfFirstShare();
    std::vector<std::string> folders;
    for (const std::string &path : queue.waiting) {
        folders.push_back(FullPathOf(path));
    }
    Random random(kSeed);
    std::ofstream file(queue.file, std::ios::binary);
    for (std::string piece; queue.events < events && queue.bytes < bytes; piece.clear()) {
        while (queue.events < events && piece.size() < kPieceBytes) {
            piece += EventLine(folders, random);
            ++queue.events;
        }
        file << piece;
        queue.bytes += piece.size();
    }
    file.close();
    Require(static_cast<bool>(file), "cannot write " + queue.file);
    return Filled() = queue;
}

} // namespace VANO::BENCH
