#include "support/appliance.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include "support/files.h"

namespace VANO::TESTS {

namespace {

constexpr char kMetadataDirectory[] = "/@eaDir";

void EmptyDirectory(const std::string &path) {
    MakeDirs(path);
    for (const std::string &name : NamesIn(path)) {
        RemoveTree(path + "/" + name);
    }
}

} // namespace

std::string QueueOf(const std::string &directory) {
    return directory + kMetadataDirectory + "/" + kQueueName;
}

std::string TakenOf(const std::string &directory) {
    return QueueOf(directory) + ".tmp";
}

std::string DatabaseOf(const std::string &directory) {
    return directory + kMetadataDirectory + "/VANO@.fileindexdb";
}

std::string EventLine(const std::string &path, int code) {
    return R"({"data":null,"event":)" + std::to_string(code) + R"(,"path":")" + path + "\"}\n";
}

void EmptyAppliance() {
    for (const char *directory : {"/usr/vano/etc", "/usr/vano/bin", "/volume1", "/volume2"}) {
        EmptyDirectory(directory);
    }
    MakeDirs(kSettingsDirectory);
    for (const char *path : {kFolderLock, kStatusLock, kDaemonSocket}) {
        RemoveTree(path);
    }
}

void PutShares(const std::map<std::string, std::string> &directories,
               const std::vector<std::string> &folders) {
    Json::Value table(Json::objectValue);
    for (const auto &[name, directory] : directories) {
        table[name] = directory;
        MakeDirs(directory + kMetadataDirectory);
        for (const std::string &folder : folders) {
            MakeDirs(directory + "/" + folder);
        }
    }
    PutFile(kShareTable, CompactText(table));
}

void PutProgram(const std::string &path, const std::string &shellText) {
    PutFile(path, "#!/bin/sh\n" + shellText);
    EXPECT_EQ(::chmod(path.c_str(), 0755), 0) << path;
}

} // namespace VANO::TESTS
