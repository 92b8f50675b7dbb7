#include "SubscriptionRecords.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <nlohmann/json.hpp>
#include <stdexcept>
#include <system_error>

#include "zrcommon/File.h"
#include "zrcommon/UniqueFd.h"

namespace cimom::wbem {

namespace {

using nlohmann::json;

constexpr int formOfFile = 1;

json jsonOf(const FilterRecord& filter) {
    return {{"name", filter.name},
            {"creator", filter.creator},
            {"query", filter.query},
            {"language", filter.language},
            {"sourceNamespaces", filter.sourceNameSpaces},
            {"elementName", filter.elementName}};
}

json jsonOf(const DestinationRecord& destination) {
    return {{"id", destination.id},
            {"name", destination.name},
            {"creator", destination.creator},
            {"destination", destination.url},
            {"persistenceType", static_cast<unsigned>(destination.persistence)},
            {"elementName", destination.elementName},
            {"created", destination.created}};
}

json jsonOf(const SubscriptionRecord& subscription) {
    return {{"filter", subscription.filter},
            {"destination", subscription.destination},
            {"creator", subscription.creator},
            {"onFatalErrorPolicy", static_cast<unsigned>(subscription.policy)},
            {"state", static_cast<unsigned>(subscription.state)},
            {"duration", subscription.duration ? json(*subscription.duration) : json(nullptr)},
            {"info", subscription.info},
            {"started", subscription.started},
            {"stateChanged", subscription.stateChanged}};
}

template <typename Record>
json jsonOfAll(const std::vector<Record>& records) {
    json all = json::array();
    for (const Record& record : records) {
        all.push_back(jsonOf(record));
    }
    return all;
}

/// A value of an enumeration that has `values`.
template <typename Enumeration>
Enumeration oneOf(const json& value, std::initializer_list<Enumeration> values) {
    const auto number = value.get<unsigned>();
    for (const Enumeration each : values) {
        if (static_cast<unsigned>(each) == number) {
            return each;
        }
    }
    throw std::runtime_error("a value that there is not: " + std::to_string(number));
}

void read(const json& from, FilterRecord& filter) {
    filter = {from.at("name"),     from.at("creator"),          from.at("query"),
              from.at("language"), from.at("sourceNamespaces"), from.at("elementName")};
}

void read(const json& from, DestinationRecord& destination) {
    destination = {
        from.at("id"),
        from.at("name"),
        from.at("creator"),
        from.at("destination"),
        oneOf(from.at("persistenceType"), {Persistence::permanent, Persistence::transient}),
        from.at("elementName"),
        from.at("created")};
}

void read(const json& from, SubscriptionRecord& subscription) {
    subscription = {
        from.at("filter"),
        from.at("destination"),
        from.at("creator"),
        oneOf(from.at("onFatalErrorPolicy"),
              {ErrorPolicy::ignore, ErrorPolicy::disable, ErrorPolicy::remove}),
        oneOf(from.at("state"), {SubscriptionState::enabled, SubscriptionState::disabled}),
        std::nullopt,
        from.at("info"),
        from.at("started"),
        from.at("stateChanged")};
    if (!from.at("duration").is_null()) {
        subscription.duration = from.at("duration").get<std::uint64_t>();
    }
}

template <typename Record>
void readAll(const json& from, std::vector<Record>& records) {
    if (!from.is_array()) {
        throw std::runtime_error("a list is missing");
    }
    for (const json& each : from) {
        read(each, records.emplace_back());
    }
}

template <typename Record>
bool hasName(const std::vector<Record>& records, const std::string& name) {
    return std::count_if(records.begin(), records.end(),
                         [&name](const Record& record) { return record.name == name; }) == 1;
}

/// What the server relies on.
void check(const SubscriptionRecords& records) {
    const auto require = [](bool holds, const std::string& what) {
        if (!holds) {
            throw std::runtime_error(what);
        }
    };
    for (const FilterRecord& filter : records.filters) {
        require(hasName(records.filters, filter.name), "two filters \"" + filter.name + '"');
    }
    for (const DestinationRecord& destination : records.destinations) {
        require(hasName(records.destinations, destination.name),
                "two destinations \"" + destination.name + '"');
        require(destination.id < records.nextId, "an id that is to be given yet");
    }
    for (const SubscriptionRecord& subscription : records.subscriptions) {
        require(hasName(records.filters, subscription.filter),
                "no filter \"" + subscription.filter + '"');
        require(hasName(records.destinations, subscription.destination),
                "no destination \"" + subscription.destination + '"');
    }
}

[[noreturn]] void failWriting(const std::filesystem::path& file) {
    throw std::system_error(errno, std::generic_category(), file.string());
}

}  // namespace

std::string toJson(const SubscriptionRecords& records) {
    const json all{{"form", formOfFile},
                   {"nextId", records.nextId},
                   {"filters", jsonOfAll(records.filters)},
                   {"destinations", jsonOfAll(records.destinations)},
                   {"subscriptions", jsonOfAll(records.subscriptions)}};
    // Texts of clients may hold anything; what is not UTF-8 is replaced.
    return all.dump(2, ' ', false, json::error_handler_t::replace) + '\n';
}

SubscriptionRecords subscriptionRecords(std::string_view text) {
    try {
        const json all = json::parse(text);
        if (all.at("form") != formOfFile) {
            throw std::runtime_error("it is of another form");
        }
        SubscriptionRecords records;
        records.nextId = all.at("nextId");
        readAll(all.at("filters"), records.filters);
        readAll(all.at("destinations"), records.destinations);
        readAll(all.at("subscriptions"), records.subscriptions);
        check(records);
        return records;
    } catch (const json::exception& error) {
        throw std::runtime_error(error.what());
    }
}

void writeRecords(const std::filesystem::path& file, const SubscriptionRecords& records) {
    std::filesystem::path made = file;
    made += ".new";
    const std::string text = toJson(records);
    const ZR::UniqueFd fd(::open(made.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600));
    if (!fd) {
        failWriting(made);
    }
    std::string_view rest = text;
    while (!rest.empty()) {
        const ssize_t done = ::write(fd.get(), rest.data(), rest.size());
        if (done < 0 && errno != EINTR) {
            failWriting(made);
        }
        rest.remove_prefix(done < 0 ? 0 : static_cast<std::size_t>(done));
    }
    // Without fsync the new name could stand for an empty file after a loss of power.
    if (::fsync(fd.get()) != 0 || ::rename(made.c_str(), file.c_str()) != 0) {
        failWriting(file);
    }
}

std::optional<SubscriptionRecords> readRecords(const std::filesystem::path& file) {
    constexpr std::size_t longest = 64U << 20U;
    struct stat status {};
    if (::stat(file.c_str(), &status) != 0) {
        if (errno == ENOENT) {
            return std::nullopt;
        }
        throw std::runtime_error(std::strerror(errno));
    }
    // What stands in it makes the server send requests.
    if ((status.st_mode & (S_IWGRP | S_IWOTH)) != 0 ||
        (status.st_uid != ::geteuid() && status.st_uid != 0)) {
        throw std::runtime_error("others than its owner may write it");
    }
    const auto content = ZR::File::read(file.string(), longest);
    if (!content) {
        throw std::runtime_error(std::strerror(errno));
    }
    return subscriptionRecords(*content);
}

}  // namespace cimom::wbem
