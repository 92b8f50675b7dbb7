#pragma once

#include <cstdint>
#include <string>
#include <utility>

namespace ZR {

/// One thing that was not to be had, or that is not as it looks, in a sentence for people.
struct Diagnostic {
    enum class Kind : std::uint8_t {
        Unreadable,  ///< could not be read, or not for certain
        Denied,      ///< this user may not read it
        Damaged,     ///< was read, and is not of its form; names the file and the place in it
        Untrusted,   ///< was read, and is not believed: others could have written or started it
        NotApplied,  ///< a configuration asks for DHCP, and nothing executes it
        LeaseEnded,  ///< a lease has ended or was lost, and no client asks for another one
        ClientGone,  ///< a lease whose client does not run: nothing will renew it
        Note,        ///< anything else that a reader of the tree should know
    };

    explicit Diagnostic(std::string sentence, Kind what = Kind::Unreadable)
        : kind(what), text(std::move(sentence)) {}

    Kind kind;
    std::string text;

    bool operator==(const Diagnostic&) const = default;
};

}  // namespace ZR
