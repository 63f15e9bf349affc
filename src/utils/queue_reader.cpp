#include "utils/queue_reader.h"

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <unistd.h>

namespace VANO::FILEINDEX {

QueueReader::QueueReader(const std::string &path)
    : file_(::open(path.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC)) {}

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
    for (;;) {
        if (begin_ == end_ && !Fill()) {
            return !line.empty();
        }
        const char *const start = buffer_.data() + begin_;
        const std::size_t available = end_ - begin_;
        const void *const newline = std::memchr(start, '\n', available);
        if (newline != nullptr) {
            const auto length =
                static_cast<std::size_t>(static_cast<const char *>(newline) - start);
            line.append(start, length);
            begin_ += length + 1;
            return true;
        }
        line.append(start, available);
        begin_ = end_;
    }
}

bool QueueReader::ParseEvent(QueueEvent &event, const std::string &line) {
    if (!parser_.Parse(parsed_, line) || !parsed_.isObject()) {
        return false;
    }
    if (!parsed_.isMember("event") || !parsed_["event"].isConvertibleTo(Json::uintValue) ||
        !parsed_["path"].isString()) {
        return false;
    }
    event.code = parsed_["event"].asUInt();
    event.path = parsed_["path"].asString();
    const Json::Value &former = parsed_["path_old"];
    event.formerPath =
        former.isConvertibleTo(Json::stringValue) ? former.asString() : std::string();
    return true;
}

} // namespace VANO::FILEINDEX
