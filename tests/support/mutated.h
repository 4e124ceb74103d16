#pragma once

#include <random>
#include <string>

namespace pells_test {

/// The text after a few characters or pieces were lost, doubled or put in, some of them
/// interesting.
inline std::string mutated(std::string text, const std::string& interesting, std::mt19937& random) {
    const auto below = [&random](std::size_t bound) { return random() % bound; };
    for (std::size_t left = 1 + below(3); left > 0; --left) {
        const std::size_t at = below(text.size() + 1);
        const std::size_t other = below(text.size() + 1);
        const char byte = interesting[below(interesting.size())];
        switch (below(5)) {
            case 0:
                text.erase(at, 1 + below(6));
                break;
            case 1:
                text.insert(at, text.substr(other, 1 + below(20)));
                break;
            case 2:
                text.insert(at, 1 + below(2), byte);
                break;
            case 3:
                text.resize(below(4) == 0 ? at : text.size());
                break;
            default:
                text.replace(at, 1, 1, byte);
        }
    }
    return text;
}

}  // namespace pells_test
