#include "providerutilities/Refusal.h"

#include "providerutilities/Keys.h"

namespace ZR {

namespace {

[[noreturn]] void refuseKey(const char* className, const char* key, const char* what) {
    throw Refusal(CMPI_RC_ERR_INVALID_PARAMETER,
                  std::string("the key ") + key + " of " + className + ' ' + what);
}

}  // namespace

void requireKeys(const char* className, std::span<const char* const> names, KeyKind kind,
                 const Keys& keys) {
    const bool references = kind == KeyKind::reference;
    for (const char* name : names) {
        const Key* key = keys.find(name);
        if (key == nullptr) {
            refuseKey(className, name, "is missing");
        }
        if (references ? key->reference == nullptr : !key->isText) {
            refuseKey(className, name, references ? "is not a reference" : "is not a text");
        }
    }
    if (keys.size() != names.size()) {
        throw Refusal(CMPI_RC_ERR_INVALID_PARAMETER,
                      std::string("the path has a key that ") + className + " does not have");
    }
}

void refuseMissing(const char* className, const Keys& keys) {
    std::string text = std::string("there is no ") + className;
    char separator = '.';
    for (const Key& key : keys) {
        const std::string value =
            key.isText ? '"' + key.text + '"' : "a " + classNameOf(key.reference);
        text += separator + key.name + '=' + value;
        separator = ',';
    }
    throw Refusal(CMPI_RC_ERR_NOT_FOUND, text);
}

}  // namespace ZR
