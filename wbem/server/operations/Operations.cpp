#include "operations/Operations.h"

#include <exception>
#include <new>
#include <unordered_map>

#include "cimom/Names.h"
#include "operations/Request.h"

namespace cimom::wbem {

namespace {

using Table = std::unordered_map<std::string_view, Operation, NameHash, NameEqual>;

const Table& table() {
    static const Table all = [] {
        Table made;
        for (const auto& group :
             {instanceOperations(), changingOperations(), associationOperations(),
              classOperations(), qualifierOperations(), queryOperations(), pullOperations()}) {
            for (const NamedOperation& entry : group) {
                made.emplace(entry.name, entry.operation);
            }
        }
        return made;
    }();
    return all;
}

}  // namespace

Operations::Operations(ObjectManager& manager, const Limits& limits, ModificationLog log)
    : manager_(manager),
      sessions_(limits.sessions),
      largestResult_(limits.result),
      log_(std::move(log)) {}

ResponseBody Operations::perform(const Call& call, const Caller& caller) {
    const auto found = call.intrinsic ? table().find(call.method) : table().end();
    if (found == table().end()) {
        // Also for methods of classes, none of which this manager calls. Clients
        // fall back to other operations on this very status.
        return ResponseBody(errorResponse(call, static_cast<unsigned>(CimStatus::notSupported),
                                          "the operation " + call.method + " is not offered"));
    }
    try {
        Request request{manager_, sessions_, largestResult_, log_, call, caller, Parameters(call)};
        // Clients try namespaces out, and go by this status alone.
        requireNameSpace(request);
        return found->second(request);
    } catch (const CimError& error) {
        return ResponseBody(errorResponse(call, error.code, error.what()));
    } catch (const NotValid&) {
        throw;
    } catch (const std::bad_alloc&) {
        return ResponseBody(errorResponse(call,
                                          static_cast<unsigned>(CimStatus::serverLimitsExceeded),
                                          "the server is out of memory"));
    } catch (const std::exception& error) {
        return ResponseBody(
            errorResponse(call, static_cast<unsigned>(CimStatus::failed), error.what()));
    }
}

}  // namespace cimom::wbem
