#include "bench/input.h"

#include <array>
#include <cstdio>
#include <stdexcept>

#include "core/event.h"

namespace VANO::BENCH {

namespace {

using FILEINDEX::kEventMoved;
using FILEINDEX::kEventReindexFolder;
using FILEINDEX::kEventSettingChanged;

constexpr std::uint64_t kSeed = 20160229;
constexpr std::size_t kVolumeBytes = sizeof("/volume1") - 1;
constexpr std::size_t kMinPathBytes = 60;
constexpr std::size_t kMaxPathBytes = 120;

constexpr std::array kWords = {"2014",           "2015",        "2016",
                               "Accounts",       "Aufnahmen",   "Bücher",
                               "Camera Uploads", "Clients",     "Contracts",
                               "Exports",        "Fotos",       "From Anna's phone",
                               "Großeltern",     "Holidays",    "Invoices",
                               "Kunden",         "Lectures",    "Location scouting",
                               "Mitschnitte",    "Originals",   "Präsentation",
                               "Project Alpha",  "Raw",         "Reisen",
                               "Reports",        "Scans",       "Sommerfest",
                               "Video-Schnitt",  "Weihnachten", "données",
                               "vacances d'été", "家族写真",    "документы",
                               "資料",           "wedding",     "zum Sortieren"};

constexpr std::array kFileNames = {"IMG_",      "DSC0",   "scan-",      "Rechnung ",
                                   "report_",   "Track ", "Übersicht ", "notes-",
                                   "会議メモ ", "P10",    "backup.",    "Entwurf \\\"v2\\\" "};
constexpr std::array kSuffixes = {".jpg", ".JPG",  ".pdf", ".docx", ".mp3",
                                  ".mp4", ".xlsx", ".png", ".txt",  ".flac"};

// A file's events as the monitor reports them: inotify's bits.
constexpr std::array kFileCodes = {0x2, 0x4, 0x8, 0x8, 0x8, 0x200, 0x8000};

std::uint64_t NextRandom(std::uint64_t &state) { // splitmix64
    state += 0x9e3779b97f4a7c15;
    std::uint64_t z = state;
    z = (z ^ (z >> 30U)) * 0xbf58476d1ce4e5b9;
    z = (z ^ (z >> 27U)) * 0x94d049bb133111eb;
    return z ^ (z >> 31U);
}

template <typename Table>
auto Pick(const Table &table, std::uint64_t random) {
    return table[random % table.size()];
}

std::string MakeFolderPath(const std::string &share, std::size_t number, std::uint64_t &state) {
    constexpr std::size_t kFewest = 55;
    constexpr std::size_t kSpread = 22;
    const std::size_t wanted = kFewest + NextRandom(state) % kSpread;
    std::string path = "/" + share;
    while (path.size() < wanted) {
        path += '/';
        path += Pick(kWords, NextRandom(state));
    }
    // The number keeps any folder from lying below another.
    std::array<char, 24> suffix{};
    (void)std::snprintf(suffix.data(), suffix.size(), " %04zu", number);
    path += suffix.data();
    if (path.size() < kMinPathBytes || path.size() + kVolumeBytes > kMaxPathBytes) {
        throw std::logic_error("a generated path is too short or too long: " + path);
    }
    return path;
}

} // namespace

const std::vector<std::string> &ShareNames() {
    static const std::vector<std::string> names = {
        "archive",  "backup", "bücher",   "design", "documents", "familie", "fotos",
        "homes",    "music",  "photos",   "privat", "projekte",  "public",  "scans",
        "software", "team",   "vertrieb", "video",  "web",       "写真"};
    return names;
}

std::vector<std::string> FolderPaths(std::size_t count) {
    std::uint64_t state = kSeed;
    std::vector<std::string> paths;
    paths.reserve(count);
    for (std::size_t i = 0; i < count; ++i) {
        paths.push_back(MakeFolderPath(ShareNames()[i % kShareCount], i, state));
    }
    return paths;
}

EventLines::EventLines(std::vector<std::string> folders)
    : folders_(std::move(folders)), state_(kSeed) {}

std::uint64_t EventLines::Random() {
    return NextRandom(state_);
}

void EventLines::AppendFile(std::string &text) {
    text += Pick(folders_, Random());
    text += '/';
    const std::uint64_t random = Random();
    // Names with a quotation mark are rare.
    const std::size_t names = kFileNames.size() - (random % 64 == 0 ? 0 : 1);
    text += kFileNames[(random >> 8U) % names];
    text += std::to_string((random >> 16U) % 10000);
    text += Pick(kSuffixes, random >> 32U);
}

void EventLines::AppendTo(std::string &text) {
    const std::uint64_t kind = Random() % 1000;
    if (kind == 0) {
        text += R"({"data":null,"event":)" + std::to_string(kEventReindexFolder) + R"(,"path":")";
        text += Pick(folders_, Random());
    } else if (kind < 10) {
        text += R"({"data":{"audio":false,"document":true,"photo":true,"video":false},"event":)" +
                std::to_string(kEventSettingChanged) + R"(,"path":")";
        text += Pick(folders_, Random());
    } else if (kind < 150) {
        text += R"({"event":)" + std::to_string(kEventMoved) + R"(,"path":")";
        AppendFile(text);
        text += R"(","path_old":")";
        AppendFile(text);
    } else {
        text += R"({"event":)" + std::to_string(Pick(kFileCodes, Random())) + R"(,"path":")";
        AppendFile(text);
    }
    text += "\"}\n";
}

} // namespace VANO::BENCH
