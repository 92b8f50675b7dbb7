#pragma once

#include <cmpidt.h>

#include "cimom/Forward.h"

namespace cimom::broker {

class Broker;

/// Where the indications that providers deliver go. Any thread calls it.
class IndicationSink {
  public:
    IndicationSink() = default;
    virtual ~IndicationSink() = default;
    IndicationSink(const IndicationSink&) = delete;
    IndicationSink& operator=(const IndicationSink&) = delete;

    /// Takes what a provider of that broker's library delivered; the namespace is in its path.
    virtual CMPIrc take(const Broker& from, Instance indication) = 0;
};

}  // namespace cimom::broker
