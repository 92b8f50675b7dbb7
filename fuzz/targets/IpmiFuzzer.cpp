// The responses of a service processor: in pieces of a byte that tells which request is
// responded to and how, a byte of the length of the response, and the response.
#include <cerrno>

#include "Input.h"
#include "ipmi/IpmiConversation.h"
#include "ipmi/IpmiMessages.h"

namespace {

using ZR::Live::IpmiRefusal;
using ZR::Live::IpmiResponse;
using State = ZR::Live::IpmiConversation::State;

class Processor final : public ZR::Live::IpmiTransport {
  public:
    explicit Processor(fuzz::Bytes input) : input_(input) {}

    int open() override { return 0; }
    void close() noexcept override {}

    int send(long id, const ZR::Live::IpmiRequest& request) override {
        fuzz::require(id > lastId_, "each request has a number of its own");
        lastId_ = id;
        last_ = request;
        ++asked;
        return 0;
    }

    ZR::Live::IpmiReceived receive() override {
        ++received;
        if (input_.empty()) {
            return {.error = EAGAIN, .response = {}};
        }
        const auto head = input_.number<std::uint8_t>();
        if ((head & 0xF0U) == 0xF0U) {
            return {.error = (head & 1U) != 0 ? EAGAIN : EIO, .response = {}};
        }
        const auto response = input_.take(input_.number<std::uint8_t>());
        // The numbers of the requests go up, and the last ones are those that are open.
        const long id = lastId_ - static_cast<long>(head & 0x0FU);
        // Most requests are of the network function 0x0C; that of the channel is 0x06.
        const bool channel = (head & 0x40U) != 0;
        return {.error = 0,
                .id = id,
                .response = {static_cast<std::uint8_t>(channel ? 0x07 : 0x0D),
                             static_cast<std::uint8_t>(channel ? 0x42 : 0x02),
                             {response.begin(), response.end()}}};
    }

    int asked = 0;
    int received = 0;

  private:
    fuzz::Bytes input_;
    long lastId_ = 0;
    ZR::Live::IpmiRequest last_;
};

template <typename Facts>
void checkRefusal(const ZR::Live::IpmiDecoded<Facts>& decoded) {
    const auto* const refusal = std::get_if<IpmiRefusal>(&decoded);
    fuzz::require(refusal == nullptr || !refusal->reason.empty(), "a refusal has a reason");
    fuzz::require(refusal == nullptr || !(refusal->passing() && refusal->unsupported()),
                  "what is not supported does not pass");
}

void checkMessages(const std::uint8_t* data, std::size_t size) {
    fuzz::Bytes input(data, size);
    IpmiResponse response{input.number<std::uint8_t>(), input.number<std::uint8_t>(), {}};
    const auto rest = input.take(size);
    response.data.assign(rest.begin(), rest.end());
    const auto address = ZR::Live::decodeLanAddress(response);
    checkRefusal(address);
    using Address = std::optional<ZR::Live::IpAddress>;
    if (const auto* const found = std::get_if<Address>(&address); found != nullptr && *found) {
        fuzz::require((*found)->isIPv4() && !(*found)->isUnspecified(),
                      "an address is one of IPv4, and not that which stands for none");
    }
    const auto source = ZR::Live::decodeLanAddressSource(response);
    checkRefusal(source);
    fuzz::require(
        !std::holds_alternative<std::uint8_t>(source) || std::get<std::uint8_t>(source) <= 15,
        "a source is a number of four bits");
    const auto channel = ZR::Live::decodeChannelInfo(response);
    checkRefusal(channel);
    // What later versions append changes nothing.
    response.data.push_back(0xAB);
    if (std::holds_alternative<ZR::Live::ChannelInfo>(channel)) {
        fuzz::require(ZR::Live::decodeChannelInfo(response) == channel, "more bytes do not count");
    }
}

void checkConversation(const std::uint8_t* data, std::size_t size) {
    Processor processor{fuzz::Bytes(data, size)};
    long lastId = 0;
    auto now = ZR::Live::IpmiConversation::Time{};
    ZR::Live::IpmiConversation conversation(processor, lastId,
                                            ZR::Live::IpmiConversation::usualChannel, now);
    // Eleven at which a response is missing are more than a second; those at which the
    // responses of one of the three rounds have come do not count.
    constexpr int looks = 11 + 3;
    for (int i = 0; i < looks && conversation.state() == State::Underway; ++i) {
        const int before = processor.received;
        now += std::chrono::milliseconds(100);
        static_cast<void>(conversation.continue_(now));
        fuzz::require(processor.received - before <= 64,
                      "a flood of messages does not keep a caller");
    }
    constexpr int mostRequests = 16;
    fuzz::require(processor.asked <= mostRequests, "requests are few");
    fuzz::require(conversation.state() != State::Underway, "a conversation ends in time");
    if (conversation.state() == State::Failed) {
        fuzz::require(conversation.diagnostics().size() == 1, "a failure has a reason");
    } else if (const auto& lan = conversation.lan()) {
        fuzz::require(lan->channel < 16, "a channel is a number of four bits");
    }
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    checkMessages(data, size);
    checkConversation(data, size);
    return 0;
}
