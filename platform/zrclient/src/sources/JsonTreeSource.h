#pragma once

#include <memory>
#include <string>

#include "sources/FileWatch.h"
#include "zrclient/Snapshot.h"
#include "zrclient/SnapshotSource.h"

namespace ZR {

/// A JSON tree in a file as the source of snapshots. A file that cannot be used
/// gives an empty snapshot that tells why, and one line in the log, at level 6000; so
/// does one that is read while its author is still writing it in place, until the next
/// reading. Replacing the file by renaming another over it avoids that.
class JsonTreeSource : public SnapshotSource {
  public:
    /// Snapshots tell of the tree under the name given, the log by its absolute path.
    JsonTreeSource(const std::string& path, std::string name);
    explicit JsonTreeSource(const std::string& path) : JsonTreeSource(path, path) {}

    [[nodiscard]] bool changed() override;
    [[nodiscard]] ChangeSigns signs() override;
    [[nodiscard]] std::shared_ptr<const Snapshot> read() override;

  private:
    [[nodiscard]] std::shared_ptr<const Snapshot> tryToRead();
    /// The snapshot of a file that cannot be used. `reason` is what stands behind its name.
    [[nodiscard]] std::shared_ptr<const Snapshot> unusable(const std::string& reason);
    void report(const std::string& message);

    FileWatch watch_;
    std::string name_;
    std::shared_ptr<const Snapshot> empty_;
    std::string lastReported_;
    bool nameless_ = false;   // the machine told no name for the tree that was read last
    bool readAgain_ = false;  // the next request is to try again, whatever the watch says
};

}  // namespace ZR
