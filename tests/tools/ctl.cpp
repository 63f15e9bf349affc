#include "tools/ctl.h"

#include <csignal>
#include <sys/stat.h>

namespace VANO::TESTS {

namespace {

constexpr char kService[] = "/etc/init.d/fileindexd";

} // namespace

Outcome Ctl(Words arguments) {
    arguments.insert(arguments.begin(), FILEINDEXCTL_PATH);
    return RunToEnd(arguments);
}

Outcome CtlAsNobody(const Words &arguments) {
    Words command = {"/usr/bin/setpriv", "--reuid=65534", "--regid=65534", "--clear-groups",
                     FILEINDEXCTL_PATH};
    command.insert(command.end(), arguments.begin(), arguments.end());
    return RunToEnd(command);
}

std::string CtlOnTerminal(const std::string &settings, const std::string &arguments) {
    const Outcome outcome =
        RunToEnd({"/usr/bin/script", "--quiet", "--return", "--command",
                  "env " + settings + " " FILEINDEXCTL_PATH " " + arguments, "/dev/null"});
    EXPECT_EQ(outcome.status, kDone) << outcome.out;
    return outcome.out;
}

void CtlTest::SetUp() {
    for (const char *path :
         {kFolders, kStatus, kMonitors, kPeerOut, kSocket, "/volume1/photos", "/volume2/media"}) {
        RemoveTree(path);
    }
    PutFile(kShares, R"({"photos":"/volume1/photos","media":"/volume2/media"})");
    MakeDirs("/volume1/photos/2016");
    MakeDirs("/volume2/media/films");
    PutFile(kService, "#!/bin/sh\n"
                      "### BEGIN INIT INFO\n"
                      "# Provides:          fileindexd\n"
                      "# Required-Start:    $remote_fs\n"
                      "# Required-Stop:     $remote_fs\n"
                      "# Default-Start:     2 3 4 5\n"
                      "# Default-Stop:      0 1 6\n"
                      "### END INIT INFO\n");
    ASSERT_EQ(::chmod(kService, 0755), 0);
}

void CtlTest::StartDaemon(Words options) {
    options.insert(options.begin(), PEER_PATH);
    daemon_ = std::make_unique<Child>(options, kPeerOut, "/tmp/peer.err");
    ASSERT_TRUE(Eventually([] { return Exists(kSocket); }));
}

Words CtlTest::Told() {
    daemon_->Signal(SIGTERM);
    EXPECT_EQ(daemon_->Wait(), 0);
    return LinesOf(ReadText(kPeerOut));
}

} // namespace VANO::TESTS
