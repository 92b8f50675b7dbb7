#pragma once

#include <cmpift.h>

#include <string_view>

#include "broker/Arena.h"
#include "broker/objects/BrokerString.h"
#include "cimom/Status.h"
#include "model/NameKey.h"

namespace cimom::broker {

/// A value as a provider hands it over, copied into the arena: texts, paths,
/// instances, datetimes and arrays are copied deeply, a CMPI_chars text (whose
/// "value" pointer is the text pointer itself) becomes a CMPI_string. A null
/// pointer, outside or inside, is a null value of the type.
///
/// OK, CMPI_RC_ERR_INVALID_DATA_TYPE for a type that is not a CIM type, or
/// CMPI_RC_ERR_INVALID_HANDLE for an object that this broker did not make.
CMPIrc copyValue(Arena& arena, const CMPIValue* value, CMPIType type, CMPIData& copy);

/// A stored value copied deeply into another arena.
[[nodiscard]] CMPIData copyData(Arena& arena, const CMPIData& data);

/// A null value of the type.
[[nodiscard]] CMPIData nullData(CMPIType type) noexcept;

/// A named value; the name is a string that getters hand out.
struct Entry {
    StringRecord* name;
    std::uint64_t hash;  ///< of the name
    CMPIData data;
};

/// Named values in their order, in an arena; names compare without regard to
/// case. Copying the list itself shares the entries: use copyInto.
class EntryList {
  public:
    [[nodiscard]] CMPICount size() const noexcept { return size_; }
    [[nodiscard]] const Entry* begin() const noexcept { return entries_; }
    [[nodiscard]] const Entry* end() const noexcept { return entries_ + size_; }
    [[nodiscard]] const Entry& operator[](CMPICount index) const noexcept {
        return entries_[index];
    }
    [[nodiscard]] const Entry* find(std::string_view name) const noexcept;
    /// size() when there is none of the name.
    [[nodiscard]] CMPICount position(const NameKey& name) const noexcept;

    void reserve(Arena& arena, CMPICount capacity);
    /// Adds the value, or replaces the one of that name.
    void set(Arena& arena, const NameKey& name, const CMPIData& data);
    void set(Arena& arena, std::string_view name, const CMPIData& data) {
        set(arena, NameKey(name), data);
    }
    void remove(CMPICount index) noexcept;
    /// A deep copy.
    [[nodiscard]] EntryList copyInto(Arena& arena) const;

  private:
    [[nodiscard]] Entry* locate(const NameKey& name) const noexcept;
    void append(Arena& arena, const Entry& entry);

    Entry* entries_ = nullptr;
    CMPICount size_ = 0;
    CMPICount capacity_ = 0;
};

/// What a getter by name gives: the data with `extraState`, or the data and
/// status of a missing one.
CMPIData dataByName(const EntryList& entries, const char* name, CMPIValueState extraState,
                    CMPIStatus* rc) noexcept;
/// The same by position; writes the name when asked.
CMPIData dataAt(const EntryList& entries, CMPICount index, CMPIValueState extraState,
                CMPIString** name, CMPIStatus* rc) noexcept;

}  // namespace cimom::broker
