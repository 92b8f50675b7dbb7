#pragma once

#include "cimom/ObjectManager.h"
#include "cimxml/XmlDocument.h"

namespace fuzz {

/// The object manager with the shipped schema and the real provider, which shows the
/// machine of docs/sample-machine.json and logs nothing. Its configuration files would
/// lie in a directory that does not exist, so that an input leaves nothing behind.
cimom::ObjectManager& machine();

/// Reads a response of the server. Ends the process unless it is well-formed and of
/// the structure of DSP0203.
cimom::wbem::XmlElement validResponse(const std::string& xml);

/// Turns off log and trace of this process. Before the first call into the platform.
void silence();

}  // namespace fuzz
