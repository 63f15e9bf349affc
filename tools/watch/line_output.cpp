#include "watch/line_output.h"

#include <iostream>

#include "terminal/output.h"
#include "terminal/text.h"
#include "terminal/times.h"
#include "watch/service_text.h"

namespace CTL {

namespace {

std::string TextOf(const WatchedState &state, std::size_t share) {
    const ShareState &shown = state.service.shares[share];
    std::string text = PendingText(shown.pending) + " pending";
    if (shown.pending.value_or(0) > 0) {
        text += ", " + PercentText(state.progress[share]);
    }
    const std::string outlook = OutlookText(state.service, shown, state.progress[share]);
    return outlook.empty() ? text : text + ", " + outlook;
}

} // namespace

bool LineOutput::Show(const WatchedState &state) {
    const std::string stamp = StampText(state.service.now);
    ShowChange(stamp, "daemon", NameOf(state.service.daemon));
    ShowChange(stamp, "indexing", PauseTextOf(state.service));
    for (std::size_t i = 0; i < state.service.shares.size(); ++i) {
        ShowChange(stamp, "share " + Shown(state.service.shares[i].name), TextOf(state, i));
    }
    return static_cast<bool>(std::cout.flush());
}

void LineOutput::ShowChange(const std::string &stamp, const std::string &what,
                            const std::string &text) {
    std::string &last = last_[what];
    if (last != text) {
        std::cout << stamp << "  " << what << "  " << text << '\n';
        last = text;
    }
}

bool JsonOutput::Show(const WatchedState &state) {
    Json::Value object = JsonOf(state.service);
    object["time"] = Json::Int64{state.service.now};
    for (std::size_t i = 0; i < state.service.shares.size(); ++i) {
        Json::Value &share = object["share"][static_cast<Json::ArrayIndex>(i)];
        const std::optional<long long> left = state.progress[i].SecondsLeft();
        share["done"] =
            share["pending"].isNull() ? Json::Value() : Json::Value(state.progress[i].Fraction());
        share["seconds_left"] = left ? Json::Value(Json::Int64{*left}) : Json::Value();
    }
    PrintJson(object, JsonMode::kShort);
    return static_cast<bool>(std::cout.flush());
}

} // namespace CTL
