// What counts as an event is what the JSON library says, whoever reads the line. The readers are
// hidden in the library: they are linked a second time.

#include "core/event.h"

#include <memory>

#include "base/json_io.h"
#include "support/fixture.h"
#include "support/json_texts.h"

namespace VANO::TESTS {

namespace {

struct Decision {
    bool isEvent = false;
    unsigned int code = 0;
    std::string path;
    std::string formerPath;

    bool operator==(const Decision &other) const {
        return isEvent == other.isEvent && code == other.code && path == other.path &&
               formerPath == other.formerPath;
    }
};

void PrintTo(const Decision &decision, std::ostream *out) {
    if (!decision.isEvent) {
        *out << "no event";
        return;
    }
    *out << "event " << decision.code << " of " << ::testing::PrintToString(decision.path)
         << ", former path " << ::testing::PrintToString(decision.formerPath);
}

Decision DecideWithLibrary(JsonParser &parser, const std::string &line) {
    Json::Value event;
    if (!parser.ParseWithLibrary(event, line) || !event.isObject() || !event.isMember("event") ||
        !event["event"].isConvertibleTo(Json::uintValue) || !event["path"].isString()) {
        return {};
    }
    const Json::Value &formerPath = event["path_old"];
    const bool isMove = event["event"].asUInt() == 256;
    return {true, event["event"].asUInt(), event["path"].asString(),
            isMove && formerPath.isConvertibleTo(Json::stringValue) ? formerPath.asString() : ""};
}

Decision DecisionOf(bool isEvent, const QueueEvent &event) {
    return isEvent
               ? Decision{true, event.code, std::string(event.path), std::string(event.formerPath)}
               : Decision{};
}

// A line in memory of its very size, so that a sanitizer sees any byte read beyond it.
class ExactCopy {
  public:
    explicit ExactCopy(const std::string &text)
        : bytes_(new char[text.size()]), size_(text.size()) {
        text.copy(bytes_.get(), size_);
    }
    [[nodiscard]] std::string_view View() const { return {bytes_.get(), size_}; }

  private:
    std::unique_ptr<char[]> bytes_;
    std::size_t size_;
};

class EventTest : public LibraryTest {};

TEST_F(EventTest, EveryLineIsDecidedAsTheJsonLibraryDecidesIt) {
    JsonTexts texts(20170401);
    JsonParser parser;
    EventParser reader;
    const std::size_t count = TextCount();
    std::size_t events = 0;
    std::size_t plain = 0;
    for (std::size_t number = 0; number < count; ++number) {
        const std::string line = texts.Event();
        const ExactCopy copy(line);
        const Decision expected = DecideWithLibrary(parser, line);
        QueueEvent event{};
        const bool isEvent = reader.Parse(event, copy.View());
        ASSERT_EQ(DecisionOf(isEvent, event), expected)
            << "line " << number << ": " << ::testing::PrintToString(line);
        events += expected.isEvent ? 1 : 0;
        plain += ReadPlainEvent(event, copy.View()) ? 1 : 0;
    }
    // The texts are of every kind.
    EXPECT_GT(plain, count / 10);
    EXPECT_GT(events - plain, count / 100);
    EXPECT_GT(count - events, count / 10);
}

TEST_F(EventTest, UsualEventsNeedNoJsonLibrary) {
    const char *const kLines[] = {
        R"({"event":2,"path":"/volume1/photos/ü.jpg"})",
        R"({"event":256,"path":"/volume1/a","path_old":"/volume1/b"})",
        R"({"data":null,"event":65536,"path":"/volume1/a"})",
        R"({"data":{"audio":true,"document":false},"event":131072,"path":"/volume1/a"})",
        R"({"event": 2, "path": "/volume1/a", "data": [ 1, "x", -2 ] })"};
    for (const char *line : kLines) {
        QueueEvent event{};
        EXPECT_TRUE(ReadPlainEvent(event, line)) << line;
    }
}

TEST_F(EventTest, ALineIsWhatTheJsonLibraryWrites) {
    JsonTexts texts(20170402);
    std::vector<Json::Value> values;
    for (std::size_t number = 0; number < 2000; ++number) {
        Json::Value value;
        if (JsonFromString(value, texts.Settings())) {
            values.push_back(value);
        }
    }
    ASSERT_GT(values.size(), 500U);
    std::string bytes; // each alone, and all in one path
    for (int byte = 0; byte < 256; ++byte) {
        bytes += static_cast<char>(byte);
    }
    for (std::size_t number = 0; number < values.size(); ++number) {
        Json::Value object(Json::objectValue);
        object["event"] = static_cast<int>(number) - 100;
        object["path"] = number < 256 ? bytes.substr(number, 1) : number == 256 ? bytes : "/v/a";
        object["data"] = values[number];
        ASSERT_EQ(FILEINDEX::EventLine(object["event"].asInt(), object["path"].asString(),
                                       object["data"]),
                  JsonToString(object) + "\n");
    }
}

} // namespace

} // namespace VANO::TESTS
