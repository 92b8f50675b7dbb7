#pragma once

#include <cmpift.h>

#include <string>
#include <string_view>
#include <vector>

#include "zrclient/Moniker.h"

namespace ZR {

/// What CMPI providers ask of the broker, without its tables in sight.
///
/// Every function accepts null for broker, path, instance and name: nothing is
/// dereferenced, creation returns null, counts return 0, reads and writes return
/// false with their output left as it was. Objects made here belong to the host
/// and end with the request. Safe on any thread that the host knows.
///
/// Texts are set as CMPI_string, for which a broker is needed: the setters that
/// take none use the one with which this thread last made a path or an instance.
struct ProviderUtilities {
    /// The identifier of every class without one of its own.
    static constexpr unsigned short unknownClass = 255;

    // Class identifiers. Names compare without regard to case.
    [[nodiscard]] static unsigned short getClassId(const char* className);
    [[nodiscard]] static unsigned short getClassId(const CMPIObjectPath* path);

    /// Whether the host's class repository says that either class is the other
    /// or an ancestor of the other. Without a class name (null or empty) there is no
    /// restriction: it is related to every class. Where the host reports an error, the
    /// classes are not related.
    [[nodiscard]] static bool areClassesRelated(const CMPIBroker* broker,
                                                const std::string& nameSpace, const char* className,
                                                const char* parent);

    // Object paths and instances.
    [[nodiscard]] static std::string getNamespace(const CMPIObjectPath* path);
    [[nodiscard]] static CMPIObjectPath* createObjectPath(const CMPIBroker* broker,
                                                          const char* className,
                                                          const std::string& nameSpace);
    [[nodiscard]] static CMPIInstance* createInstance(const CMPIBroker* broker,
                                                      const CMPIObjectPath* path);

    /// Whether a property list of a request, null for all properties, has a property. Names
    /// compare without regard to case.
    [[nodiscard]] static bool isListed(const char* const* properties,
                                       std::string_view name) noexcept;

    // Keys. Only those with a value count, whatever the host counts, and a path is never
    // asked for one by name. A key is read as text only when it is one, as a reference
    // only when it is one. A null reference adds no key.
    [[nodiscard]] static unsigned int getKeyCount(const CMPIObjectPath* path);
    static bool getKeyProperty(const CMPIObjectPath* path, const char* name, std::string& value);
    static bool getKeyProperty(const CMPIObjectPath* path, const char* name,
                               CMPIObjectPath** reference);
    static bool setKeyProperty(CMPIObjectPath* path, const char* name, const std::string& value);
    static bool setKeyProperty(CMPIObjectPath* path, const char* name, CMPIObjectPath* reference);

    // Properties.
    static bool setProperty(CMPIInstance* instance, const char* name, const std::string& value);
    static bool setProperty(CMPIInstance* instance, const char* name, unsigned short number);
    static bool setProperty(CMPIInstance* instance, const char* name, unsigned int number);
    static bool setProperty(CMPIInstance* instance, const char* name, unsigned long long number);
    static bool setProperty(CMPIInstance* instance, const char* name, bool truth);
    static bool setProperty(CMPIInstance* instance, const char* name, CMPIObjectPath* reference);
    /// Sets the null of a type: some object managers show the schema's default for a property
    /// that stays unset.
    static bool setNull(CMPIInstance* instance, const char* name, CMPIType type);
    /// A literal would silently become a boolean.
    static bool setProperty(CMPIInstance* instance, const char* name, const char* value) = delete;
    /// With dateTime, the text is a CIM date-time of 25 characters (DSP0004, 5.2.4);
    /// one that the host does not accept sets nothing.
    static bool setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                            const std::string& text, bool dateTime);
    static bool setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                            const std::vector<unsigned short>& values);
    static bool setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                            const std::vector<std::string>& values);

    /// Reads a text property; with dateTime, the text form of a date-time property.
    static bool getProperty(const CMPIInstance* instance, const char* name, std::string& value,
                            bool dateTime);

    // Monikers.
    /// Adds the path's text keys to the moniker, in its order, with their names in the
    /// schema's case; others are skipped. False for a null path.
    static bool transformObjectPathToMoniker(const CMPIObjectPath* path, Moniker& moniker);
    /// Replaces the path by a new one of the same class and namespace whose keys
    /// are the moniker's, in their order. When that fails, the path stays.
    static bool transformMonikerToObjectPath(Moniker& moniker, CMPIObjectPath** path);
};

}  // namespace ZR
