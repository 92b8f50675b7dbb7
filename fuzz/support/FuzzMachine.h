#pragma once

#include "cimom/ObjectManager.h"
#include "cimxml/XmlDocument.h"

namespace fuzz {

/// The object manager with the shipped schema and the real provider, which shows the
/// machine of docs/sample-machine.json and logs nothing. Its configuration files would
/// lie in a directory that there is not, so that an input leaves nothing behind.
cimom::ObjectManager& machine();

/// Reads what the server answered. Ends the process unless it is well-formed and of
/// the structure of DSP0203.
cimom::wbem::XmlElement validAnswer(const std::string& xml);

/// Lets what an input calls log nothing. Before the first call into the platform.
void silence();

}  // namespace fuzz
