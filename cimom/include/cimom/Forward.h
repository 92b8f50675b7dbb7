#pragma once

/// The names of what the object manager works on, for headers that only pass these on:
/// so that a change of the model compiles those sources anew that look into it.
namespace cimom {

struct Value;
struct NamedValue;
struct ObjectPath;
struct Instance;
struct Status;

struct PropertyDeclaration;
struct ClassDeclaration;
struct QualifierType;
class ClassRepository;

struct AssociationRequest;
struct PathsResult;
struct InstancesResult;
class RequestHandler;
class IndicationHub;
class OwnClass;
class Query;
class ObjectManager;

}  // namespace cimom
