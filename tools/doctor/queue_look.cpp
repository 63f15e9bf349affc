#include "doctor/queue_look.h"

#include <algorithm>
#include <cerrno>
#include <ctime>
#include <fcntl.h>
#include <json/value.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vector>

#include "base/json_io.h"
#include "base/unique_fd.h"

namespace CTL::DOCTOR {

namespace {

using VANO::FILEINDEX::JsonParser;
using VANO::FILEINDEX::UniqueFd;

// A queue file is made with its first event.
long long AgeOf(const UniqueFd &file) {
    struct statx times {};
    if (::statx(file.Get(), "", AT_EMPTY_PATH, STATX_BTIME | STATX_MTIME, &times) != 0) {
        return 0;
    }
    long long first = times.stx_mtime.tv_sec;
    if ((times.stx_mask & STATX_BTIME) != 0) {
        first = std::min<long long>(first, times.stx_btime.tv_sec);
    }
    return std::max<long long>(0, std::time(nullptr) - first);
}

bool IsEvent(const Json::Value &line) {
    return line.isObject() && line.isMember("event") &&
           line["event"].isConvertibleTo(Json::uintValue) && line["path"].isString();
}

void CountLine(QueueLook &look, JsonParser &parser, const std::string &line) {
    Json::Value value;
    if (parser.Parse(value, line) && IsEvent(value)) {
        ++look.events;
    } else {
        ++look.malformed;
    }
}

void CountLines(QueueLook &look, const UniqueFd &file) {
    JsonParser parser;
    std::string line;
    long long left = kMostQueueBytes;
    std::vector<char> buffer(std::size_t{256} * 1024);
    for (;;) {
        const ssize_t got = ::read(file.Get(), buffer.data(), buffer.size());
        if (got < 0 && errno == EINTR) {
            continue;
        }
        if (got <= 0 || left <= 0) {
            look.error = got < 0 ? errno : 0;
            look.isWhole = got == 0;
            break;
        }
        left -= got;
        auto begin = buffer.cbegin();
        const auto end = begin + got;
        for (auto newline = std::find(begin, end, '\n'); newline != end;
             newline = std::find(begin, end, '\n')) {
            line.append(begin, newline);
            CountLine(look, parser, line);
            line.clear();
            begin = newline + 1;
        }
        line.append(begin, end);
    }
    if (look.isWhole && !line.empty()) {
        CountLine(look, parser, line);
    }
}

} // namespace

QueueLook LookAtQueue(const std::string &path) {
    QueueLook look;
    const UniqueFd file(
        ::open(path.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
    struct stat info {};
    if (!file || ::fstat(file.Get(), &info) != 0) {
        look.error = errno;
        return look;
    }
    look.bytes = static_cast<unsigned long long>(info.st_size);
    look.age = AgeOf(file);
    CountLines(look, file);
    return look;
}

} // namespace CTL::DOCTOR
