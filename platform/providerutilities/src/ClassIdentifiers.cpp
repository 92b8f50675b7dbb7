#include <algorithm>

#include "providerutilities/Classes.h"
#include "providerutilities/ProviderUtilities.h"
#include "zrcommon/Strings.h"

namespace ZR {

unsigned short ProviderUtilities::getClassId(const char* className) {
    if (className == nullptr) {
        return unknownClass;
    }
    const auto* found = std::find_if(
        Classes::all.begin(), Classes::all.end(),
        [className](const Classes::Class& known) { return equalNames(known.name, className); });
    return found == Classes::all.end() ? unknownClass : found->id;
}

}  // namespace ZR
