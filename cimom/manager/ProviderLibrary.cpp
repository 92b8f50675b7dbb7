#include "manager/ProviderLibrary.h"

#include <dlfcn.h>

#include "cimom/Registrations.h"

namespace cimom {

namespace {

std::filesystem::path find(const std::string& location,
                           const std::vector<std::filesystem::path>& directories) {
    const std::string name = "lib" + location + ".so";
    std::string searched;
    for (const auto& directory : directories) {
        std::error_code error;
        if (std::filesystem::exists(directory / name, error)) {
            return directory / name;
        }
        searched += (searched.empty() ? "" : ", ") + directory.string();
    }
    throw LoadError(name + ": not found in " +
                    (searched.empty() ? "any directory: none is configured" : searched));
}

}  // namespace

ProviderLibrary::ProviderLibrary(const std::string& location,
                                 const std::vector<std::filesystem::path>& directories)
    : file_(std::filesystem::absolute(find(location, directories))),
      handle_(dlopen(file_.c_str(), RTLD_NOW | RTLD_LOCAL)) {
    if (!handle_) {
        const char* const reason = dlerror();
        throw LoadError(file_.string() + ": " + (reason == nullptr ? "cannot be loaded" : reason));
    }
}

void ProviderLibrary::Closed::operator()(void* handle) const noexcept {
    dlclose(handle);
}

void* ProviderLibrary::symbol(const std::string& name) const noexcept {
    return dlsym(handle_.get(), name.c_str());
}

}  // namespace cimom
