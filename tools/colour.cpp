#include "colour.h"

namespace CTL {

namespace {

const char *CodeOf(Colour colour) {
    switch (colour) {
    case Colour::kBold:
        return "\033[1m";
    case Colour::kGood:
        return "\033[32m";
    case Colour::kBad:
        return "\033[31m";
    case Colour::kPlain:
        break;
    }
    return "";
}

} // namespace

std::string Coloured(const std::string &text, Colour colour, bool hasColour) {
    return !hasColour || colour == Colour::kPlain ? text : CodeOf(colour) + text + "\033[0m";
}

} // namespace CTL
