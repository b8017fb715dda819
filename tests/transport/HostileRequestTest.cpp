// SPDX-License-Identifier: Apache-2.0
#include "support/TransportTest.h"
#include "transport/RawClient.h"

#include <hidl/HidlBinderSupport.h>
#include <hwbinder/ProcessState.h>

#include <optional>

// What the daemon, and on the kernel's binder the service manager, do with requests that no proxy
// sends. Runs on sockets everywhere, and on the kernel's binder in a virtual machine.

namespace {

using ::android::sp;
using ::android::status_t;
using ::android::hardware::BHwBinder;
using ::android::hardware::IBinder;
using ::android::hardware::Parcel;
using ::android::hardware::ProcessState;

/** An object of this process that nobody calls. */
struct Peer : BHwBinder {
    status_t onTransact(uint32_t, const Parcel&, Parcel*, uint32_t, TransactCallback) override {
        return android::UNKNOWN_TRANSACTION;
    }
};

/** An operation whose first argument is a list or a string. */
struct Target {
    const char* name;
    const char* interface;
    uint32_t code;
    /** @return a right request for it. */
    RawMessage (*right)(const std::string& token);

    friend std::ostream& operator<<(std::ostream& out, const Target& target) {
        return out << target.name;
    }
};

const Target kTargets[] = {
        {"Service", raw::kV20, raw::kDaxPerformHapticEngine,
         [](const std::string& token) {
             RawMessage message = RawMessage::to(token);
             message.addList(1, std::string(16, '\1'));
             message.tail = bytesOf(10000);
             return message;
         }},
        {"Manager", raw::kManager, raw::kManagersGet,
         [](const std::string& token) {
             RawMessage message = RawMessage::to(token);
             message.addString(raw::kV21);
             message.addString("default");
             return message;
         }},
};

// In numbers, as they travel: those of a device are the same.
constexpr status_t kNoData = -61;
constexpr status_t kBadType = INT32_MIN + 1;
constexpr status_t kBadValue = -22;
constexpr status_t kFailed = INT32_MIN + 2;
constexpr status_t kUnknown = -74;

/** @return what refers to an object of this process. */
flat_binder_object ownObject() {
    static const sp<Peer> peer = new Peer;
    flat_binder_object object{};
    object.hdr.type = BINDER_TYPE_BINDER;
    object.binder = reinterpret_cast<binder_uintptr_t>(peer->getWeakRefs());
    object.cookie = reinterpret_cast<binder_uintptr_t>(static_cast<BHwBinder*>(peer.get()));
    return object;
}

/** @return what refers to an empty buffer whose address is written into another one. */
binder_buffer_object childOf(binder_size_t parent) {
    return {{BINDER_TYPE_PTR}, BINDER_BUFFER_FLAG_HAS_PARENT, 0, 0, parent, 0};
}

const struct {
    const char* name;
    /** Makes the right request wrong. */
    void (*change)(RawMessage&);
    status_t status;
    /** What it is on the kernel's binder, which copies objects but does not judge all of them. */
    std::optional<status_t> onKernel = std::nullopt;
} kAttacks[] = {
        {"none", [](auto&) {}, android::OK},
        {"no arguments", [](auto& m) { m.keep(0); }, kNoData},
        {"last argument missing", [](auto& m) { m.keep(2); }, kNoData},
        {"half an object",
         [](auto& m) {
             m.keep(1);
             m.tail = std::string(20, '\0');
         },
         kNoData},
        {"numbers for objects",
         [](auto& m) {
             m.keep(0);
             m.tail = std::string(256, 'A');
         },
         kBadType},
        {"numbers like the object", [](auto& m) { m.head += bytesOf(m.objects[0]); }, kBadType},
        {"count beyond the buffer", [](auto& m) { m.setCount(60); }, kBadValue},
        // Its size in bytes is that of the buffer, in 32 bits.
        {"count that overflows", [](auto& m) { m.setCount(0x10000001); }, kBadValue},
        {"no elements", [](auto& m) { m.set(1, ""); }, kBadValue},
        {"short header", [](auto& m) { m.set(0, "12345678"); }, kBadValue},
        {"length beyond the memory", [](auto& m) { m.objects[1].length = UINT64_MAX; }, kFailed},
        {"length that overflows", [](auto& m) { m.objects[1].length = UINT64_MAX - 6; }, kFailed},
        {"short length", [](auto& m) { m.objects[1].length = 8; }, kFailed, kBadValue},
        {"elements without parent", [](auto& m) { m.objects[1].flags = 0; }, kBadValue},
        {"parent of the first", [](auto& m) { m.objects[0].flags = 1; }, kFailed},
        {"parent is itself", [](auto& m) { m.objects[1].parent = 1; }, kFailed},
        {"parent that does not exist", [](auto& m) { m.objects[1].parent = UINT64_MAX; }, kFailed},
        // The address is written over the count then.
        {"wrong place in parent", [](auto& m) { m.objects[1].parent_offset = 8; }, kBadValue},
        {"place beyond the parent", [](auto& m) { m.objects[1].parent_offset = 9; }, kFailed},
        {"place that overflows", [](auto& m) { m.objects[1].parent_offset = UINT64_MAX - 7; },
         kFailed},
        {"address written over", [](auto& m) { m.add("short", true); }, kFailed},
        // Else an address of the receiver's is taken for what the sender says.
        {"address in the elements", [](auto& m) { m.addLast(childOf(m.objects.size() - 1)); },
         kBadValue},
        {"address in the elements, behind an object",
         [](auto& m) {
             m.addLast(ownObject());
             m.addLast(childOf(m.objects.size() - 1));
         },
         kFailed, kBadValue},
        {"address in the elements, behind a buffer",
         [](auto& m) {
             m.addLast(binder_buffer_object{{BINDER_TYPE_PTR}, 0, 0, 0, 0, 0});
             m.addLast(childOf(1));
         },
         kFailed},
        {"odd offset", [](auto& m) { m.offsets[0] += 1; }, kFailed},
        {"offset that overflows", [](auto& m) { m.offsets[0] = UINT64_MAX - 3 - m.head.size(); },
         kFailed},
        {"offset of no object", [](auto& m) { m.offsets[1] += 8; }, kFailed},
        {"offsets in disorder", [](auto& m) { std::swap(m.offsets[0], m.offsets[1]); }, kFailed},
        {"offset twice", [](auto& m) { m.offsets[1] = m.offsets[0]; }, kFailed},
        // Addresses of the sender's choice, if anybody takes them for objects.
        {"objects not listed", [](auto& m) { m.offsets.clear(); }, kFailed, kBadType},
        {"elements not listed", [](auto& m) { m.offsets.resize(1); }, kFailed, kBadType},
        {"object for a buffer", [](auto& m) { m.replace(1, BINDER_TYPE_BINDER, ownObject()); },
         kFailed, kBadType},
        {"handle of nothing",
         [](auto& m) { m.replace(0, BINDER_TYPE_HANDLE, flat_binder_object{}); }, kFailed},
        {"descriptor", [](auto& m) { m.replace(1, BINDER_TYPE_FD, binder_fd_object{}); }, kFailed},
        {"descriptors",
         [](auto& m) {
             binder_fd_array_object descriptors{};
             descriptors.num_fds = 2;
             m.replace(1, BINDER_TYPE_FDA, descriptors);
         },
         kFailed},
        {"object of no type", [](auto& m) { m.replace(1, 0x12345678, binder_buffer_object{}); },
         kFailed},
};

class HostileRequestTest : public TransportTest, public ::testing::WithParamInterface<Target> {
  protected:
    void SetUp() override { serve(); }
    /** Nothing that a test does may cost a polite client anything. */
    void TearDown() override { expectService(); }
    static void expectService() { EXPECT_TRUE(answers()); }
    static bool isManager() { return GetParam().interface == std::string(raw::kManager); }

