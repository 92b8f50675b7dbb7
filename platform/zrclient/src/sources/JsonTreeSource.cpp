#include "sources/JsonTreeSource.h"

#include <cerrno>
#include <cstddef>
#include <exception>
#include <utility>
#include <variant>

#include "sources/JsonTree.h"
#include "tklogger/TKLogger.h"
#include "zrclient/TreeFile.h"
#include "zrcommon/BuiltSources.h"
#include "zrcommon/File.h"
#include "zrcommon/LogLevel.h"
#include "zrcommon/SystemName.h"

namespace ZR {

namespace {

/// Some 15,000 interfaces: as much as can be read in the time that a source has.
constexpr std::size_t largestFile = std::size_t{10} << 20U;

/// Whether what made the reading fail lies in the file, so that the watch tells
/// when it may be over. Too many open files, or a directory without permission,
/// come to an end unseen. A build that does not read trees does not use it.
[[maybe_unused]] bool isOfTheFile(int error) {
    return error == ENOENT || error == ENOTDIR || error == EISDIR || error == EINVAL ||
           error == EFBIG;
}

}  // namespace

JsonTreeSource::JsonTreeSource(const std::string& path, std::string name)
    : watch_(path), name_(std::move(name)), empty_(SnapshotBuilder().build()) {}

bool JsonTreeSource::changed() {
    // No file tells when the machine gets a name.
    return readAgain_ || watch_.changed() || (nameless_ && !getSystemName().empty());
}

ChangeSigns JsonTreeSource::signs() {
    ChangeSigns signs{.descriptor = watch_.sign(), .askAt = std::nullopt};
    if (readAgain_ || nameless_ || !signs.descriptor) {
        signs.askNoLaterThan(std::chrono::steady_clock::now() + slowest);
    }
    return signs;
}

std::shared_ptr<const Snapshot> JsonTreeSource::read() {
    try {
        readAgain_ = false;
        watch_.subscribe();
        return tryToRead();
    } catch (const std::exception& error) {
        // Out of memory, in the main: the machine shows nothing until there is some.
        readAgain_ = true;
        try {
            return unusable(std::string(": ") + error.what());
        } catch (const std::exception&) {  // NOLINT(bugprone-empty-catch)
            // Without memory for a message there is none.
        }
        return empty_;
    }
}

std::shared_ptr<const Snapshot> JsonTreeSource::tryToRead() {
    if constexpr (Built::has("json-tree")) {
        const auto text = File::read(watch_.path(), largestFile);
        if (!text) {
            const int reason = errno;
            readAgain_ = !isOfTheFile(reason);
            return unusable(": " + reasonOf(reason));
        }
        const SystemName system = readSystemName();
        nameless_ = system.name.empty();
        JsonTree tree = parseJsonTree(*text, system.name, name_);
        if (const auto* fault = std::get_if<JsonTreeFault>(&tree)) {
            return unusable(":" + std::to_string(fault->line) + ":" +
                            std::to_string(fault->column) + ": " + fault->reason);
        }
        if (nameless_) {
            report(system.diagnostic);
        } else {
            lastReported_.clear();
        }
        return std::get<std::shared_ptr<const Snapshot>>(std::move(tree));
    } else {
        return unusable(": this build does not read trees");
    }
}

std::shared_ptr<const Snapshot> JsonTreeSource::unusable(const std::string& reason) {
    report(watch_.path() + reason);
    SnapshotBuilder builder;
    builder.diagnostic(Diagnostic{name_ + reason});
    return builder.build();
}

void JsonTreeSource::report(const std::string& message) {
    // When every request reads the file, the log would overflow with what it knows.
    if ((readAgain_ || watch_.isBlind()) && message == lastReported_) {
        return;
    }
    lastReported_ = message;
    TKLog::TKLogger::logLevelMessage("zrclient/JsonTreeSource", "read", __LINE__,
                                     "ZR.Instrumentation", LogLevel::failure, nullptr, 0, 0,
                                     message);
}

std::unique_ptr<SnapshotSource> openTreeFile(const std::string& path, std::string name) {
    return std::make_unique<JsonTreeSource>(path, std::move(name));
}

}  // namespace ZR
