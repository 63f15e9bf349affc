// Adds one folder for photo indexing.

#include <fileindex/error_handler.h>
#include <fileindex/index_mgr.h>
#include <iostream>

using VANO::FILEINDEX::ErrorHandler;
using VANO::FILEINDEX::IndexMgr;

int main(int argc, char **argv) {
    if (argc != 2) {
        std::cerr << "Usage: " << argv[0] << " SHARE_PATH\n";
        return 2;
    }
    Json::Value folder(Json::objectValue);
    folder["path"] = argv[1];
    folder["photo"] = true;
    Json::Value request(Json::arrayValue);
    request.append(folder);

    if (!IndexMgr::Upsert(request)) {
        std::cerr << "Cannot add " << argv[1] << ", error " << ErrorHandler::GetError()
                  << "; the system log tells more\n";
        return 1;
    }
    std::cout << argv[1] << " is indexed\n";
    return 0;
}
