#pragma once

#include <cstdint>
#include <random>
#include <string>

#include "cimom/Instance.h"

namespace cimom::test {

/// Makes objects that CIM-XML can carry without loss: of all types, with nulls,
/// arrays, extremes, nested references and any text that XML can hold.
class RandomObjects {
  public:
    explicit RandomObjects(std::uint64_t seed) : random_(seed) {}

    Instance instance(unsigned depth = 2);
    ObjectPath path(unsigned depth = 2);
    /// Printable and other characters from all planes, line ends and blanks.
    std::string text();

  private:
    std::uint64_t below(std::uint64_t limit);
    std::string name();
    std::string nameSpace();
    Value value(unsigned depth);
    Scalar scalar(Type type, unsigned depth);
    Value key(unsigned depth);
    template <typename Integer>
    Scalar integer();

    std::mt19937_64 random_;
};

/// A seed for this run, printed so that a failure can be repeated; the variable
/// WBEM_TEST_SEED sets it.
std::uint64_t randomSeed();

}  // namespace cimom::test
