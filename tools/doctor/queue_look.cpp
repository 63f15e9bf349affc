#include "doctor/queue_look.h"

#include <algorithm>
#include <cerrno>
#include <string_view>

#include "status/queue_event.h"

namespace CTL::DOCTOR {

QueueLook LookInto(const QueueFile &queue) {
    QueueLook look;
    look.bytes = static_cast<unsigned long long>(queue.Size());
    look.age = queue.Age();
    look.isWhole = queue.Size() <= kMostQueueBytes;
    const auto wanted = std::min<long long>(queue.Size(), kMostQueueBytes);
    const std::string text = queue.ReadAt(0, static_cast<std::size_t>(wanted));
    look.error = errno;
    QueueEventParser parser;
    QueueEvent event;
    for (std::string_view rest = text; !rest.empty();) {
        const std::size_t end = rest.find('\n');
        if (end == std::string_view::npos && !look.isWhole) {
            break;
        }
        ++(parser.Parse(event, rest.substr(0, end)) ? look.events : look.malformed);
        rest.remove_prefix(end == std::string_view::npos ? rest.size() : end + 1);
    }
    return look;
}

} // namespace CTL::DOCTOR
