#ifndef FILEINDEX_TESTS_JSON_TEXTS_H
#define FILEINDEX_TESTS_JSON_TEXTS_H

#include <array>
#include <cstddef>
#include <initializer_list>
#include <random>
#include <string>
#include <string_view>

namespace VANO::TESTS {

// How many texts a differential test compares: FILEINDEX_TEXTS in the environment (which needs
// scripts/sandbox --keep-env), otherwise what takes a few seconds.
std::size_t TextCount();

// Endless JSON texts, and texts that nearly are: built from a grammar that knows what readers
// differ about (escapes, numbers, white space, repeated names, zero bytes, bytes that are not
// UTF-8), and half of them damaged. A seed gives the same texts everywhere.
class JsonTexts {
  public:
    explicit JsonTexts(unsigned int seed) : random_(seed) {}

    std::string Event();    // like a line of an event queue, without a newline
    std::string Settings(); // like a settings file

  private:
    std::size_t Below(std::size_t bound); // 0 to bound - 1
    bool Chance(std::size_t percent) { return Below(100) < percent; }
    std::string_view Pick(std::initializer_list<std::string_view> texts);

    std::string Space();
    std::string Character();
    std::string String();
    std::string Number();
    std::string Value(int depth);
    std::string Member(const std::string &name, const std::string &value);
    std::string Object(const std::string &members);
    std::string EventMember();
    std::string Folder();
    std::string Damaged(std::string text);

    std::mt19937 random_;
    bool odd_ = false; // whether this text may have what is unusual
};

} // namespace VANO::TESTS

#endif
