// A registration file, as the packages of providers bring it.
#include "Input.h"
#include "cimom/ObjectManager.h"
#include "support/MemoryFile.h"

namespace {

std::string written(const std::vector<cimom::Registration>& registrations) {
    std::string text;
    for (const cimom::Registration& registration : registrations) {
        text += '[' + registration.className + "]\nprovider: " + registration.provider +
                "\nlocation: " + registration.location + "\ntype: method" +
                (registration.instance ? " instance" : "") +
                (registration.association ? " association" : "") + "\nnamespace:";
        for (const std::string& nameSpace : registration.nameSpaces) {
            text += ' ' + nameSpace;
        }
        text += '\n';
    }
    return text;
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const fuzz::MemoryFile file;
    file.put(fuzz::text(data, size));
    std::vector<cimom::Registration> registrations;
    try {
        registrations = cimom::readRegistrations(file.path());
    } catch (const cimom::LoadError& error) {
        fuzz::require(std::string_view(error.what()).starts_with(file.path() + ':'),
                      "an error tells its file");
        return 0;
    }
    for (const cimom::Registration& registration : registrations) {
        fuzz::require(!registration.className.empty() && !registration.provider.empty() &&
                          registration.location.find('/') == std::string::npos &&
                          !registration.location.empty() && !registration.nameSpaces.empty(),
                      "a registration is whole");
    }
    file.put(written(registrations));
    fuzz::require(cimom::readRegistrations(file.path()) == registrations,
                  "registrations survive being written");
    return 0;
}
