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

ResponseBody failed(const Call& call, unsigned status, const std::string& description) {
    return ResponseBody(errorResponse(call, status, description), status);
}
ResponseBody failed(const Call& call, CimStatus status, const std::string& description) {
    return failed(call, static_cast<unsigned>(status), description);
}

}  // namespace

Operations::Operations(ObjectManager& manager, const Limits& limits, ModificationLog log)
    : manager_(manager),
      sessions_(limits.sessions),
      largestResult_(limits.result),
      log_(std::move(log)) {}

std::string_view Operations::nameOf(const Call& call) {
    const auto found = call.intrinsic ? table().find(call.method) : table().end();
    return found == table().end() ? "other" : found->first;
}

ResponseBody Operations::perform(const Call& call, const Caller& caller) {
    const auto found = call.intrinsic ? table().find(call.method) : table().end();
    if (found == table().end()) {
        // Also for methods of classes, none of which this manager calls. Clients
        // fall back to other operations on this very status.
        return failed(call, CimStatus::notSupported,
                      "the operation " + call.method + " is not offered");
    }
    try {
        Request request{manager_, sessions_, largestResult_, log_, call, caller, Parameters(call)};
        // Clients try namespaces out, and go by this status alone.
        requireNameSpace(request);
        return found->second(request);
    } catch (const CimError& error) {
        return failed(call, error.code, error.what());
    } catch (const NotValid&) {
        throw;
    } catch (const std::bad_alloc&) {
        return failed(call, CimStatus::serverLimitsExceeded, "the server is out of memory");
    } catch (const std::exception& error) {
        return failed(call, CimStatus::failed, error.what());
    }
}

}  // namespace cimom::wbem
