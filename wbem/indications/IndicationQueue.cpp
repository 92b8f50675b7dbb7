#include "IndicationQueue.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <limits>
#include <optional>
#include <utility>

#include "zrcommon/File.h"

namespace cimom::wbem {

namespace {

/// Longer files than queues make are not read.
constexpr std::size_t longestFile = 256U << 20U;
/// How much history a file may have beyond what waits.
constexpr std::size_t spareHistory = 256U << 10U;

/// Takes "WORD NUMBER..." off a line's beginning.
std::optional<std::uint64_t> takeNumber(std::string_view& line) {
    std::uint64_t number = 0;
    const auto [stop, error] = std::from_chars(line.data(), line.data() + line.size(), number);
    if (error != std::errc() || stop == line.data()) {
        return std::nullopt;
    }
    line.remove_prefix(static_cast<std::size_t>(stop - line.data()));
    return number;
}

std::string queuedLine(const IndicationQueue::Entry& entry) {
    return "Q " + std::to_string(entry.id) + ' ' + std::to_string(entry.text.size()) + '\n' +
           entry.text + '\n';
}

bool writeAll(int fd, std::string_view text) {
    while (!text.empty()) {
        const ssize_t done = ::write(fd, text.data(), text.size());
        if (done < 0 && errno != EINTR) {
            return false;
        }
        text.remove_prefix(done < 0 ? 0 : static_cast<std::size_t>(done));
    }
    return true;
}

}  // namespace

IndicationQueue::IndicationQueue(std::filesystem::path file, Bounds bounds, Log log)
    : file_(std::move(file)), bounds_(bounds), log_(std::move(log)) {
    load();
    writeAnew();
}

void IndicationQueue::load() {
    std::error_code none;
    if (!std::filesystem::exists(file_, none)) {
        return;
    }
    try {
        const auto content = ZR::File::read(file_.string(), longestFile);
        if (!content) {
            throw std::runtime_error(std::strerror(errno));
        }
        read(*content);
    } catch (const std::runtime_error& error) {
        std::filesystem::path aside = file_;
        aside += ".bad";
        std::filesystem::rename(file_, aside, none);
        log_(file_.string() + ": " + error.what() +
             "; indications that wait in it are lost, it is kept as " + aside.string());
    }
    for (Entry& entry : entries_) {
        entry.number = nextNumber_++;
        bytes_ += entry.text.size();
    }
}

/// The end may be missing, where a process was killed as it wrote; nothing else may be wrong.
void IndicationQueue::read(std::string_view content) {
    std::deque<Entry> entries;
    while (!content.empty()) {
        const std::size_t end = content.find('\n');
        if (end == std::string_view::npos) {
            break;
        }
        std::string_view line = content.substr(0, end);
        const bool queued = line.starts_with("Q ");
        if (!queued && !line.starts_with("D ")) {
            throw std::runtime_error("it is not a queue of indications");
        }
        content.remove_prefix(end + 1);
        line.remove_prefix(2);
        const auto id = takeNumber(line);
        if (!id) {
            throw std::runtime_error("it has a line without a number");
        }
        if (!queued) {
            std::erase_if(entries, [&id](const Entry& entry) { return entry.id == *id; });
            continue;
        }
        line.remove_prefix(std::min<std::size_t>(line.size(), 1));
        const auto told = takeNumber(line);
        if (!told || !line.empty() || *told > longestFile) {
            throw std::runtime_error("it has an indication without a length");
        }
        const auto size = static_cast<std::size_t>(*told);
        if (content.size() <= size) {
            break;
        }
        if (content[size] != '\n') {
            throw std::runtime_error("it has an indication of another length");
        }
        entries.push_back({*id, 0, std::string(content.substr(0, size))});
        content.remove_prefix(size + 1);
        nextId_ = std::max(nextId_, *id + 1);
    }
    entries_ = std::move(entries);
}

std::size_t IndicationQueue::push(std::string text, bool held) {
    const std::int64_t number = nextNumber_;
    nextNumber_ = number == std::numeric_limits<std::int64_t>::max() ? 0 : number + 1;
    if (text.size() > bounds_.bytes) {
        return 1;
    }
    std::size_t gone = 0;
    const std::size_t first = held ? 1 : 0;
    while (entries_.size() > first &&
           (entries_.size() >= bounds_.count || bytes_ + text.size() > bounds_.bytes)) {
        erase(first);
        ++gone;
    }
    entries_.push_back({nextId_++, number, std::move(text)});
    bytes_ += entries_.back().text.size();
    note(queuedLine(entries_.back()));
    return gone;
}

const IndicationQueue::Entry* IndicationQueue::front() const noexcept {
    return entries_.empty() ? nullptr : &entries_.front();
}

void IndicationQueue::pop() {
    erase(0);
}

void IndicationQueue::erase(std::size_t index) {
    const auto entry = entries_.begin() + static_cast<std::ptrdiff_t>(index);
    const std::uint64_t id = entry->id;
    bytes_ -= entry->text.size();
    entries_.erase(entry);
    if (entries_.empty() || written_ > 2 * bytes_ + spareHistory) {
        writeAnew();
    } else {
        note("D " + std::to_string(id) + '\n');
    }
}

std::size_t IndicationQueue::discard() {
    const std::size_t count = entries_.size();
    entries_.clear();
    bytes_ = 0;
    fd_.reset();
    std::error_code none;  // it may never have been there
    std::filesystem::remove(file_, none);
    written_ = 0;
    return count;
}

void IndicationQueue::note(std::string_view line) {
    if (!fd_) {
        // A file that could not be written holds all that waits once it can be.
        if (std::chrono::steady_clock::now() >= nextTry_) {
            writeAnew();
        }
        return;
    }
    if (!writeAll(fd_.get(), line)) {
        fail(std::strerror(errno));
        return;
    }
    written_ += line.size();
}

/// Puts what waits in a new file in the place of the old one, which is whole until then. An
/// empty queue only empties its file.
void IndicationQueue::writeAnew() {
    if (file_.empty()) {
        return;
    }
    if (entries_.empty() && fd_ && ::ftruncate(fd_.get(), 0) == 0) {
        written_ = 0;
        return;
    }
    std::filesystem::path made = file_;
    made += ".new";
    ZR::UniqueFd fd(
        ::open(made.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_APPEND | O_CLOEXEC, 0600));
    if (!fd) {
        fail(std::strerror(errno));
        return;
    }
    std::size_t written = 0;
    for (const Entry& entry : entries_) {
        const std::string line = queuedLine(entry);
        if (!writeAll(fd.get(), line)) {
            fail(std::strerror(errno));
            return;
        }
        written += line.size();
    }
    if (::rename(made.c_str(), file_.c_str()) != 0) {
        fail(std::strerror(errno));
        return;
    }
    fd_ = std::move(fd);
    written_ = written;
    failed_ = false;
}

/// The file is not appended to after a failure, which may have left half a line: what waits
/// is written as a whole, at the next occasion.
void IndicationQueue::fail(const std::string& reason) {
    constexpr std::chrono::seconds pause(10);
    fd_.reset();
    nextTry_ = std::chrono::steady_clock::now() + pause;
    if (!failed_) {
        log_(file_.string() + ": " + reason +
             "; what waits is in memory alone, and would be lost if the server ended");
    }
    failed_ = true;
}

}  // namespace cimom::wbem
