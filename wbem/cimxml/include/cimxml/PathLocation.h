#pragma once

#include <string>

#include "cimom/Forward.h"

namespace cimom::wbem {

/// Puts the namespace where a path names none: DSP0201 lets INSTANCENAME stand for an
/// object of the operation's own namespace. A reference in the keys that names none is
/// of the namespace of the path around it.
void locate(ObjectPath& path, const std::string& nameSpace);
/// The same for an instance: its path, and the references in its properties.
void locate(Instance& instance, const std::string& nameSpace);

}  // namespace cimom::wbem
