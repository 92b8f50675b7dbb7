#include "sources/JsonTreeSource.h"

#include <cerrno>
#include <cstddef>
#include <exception>
#include <system_error>
#include <utility>
#include <variant>

#include "sources/JsonTree.h"
#include "tklogger/TKLogger.h"
#include "zrcommon/File.h"
#include "zrcommon/SystemName.h"

namespace ZR {

namespace {

/// Some 15,000 interfaces: as much as can be read in the time that a source has.
constexpr std::size_t largestFile = std::size_t{10} << 20U;

/// Whether what made the reading fail lies in the file, so that the watch tells
/// when it may be over. Too many open files, or a directory that lets nobody in,
/// come to an end unseen.
bool isOfTheFile(int error) {
    return error == ENOENT || error == ENOTDIR || error == EISDIR || error == EINVAL ||
           error == EFBIG;
}

}  // namespace

JsonTreeSource::JsonTreeSource(const std::string& path)
    : watch_(path), empty_(SnapshotBuilder().build()) {}

bool JsonTreeSource::changed() {
    return readAgain_ || watch_.changed();
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
            complain(watch_.path() + ": " + error.what());
        } catch (const std::exception&) {  // NOLINT(bugprone-empty-catch)
            // Without memory for a message there is none.
        }
        return empty_;
    }
}

std::shared_ptr<const Snapshot> JsonTreeSource::tryToRead() {
    const auto text = File::read(watch_.path(), largestFile);
    if (!text) {
        const int reason = errno;
        readAgain_ = !isOfTheFile(reason);
        complain(watch_.path() + ": " + std::generic_category().message(reason));
        return empty_;
    }
    const std::string hostName = getSystemName();
    if (hostName.empty()) {
        const int reason = errno;
        readAgain_ = true;
        complain("the system does not tell its name: " + std::generic_category().message(reason));
        return empty_;
    }
    JsonTree tree = parseJsonTree(*text, hostName);
    if (const auto* fault = std::get_if<JsonTreeFault>(&tree)) {
        complain(watch_.path() + ":" + std::to_string(fault->line) + ":" +
                 std::to_string(fault->column) + ": " + fault->reason);
        return empty_;
    }
    lastComplaint_.clear();
    return std::get<std::shared_ptr<const Snapshot>>(std::move(tree));
}

void JsonTreeSource::complain(const std::string& message) {
    // When every request reads the file, the log would overflow with what it knows.
    if ((readAgain_ || watch_.isBlind()) && message == lastComplaint_) {
        return;
    }
    lastComplaint_ = message;
    constexpr int failure = 6000;
    TKLog::TKLogger::logLevelMessage("zrclient/JsonTreeSource", "read", __LINE__,
                                     "ZR.Instrumentation", failure, nullptr, 0, 0, message);
}

}  // namespace ZR
