#pragma once

#include <cmpidt.h>

#include <string>
#include <vector>

#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"

/// Between the values of CMPI and those of the model, and the checks of what a
/// provider sets and delivers. Each wrong value is a violation.
namespace strict {

/// What a provider hands over. A null object inside is a violation and becomes null.
cimom::Scalar scalarFrom(const CMPIValue& value, CMPIType type, const char* function);
cimom::Value valueFrom(const CMPIValue& value, CMPIType type, const char* function);

/// The null of a type of CMPI.
cimom::Value nullOf(CMPIType type);

/// What a provider gets; its texts and paths are objects of the present request.
CMPIData dataFrom(const cimom::ClassRepository& repository, const cimom::Value& value,
                  CMPIValueState state);
CMPIData missing();

/// Adds a named value, or replaces it.
void put(std::vector<cimom::NamedValue>& values, const std::string& name, cimom::Value value);

/// Whether the class declares such a property, of this type.
bool hasType(const cimom::ClassRepository& repository, const std::string& className,
             const std::string& property, CMPIType type, const char* function);

/// A path must have all keys of its class, none of them null, and no others; an
/// instance its references as well. Object managers return nothing at all otherwise.
void checkDelivered(const cimom::ClassRepository& repository, const cimom::ObjectPath& path);
void checkDelivered(const cimom::ClassRepository& repository, const cimom::Instance& instance);

/// Whose default counts: that of the class, or that of the topmost superclass that has one.
enum class Defaults { declared, inherited };

/// The instance with the default in place of each property that is unset.
cimom::Instance withDefaults(const cimom::ClassRepository& repository, cimom::Instance instance,
                             Defaults defaults);

}  // namespace strict
