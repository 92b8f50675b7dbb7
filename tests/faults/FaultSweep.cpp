#include "FaultSweep.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <vector>

#include "kit/Allocations.h"
#include "kit/Files.h"
#include "kit/SystemCalls.h"

namespace test {
namespace {

using ZR::Testing::Allocations;
using ZR::Testing::Call;
using ZR::Testing::CallOrigin;
using ZR::Testing::openDescriptors;
using ZR::Testing::SystemCalls;

constexpr const char* oldContent = "# eth0\nBOOTPROTO=dhcp\nCONFIG_NAME=old\nONBOOT=yes\n";
constexpr const char* newContent = "# eth0\nBOOTPROTO=dhcp\nCONFIG_NAME=new\nONBOOT=yes\n";

/// What the manual pages (section 2, and 3 for functions of the C library) tell of that
/// such a call may fail with.
struct Errors {
    Call call;
    std::vector<int> errors;
};
const std::vector<Errors>& documentedErrors() {
    constexpr int half = SystemCalls::halfTransferred;
    static const std::vector<Errors> all{
        {Call::access,
         {EACCES, EBADF, EFAULT, EINVAL, EIO, ELOOP, ENAMETOOLONG, ENOENT, ENOMEM, ENOTDIR, EPERM,
          EROFS, ETXTBSY}},
        {Call::bind, {EACCES, EADDRINUSE, EBADF, EINVAL, ENOTSOCK, EADDRNOTAVAIL, EFAULT, ENOMEM}},
        {Call::close, {EBADF, EINTR, EIO, ENOSPC, EDQUOT}},
        {Call::fallocate,
         {EBADF, EFBIG, EINTR, EINVAL, EIO, ENODEV, ENOSPC, ENOSYS, EOPNOTSUPP, EPERM, ESPIPE,
          ETXTBSY}},
        {Call::fstat, {EACCES, EBADF, EFAULT, ENOMEM, EOVERFLOW}},
        {Call::fstatat,
         {EACCES, EBADF, EFAULT, EINVAL, ELOOP, ENAMETOOLONG, ENOENT, ENOMEM, ENOTDIR, EOVERFLOW}},
        {Call::ftruncate, {EACCES, EBADF, EFBIG, EINTR, EINVAL, EIO, EPERM, EROFS, ETXTBSY}},
        {Call::gethostname, {EFAULT, EINVAL, ENAMETOOLONG, EPERM}},
        {Call::getsockname, {EBADF, EFAULT, EINVAL, ENOBUFS, ENOTSOCK}},
        // Not ENOENT and ENOTDIR: who is told that a directory is not there waits for its
        // coming, and these have been there all the time.
        {Call::inotify_add_watch,
         {EACCES, EBADF, EEXIST, EFAULT, EINVAL, ENAMETOOLONG, ENOMEM, ENOSPC}},
        {Call::inotify_init1, {EINVAL, EMFILE, ENFILE, ENOMEM}},
        {Call::inotify_rm_watch, {EBADF, EINVAL}},
        {Call::ioctl, {EBADF, EFAULT, EINVAL, ENOTTY}},
        {Call::lstat,
         {EACCES, EBADF, EFAULT, ELOOP, ENAMETOOLONG, ENOENT, ENOMEM, ENOTDIR, EOVERFLOW}},
        {Call::open, {EACCES, EBUSY,        EFAULT, EFBIG,  EINTR,   EINVAL,     EISDIR, ELOOP,
                      EMFILE, ENAMETOOLONG, ENFILE, ENODEV, ENOENT,  ENOMEM,     ENOSPC, ENOTDIR,
                      ENXIO,  EOVERFLOW,    EPERM,  EROFS,  ETXTBSY, EWOULDBLOCK}},
        {Call::openat,
         {EACCES, EBADF, EINTR, EINVAL, ELOOP, EMFILE, ENAMETOOLONG, ENFILE, ENOENT, ENOMEM,
          ENOTDIR, EPERM}},
        {Call::opendir, {EACCES, EBADF, EMFILE, ENFILE, ENOENT, ENOMEM, ENOTDIR}},
        {Call::poll, {EFAULT, EINTR, EINVAL, ENOMEM}},
        {Call::pwrite,
         {EAGAIN, EBADF, EDQUOT, EFAULT, EFBIG, EINTR, EINVAL, EIO, ENOSPC, ENXIO, EOVERFLOW, EPERM,
          EPIPE, ESPIPE, half}},
        {Call::read, {EAGAIN, EBADF, EFAULT, EINTR, EINVAL, EIO, EISDIR, half}},
        {Call::readdir, {EBADF}},
        {Call::readlink,
         {EACCES, EFAULT, EINVAL, EIO, ELOOP, ENAMETOOLONG, ENOENT, ENOMEM, ENOTDIR}},
        {Call::readlinkat,
         {EACCES, EBADF, EFAULT, EINVAL, EIO, ELOOP, ENAMETOOLONG, ENOENT, ENOMEM, ENOTDIR}},
        {Call::recv,
         {EAGAIN, EBADF, ECONNREFUSED, EFAULT, EINTR, EINVAL, ENOBUFS, ENOMEM, ENOTCONN, ENOTSOCK}},
        {Call::recvmsg,
         {EAGAIN, EBADF, ECONNREFUSED, EFAULT, EINTR, EINVAL, ENOBUFS, ENOMEM, ENOTCONN, ENOTSOCK}},
        {Call::sendto,
         {EACCES, EAGAIN, EALREADY, EBADF, ECONNRESET, EDESTADDRREQ, EFAULT, EINTR, EINVAL, EISCONN,
          EMSGSIZE, ENOBUFS, ENOMEM, ENOTCONN, ENOTSOCK, EOPNOTSUPP, EPIPE, half}},
        {Call::socket,
         {EACCES, EAFNOSUPPORT, EINVAL, EMFILE, ENFILE, ENOBUFS, ENOMEM, EPROTONOSUPPORT}},
        {Call::stat,
         {EACCES, EBADF, EFAULT, ELOOP, ENAMETOOLONG, ENOENT, ENOMEM, ENOTDIR, EOVERFLOW}},
        {Call::syscall, {EINVAL, EMFILE, ENFILE, ENODEV, ENOMEM, ENOSYS, ESRCH}},
        {Call::write,
         {EAGAIN, EBADF, EDESTADDRREQ, EDQUOT, EFAULT, EFBIG, EINTR, EINVAL, EIO, ENOSPC, EPERM,
          EPIPE, half}},
    };
    return all;
}

/// Whether a failure says of the machine what is not so: that something is not there,
/// or is another thing, or may not be read by this user.
bool misinforms(Call call, int error) {
    switch (error) {
        case ENOENT:
        case ENOTDIR:
        case ESRCH:
        case EACCES:
        case EPERM:
            return true;
        case EAGAIN:  // that nothing happened
            return call == Call::read || call == Call::recv;
        case EINVAL:  // that it is not a link, or nothing that can be read
            return call == Call::open || call == Call::read || call == Call::readlink ||
                   call == Call::readlinkat;
        case EISDIR:
        case EFBIG:
            return call == Call::open || call == Call::read;
        default:
            return call == Call::access || call == Call::readlink || call == Call::readlinkat;
    }
}

std::string errorText(int error) {
    return error == SystemCalls::halfTransferred ? "half" : std::strerror(error);
}

/// The object as it is where its configuration file could not be read.
std::string withoutConfiguration(std::string object) {
    const std::string line = "  ConfigurationName=\"old\"\n";
    if (const std::size_t at = object.find(line); at != std::string::npos) {
        object.erase(at, line.size());
    }
    return object;
}

/// Whether the objects are some of those, in their order.
bool areAmong(const std::vector<std::string>& objects, const std::vector<std::string>& all) {
    std::size_t at = 0;
    return std::all_of(objects.begin(), objects.end(), [&](const std::string& object) {
        while (at < all.size() && all[at] != object && withoutConfiguration(all[at]) != object) {
            ++at;
        }
        return at++ < all.size();
    });
}

}  // namespace

FaultSweep::FaultSweep(Machine& machine, Reads reads) : machine_(machine), reads_(reads) {
    std::filesystem::create_directory(data_);
    ZR::Testing::writeFile(log_, "");
    ::setenv("ZR_DATA_DIR", data_.c_str(), 1);
    ::setenv("ZR_LOG_SINK", ("file:" + log_).c_str(), 1);
    machine_.enter(state_);
    host_ = std::make_unique<ProviderHost>();
    origin_ = CallOrigin(ProviderHost::library);
}

FaultSweep::~FaultSweep() = default;

std::uintmax_t FaultSweep::logSize() const {
    return std::filesystem::file_size(log_);
}

ScriptResponse FaultSweep::runUndisturbed(const ScriptRequest& request) {
    ZR::Testing::writeFile(configurationFile_, oldContent);
    return host_->run(request);
}

std::int64_t FaultSweep::blocksAfter(const ScriptRequest& request) {
    static_cast<void>(runUndisturbed(request));
    return Allocations::blocksHeld();
}

void FaultSweep::prepare(const ScriptRequest& request) {
    // A line of the log, so that its file is open.
    static_cast<void>(
        host_->run({"", Operation::references, R"(QVXZR_DHCPSettingData.InstanceID="none")",
                    "QVXZR_DHCPElementSettingData"}));
    ASSERT_GT(logSize(), 0U);
    for (unsigned round = 0; round < 4; ++round) {
        enterNextState();
        usual_.at(state_).response = runUndisturbed(request);
        usual_.at(state_).blocks = blocksAfter(request);
    }
    descriptors_ = openDescriptors();
    if (request.operation == Operation::modify) {
        ASSERT_EQ(ZR::Testing::readFile(configurationFile_), newContent);
    }
}

void FaultSweep::enterNextState() {
    if (reads_ == Reads::yes) {
        state_ = 1 - state_;
        machine_.enter(state_);
    }
}

bool FaultSweep::failOnce(const ScriptRequest& request, const Fault& fault,
                          const std::function<bool(ScriptResponse&)>& failing) {
    SCOPED_TRACE(fault.what);
    const auto failOnceMore = [&] {
        enterNextState();
        ZR::Testing::writeFile(configurationFile_, oldContent);
        const std::uintmax_t before = logSize();
        ScriptResponse response;
        const bool failed = failing(response);
        if (failed) {
            expectTruth(request, response, logSize() > before, fault);
            expectOneContent();
            if (fault.misinforms) {
                machine_.enter(state_);
            }
            EXPECT_EQ(runUndisturbed(request), usual_.at(state_).response) << "the next request";
            EXPECT_LE(openDescriptors(), descriptors_);
        } else {
            EXPECT_EQ(response, usual_.at(state_).response);
        }
        return failed;
    };
    if (!failOnceMore()) {
        return false;
    }
    // Some memory is kept for the next time, the room of a text for example; what is
    // lost is lost again each time.
    for (unsigned round = 0; round < 6; ++round) {
        const std::int64_t blocks = blocksAfter(request);
        if (blocks <= usual_.at(state_).blocks) {
            return true;
        }
        usual_.at(state_).blocks = blocks;
        failOnceMore();
        if (::testing::Test::HasFailure()) {
            return true;
        }
    }
    ADD_FAILURE() << "memory is lost each time";
    return true;
}

void FaultSweep::expectTruth(const ScriptRequest& request, const ScriptResponse& response,
                             bool logged, const Fault& fault) {
    const ScriptResponse& usual = usual_.at(state_).response;
    EXPECT_THAT(response.message, ::testing::Not(::testing::HasSubstr("exception")));
    if (response == usual) {
        return;
    }
    const bool nothingFound = request.operation == Operation::get && response.objects.empty() &&
                              response.code == CMPI_RC_ERR_NOT_FOUND;
    EXPECT_TRUE(response.code == usual.code || nothingFound) << response.code;
    if (fault.misinforms || fault.ofName) {
        return;  // what follows from it is right
    }
    const bool some = areAmong(response.objects, usual.objects);
    if (fault.ofMemory) {
        EXPECT_TRUE(some) << ::testing::PrintToString(response.objects);
    }
    const bool readsConfiguration = some && response.objects.size() == usual.objects.size();
    EXPECT_TRUE(logged || readsConfiguration || (fault.ofMemory && isSilent(request)))
        << "not a word in the log, and the response is "
        << ::testing::PrintToString(response.objects);
}

void FaultSweep::expectOneContent() {
    const std::string content = ZR::Testing::readFile(configurationFile_);
    EXPECT_TRUE(content == oldContent || content == newContent) << content;
}

unsigned FaultSweep::failAllocations(const ScriptRequest& request) {
    prepare(request);
    unsigned number = 1;
    for (;; ++number) {
        const Fault fault{"allocation " + std::to_string(number), false, true};
        const bool failed = failOnce(request, fault, [&](ScriptResponse& response) {
            const Allocations allocations(origin_, number);
            response = host_->run(request);
            return allocations.count() >= number;
        });
        if (!failed || ::testing::Test::HasFailure()) {
            break;
        }
    }
    EXPECT_EQ(runUndisturbed(request), usual_.at(state_).response);
    return number - 1;
}

unsigned FaultSweep::failSystemCalls(const ScriptRequest& request) {
    prepare(request);
    unsigned failures = 0;
    for (const Errors& documented : documentedErrors()) {
        const Call call = documented.call;
        for (const int error : documented.errors) {
            for (unsigned number = 1;; ++number) {
                const Fault fault{std::string(nameOf(call)) + ' ' + std::to_string(number) + ": " +
                                      errorText(error),
                                  misinforms(call, error), false, call == Call::gethostname};
                const bool failed = failOnce(request, fault, [&](ScriptResponse& response) {
                    SystemCalls calls(origin_);
                    calls.fail(call, number, error);
                    response = host_->run(request);
                    return calls.failed();
                });
                if (!failed || ::testing::Test::HasFailure()) {
                    break;
                }
                ++failures;
            }
        }
    }
    EXPECT_EQ(runUndisturbed(request), usual_.at(state_).response);
    return failures;
}

}  // namespace test
