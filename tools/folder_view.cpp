#include "folder_view.h"

namespace CTL {

Json::Value AdditionalKeys() {
    Json::Value keys(Json::arrayValue);
    keys.append("status");
    keys.append("is_valid");
    return keys;
}

std::string TypesOf(const Json::Value &folder) {
    std::string types;
    for (const char *type : {"document", "audio", "video", "photo"}) {
        if (folder[type].asBool()) {
            types += (types.empty() ? "" : ",") + std::string(type);
        }
    }
    return types;
}

std::string StatusOf(const Json::Value &folder) {
    const Json::Value &facts = folder["additional"];
    const std::string status = facts["status"].asString();
    if (!facts["is_valid"].asBool()) {
        return "cannot be indexed";
    }
    return status == "err_no_space" ? "out of space" : status;
}

} // namespace CTL
