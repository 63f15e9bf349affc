#ifndef FILEINDEX_BASE_FILE_IO_H
#define FILEINDEX_BASE_FILE_IO_H

#include <cstddef>
#include <string>
#include <string_view>

namespace VANO::FILEINDEX {

// Reads a regular file of at most `maxBytes` bytes whole. A final symbolic link is followed; a
// directory, FIFO, socket or device is refused (EINVAL) and a larger file too (EFBIG), so a call
// neither blocks nor reads without end. On failure returns false with errno set; `text` is then
// unspecified.
[[nodiscard]] bool ReadFile(std::string &text, const std::string &path, std::size_t maxBytes);

// Makes `text` the whole content of the file `path`, creating it (mode 0644) when missing.
//
// The file is replaced atomically and durably: a temporary file beside it is written, given the old
// file's owner and mode, flushed and renamed over it, then the directory is flushed.
// A reader sees the old text or the new one; a full disk or a killed process leaves the old one.
// Where a file cannot be replaced (it is no regular file, its directory refuses new files, it is a
// mount point, its owner cannot be given) it is rewritten in place, and put back when that fails.
//
// On failure returns false with errno set, the old text standing and no other file left behind.
[[nodiscard]] bool WriteFile(const std::string &path, std::string_view text);

} // namespace VANO::FILEINDEX

#endif
