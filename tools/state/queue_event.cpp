#include "state/queue_event.h"

namespace CTL {

namespace {

constexpr Json::UInt kMoved = 256;

} // namespace

bool QueueEventParser::Parse(QueueEvent &event, std::string_view line) {
    if (!parser_.Parse(parsed_, line) || !parsed_.isObject()) {
        return false;
    }
    const Json::Value &object = parsed_; // looking a member up must not make it
    const Json::Value &path = object["path"];
    if (!object.isMember("event") || !object["event"].isConvertibleTo(Json::uintValue) ||
        !path.isString()) {
        return false;
    }
    event.path = path.asString();
    event.formerPath.clear();
    const Json::Value &formerPath = object["path_old"];
    if (object["event"].asUInt() == kMoved && formerPath.isConvertibleTo(Json::stringValue)) {
        event.formerPath = formerPath.asString();
    }
    return true;
}

} // namespace CTL
