#include "utils/queue_reader.h"

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <string_view>
#include <sys/stat.h>
#include <unistd.h>

#include "utils/metadata_entry.h"

namespace VANO::FILEINDEX {

namespace {

// Far beyond any event. What is longer comes from a file that is no queue, and is cut.
constexpr std::size_t kMaxLineBytes = kMaxJsonFileBytes;
// Ends a line that was cut: no JSON object ends so.
constexpr char kCutMark[] = "...";

} // namespace

QueueReader::QueueReader(const std::string &path) : file_(MetadataEntry(path).Open(O_RDONLY)) {
    struct stat info {};
    if (file_ && (::fstat(file_.Get(), &info) != 0 || !S_ISREG(info.st_mode))) {
        file_ = UniqueFd();
        errno = EINVAL;
    }
}

bool QueueReader::Fill() {
    ssize_t got = 0;
    do {
        got = ::read(file_.Get(), buffer_.data(), buffer_.size());
    } while (got < 0 && errno == EINTR);
    begin_ = 0;
    end_ = got > 0 ? static_cast<std::size_t>(got) : 0;
    return got > 0;
}

bool QueueReader::NextLine(std::string &line) {
    line.clear();
    bool cut = false;
    bool ended = false;
    while (!ended && (begin_ != end_ || Fill())) {
        const std::string_view rest(buffer_.data() + begin_, end_ - begin_);
        const std::size_t length = std::min(rest.find('\n'), rest.size());
        const std::size_t room = kMaxLineBytes - line.size();
        line.append(rest.substr(0, std::min(length, room)));
        cut = cut || length > room;
        ended = length < rest.size();
        begin_ += length + (ended ? 1 : 0);
    }
    if (cut) {
        line.append(kCutMark);
    }
    return ended || !line.empty();
}

bool QueueReader::ParseEvent(QueueEvent &event, const std::string &line) {
    if (!parser_.Parse(parsed_, line) || !parsed_.isObject()) {
        return false;
    }
    const Json::Value &object = parsed_;
    const Json::Value &path = object["path"];
    const Json::Value &formerPath = object["path_old"];
    if (!object.isMember("event") || !object["event"].isConvertibleTo(Json::uintValue) ||
        !path.isString()) {
        return false;
    }
    event.code = object["event"].asUInt();
    event.path = path.asString();
    event.formerPath =
        formerPath.isConvertibleTo(Json::stringValue) ? formerPath.asString() : std::string();
    return true;
}

} // namespace VANO::FILEINDEX
