#include "commands/Exporter.h"

#include <malloc.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <cerrno>
#include <charconv>
#include <chrono>
#include <cmath>
#include <csignal>
#include <cstring>
#include <mutex>
#include <nlohmann/json.hpp>
#include <optional>
#include <ostream>
#include <semaphore>
#include <string_view>
#include <utility>

#include "cimom/Names.h"
#include "cimxml/HttpStatus.h"
#include "client/RemoteClient.h"
#include "client/ServerUrl.h"
#include "commands/Metrics.h"
#include "commands/Overview.h"
#include "commands/Serve.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/Times.h"
#include "zrcommon/File.h"

namespace cimdhcp {

namespace {

using cimom::wbem::LogKind;
using cimom::wbem::MetricFamily;
using cimom::wbem::Page;
using cimom::wbem::PageRequest;
using Milliseconds = std::chrono::milliseconds;
using Seconds = std::chrono::duration<double>;
namespace http = cimom::wbem::http;

/// Where "*" stands in the host of a target: a byte that no text of UTF-8 has, and that is a
/// letter of hosts to the reader of URLs.
constexpr char anyText = '\xFF';
/// Bytes of a server's response: what one probe may cost.
constexpr std::size_t longestProbe = 1U << 20U;

bool isOfLabel(char c) noexcept {
    return (c >= '0' && c <= '9') || (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || c == '-';
}

/// Goes over the host once: a stranger chooses it, and signs for any text that stand side by
/// side could be tried in very many ways.
bool matchesHost(std::string_view pattern, std::string_view host) {
    // Whether so many letters of the pattern stand for what was read of the host.
    std::vector<bool> reached(pattern.size() + 1);
    reached.front() = true;
    for (std::size_t at = 0; at < host.size(); ++at) {
        std::vector<bool> further(pattern.size() + 1);
        for (std::size_t each = 0; each < pattern.size(); ++each) {
            further[each + 1] =
                pattern[each] == anyText
                    ? isOfLabel(host[at]) && (reached[each] || reached[each + 1])
                    : reached[each] && cimom::sameName(pattern.substr(each, 1), host.substr(at, 1));
        }
        reached = std::move(further);
    }
    return reached.back();
}

[[noreturn]] void refuseSetting(const std::string& reason) {
    throw Failure(ExitStatus::usage, printable(reason));
}

/// Reads the configuration.
class ExporterReader {
  public:
    using Document = nlohmann::json;

    explicit ExporterReader(const Options& options) : options_(options) {}

    [[nodiscard]] ExporterSettings read(const Document& whole) const {
        if (!whole.is_object()) {
            refuseSetting("an object with \"targets\" is wanted");
        }
        ExporterSettings settings;
        Said said;
        said.options = options_;
        const Document* targets = nullptr;
        for (const auto& [key, value] : whole.items()) {
            if (key == "targets" && value.is_array()) {
                targets = &value;
            } else if (key == "timeoutOffset") {
                settings.offset = seconds(value, key);
            } else if (!take(key, value, said)) {
                refuseSetting("\"" + key + "\" is not known here");
            }
        }
        if (targets == nullptr || targets->empty()) {
            refuseSetting("\"targets\" is a list of at least one target");
        }
        for (const Document& each : *targets) {
            settings.targets.push_back(targetFrom(each, said));
        }
        return settings;
    }

  private:
    /// What is said for all targets, or for one.
    struct Said {
        Options options;
        Milliseconds timeout{10'000};
    };

    [[nodiscard]] static Milliseconds seconds(const Document& value, const std::string& key) {
        constexpr double longest = 100;
        const double number = value.get<double>();
        if (!(number > 0 && number <= longest)) {
            refuseSetting('"' + key + "\" is a number of seconds, above 0 and at most 100");
        }
        return std::chrono::ceil<Milliseconds>(Seconds(number));
    }

    /// Whether the key is one of those that stand both for all and for one.
    static bool take(const std::string& key, const Document& value, Said& said) {
        if (key == "cacert") {
            said.options.caCertificate = value.get<std::string>();
        } else if (key == "credentials") {
            said.options.credentials = value.get<std::string>();
        } else if (key == "namespace") {
            said.options.nameSpace = value.get<std::string>();
        } else if (key == "timeout") {
            said.timeout = seconds(value, key);
        } else {
            return false;
        }
        return true;
    }

    [[nodiscard]] static std::unique_ptr<ProbeTarget> targetFrom(const Document& entry, Said said) {
        std::string text;
        if (entry.is_string()) {
            text = entry.get<std::string>();
        } else if (!entry.is_object()) {
            refuseSetting("a target is a text or an object");
        } else {
            for (const auto& [key, value] : entry.items()) {
                if (key == "target") {
                    text = value.get<std::string>();
                } else if (!take(key, value, said)) {
                    refuseSetting("\"" + key + "\" is not known for a target");
                }
            }
        }
        auto target = std::make_unique<ProbeTarget>();
        std::string url = text;
        std::replace(url.begin(), url.end(), '*', anyText);
        try {
            target->url = readServerUrl(url);
        } catch (const Failure& failure) {
            refuseSetting("target \"" + text + "\": " + failure.what());
        }
        target->url.given = text;
        target->timeout = said.timeout;
        target->options = std::move(said.options);
        return target;
    }

    const Options& options_;
};

/// The configuration, read again whenever it is asked for.
class ExporterFile {
  public:
    ExporterFile(std::string file, const Options& options, const std::atomic<bool>& ending)
        : file_(std::move(file)), options_(options), ending_(ending) {}

    [[nodiscard]] ExporterSettings read() const {
        const auto text = ZR::File::read(file_);
        if (!text) {
            throw Failure(ExitStatus::notLoaded, printable(file_) + ": " + std::strerror(errno));
        }
        try {
            ExporterSettings settings = readExporterSettings(*text, options_);
            settings.open(ending_);
            return settings;
        } catch (const Failure& failure) {
            throw Failure(ExitStatus::usage, printable(file_) + ": " + failure.what());
        }
    }

  private:
    const std::string file_;
    const Options& options_;
    const std::atomic<bool>& ending_;
};

/// The value of the header by which Prometheus tells how long it waits.
std::optional<Milliseconds> scrapeTimeout(const PageRequest& request) {
    const std::string text = request.header("X-Prometheus-Scrape-Timeout-Seconds");
    double number = 0;
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number);
    constexpr double longest = 86400;
    const bool good = !text.empty() && error == std::errc() && stop == end && number > 0 &&
                      number <= longest;  // "nan" is in no range
    return good ? std::optional(std::chrono::floor<Milliseconds>(Seconds(number))) : std::nullopt;
}

/// The first target that allows it; null: none does.
const ProbeTarget* targetFor(const std::string& asked, const ExporterSettings& settings,
                             ServerUrl& url) {
    try {
        url = readServerUrl(asked);
    } catch (const Failure&) {
        // What is not a URL is not a target either; it is not repeated.
        return nullptr;
    }
    // What is the sign of patterns is not a host, nor is what no name can be.
    constexpr std::size_t longestHost = 253;
    if (url.host.size() > longestHost || url.host.find(anyText) != std::string::npos) {
        return nullptr;
    }
    const auto found = std::find_if(settings.targets.begin(), settings.targets.end(),
                                    [&url](const auto& each) { return each->allows(url); });
    return found == settings.targets.end() ? nullptr : found->get();
}

/// Probes that get long responses, of which few go on at the same time, so that what they take
/// together is bounded: targets may be hostile, and those that are not tell of a few interfaces.
class LongProbes {
  public:
    [[nodiscard]] bool begin(std::chrono::steady_clock::time_point until) {
        return free_.try_acquire_until(until);
    }
    void end() {
        free_.release();
#ifdef __GLIBC__
        // What they took was large, and this allocator would keep it.
        ::malloc_trim(0);
#endif
    }

  private:
    static constexpr std::ptrdiff_t most = 2;
    std::counting_semaphore<most> free_{most};
};

/// What the responses to one probe may take.
class ProbeRoom {
  public:
    ProbeRoom(LongProbes& others, std::chrono::steady_clock::time_point until)
        : others_(others), until_(until) {}
    ~ProbeRoom() {
        if (isLong_) {
            others_.end();
        }
    }
    ProbeRoom(const ProbeRoom&) = delete;
    ProbeRoom& operator=(const ProbeRoom&) = delete;

    /// Whether there is room for more bytes; waits for it where it is necessary.
    [[nodiscard]] bool grow(std::size_t more) {
        constexpr std::size_t shortProbe = 65536;
        bytes_ += more;
        isLong_ = isLong_ || (bytes_ > shortProbe && others_.begin(until_));
        return isLong_ || bytes_ <= shortProbe;
    }

  private:
    LongProbes& others_;
    const std::chrono::steady_clock::time_point until_;
    std::size_t bytes_ = 0;
    bool isLong_ = false;
};

class Exporter {
  public:
    Exporter(ExporterFile file, cimom::wbem::ServerLog log)
        : file_(std::move(file)),
          log_(std::move(log)),
          settings_(std::make_shared<const ExporterSettings>(file_.read())) {}

    Page page(const PageRequest& request) {
        if (request.path == "/probe") {
            return probe(request);
        }
        if (request.path == "/metrics") {
            return metricsPage(own(), request);
        }
        if (request.path == "/-/healthy") {
            return {http::ok, "Healthy\n"};
        }
        if (request.path == "/") {
            return {http::ok,
                    "Metrics of the DHCP clients of other machines.\n"
                    "/probe?target=https://HOST  a machine, of those that the configuration "
                    "allows\n/metrics  the exporter itself\n/-/healthy\n"};
        }
        return {http::notFound, "nothing is at this path\n"};
    }

    /// A file that cannot be used changes nothing.
    void reload() {
        bool good = true;
        try {
            auto settings = std::make_shared<const ExporterSettings>(file_.read());
            const std::lock_guard lock(mutex_);
            settings_.swap(settings);
            reloadTime_ = secondsNow();
        } catch (const Failure& failure) {
            good = false;
            log_(LogKind::failure, std::string("the configuration stays: ") + failure.what());
        }
        reloaded_ = good;
        if (good) {
            log_(LogKind::notice, "the configuration was read again");
        }
    }

    [[nodiscard]] std::size_t targets() const { return settings()->targets.size(); }

  private:
    [[nodiscard]] std::shared_ptr<const ExporterSettings> settings() const {
        const std::lock_guard lock(mutex_);
        return settings_;
    }

    Page probe(const PageRequest& request) {
        const auto settings = this->settings();
        try {
            return metricsPage(ask(readProbe(request, *settings), request.arrived), request);
        } catch (const Failure& failure) {
            ++refused_;
            return {http::badRequest, std::string(failure.what()) + '\n'};
        }
    }

    /// Never throws Failure: what fails is what the metrics tell.
    MetricFamilies ask(const Probe& probe, std::chrono::steady_clock::time_point arrived) {
        const auto now = [] { return std::chrono::steady_clock::now(); };
        MetricFamilies families;
        std::string reason;
        // Until the last of what they became is gone.
        ProbeRoom room(longProbes_, arrived + probe.time);
        try {
            HttpSettings settings = probe.target.access.value().settingsFor(probe.url);
            settings.longestResponse = longestProbe;
            settings.mayGrow = [&room](std::size_t more) { return room.grow(more); };
            // What it has waited for its turn is gone.
            const auto left = std::chrono::ceil<Milliseconds>(arrived + probe.time - now());
            RemoteClient client(probe.url, std::move(settings), Deadline(left),
                                probe.target.options.nameSpace);
            families = machineMetrics(askMachine(client, AskDiagnostics::Yes), secondsNow());
        } catch (const Failure& failure) {
            reason = failure.what();
        } catch (const cimom::wbem::ConnectionError& error) {
            reason = error.what();
        }
        const Seconds took = now() - arrived;
        const bool success = reason.empty();
        durations_.add(took);
        ++(success ? succeeded_ : failed_);
        if (!success) {
            log_(LogKind::request, printable(probe.url.text()) + ": " + printable(reason));
        }
        families.push_back({"probe_success",
                            MetricFamily::Kind::gauge,
                            "Whether the machine was asked and has responded.",
                            "",
                            {{{}, success ? 1.0 : 0.0, ""}}});
        families.push_back({"probe_duration_seconds",
                            MetricFamily::Kind::gauge,
                            "How long the probe took.",
                            "seconds",
                            {{{}, took.count(), ""}}});
        return families;
    }

    /// What is told of the exporter itself.
    [[nodiscard]] MetricFamilies own() const {
        const auto number = [](auto value) { return static_cast<double>(value); };
        using FamilyKind = MetricFamily::Kind;
        MetricFamilies families;
        const auto one = [&](const char* name, FamilyKind kind, const char* help, const char* unit,
                             double value) {
            families.push_back({name, kind, help, unit, {{{}, value, ""}}});
        };
        families.push_back(buildInfo("cimdhcp_exporter"));
        families.push_back({"cimdhcp_exporter_probes",
                            FamilyKind::counter,
                            "Probes of machines, by how they ended.",
                            "",
                            {{{{"result", "success"}}, number(succeeded_.load()), ""},
                             {{{"result", "failure"}}, number(failed_.load()), ""}}});
        one("cimdhcp_exporter_refused_requests", FamilyKind::counter,
            "Requests for a target that the configuration does not allow.", "",
            number(refused_.load()));
        families.push_back({"cimdhcp_exporter_probe_duration_seconds", FamilyKind::histogram,
                            "How long probes took, with the wait for their turn.", "seconds",
                            durations_.samples()});
        one("cimdhcp_exporter_targets", FamilyKind::gauge,
            "Targets and patterns of targets in the configuration.", "", number(targets()));
        one("cimdhcp_exporter_config_reload_successful", FamilyKind::gauge,
            "Whether the configuration could be read when it was last asked for.", "",
            reloaded_ ? 1 : 0);
        one("cimdhcp_exporter_config_reload_timestamp_seconds", FamilyKind::gauge,
            "When the configuration in use was read.", "seconds", number(reloadTime_.load()));
        families.push_back(cimom::wbem::residentMemory("cimdhcp_exporter"));
        return families;
    }

    const ExporterFile file_;
    const cimom::wbem::ServerLog log_;
    mutable std::mutex mutex_;  ///< of settings_
    std::shared_ptr<const ExporterSettings> settings_;
    LongProbes longProbes_;
    cimom::wbem::DurationHistogram durations_;
    std::atomic<std::uint64_t> succeeded_{0};
    std::atomic<std::uint64_t> failed_{0};
    std::atomic<std::uint64_t> refused_{0};
    std::atomic<bool> reloaded_{true};
    std::atomic<std::int64_t> reloadTime_{secondsNow()};
};

/// The signals that the exporter waits for, blocked in all threads that start from now on.
sigset_t blockExporterSignals() {
    sigset_t signals;
    sigemptyset(&signals);
    for (const int signal : {SIGTERM, SIGINT, SIGHUP}) {
        sigaddset(&signals, signal);
    }
    const int error = ::pthread_sigmask(SIG_BLOCK, &signals, nullptr);
    if (error != 0) {
        throw Failure(ExitStatus::notLoaded, std::strerror(error));
    }
    return signals;
}

}  // namespace

bool ProbeTarget::allows(const ServerUrl& asked) const {
    return asked.encrypted == url.encrypted && asked.port == url.port && asked.path == url.path &&
           matchesHost(url.host, asked.host);
}

void ExporterSettings::open(const std::atomic<bool>& ending) {
    for (const auto& target : targets) {
        try {
            target->access.emplace(target->options, ending);
        } catch (const Failure& failure) {
            refuseSetting("target \"" + target->url.given + "\": " + failure.what());
        }
    }
}

ExporterSettings readExporterSettings(const std::string& json, const Options& options) {
    try {
        return ExporterReader(options).read(ExporterReader::Document::parse(json));
    } catch (const nlohmann::json::exception& error) {
        refuseSetting(error.what());
    }
}

Probe readProbe(const PageRequest& request, const ExporterSettings& settings) {
    const std::string* asked = nullptr;
    for (const auto& [name, value] : request.arguments) {
        if (name == "target" && asked != nullptr) {
            throw Failure(ExitStatus::usage, "target is given twice");
        }
        if (name == "target") {
            asked = &value;
        }
    }
    if (asked == nullptr || asked->empty()) {
        throw Failure(ExitStatus::usage, "target is missing");
    }
    ServerUrl url;
    const ProbeTarget* const target = targetFor(*asked, settings, url);
    if (target == nullptr) {
        throw Failure(ExitStatus::usage, "the configuration does not allow this target");
    }
    Milliseconds time = target->timeout;
    if (const auto scraper = scrapeTimeout(request)) {
        // With an offset that would leave nothing, half of it is better than none.
        time = std::min(time, std::max(*scraper - settings.offset, *scraper / 2));
    }
    return {*target, std::move(url), time};
}

void serveExporter(const ExporterCommand& command, const Options& options, std::ostream& out) {
    std::atomic<bool> ending = false;
    ExporterFile file(command.config, options, ending);
    if (command.check) {
        const std::size_t count = file.read().targets.size();
        out << printable(command.config) << ": good, with " << count
            << (count == 1 ? " target\n" : " targets\n");
        return;
    }
    const sigset_t signals = blockExporterSignals();
    const auto log = serverLog();
    Exporter exporter(std::move(file), log);
    try {
        ServeCommand where = command.server;
        where.limits.workers = options.parallel;
        where.limits.stuck = 1;
        // One Prometheus, with a connection for each target, is all its clients.
        where.limits.connectionsEach = where.limits.connections;
        where.limits.checksEach = where.limits.connections;
        where.limits.connectionRate = 10 * where.limits.connections;
        // Longer than any probe takes, and than Prometheus mostly lets a connection rest.
        where.limits.request = std::chrono::seconds(120);
        constexpr std::uint16_t port = 9989;
        cimom::wbem::ServerSettings settings = settingsOf(where);
        settings.port = settings.port.value_or(port);
        cimom::wbem::Server server(
            [&exporter](const PageRequest& request) { return exporter.page(request); },
            std::move(settings), log);
        out << "Listening on " << server.url() << std::endl;
        int signal = 0;
        while (::sigwait(&signals, &signal) != 0 || signal == SIGHUP) {
            if (signal == SIGHUP) {
                exporter.reload();
                renewListeners(where, {&server});
            }
            signal = 0;
        }
        ending = true;
    } catch (const cimom::wbem::ServerError& error) {
        throw Failure(ExitStatus::notLoaded, printable(error.what()));
    } catch (const cimom::wbem::UsersError& error) {
        throw Failure(ExitStatus::notLoaded, printable(error.what()));
    }
}

}  // namespace cimdhcp
