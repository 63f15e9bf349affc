#include "doctor/process.h"

#include <fstream>

#include "terminal/text.h"

namespace CTL::DOCTOR {

namespace {

std::string FirstLine(pid_t pid, const char *file) {
    std::ifstream stream("/proc/" + std::to_string(pid) + "/" + file);
    std::string line;
    std::getline(stream, line);
    return line;
}

} // namespace

std::string ProcessName(pid_t pid) {
    const std::string name = pid > 0 ? FirstLine(pid, "comm") : "";
    return name.empty() ? "an unknown process" : Shown(name) + " (PID " + std::to_string(pid) + ")";
}

char ProcessState(pid_t pid) {
    // "123 (any name, also with brackets) S ..."
    const std::string line = pid > 0 ? FirstLine(pid, "stat") : "";
    const std::size_t end = line.rfind(')');
    return end == std::string::npos || end + 2 >= line.size() ? '\0' : line[end + 2];
}

} // namespace CTL::DOCTOR
