#include "broker/BrokerText.h"

#include "broker/Broker.h"
#include "broker/BrokerTypes.h"
#include "broker/Conversion.h"
#include "broker/objects/BrokerRecords.h"
#include "broker/objects/BrokerResult.h"
#include "cimom/ObjectPath.h"
#include "cimom/ObjectPathText.h"

namespace cimom::broker {

namespace {

/// Every CMPI object begins so.
struct AnyRecord {
    void* hdl;
    const void* table;
};

std::string describe(const CMPIData& data);

std::string describe(const ArrayRecord& array) {
    std::string text = "{";
    for (CMPICount index = 0; index < array.size; ++index) {
        text += index == 0 ? "" : ", ";
        text += describe(array.elements[index]);
    }
    return text + "}";
}

std::string describe(const EntryList& entries) {
    std::string text = " {";
    for (const Entry& entry : entries) {
        text += ' ';
        text += entry.name->view();
        text += " = " + describe(entry.data) + ";";
    }
    return text + " }";
}

std::string describe(const CMPIData& data) {
    if ((data.state & CMPI_nullValue) != 0) {
        return "NULL";
    }
    if (isArrayType(data.type)) {
        return describe(*arrayOf(data.value.array));
    }
    if (data.type == CMPI_instance) {
        return broker::describe(data.value.inst);
    }
    const Value value = toModel(data);
    return scalarText(*value.scalar()).value_or("");
}

}  // namespace

std::string_view kindOf(const void* object) noexcept {
    if (object == nullptr) {
        return {};
    }
    const void* const table = static_cast<const AnyRecord*>(object)->table;
    struct Kind {
        const void* table;
        std::string_view name;
    };
    const Kind kinds[] = {
        {&instanceTable, "CMPIInstance"},   {&objectPathTable, "CMPIObjectPath"},
        {&stringTable, "CMPIString"},       {&arrayTable, "CMPIArray"},
        {&dateTimeTable, "CMPIDateTime"},   {&argsTable, "CMPIArgs"},
        {&contextTable, "CMPIContext"},     {&enumerationTable, "CMPIEnumeration"},
        {&resultTable, "CMPIResult"},       {&errorTable, "CMPIError"},
        {&selectExpTable, "CMPISelectExp"}, {&brokerTable, "CMPIBroker"},
    };
    for (const Kind& kind : kinds) {
        if (kind.table == table) {
            return kind.name;
        }
    }
    return {};
}

std::string textOf(const PathRecord& path) {
    return cimom::toText(toModel(path));
}

std::string describe(const void* object) {
    const std::string_view kind = kindOf(object);
    if (kind == "CMPIObjectPath") {
        return textOf(*pathOf(static_cast<const CMPIObjectPath*>(object)));
    }
    if (kind == "CMPIInstance") {
        const InstanceRecord& instance = *instanceOf(static_cast<const CMPIInstance*>(object));
        return "instance of " + std::string(instance.path->className->view()) +
               describe(instance.properties);
    }
    if (kind == "CMPIString") {
        return std::string(textOf(static_cast<const CMPIString*>(object)));
    }
    if (kind == "CMPIArray") {
        return describe(*arrayOf(static_cast<const CMPIArray*>(object)));
    }
    if (kind == "CMPIDateTime") {
        return std::string(dateTimeOf(static_cast<const CMPIDateTime*>(object))->text->view());
    }
    if (kind == "CMPIArgs") {
        return "CMPIArgs" + describe(argsOf(static_cast<const CMPIArgs*>(object))->entries);
    }
    if (kind == "CMPIContext") {
        return "CMPIContext" +
               describe(contextOf(static_cast<const CMPIContext*>(object))->entries);
    }
    return std::string(kind);
}

}  // namespace cimom::broker
