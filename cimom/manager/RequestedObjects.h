#pragma once

#include <functional>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "cimom/Forward.h"
#include "cimom/ResultReceiver.h"

namespace cimom {

/// What the objects of a request get that providers may leave out. Borrows all.
struct RequestSurroundings {
    const std::string& host;
    const std::string& nameSpace;
};

/// Adds host and namespace where they are missing.
void complete(ObjectPath& path, const RequestSurroundings& surroundings);
void complete(Instance& instance, const RequestSurroundings& surroundings);

/// Drops the properties that the list does not name; keys stay in the path.
void applyPropertyList(Instance& instance,
                       const std::optional<std::vector<std::string>>& propertyList);
inline void applyPropertyList(const ObjectPath& /*path*/,
                              const std::optional<std::vector<std::string>>& /*propertyList*/) {}

/// Makes of what providers hand over what the client has requested: complete objects,
/// with the properties of the list alone, and only those that are wanted.
template <typename Object>
class RequestedObjects final : public ResultReceiver<Object> {
  public:
    using Wanted = std::function<bool(const Object&)>;

    /// Borrows all but `wanted`, which gets complete objects; empty: all are wanted.
    RequestedObjects(ResultReceiver<Object>& client, const RequestSurroundings& surroundings,
                     const std::optional<std::vector<std::string>>& propertyList,
                     Wanted wanted = nullptr)
        : client_(client),
          surroundings_(surroundings),
          propertyList_(propertyList),
          wanted_(std::move(wanted)) {}

    void beginCall() override { client_.beginCall(); }
    void take(std::optional<Object> object) override {
        if (object) {
            complete(*object, surroundings_);
            // An absent entry is not an object that could be judged.
            if (wanted_ && !wanted_(*object)) {
                return;
            }
            applyPropertyList(*object, propertyList_);
        }
        client_.take(std::move(object));
    }
    void dropCall() override { client_.dropCall(); }

  private:
    ResultReceiver<Object>& client_;
    const RequestSurroundings surroundings_;
    const std::optional<std::vector<std::string>>& propertyList_;
    const Wanted wanted_;
};

}  // namespace cimom
