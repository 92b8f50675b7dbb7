#include "providerutilities/Keys.h"

#include <algorithm>

#include "providerutilities/ProviderUtilities.h"
#include "zrcommon/Strings.h"

namespace ZR {

namespace {

std::string contentOf(const CMPIString* text) {
    const char* characters = text == nullptr ? nullptr : text->ft->getCharPtr(text, nullptr);
    return characters == nullptr ? "" : characters;
}

bool sameValue(const Key& one, const Key& other) {
    if (one.reference != nullptr && other.reference != nullptr) {
        return sameObject(one.reference, other.reference);
    }
    return one.isText && other.isText && one.text == other.text;
}

}  // namespace

Keys::Keys(const CMPIObjectPath* path) {
    const CMPICount count = path == nullptr ? 0 : path->ft->getKeyCount(path, nullptr);
    keys_.reserve(count);
    for (CMPICount index = 0; index < count; ++index) {
        CMPIString* name = nullptr;
        CMPIStatus status{CMPI_RC_OK, nullptr};
        const CMPIData data = path->ft->getKeyAt(path, index, &name, &status);
        constexpr unsigned absent = CMPI_nullValue | CMPI_notFound | CMPI_badValue;
        if (status.rc != CMPI_RC_OK || (data.state & absent) != 0) {
            continue;
        }
        Key& key = keys_.emplace_back();
        key.name = contentOf(name);
        if (data.type == CMPI_string) {
            key.text = contentOf(data.value.string);
            key.isText = data.value.string != nullptr;
        } else if (data.type == CMPI_chars) {
            key.text = data.value.chars == nullptr ? "" : data.value.chars;
            key.isText = data.value.chars != nullptr;
        } else if (data.type == CMPI_ref) {
            key.reference = data.value.ref;
        }
    }
}

const Key* Keys::find(std::string_view name) const noexcept {
    const auto found = std::find_if(keys_.begin(), keys_.end(),
                                    [name](const Key& key) { return equalNames(key.name, name); });
    return found == keys_.end() ? nullptr : &*found;
}

std::string_view Keys::text(std::string_view name) const noexcept {
    const Key* key = find(name);
    return key == nullptr ? std::string_view() : std::string_view(key->text);
}

bool Keys::operator==(const Keys& other) const {
    return size() == other.size() &&
           std::all_of(keys_.begin(), keys_.end(), [&other](const Key& key) {
               const Key* found = other.find(key.name);
               return found != nullptr && sameValue(key, *found);
           });
}

std::string classNameOf(const CMPIObjectPath* path) {
    return path == nullptr ? "" : contentOf(path->ft->getClassName(path, nullptr));
}

bool sameObject(const CMPIObjectPath* one, const CMPIObjectPath* other) {
    if (!equalNames(classNameOf(one), classNameOf(other))) {
        return false;
    }
    const std::string here = ProviderUtilities::getNamespace(one);
    const std::string there = ProviderUtilities::getNamespace(other);
    return (here.empty() || there.empty() || equalNames(here, there)) && Keys(one) == Keys(other);
}

}  // namespace ZR
