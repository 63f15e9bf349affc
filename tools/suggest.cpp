#include "suggest.h"

#include <algorithm>

namespace CTL {

namespace {

std::size_t Distance(const std::string &a, const std::string &b) {
    // steps[i][j] leads from the first i letters of a to the first j of b.
    std::vector<std::vector<std::size_t>> steps(a.size() + 1,
                                                std::vector<std::size_t>(b.size() + 1));
    for (std::size_t i = 0; i <= a.size(); ++i) {
        for (std::size_t j = 0; j <= b.size(); ++j) {
            if (i == 0 || j == 0) {
                steps[i][j] = i + j;
                continue;
            }
            const std::size_t change = a[i - 1] == b[j - 1] ? 0 : 1;
            steps[i][j] =
                std::min({steps[i - 1][j] + 1, steps[i][j - 1] + 1, steps[i - 1][j - 1] + change});
            if (i > 1 && j > 1 && a[i - 1] == b[j - 2] && a[i - 2] == b[j - 1]) {
                steps[i][j] = std::min(steps[i][j], steps[i - 2][j - 2] + 1);
            }
        }
    }
    return steps[a.size()][b.size()];
}

} // namespace

std::string Nearest(const std::string &typed, const std::vector<std::string> &words) {
    constexpr std::size_t kLongest = 32; // nobody mistypes more than that into a command
    if (typed.size() > kLongest) {
        return {};
    }
    std::string nearest;
    std::size_t least =
        std::max<std::size_t>(2, typed.size() / 3 + 1); // further away it is another word
    for (const std::string &word : words) {
        if (typed.size() > 1 && word.compare(0, typed.size(), typed) == 0) {
            return word;
        }
        const std::size_t distance = Distance(typed, word);
        if (distance < least) {
            least = distance;
            nearest = word;
        }
    }
    return nearest;
}

} // namespace CTL
