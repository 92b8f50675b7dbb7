#pragma once

#include <cerrno>
#include <cstdint>
#include <deque>
#include <map>
#include <utility>
#include <vector>

#include "ipmi/IpmiTransport.h"

namespace ZR::Live {

using Bytes = std::vector<std::uint8_t>;

/// The address that a processor was leased: 198.51.100.77.
inline const Bytes leased{198, 51, 100, 77};

/// A service processor as tests want it: it responds from a table, and what it was
/// asked and how it is spoken to stays to be looked at. IpmiSimulatorTest.cpp goes
/// the same way with a simulator that others made.
struct ScriptedProcessor {
    std::map<Bytes, Bytes> responses;  ///< by network function, command and data
    std::deque<IpmiReceived> ready;    ///< what receive() gives next
    std::vector<std::pair<long, IpmiRequest>> asked;
    int openError = 0;
    int sendError = 0;
    int receiveError = 0;  ///< instead of there being nothing
    bool silent = false;   ///< takes requests and responds to none
    int opened = 0;
    bool isOpen = false;
    int received = 0;

    /// A processor with LAN on this channel.
    static ScriptedProcessor withLan(std::uint8_t channel, std::uint8_t addressSource,
                                     const Bytes& address) {
        ScriptedProcessor processor;
        processor.channel(channel, 4);
        processor.parameter(channel, 4, {addressSource});
        processor.parameter(channel, 3, address);
        return processor;
    }

    void channel(std::uint8_t channel, std::uint8_t medium) {
        responses[{0x06, 0x42, channel}] = {0x00, channel, medium, 0x01, 0x80,
                                            0xf2, 0x1b,    0x00,   0x00, 0x00};
    }
    void parameter(std::uint8_t channel, std::uint8_t number, const Bytes& value) {
        Bytes& response = responses[{0x0c, 0x02, channel, number, 0, 0}];
        response = {0x00, 0x11};
        response.insert(response.end(), value.begin(), value.end());
    }
    void refuseParameter(std::uint8_t channel, std::uint8_t number, std::uint8_t code) {
        responses[{0x0c, 0x02, channel, number, 0, 0}] = {code};
    }
};

class ScriptedIpmi final : public IpmiTransport {
  public:
    explicit ScriptedIpmi(ScriptedProcessor& processor) : processor_(processor) {}

    int open() override {
        ++processor_.opened;
        processor_.ready.clear();
        processor_.isOpen = processor_.openError == 0;
        return processor_.openError;
    }

    void close() noexcept override { processor_.isOpen = false; }

    int send(long id, const IpmiRequest& request) override {
        if (!processor_.isOpen) {
            return EBADF;
        }
        if (processor_.sendError != 0) {
            return processor_.sendError;
        }
        processor_.asked.emplace_back(id, request);
        if (!processor_.silent) {
            Bytes key{request.netFn, request.command};
            key.insert(key.end(), request.data.begin(), request.data.end());
            const auto response = processor_.responses.find(key);
            // 0xCC: invalid data field, as for a channel that there is not.
            processor_.ready.push_back(
                {.id = id,
                 .response = {
                     static_cast<std::uint8_t>(request.netFn + 1), request.command,
                     response != processor_.responses.end() ? response->second : Bytes{0xcc}}});
        }
        return 0;
    }

    IpmiReceived receive() override {
        ++processor_.received;
        if (!processor_.isOpen) {
            return {.error = EBADF, .response = {}};
        }
        if (processor_.ready.empty()) {
            return {.error = processor_.receiveError != 0 ? processor_.receiveError : EAGAIN,
                    .response = {}};
        }
        IpmiReceived next = std::move(processor_.ready.front());
        processor_.ready.pop_front();
        return next;
    }

  private:
    ScriptedProcessor& processor_;
};

}  // namespace ZR::Live
