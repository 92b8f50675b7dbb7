// An association row that names every step and field that a row may name. The test of
// rows compiles it as it is, and with each of the names misspelt.

#include "CMPI/AssociationAdapter.h"
#include "CMPI/CMPIDHCPProtocolEndpoint.h"
#include "CMPI/CMPIIPProtocolEndpoint.h"
#include "Lindows/SAPSAPDependency.h"

namespace ZR::DHCPClientProvider {

struct WholeRow {
    using First = CMPIIPProtocolEndpoint;
    using Second = CMPIDHCPProtocolEndpoint;
    using Record = SAPSAPDependency;

    static constexpr const Classes::Class& servedClass = Classes::sapSapDependency;
    static const RowSource trace;
    static const AssociationClass<WholeRow> associationClass;
};

using Adapter = AssociationAdapter<WholeRow>;

const std::string logger = loggerCategory;
const RowSource WholeRow::trace{{"Row", logger}, "~WholeRow", __LINE__};

constinit const AssociationClass<WholeRow> WholeRow::associationClass{
    .first = {.role = "Antecedent", .locate = nullptr},
    .second = {.role = "Dependent", .locate = nullptr},
    .ownProperties = {},
    .walked = End::second,
    .place = [](Adapter& /*adapter*/, const CMPIObjectPath* /*objectPath*/) {},
    .stands = [](Adapter& /*adapter*/) { return false; },
    .step = [](Adapter& /*adapter*/) {},
    .referencedFirst = End::first,
    .other = Reference::own,
    .placeFirstAsSource = &CMPIIPProtocolEndpoint::setSingleObjectPath,
    .placeFirstLocated = &CMPIIPProtocolEndpoint::setSingleObjectPath,
};

template class AssociationAdapter<WholeRow>;

}  // namespace ZR::DHCPClientProvider
