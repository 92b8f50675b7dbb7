// What Prometheus is told of a machine, and in which form.
#include "commands/Metrics.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <filesystem>

#include "commands/Exporter.h"
#include "kit/Files.h"
#include "text/Failure.h"
#include "zrclient/NodeLexicon.h"

namespace cimdhcp {
namespace {

using cimom::wbem::DurationHistogram;
using cimom::wbem::labelText;
using cimom::wbem::MetricFamily;
using cimom::wbem::metricsFormat;
using cimom::wbem::MetricsFormat;
using cimom::wbem::metricsText;
using testing::HasSubstr;
using testing::Not;
using MetricKind = MetricFamily::Kind;

MetricFamilies ofEachKind() {
    return {{"a_seconds",
             MetricKind::gauge,
             "Back\\slash, \"quotes\" and\nlines.",
             "seconds",
             {{{{"b", "\\ \" \n"}, {"c", ""}}, -0.5, ""}, {{}, 1e300, ""}}},
            {"d", MetricKind::counter, "Counted.", "", {{{}, 1234567, ""}}},
            {"e", MetricKind::info, "Named.", "", {{{{"version", "1"}}, 1, ""}}},
            {"f_seconds",
             MetricKind::histogram,
             "Measured.",
             "seconds",
             {{{{"le", "+Inf"}}, 2, "_bucket"}, {{}, 0.25, "_sum"}, {{}, 2, "_count"}}},
            {"none", MetricKind::gauge, "Without values.", "", {}}};
}

TEST(Metrics, AreWrittenInTheTextFormat) {
    EXPECT_EQ(metricsText(ofEachKind(), MetricsFormat::text),
              "# HELP a_seconds Back\\\\slash, \"quotes\" and\\nlines.\n"
              "# TYPE a_seconds gauge\n"
              "a_seconds{b=\"\\\\ \\\" \\n\",c=\"\"} -0.5\n"
              "a_seconds 1e+300\n"
              "# HELP d_total Counted.\n"
              "# TYPE d_total counter\n"
              "d_total 1234567\n"
              "# HELP e_info Named.\n"
              "# TYPE e_info gauge\n"
              "e_info{version=\"1\"} 1\n"
              "# HELP f_seconds Measured.\n"
              "# TYPE f_seconds histogram\n"
              "f_seconds_bucket{le=\"+Inf\"} 2\n"
              "f_seconds_sum 0.25\n"
              "f_seconds_count 2\n");
    EXPECT_EQ(metricsText({}, MetricsFormat::text), "");
}

TEST(Metrics, AreWrittenInOpenMetrics) {
    EXPECT_EQ(metricsText(ofEachKind(), MetricsFormat::openMetrics),
              "# HELP a_seconds Back\\\\slash, \\\"quotes\\\" and\\nlines.\n"
              "# TYPE a_seconds gauge\n"
              "# UNIT a_seconds seconds\n"
              "a_seconds{b=\"\\\\ \\\" \\n\",c=\"\"} -0.5\n"
              "a_seconds 1e+300\n"
              "# HELP d Counted.\n"
              "# TYPE d counter\n"
              "d_total 1234567\n"
              "# HELP e Named.\n"
              "# TYPE e info\n"
              "e_info{version=\"1\"} 1\n"
              "# HELP f_seconds Measured.\n"
              "# TYPE f_seconds histogram\n"
              "# UNIT f_seconds seconds\n"
              "f_seconds_bucket{le=\"+Inf\"} 2\n"
              "f_seconds_sum 0.25\n"
              "f_seconds_count 2\n"
              "# EOF\n");
    EXPECT_EQ(metricsText({}, MetricsFormat::openMetrics), "# EOF\n");
}

TEST(Metrics, NumbersThatAreNone) {
    const double infinity = std::numeric_limits<double>::infinity();
    const MetricFamily family{
        "a",
        MetricKind::gauge,
        "A.",
        "",
        {{{}, infinity, ""}, {{}, -infinity, ""}, {{}, std::nan(""), ""}, {{}, 1e15, ""}}};
    EXPECT_THAT(metricsText({family}, MetricsFormat::text),
                HasSubstr("\na +Inf\na -Inf\na NaN\na 1000000000000000\n"));
}

TEST(Metrics, TheFormatIsTheOneThatAClientLikes) {
    const std::pair<const char*, MetricsFormat> cases[] = {
        // As Prometheus sends it.
        {"application/openmetrics-text;version=1.0.0,application/openmetrics-text;version=0.0.1;"
         "q=0.75,text/plain;version=0.0.4;q=0.5,*/*;q=0.1",
         MetricsFormat::openMetrics},
        {"application/openmetrics-text; version=1.0.0; escaping=allow-utf-8; q=0.6, "
         "text/plain;version=0.0.4;q=0.5",
         MetricsFormat::openMetrics},
        {"Application/OpenMetrics-Text", MetricsFormat::openMetrics},
        {"application/openmetrics-text;q=0.3,text/plain;q=0.5", MetricsFormat::text},
        {"application/openmetrics-text;version=0.0.1", MetricsFormat::text},
        {"application/openmetrics-text;q=0", MetricsFormat::text},
        {"application/openmetrics-text;q=x", MetricsFormat::text},
        {"application/vnd.google.protobuf;proto=io.prometheus.client.MetricFamily;q=1",
         MetricsFormat::text},
        {"*/*", MetricsFormat::text},
        {",;,=;q=,", MetricsFormat::text},
        {"", MetricsFormat::text}};
    for (const auto& [accept, format] : cases) {
        EXPECT_EQ(metricsFormat(accept), format) << accept;
    }
    EXPECT_EQ(contentType(MetricsFormat::text), "text/plain; version=0.0.4; charset=utf-8");
    EXPECT_EQ(contentType(MetricsFormat::openMetrics),
              "application/openmetrics-text; version=1.0.0; charset=utf-8");
}

TEST(Metrics, TextsOfOthersAreBounded) {
    const std::pair<std::string, std::string> cases[] = {
        {"", ""},
        {"dhclient \"4\"", "dhclient \"4\""},
        {"a\nb\x1B[31m\x7F", "a?b?[31m?"},
        {std::string("a\0b", 3), "a?b"},
        {"\u00E4\u20AC\U0001F600", "\u00E4\u20AC\U0001F600"},
        {"\xC2\x85", "??"},       // a control character
        {"\xC0\xAF", "??"},       // longer than it need be
        {"\xE0\x80\xAF", "???"},  // the same
        {"\xED\xA0\x80", "???"},  // half of a pair
        {"\xF5\x80\x80\x80", "????"},
        {"\xE2\x82", "??"},  // cut off
        {"\xFF", "?"},
        {std::string(500, 'x'), std::string(128, 'x')},
        {std::string(127, 'x') + "\u20AC", std::string(127, 'x')}};
    for (const auto& [text, label] : cases) {
        EXPECT_EQ(labelText(text), label) << text;
    }
}

TEST(Metrics, AHistogramCountsWhatIsBelowEachBound) {
    DurationHistogram histogram;
    for (const double seconds : {0.0005, 0.001, 0.3, 100.0}) {
        histogram.add(std::chrono::duration<double>(seconds));
    }
    const MetricFamily family{"a_seconds", MetricKind::histogram, "A.", "seconds",
                              histogram.samples()};
    const std::string text = metricsText({family}, MetricsFormat::text);
    EXPECT_THAT(text, HasSubstr("a_seconds_bucket{le=\"0.001\"} 2\n"));
    EXPECT_THAT(text, HasSubstr("a_seconds_bucket{le=\"0.1\"} 2\n"));
    EXPECT_THAT(text, HasSubstr("a_seconds_bucket{le=\"0.5\"} 3\n"));
    EXPECT_THAT(text, HasSubstr("a_seconds_bucket{le=\"30.0\"} 3\n"
                                "a_seconds_bucket{le=\"+Inf\"} 4\n"
                                "a_seconds_sum 100.3015\na_seconds_count 4\n"));
}

constexpr std::int64_t lookedAt = 2000;

LeaseOverview leaseWith(const char* family, const char* address) {
    LeaseOverview made;
    made.family = family;
    made.address = address;
    made.client = "dhclient";
    made.server = "192.0.2.1";
    made.obtained = 1000;
    made.renews = 3000;
    made.rebinds = 4000;
    made.expires = 5000;
    return made;
}

InterfaceOverview interfaceWith(std::vector<LeaseOverview> leases) {
    InterfaceOverview made;
    made.system = hostSystem;
    made.name = "eth0";
    made.dhcp = true;
    made.active = true;
    made.address = "192.0.2.17";
    made.leases = std::move(leases);
    return made;
}

std::string metricsOf(const MachineInterfaces& machine) {
    return metricsText(machineMetrics(machine, lookedAt), MetricsFormat::text);
}

/// Those of the text's lines that begin so.
std::vector<std::string> metricLines(const std::string& text, const std::string& beginning) {
    std::vector<std::string> found;
    std::istringstream lines(text);
    for (std::string line; std::getline(lines, line);) {
        if (line.starts_with(beginning)) {
            found.push_back(line);
        }
    }
    return found;
}

TEST(MachineMetrics, ALeaseHasItsMomentsAndWhoGaveIt) {
    const std::string text = metricsOf({{interfaceWith({leaseWith("IPv4", "192.0.2.17")})}, {}});
    for (const char* line :
         {"dhcp_client_up 1", "dhcp_client_enabled{interface=\"eth0\"} 1",
          "dhcp_client_interface_up{interface=\"eth0\"} 1",
          "dhcp_client_lease_obtained_timestamp_seconds{interface=\"eth0\",family=\"ipv4\"} 1000",
          "dhcp_client_lease_renewal_timestamp_seconds{interface=\"eth0\",family=\"ipv4\"} 3000",
          "dhcp_client_lease_rebinding_timestamp_seconds{interface=\"eth0\",family=\"ipv4\"} 4000",
          "dhcp_client_lease_expires_timestamp_seconds{interface=\"eth0\",family=\"ipv4\"} 5000",
          "dhcp_client_info{interface=\"eth0\",family=\"ipv4\",client=\"dhclient\","
          "server=\"192.0.2.1\"} 1"}) {
        EXPECT_THAT(text, HasSubstr("\n" + std::string(line) + "\n"));
    }
    EXPECT_EQ(metricLines(text, "dhcp_client_source_errors").size(), 7U);
}

TEST(MachineMetrics, OneStateHolds) {
    EXPECT_EQ(metricLines(metricsOf({{interfaceWith({leaseWith("IPv4", "192.0.2.17")})}, {}}),
                          "dhcp_client_state{"),
              (std::vector<std::string>{
                  "dhcp_client_state{interface=\"eth0\",family=\"ipv4\",state=\"off\"} 0",
                  "dhcp_client_state{interface=\"eth0\",family=\"ipv4\",state=\"no_link\"} 0",
                  "dhcp_client_state{interface=\"eth0\",family=\"ipv4\",state=\"asking\"} 0",
                  "dhcp_client_state{interface=\"eth0\",family=\"ipv4\",state=\"bound\"} 1",
                  "dhcp_client_state{interface=\"eth0\",family=\"ipv4\",state=\"renewing\"} 0",
                  "dhcp_client_state{interface=\"eth0\",family=\"ipv4\",state=\"rebinding\"} 0",
                  "dhcp_client_state{interface=\"eth0\",family=\"ipv4\",state=\"expired\"} 0",
                  "dhcp_client_state{interface=\"eth0\",family=\"ipv4\",state=\"unknown\"} 0"}));
}

TEST(MachineMetrics, EachAddressFamilyHasItsOwnState) {
    LeaseOverview asked = leaseWith("IPv6", "");
    asked.clientState = static_cast<std::uint64_t>(ZR::NodeLexicon::ClientState::Selecting);
    asked.expires.reset();
    const std::string text =
        metricsOf({{interfaceWith({leaseWith("IPv4", "192.0.2.17"), asked})}, {}});
    EXPECT_THAT(text, HasSubstr("family=\"ipv4\",state=\"bound\"} 1\n"));
    EXPECT_THAT(text, HasSubstr("family=\"ipv6\",state=\"asking\"} 1\n"));
    EXPECT_EQ(metricLines(text, "dhcp_client_lease_expires").size(), 1U);
}

TEST(MachineMetrics, OfSeveralLeasesOfAFamilyTheLeadingOneCounts) {
    LeaseOverview other = leaseWith("IPv4", "198.51.100.1");
    other.expires = 9000;
    const std::string text =
        metricsOf({{interfaceWith({other, leaseWith("IPv4", "192.0.2.17")})}, {}});
    EXPECT_EQ(metricLines(text, "dhcp_client_lease_expires").size(), 1U);
    EXPECT_THAT(text, HasSubstr("family=\"ipv4\"} 5000\n"));
}

TEST(MachineMetrics, ALeaseWithoutAnEndNeverEnds) {
    LeaseOverview endless = leaseWith("IPv4", "192.0.2.17");
    endless.expires = static_cast<std::int64_t>(ZR::NodeLexicon::never);
    EXPECT_THAT(metricsOf({{interfaceWith({endless})}, {}}),
                HasSubstr("dhcp_client_lease_expires_timestamp_seconds{interface=\"eth0\","
                          "family=\"ipv4\"} +Inf\n"));
}

TEST(MachineMetrics, WhatIsNotKnownHasNoValue) {
    InterfaceOverview interface;
    interface.system = hostSystem;
    interface.name = "eth0";
    const std::string text = metricsOf({{interface}, {}});
    EXPECT_EQ(metricLines(text, "dhcp_client_").size(), 9U) << text;  // up, and its state
    EXPECT_THAT(text, HasSubstr("state=\"unknown\"} 1\n"));
    EXPECT_THAT(text, Not(HasSubstr("source_errors")));
}

TEST(MachineMetrics, ANameThatComesTwiceHasOneValue) {
    // A server may tell what it likes: the same line twice would make the whole text wrong.
    const std::string text = metricsOf({{interfaceWith({}), interfaceWith({})}, {}});
    EXPECT_EQ(metricLines(text, "dhcp_client_enabled").size(), 1U);
}

TEST(MachineMetrics, ErrorsAreCountedByTheirKind) {
    using ZR::Diagnostic;
    const std::string text = metricsOf(
        {{interfaceWith({})},
         {Diagnostic("a", Diagnostic::Kind::Denied), Diagnostic("b", Diagnostic::Kind::Denied),
          Diagnostic("c", Diagnostic::Kind::Note)}});
    EXPECT_THAT(metricLines(text, "dhcp_client_source_errors"),
                testing::ElementsAre("dhcp_client_source_errors{kind=\"unreadable\"} 0",
                                     "dhcp_client_source_errors{kind=\"denied\"} 2",
                                     "dhcp_client_source_errors{kind=\"damaged\"} 0",
                                     "dhcp_client_source_errors{kind=\"untrusted\"} 0",
                                     "dhcp_client_source_errors{kind=\"not_applied\"} 0",
                                     "dhcp_client_source_errors{kind=\"lease_ended\"} 0",
                                     "dhcp_client_source_errors{kind=\"client_gone\"} 0"));
}

TEST(ReplaceFile, MakesAFileThatAllCanRead) {
    const ZR::Testing::TemporaryDirectory directory;
    const std::string file = directory / "dhcp.prom";
    replaceFile(file, "old");
    replaceFile(file, "new");
    EXPECT_EQ(ZR::Testing::readFile(file), "new");
    struct stat status {};
    ASSERT_EQ(::stat(file.c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 07777U, 0644U);
    // Nothing else is left behind.
    EXPECT_EQ(std::distance(std::filesystem::directory_iterator(directory.path()), {}), 1);
}

TEST(ReplaceFile, RefusesWhatIsNotAFile) {
    const ZR::Testing::TemporaryDirectory directory;
    EXPECT_THROW(replaceFile(directory.path(), "x"), Failure);
    EXPECT_THROW(replaceFile("/dev/null", "x"), Failure);
    EXPECT_THROW(replaceFile(directory / "none/file", "x"), Failure);
    EXPECT_TRUE(std::filesystem::is_empty(directory.path()));
}

cimom::wbem::PageRequest probeOf(const std::string& target) {
    cimom::wbem::PageRequest request;
    request.path = "/probe";
    request.arguments = {{"target", target}};
    return request;
}

ExporterSettings settingsWith(const std::string& target) {
    return readExporterSettings(R"({"timeout": 10, "targets": [")" + target + R"("]})", {});
}

bool isAllowed(const std::string& target, const std::string& asked) {
    const ExporterSettings settings = settingsWith(target);
    try {
        const Probe probe = readProbe(probeOf(asked), settings);
        return probe.time == std::chrono::seconds(10) && &probe.target == settings.targets[0].get();
    } catch (const Failure& failure) {
        EXPECT_STREQ(failure.what(), "the configuration does not allow this target");
        return false;
    }
}

TEST(ProbeTarget, HasSignsForPartsOfOneLevelOfNames) {
    const std::pair<const char*, const char*> allowed[] = {
        {"*.example", "a.example"},
        {"*.example", "HTTPS://A-1.EXAMPLE:5989/cimom"},
        {"a*b.example", "axb.example"},
        {"a*b.example", "abbb.example"},
        {"*a*a.example", "aaaa.example"},
        {"*-*.example", "a--.example"},
        {"http://10.0.*.*:1/x", "http://10.0.0.255:1/x"},
    };
    for (const auto& [target, asked] : allowed) {
        EXPECT_TRUE(isAllowed(target, asked)) << target << ' ' << asked;
    }
    const std::pair<const char*, const char*> refused[] = {
        {"*.example", ".example"},
        {"*.example", "a.b.example"},
        {"*.example", "a.example."},
        {"*.example", "a_b.example"},
        {"*.example", "\xC3\xA4.example"},
        {"*.example", "\xFF.example"},
        {"*.example", "*.example"},
        {"*.example", "a.example:1"},
        {"*.example", "a.example/x"},
        {"*.example", "http://a.example"},
        {"*.example", "a.examplex"},
        {"a*b.example", "ab.example"},
        {"*a*a.example", "aa.example"},
        {"*-*.example", "a-.example"},
        {"10.0.*.*", "10.0.1"},
        {"10.0.*.*", "10.0.1.2.3"},
    };
    for (const auto& [target, asked] : refused) {
        EXPECT_FALSE(isAllowed(target, asked)) << target << ' ' << asked;
    }
}

TEST(ProbeTarget, IsComparedInNoTimeHoweverManySignsItHas) {
    std::string signs;
    for (int number = 0; number < 40; ++number) {
        signs += "*-";
    }
    std::string host;
    for (int number = 0; number < 120; ++number) {
        host += "a-";
    }
    // Tried one after the other, these would take longer than there has been time.
    EXPECT_FALSE(isAllowed(signs + "x.example", host + "y.example"));
    EXPECT_TRUE(isAllowed(signs + "x.example", host + "x.example"));
}

TEST(Probe, HasTheTimeOfItsScraperLessAnOffset) {
    const ExporterSettings settings = settingsWith("a.example");
    const std::pair<const char*, int> times[] = {
        {"5", 4500},       {"5.0", 4500},  {"0.8", 400},   {"100", 10'000}, {"1e1", 9500},
        {"", 10'000},      {"0", 10'000},  {"-5", 10'000}, {"nan", 10'000}, {"inf", 10'000},
        {"1e999", 10'000}, {"5s", 10'000}, {" 5", 10'000}, {"0x5", 10'000}, {"5,5", 10'000},
        {"86401", 10'000}, {"1e-9", 0},    {"+5", 10'000}, {"5\t", 10'000},
    };
    for (const auto& [text, milliseconds] : times) {
        cimom::wbem::PageRequest request = probeOf("a.example");
        request.headers = {{"x-prometheus-scrape-timeout-seconds", text}};
        EXPECT_EQ(readProbe(request, settings).time.count(), milliseconds) << text;
    }
    // Two of them are neither the one nor the other.
    cimom::wbem::PageRequest request = probeOf("a.example");
    request.headers = {{"X-Prometheus-Scrape-Timeout-Seconds", "1"},
                       {"X-Prometheus-Scrape-Timeout-Seconds", "2"}};
    EXPECT_EQ(readProbe(request, settings).time.count(), 10'000);
}

TEST(Probe, IsOfOneTarget) {
    const ExporterSettings settings = settingsWith("a.example");
    cimom::wbem::PageRequest request = probeOf("a.example");
    for (const auto& arguments :
         std::vector<cimom::wbem::PageArguments>{{},
                                                 {{"target", ""}},
                                                 {{"Target", "a.example"}},
                                                 {{"target", "a.example"}, {"target", "a.example"}},
                                                 {{std::string("target\0", 7), "a.example"}},
                                                 {{"target", std::string("a.example\0", 10)}},
                                                 {{"target", "a.example\r\nX: y"}},
                                                 {{"target", "user:word@a.example"}}}) {
        request.arguments = arguments;
        EXPECT_THROW(static_cast<void>(readProbe(request, settings)), Failure)
            << testing::PrintToString(arguments);
    }
    request.arguments = {{"module", "x"}, {"target", "a.example"}};
    EXPECT_EQ(readProbe(request, settings).url.host, "a.example");
}

}  // namespace
}  // namespace cimdhcp
