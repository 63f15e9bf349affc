#ifndef FILEINDEX_FUZZ_JSON_GRAMMAR_H
#define FILEINDEX_FUZZ_JSON_GRAMMAR_H

#include <cstddef>
#include <cstdint>
#include <json/value.h>
#include <random>
#include <string>
#include <vector>

namespace VANO::FUZZ {

// Changes JSON texts by their grammar: values are replaced, members added, dropped and renamed,
// parts nested and copied, with the names and the numbers that the library's documents are made of.
// What comes out is JSON, but now and then something is put between its parts that is no JSON, or
// bytes are changed at will.
class JsonGrammar {
  public:
    explicit JsonGrammar(unsigned seed) : random_(seed) {}

    // A text near `text`, which need not be JSON, of at most `maxSize` bytes.
    std::string Mutate(const std::string &text, std::size_t maxSize);

    // `text` with a part of it replaced by a part of `other`.
    std::string Cross(const std::string &text, const std::string &other, std::size_t maxSize);

    // Bytes changed at will, by libFuzzer's own means.
    static std::string MutateBytes(std::string bytes, std::size_t maxSize);

    // A number below `count`, and true once in so many times.
    std::size_t Below(std::size_t count);
    bool OnceIn(unsigned times) { return Below(times) == 0; }

  private:
    // A place in a document: where the value stands, and what it stands in.
    struct Place {
        Json::Value *value;
        Json::Value *parent; // null for the whole document
        std::string key;     // in an object
    };

    static void Collect(std::vector<Place> &places, const Place &place);
    Place Pick(Json::Value &document);
    void Change(Json::Value &document);
    void ChangeValue(Json::Value &value);
    void ChangeMembers(Json::Value &value);
    void Nest(Json::Value &value);
    void Rename(const Place &place);
    std::string Escape(std::string text);
    std::string Spoil(std::string text);
    Json::Value NewValue();
    std::string NewText();

    std::mt19937 random_;
};

} // namespace VANO::FUZZ

#endif
