#include "FuzzMachine.h"

#include <cstdio>
#include <cstdlib>

#include "Input.h"
#include "kit/ElementTable.h"

namespace fuzz {

namespace {

cimom::Configuration configuration() {
    silence();
    ::setenv("ZR_INSTRUMENTATION_TREE", FUZZ_SOURCE_DIR "/docs/sample-machine.json", 1);
    const std::filesystem::path schema = FUZZ_SOURCE_DIR "/schema";
    return {{schema},
            {schema / "exact/DHCPClientProvider.registration"},
            {FUZZ_BINARY_DIR "/lib/cmpi"},
            "testhost"};
}

}  // namespace

void silence() {
    ::setenv("ZR_LOG_SINK", "none", 1);
    ::setenv("ZR_TRACE_SINK", "none", 1);
    ::setenv("ZR_DATA_DIR", "/nonexistent/", 1);
}

cimom::ObjectManager& machine() {
    static cimom::ObjectManager manager(configuration());
    return manager;
}

cimom::wbem::XmlElement validResponse(const std::string& xml) {
    constexpr std::size_t depth = 64;
    cimom::wbem::XmlElement element;
    try {
        element = cimom::wbem::readXml(xml, depth);
    } catch (const cimom::wbem::XmlError& error) {
        static_cast<void>(std::fprintf(stderr, "%s\n%s\n", error.what(), xml.c_str()));
        require(false, "a response is well-formed XML");
    }
    const auto violations = cimom::test::violations(element);
    for (const std::string& violation : violations) {
        static_cast<void>(std::fprintf(stderr, "%s\n%s\n", violation.c_str(), xml.c_str()));
    }
    require(violations.empty(), "a response has the structure of DSP0203");
    return element;
}

}  // namespace fuzz
