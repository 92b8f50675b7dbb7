#pragma once

#include <chrono>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace cimom::wbem {

/// Of a query, decoded, in their order.
using PageArguments = std::vector<std::pair<std::string, std::string>>;

/// A page that a client asks for with GET or HEAD.
struct PageRequest {
    std::string path;
    PageArguments arguments;
    std::vector<std::pair<std::string, std::string>> headers;
    std::optional<std::string> authorization;  ///< the header of that name
    std::chrono::steady_clock::time_point arrived{};

    /// The values of all headers of that name, with commas between them; empty: there is none.
    [[nodiscard]] std::string header(std::string_view name) const;
};

struct Page {
    unsigned status = 200;
    std::string text;
    std::string contentType = "text/plain; charset=utf-8";
};

/// Makes the pages of a server. Called by several threads at once; what it throws becomes
/// a response with status 500.
using PageHandler = std::function<Page(const PageRequest&)>;

}  // namespace cimom::wbem
