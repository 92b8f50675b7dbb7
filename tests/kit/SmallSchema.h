#pragma once

#include "cimom/ClassRepository.h"

namespace test {

/// A few classes with all the forms that values and their meanings have.
inline constexpr const char* smallSchema = R"(
Qualifier Abstract : boolean = false, Scope(class, association), Flavor(EnableOverride, Restricted);
Qualifier Association : boolean = false, Scope(association), Flavor(DisableOverride, ToSubclass);
Qualifier Key : boolean = false, Scope(property, reference), Flavor(DisableOverride, ToSubclass);
Qualifier ValueMap : string[], Scope(property), Flavor(EnableOverride, ToSubclass);
Qualifier Values : string[], Scope(property), Flavor(EnableOverride, ToSubclass, Translatable);

class TEST_Base {
    [Key] string Id;
    [ValueMap {"0", "2", "-1", "0x10", "20..29", "..-100", "32768..", ".."},
     Values {"Unknown", "Enabled", "Minus One", "Sixteen", "Twenties", "Depth", "Vendor", "Rest"}]
    sint32 State;
};
class TEST_Thing : TEST_Base {
    [Values {"Off", "On"}] uint16 Switch;
    [ValueMap {"8", "14"}, Values {"Eight", "Fourteen"}] uint16 Options[];
    [ValueMap {"a", "b"}, Values {"Letter A", "Letter B"}] string Letter;
    [ValueMap {"1", "2"}, Values {"One"}] uint8 Short;
    boolean Flag;
    uint8 Byte; uint64 Big; sint8 Small; sint64 Deep;
    real32 Real; char16 Character; datetime When;
    string Text; string Texts[];
};
[Association] class TEST_Link {
    [Key] TEST_Base REF First;
    [Key] TEST_Base REF Second;
};
class TEST_Keyless { string Text; };
)";

inline cimom::ClassRepository smallRepository() {
    cimom::ClassRepository repository;
    repository.loadText(smallSchema, "small.mof");
    repository.complete();
    return repository;
}

}  // namespace test
