// An object path through the object manager's broker: to the record that a provider
// gets and back, and to the moniker of its text keys and back.
#include <algorithm>

#include "Input.h"
#include "broker/Broker.h"
#include "broker/Conversion.h"
#include "broker/RequestScope.h"
#include "broker/objects/BrokerRecords.h"
#include "cimom/ClassRepository.h"
#include "cimom/Names.h"
#include "cimom/ObjectPathText.h"
#include "providerutilities/ProviderUtilities.h"

namespace {

using cimom::ObjectPath;

/// What a provider's library has: a broker over a class repository.
struct Host {
    static cimom::ClassRepository load() {
        cimom::ClassRepository loaded;
        loaded.loadText(
            "Qualifier Key : boolean = false, Scope(property), Flavor(DisableOverride, ToSubclass);"
            "class TEST_Element { [Key] string InstanceID; [Key] uint16 Number; };",
            "test");
        return loaded;
    }

    cimom::ClassRepository repository = load();
    cimom::broker::Broker broker{repository};
};

/// The path with its text keys alone.
ObjectPath withTextKeys(ObjectPath path) {
    std::erase_if(path.keys, [](const cimom::NamedValue& key) {
        const cimom::Scalar* const scalar = key.value.scalar();
        return scalar == nullptr || !std::holds_alternative<std::string>(*scalar);
    });
    return path;
}

void checkMoniker(const Host& host, const ObjectPath& path, CMPIObjectPath* record) {
    ObjectPath texts = withTextKeys(path);
    ZR::Moniker moniker;
    fuzz::require(ZR::ProviderUtilities::transformObjectPathToMoniker(record, moniker),
                  "a path has a moniker");
    fuzz::require(moniker.getKeyCount() == texts.keys.size(), "text keys are in the moniker");
    for (std::size_t i = 0; i < texts.keys.size(); ++i) {
        std::string name;
        std::string value;
        fuzz::require(moniker.selectKey(i) && moniker.getName(name) && moniker.getValue(value) &&
                          cimom::sameName(name, texts.keys[i].name) &&
                          cimom::Value::ofString(value) == texts.keys[i].value,
                      "keys are in the order of the path");
        // The schema's case of the name takes the place of the client's.
        texts.keys[i].name = name;
    }
    // The broker of the last path is the one with which the next is made.
    static_cast<void>(
        ZR::ProviderUtilities::createObjectPath(host.broker.record(), "TEST_Element", ""));
    CMPIObjectPath* made = record;
    fuzz::require(ZR::ProviderUtilities::transformMonikerToObjectPath(moniker, &made),
                  "a moniker has a path");
    const ObjectPath back = toModel(*cimom::broker::pathOf(made));
    fuzz::require(back == texts && cimom::toText(back) == cimom::toText(texts),
                  "a path survives being a moniker");
    ZR::Moniker again;
    fuzz::require(
        ZR::ProviderUtilities::transformObjectPathToMoniker(made, again) && again == moniker,
        "a moniker survives being a path");
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const Host host;
    const std::string_view text = fuzz::text(data, size);
    ObjectPath path;
    try {
        path = cimom::parseObjectPath(text);
    } catch (const cimom::ObjectPathError&) {
        return 0;
    }
    const cimom::broker::RequestScope scope;
    auto* const record = cimom::broker::toRecord(cimom::broker::RequestScope::current().arena(),
                                                 &host.repository, path);
    const ObjectPath back = cimom::broker::toModel(*record);
    fuzz::require(
        back == path && back.host == path.host && cimom::toText(back) == cimom::toText(path),
        "a path survives being a record");
    // Texts of CMPI end at a zero byte.
    if (text.find('\0') == std::string_view::npos) {
        checkMoniker(host, path, record);
    }
    return 0;
}
