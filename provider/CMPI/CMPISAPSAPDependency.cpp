#include "CMPI/CMPISAPSAPDependency.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPISAPSAPDependency = loggerCategory;

namespace {

using Row = SAPSAPDependencyAssociation;
using Record = Row::Record;

CMPIObjectPath* locateIPEndpoint(CMPISAPSAPDependency& adapter, const CMPIObjectPath* objectPath) {
    return adapter.locate<End::first>(Row::trace.at(__func__), objectPath,
                                      &Record::getIPSAPMoniker);
}

CMPIObjectPath* locateDHCPEndpoint(CMPISAPSAPDependency& adapter,
                                   const CMPIObjectPath* objectPath) {
    const TracePoint at = Row::trace.at(__func__);
    return adapter.locate<End::second>(at, objectPath, [&at](Record& record, Moniker& known) {
        Moniker found = record.getDHCPSAPMoniker(known);
        traceVariable(at, "KEY Count", static_cast<unsigned>(found.getKeyCount()));
        return found;
    });
}

void placeFromSource(CMPISAPSAPDependency& adapter, const CMPIObjectPath* objectPath) {
    if (adapter.second()) {
        // The endpoint's path is fetched but not used: the IP endpoint is located
        // from the source path itself.
        static_cast<void>(adapter.second().getObjectPath());
        adapter.first().setObjectPath(locateIPEndpoint(adapter, objectPath));
    }
}

}  // namespace

const RowSource SAPSAPDependencyAssociation::trace{
    {"CMPI/CMPISAPSAPDependency", loggerCMPISAPSAPDependency}, "~CMPISAPSAPDependency", __LINE__};

constinit const AssociationClass<SAPSAPDependencyAssociation>
    SAPSAPDependencyAssociation::associationClass{
        .first = {"Antecedent", &locateIPEndpoint},
        .second = {"Dependent", &locateDHCPEndpoint},
        .walked = End::second,
        .place = &placeFromSource,
        .placeFirstLocated = &CMPIIPProtocolEndpoint::setSingleObjectPath,
    };

template class AssociationAdapter<SAPSAPDependencyAssociation>;

}  // namespace ZR::DHCPClientProvider
