// The input is what somebody writes to the daemon's command socket before closing it.
//
// The indexing peer hands out exactly the well-formed commands and refuses everything else; a
// command that it handed out is sent by the library, and read, as the same one again.

#include <cstring>
#include <fileindex/daemon_socket.h>
#include <json/reader.h>
#include <memory>
#include <sys/socket.h>
#include <unistd.h>

#include "base/unique_fd.h"
#include "indexing_peer/command_socket.h"
#include "indexing_peer/json_text.h"
#include "indexing_peer/pause_state.h"
#include "support/appliance.h"
#include "support/check.h"
#include "support/json_grammar.h"
#include "support/naive.h"
#include "support/sockets.h"
#include "support/world.h"

namespace {

using namespace VANO::FUZZ;
using VANO::FILEINDEX::UniqueFd;
using VANO::TESTS::CommandBytes;
using VANO::TESTS::ConnectTo;

constexpr std::size_t kLengthBytes = sizeof(std::uint32_t);

struct Command {
    std::string type;
    Json::Value data;
};

// The JSON text of a whole message; none for anything else.
std::optional<std::string> TextIn(const std::string &bytes) {
    std::uint32_t length = 0;
    if (bytes.size() <= kLengthBytes) {
        return std::nullopt;
    }
    std::memcpy(&length, bytes.data(), kLengthBytes);
    if (length == 0 || length > bytes.size() - kLengthBytes ||
        bytes[kLengthBytes + length - 1] != '\0') {
        return std::nullopt;
    }
    return bytes.substr(kLengthBytes, length - 1);
}

std::optional<Command> CommandIn(const Json::Value &value) {
    if (!value.isObject() || !value["type"].isString() || !value.isMember("data")) {
        return std::nullopt;
    }
    return Command{value["type"].asString(), value["data"]};
}

// With the comments and commas that the JSON library lets pass, but without repeated members.
std::optional<Json::Value> ParseLeniently(const std::string &text) {
    Json::CharReaderBuilder builder;
    builder["failIfExtra"] = true;
    builder["rejectDupKeys"] = true;
    const std::unique_ptr<Json::CharReader> reader(builder.newCharReader());
    Json::Value value;
    try {
        return reader->parse(text.data(), text.data() + text.size(), &value, nullptr)
                   ? std::optional(value)
                   : std::nullopt;
    } catch (const Json::Exception &) { // nested too deep
        return std::nullopt;
    }
}

class Peer {
  public:
    Peer() {
        std::string reason;
        Check(socket_.Listen(reason), "the peer can listen", reason);
    }

    // What the peer makes of one connection: the command, or none when it refused it.
    std::optional<Command> Work() {
        std::optional<Command> command;
        int answers = 0;
        socket_.Work(
            [&](const std::string &type, const Json::Value &data) {
                command = Command{type, data};
                ++answers;
            },
            [&](const std::string &reason) {
                Check(!reason.empty(), "a refusal has a reason");
                ++answers;
            });
        Check(answers == 1, "a connection that is closed is answered for once");
        return command;
    }

  private:
    peer::CommandSocket socket_;
};

Peer &ThePeer() {
    static Peer &peer = *new Peer;
    return peer;
}

void Send(const std::string &bytes) {
    const UniqueFd connection(ConnectTo(VANO::TESTS::kDaemonSocket));
    Check(static_cast<bool>(connection), "the peer listens");
    Check(bytes.empty() || ::send(connection.Get(), bytes.data(), bytes.size(), MSG_NOSIGNAL) ==
                               static_cast<ssize_t>(bytes.size()),
          "a message fits the socket");
}

bool IsSame(const std::optional<Command> &a, const std::optional<Command> &b) {
    return a.has_value() == b.has_value() && (!a || (a->type == b->type && a->data == b->data));
}

// The peer may be stricter about repeated members and zero bytes, and laxer about commas, than the
// library.
void CheckAnswer(const std::string &bytes, const std::optional<Command> &command) {
    const std::optional<std::string> text = TextIn(bytes);
    const auto lenient = text ? ParseLeniently(*text) : std::nullopt;
    if (command) {
        Check(lenient && IsSame(CommandIn(*lenient), command), "only commands are handed out");
    } else if (lenient && Parse(*text) && text->find('\0') == std::string::npos) {
        Check(!CommandIn(*lenient), "no well-formed command is refused", *text);
    }
}

} // namespace

// The JSON text inside the frame is changed by the grammar, now and then the frame too.
extern "C" std::size_t LLVMFuzzerCustomMutator(std::uint8_t *data, std::size_t size,
                                               std::size_t maxSize, unsigned seed) {
    const std::string bytes(reinterpret_cast<const char *>(data), size);
    JsonGrammar grammar(seed);
    std::string mutated;
    if (grammar.OnceIn(8) || size <= kLengthBytes || maxSize < 64) {
        mutated = JsonGrammar::MutateBytes(bytes, maxSize);
    } else {
        std::string text = bytes.substr(kLengthBytes, bytes.size() - kLengthBytes - 1);
        mutated = CommandBytes(grammar.Mutate(text, maxSize - kLengthBytes - 1));
    }
    return static_cast<std::size_t>(std::copy(mutated.begin(), mutated.end(), data) - data);
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
    VANO::TESTS::RequireSandbox();
    Peer &peer = ThePeer();
    const Descriptors descriptors;
    const std::string bytes(reinterpret_cast<const char *>(data), size);
    Send(bytes);
    const std::optional<Command> command = peer.Work();
    CheckAnswer(bytes, command);
    if (command) {
        peer::PauseState pause;
        pause.Follow(command->type, command->data);
        (void)pause.IsPaused();
        Check(VANO::FILEINDEX::SendCammandToDaemon(command->type, command->data),
              "the library sends any command");
        Check(IsSame(peer.Work(), command), "and the peer reads it as it was", command->type);
    }
    Check(Lines(peer::OneLine(bytes)).size() <= 1, "what is printed is one line");
    descriptors.CheckNoneLeft();
    return 0;
}
