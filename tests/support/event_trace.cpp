#include "support/event_trace.h"

#include <map>
#include <mutex>
#include <optional>

#include "support/files.h"

namespace VANO::TESTS {

namespace {

struct Entry {
    std::string text;
    bool query;
};

struct State {
    std::mutex mutex;
    std::vector<Entry> entries;
    std::map<std::string, std::optional<std::string>> watched;
    std::vector<std::function<void()>> sources;
};

// Never destroyed: interposed functions run until the very end of the process.
State &GetState() {
    static State &state = *new State;
    return state;
}

void LookAtFiles(State &state) {
    const std::lock_guard<std::mutex> lock(state.mutex);
    for (auto &[path, before] : state.watched) {
        std::optional<std::string> now = ReadIfThere(path);
        if (now != before) {
            before = std::move(now);
            state.entries.push_back({"file: " + path, false});
        }
    }
}

} // namespace

EventTrace &EventTrace::Get() {
    static EventTrace &trace = *new EventTrace;
    return trace;
}

void EventTrace::Poll() {
    if (KitScope::IsActive()) {
        return;
    }
    const KitScope kit;
    State &state = GetState();
    LookAtFiles(state);
    std::vector<std::function<void()>> sources;
    {
        const std::lock_guard<std::mutex> lock(state.mutex);
        sources = state.sources;
    }
    for (const auto &poll : sources) {
        poll();
    }
}

void EventTrace::Add(std::string entry, bool query) {
    Poll();
    State &state = GetState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    state.entries.push_back({std::move(entry), query});
}

void EventTrace::AddPolled(std::string entry) {
    State &state = GetState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    state.entries.push_back({std::move(entry), false});
}

std::vector<std::string> EventTrace::Texts(bool queriesToo) {
    Poll();
    State &state = GetState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    std::vector<std::string> texts;
    for (const Entry &entry : state.entries) {
        if (queriesToo || !entry.query) {
            texts.push_back(entry.text);
        }
    }
    return texts;
}

void EventTrace::Clear() {
    Poll();
    State &state = GetState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    state.entries.clear();
    state.watched.clear();
}

void EventTrace::WatchFile(const std::string &path) {
    const KitScope kit;
    State &state = GetState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    state.watched[path] = ReadIfThere(path);
}

void EventTrace::AddSource(std::function<void()> poll) {
    State &state = GetState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    state.sources.push_back(std::move(poll));
}

} // namespace VANO::TESTS