    /** @return what comes of a call; of one that is oneway, whether it could be sent. */
    status_t call(RawMessage message, uint32_t code, uint32_t flags = 0) {
        if (!isKernel()) {
            if (mClient == nullptr) mClient = std::make_unique<RawClient>(mDirectory.path());
            const auto packet = message.packet(code, flags);
            if ((flags & TF_ONE_WAY) != 0) return mClient->send(packet) ? 0 : -EPIPE;
            const Received answer = mClient->call(packet);
            return answer.isClosed ? -EPIPE : answer.status;
        }
        if (mObject == nullptr) {
            mObject = isManager() ? ProcessState::self()->getStrongProxyForHandle(0)
                                  : android::hardware::getOrCreateCachedBinder(
                                            IDaxVibrator::getService().get());
        }
        Parcel parcel;
        message.giveTo(&parcel);
        Parcel reply;
        int32_t exception = 0;
        const status_t status = mObject->transact(code, parcel, &reply, flags);
        if (status == android::OK && (flags & TF_ONE_WAY) == 0) reply.readInt32(&exception);
        EXPECT_EQ(exception, 0);
        return status;
    }
    RawMessage right() const { return GetParam().right(GetParam().interface); }

    std::unique_ptr<RawClient> mClient;
    sp<IBinder> mObject;
};

// Over sockets there is no service manager.
const size_t kTargetCount = getenv("HWBINDER_DEVICE") != nullptr ? 2 : 1;

INSTANTIATE_TEST_SUITE_P(Of, HostileRequestTest,
                         ::testing::ValuesIn(kTargets, kTargets + kTargetCount),
                         [](const auto& target) { return target.param.name; });

TEST_P(HostileRequestTest, WrongArgumentsAreRefused) {
    expectService();
    const size_t before = descriptorsOf(mServer.pid());
    for (const auto& [name, change, status, onKernel] : kAttacks) {
        SCOPED_TRACE(name);
        RawMessage message = right();
        change(message);
        EXPECT_EQ(call(message, GetParam().code), isKernel() ? onKernel.value_or(status) : status);
        expectService();
    }
    // The client's own connection counts.
    EXPECT_TRUE(eventually([&] { return descriptorsOf(mServer.pid()) <= before + 1; }));
}

TEST_P(HostileRequestTest, WrongTokensAndCodesAreRefused) {
    const std::string token = GetParam().interface;
    for (const std::string& wrong :
         {std::string(), std::string(raw::kV10), std::string(raw::kBase), token + "x",
          token.substr(0, token.size() - 1), std::string(60'000, 'x')}) {
        EXPECT_EQ(call(GetParam().right(wrong), GetParam().code), kBadType) << wrong.substr(0, 60);
    }
    // Without its end, and without anything.
    EXPECT_EQ(call(RawMessage(token.substr(0, token.size() / 4 * 4)), GetParam().code), kBadType);
    EXPECT_EQ(call(RawMessage(""), GetParam().code), kBadType);
    for (const uint32_t code : {0U, 999U, 0x0f000000U, 0x5f504e47U, UINT32_MAX})
        EXPECT_EQ(call(right(), code), kUnknown) << code;
    EXPECT_EQ(call(right(), raw::kPing), kBadType);
}

TEST_P(HostileRequestTest, OnewayOfEverythingCostsNobodyAnything) {
    std::vector<uint32_t> codes = {raw::kPing, raw::kInterfaceChain, raw::kDebug,
                                   raw::kSetHalInstrumentation, raw::kNotifySyspropsChanged};
    for (uint32_t code = 0; code <= 26; ++code)
        codes.push_back(code);
    for (const uint32_t code : codes) {
        // The driver may refuse it, as long as others of the same process wait.
        for (const char* token : {GetParam().interface, raw::kV10, raw::kBase})
            call(GetParam().right(token), code, TF_ONE_WAY);
    }
    expectService();
    EXPECT_EQ(log().find("val:"), std::string::npos) << "on was run: " << log();
    for (int i = 0; i < 300; ++i)
        call(RawMessage::to(GetParam().interface), GetParam().code, TF_ONE_WAY);
    // On a device these are oneway, and nothing else.
    for (const uint32_t code : {raw::kSetHalInstrumentation, raw::kNotifySyspropsChanged})
        EXPECT_EQ(call(RawMessage::to(raw::kBase), code), INT32_MIN) << code;
}

TEST_P(HostileRequestTest, LargeRefusedRequestsLeaveNothing) {
    const std::string large(isKernel() ? 200'000 : 60'000, 'x');
    for (int i = 0; i < 300; ++i) {
        RawMessage token = RawMessage::to("x");
        token.tail = large;
        RawMessage count = right();
        count.set(1, large);
        // Not for lack of space.
        ASSERT_EQ(call(token, GetParam().code), kBadType) << i;
        ASSERT_EQ(call(count, GetParam().code), kBadValue) << i;
    }
}

TEST_P(HostileRequestTest, BufferIsReadAsNothingElse) {
    RawMessage debug = RawMessage::to(raw::kBase);
    debug.add("a number");
    EXPECT_EQ(call(debug, raw::kDebug), kNoData);
    RawMessage descriptors = RawMessage::to(raw::kBase);
    descriptors.head += bytesOf(uint64_t{48});
    EXPECT_EQ(call(descriptors, raw::kDebug), android::INVALID_OPERATION);
    for (const char end : {'\0', 'x'}) {
        RawMessage text = RawMessage::to(raw::kBase);
        text.head += bytesOf(uint64_t{0});
        text.addList(1, bytesOf(uint64_t{0}) + bytesOf(uint64_t{4}));
        text.add(std::string("text") + end, true, 1);
        EXPECT_EQ(call(text, raw::kDebug), end == '\0' ? android::OK : kBadValue);
    }
    if (!isManager()) return;
    RawMessage add = RawMessage::to(raw::kManager);
    add.addString("name");
    add.add("an object");
    EXPECT_EQ(call(add, raw::kManagersAdd), kBadType);
}

TEST_P(HostileRequestTest, EmptyListsAreReadInBothForms) {
    const struct {
        const char* name;
        uint64_t address, count;
        binder_buffer_object elements;
        status_t status;
    } forms[] = {
            {"a device's", 0, 0, {{BINDER_TYPE_PTR}, 1, 0, 0, 0, 0}, android::OK},
            {"address in the list", 4096, 0, {{BINDER_TYPE_PTR}, 1, 0, 0, 0, 0}, kBadValue},
            {"address in the object", 0, 0, {{BINDER_TYPE_PTR}, 1, 4096, 0, 0, 0}, kBadValue},
            {"length", 0, 0, {{BINDER_TYPE_PTR}, 1, 0, 1, 0, 0}, kBadValue},
            {"count", 0, 1, {{BINDER_TYPE_PTR}, 1, 0, 0, 0, 0}, kBadType},
            {"another type", 0, 0, {{BINDER_TYPE_FDA}, 1, 0, 0, 0, 0}, kBadType},
    };
    RawMessage listed = RawMessage::to(raw::kBase);
    listed.head += bytesOf(uint64_t{0});
    listed.addList(0, "");
    EXPECT_EQ(call(listed, raw::kDebug), android::OK);
    for (const auto& [name, address, count, elements, status] : forms) {
        RawMessage debug = RawMessage::to(raw::kBase);
        debug.head += bytesOf(uint64_t{0});
        debug.add(bytesOf(address) + bytesOf(count));
        debug.tail = bytesOf(elements);
        EXPECT_EQ(call(debug, raw::kDebug), status) << name;
        debug.tail.resize(36);
        EXPECT_NE(call(debug, raw::kDebug), android::OK) << name << ", cut short";
    }
}

}  // namespace
