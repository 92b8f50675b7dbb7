#include "query/LikePattern.h"

#include <algorithm>
#include <string_view>

#include "cimom/Utf8.h"

namespace cimom {

namespace {

/// A byte that does not belong to UTF-8 counts as a character of its own.
std::vector<char32_t> charactersOf(std::string_view text) {
    std::vector<char32_t> characters;
    characters.reserve(text.size());
    for (std::size_t offset = 0; offset < text.size();) {
        const Utf8Character next = readUtf8(text, offset);
        constexpr char32_t beyondUnicode = 0x200000;
        characters.push_back(next.length == 0
                                 ? beyondUnicode + static_cast<unsigned char>(text[offset])
                                 : next.value);
        offset += std::max<std::size_t>(next.length, 1);
    }
    return characters;
}

}  // namespace

LikePattern LikePattern::ofWql(std::string_view pattern) {
    Sequence sequence;
    for (const char32_t character : charactersOf(pattern)) {
        const bool several = character == U'%';
        sequence.push_back({character, several || character == U'_', several});
    }
    LikePattern made;
    made.alternatives_.push_back(std::move(sequence));
    return made;
}

std::optional<LikePattern> LikePattern::ofCql(std::string_view pattern) {
    constexpr std::u32string_view others = U"[](){}+?^$";
    LikePattern made;
    made.alternatives_.emplace_back();
    bool escaped = false;
    for (const char32_t character : charactersOf(pattern)) {
        Sequence& sequence = made.alternatives_.back();
        if (escaped) {
            sequence.push_back({character});
            escaped = false;
        } else if (character == U'\\') {
            escaped = true;
        } else if (character == U'|') {
            made.alternatives_.emplace_back();
        } else if (character == U'*') {
            if (sequence.empty()) {
                return std::nullopt;
            }
            sequence.back().repeat = true;
        } else if (others.find(character) != std::u32string_view::npos) {
            return std::nullopt;
        } else {
            sequence.push_back({character, character == U'.', false});
        }
    }
    if (escaped) {
        return std::nullopt;
    }
    return made;
}

bool LikePattern::matches(std::string_view text) const {
    const std::vector<char32_t> characters = charactersOf(text);
    return std::ranges::any_of(alternatives_, [&characters](const Sequence& sequence) {
        return matches(sequence, characters);
    });
}

bool LikePattern::matches(const Sequence& sequence, const std::vector<char32_t>& characters) {
    // reached[i]: the items before i have taken all characters so far. All ways are gone at
    // once, since to try them one after the other may take for ever.
    std::vector<bool> reached(sequence.size() + 1);
    const auto passRepeats = [&] {
        for (std::size_t i = 0; i < sequence.size(); ++i) {
            if (reached[i] && sequence[i].repeat) {
                reached[i + 1] = true;
            }
        }
    };
    reached[0] = true;
    passRepeats();
    std::vector<bool> before;
    for (const char32_t character : characters) {
        before = reached;
        reached.assign(reached.size(), false);
        for (std::size_t i = 0; i < sequence.size(); ++i) {
            if (before[i] && (sequence[i].any || sequence[i].character == character)) {
                reached[sequence[i].repeat ? i : i + 1] = true;
            }
        }
        passRepeats();
    }
    return reached.back();
}

}  // namespace cimom
