// SPDX-License-Identifier: Apache-2.0
#include "kernel/RawBinder.h"
#include "kernel/Services.h"

#include <fcntl.h>
#include <gtest/gtest.h>

#include <memory>

/**
 * The daemon and the service manager, called over the kernel's binder by an independent peer: as it
 * should be, and with everything that the kernel lets a hostile process send.
 */
namespace {

constexpr char kService[] = "vendor.velmora.hardware.vibrator@2.1::IDaxVibrator";
constexpr char kVibrator1_0[] = "android.hardware.vibrator@1.0::IVibrator";
constexpr uint32_t kOn = 1;
constexpr uint32_t kOff = 2;

/** An operation whose first argument is a vector or a string. */
struct Target {
    const char* name;
    const char* interface;
    uint32_t code;
    /** The right first argument. */
    uint32_t count;
    std::string elements;
    /** Adds the other arguments. */
    void (*rest)(RawParcel&);

    friend std::ostream& operator<<(std::ostream& out, const Target& target) {
        return out << target.name;
    }
};

const Target kTargets[] = {
        {"Service", "vendor.velmora.hardware.vibrator@2.0::IDaxVibrator", 23, 1,
         std::string(16, '\1'), [](RawParcel& parcel) { parcel.u32(0); }},
        {"Manager", raw::kManager, raw::kGet, sizeof(kService) - 1,
         std::string(kService, sizeof(kService)),
         [](RawParcel& parcel) { parcel.string("default"); }},
};

/** A status that no case asks for: any will do, as long as the request is refused. */
constexpr int32_t kAny = 0;

struct Attack {
    const char* name;
    /** The request after the token. */
    void (*write)(RawParcel&, const Target&);
    int32_t status = kAny;
};

template <typename Object>
Object typed(uint32_t type) {
    Object object{};
    object.hdr.type = type;
    return object;
}

/** A descriptor that is open in every process. */
binder_fd_object descriptor() {
    return typed<binder_fd_object>(BINDER_TYPE_FD);
}

const Attack kAttacks[] = {
        {"NoArguments", [](RawParcel&, const Target&) {}, raw::kNotEnoughData},
        {"LastArgumentMissing",
         [](RawParcel& parcel, const Target& target) {
             parcel.vector(target.count, target.elements);
         },
         raw::kNotEnoughData},
        {"HalfAnObject",
         [](RawParcel& parcel, const Target& target) {
             parcel.vector(target.count, target.elements);
             parcel.cut(parcel.size() - sizeof(binder_buffer_object) / 2);
         }},
        {"ElementsMissing",
         [](RawParcel& parcel, const Target& target) {
             parcel.header(target.count, {});
             target.rest(parcel);
         }},
        {"CountBeyondTheBuffer",
         [](RawParcel& parcel, const Target& target) {
             parcel.vector(target.count + 1, target.elements);
             target.rest(parcel);
         }},
        // Its size in bytes is that of the buffer, in 32 bits.
        {"CountThatOverflows",
         [](RawParcel& parcel, const Target& target) {
             parcel.vector(target.count + 0x10000000, target.elements);
             target.rest(parcel);
         }},
        {"LargestCount",
         [](RawParcel& parcel, const Target& target) {
             parcel.vector(UINT32_MAX, target.elements);
             target.rest(parcel);
         }},
        {"CountWithoutElements",
         [](RawParcel& parcel, const Target& target) {
             parcel.vector(1000, "");
             target.rest(parcel);
         }},
        {"ShortHeader",
         [](RawParcel& parcel, const Target& target) {
             parcel.buffer(target.elements, {parcel.buffer("12345678", {}), 0});
             target.rest(parcel);
         }},
        {"ElementsWithoutParent",
         [](RawParcel& parcel, const Target& target) {
             parcel.header(target.count, {});
             parcel.buffer(target.elements, {});
             target.rest(parcel);
         }},
        {"ParentThatDoesNotExist",
         [](RawParcel& parcel, const Target& target) {
             parcel.header(target.count, {});
             parcel.buffer(target.elements, {7, 0});
             target.rest(parcel);
         }},
        {"ParentIsItself",
         [](RawParcel& parcel, const Target& target) {
             parcel.header(target.count, {});
             parcel.buffer(target.elements, {1, 0});
             target.rest(parcel);
         }},
        // The kernel writes the address over the count then.
        {"WrongPlaceInParent",
         [](RawParcel& parcel, const Target& target) {
             parcel.buffer(target.elements, {parcel.header(target.count, {}), 8});
             target.rest(parcel);
         }},
        // Addresses of the sender's choice, if anybody takes them for objects.
        {"ObjectsNotListed",
         [](RawParcel& parcel, const Target& target) {
             parcel.header(target.count, {RawParcel::Buffer::kNoParent, 0, false});
             parcel.buffer(target.elements, {0, 0, false});
             target.rest(parcel);
         }},
        {"ElementsNotListed",
         [](RawParcel& parcel, const Target& target) {
             parcel.buffer(target.elements, {parcel.header(target.count, {}), 0, false});
             target.rest(parcel);
         }},
        {"NumbersForObjects",
         [](RawParcel& parcel, const Target&) {
             for (int i = 0; i < 64; ++i)
                 parcel.u32(0x41414141);
         }},
        {"BinderForBuffer",
         [](RawParcel& parcel, const Target& target) {
             parcel.object(RawBinder::object()).object(RawBinder::object());
             target.rest(parcel);
         }},
        {"HandleForBuffer",
         [](RawParcel& parcel, const Target& target) {
             const auto manager = typed<flat_binder_object>(BINDER_TYPE_HANDLE);
             parcel.object(manager).object(manager);
             target.rest(parcel);
         }},
        {"DescriptorForBuffer",
         [](RawParcel& parcel, const Target& target) {
             parcel.object(descriptor()).object(descriptor());
             target.rest(parcel);
         }},
        {"ObjectOfNoType",
         [](RawParcel& parcel, const Target& target) {
             parcel.object(typed<binder_buffer_object>(0x12345678));
             target.rest(parcel);
         }},
};

class HostileBinderTest : public ::testing::Test {
  protected:
    static void SetUpTestSuite() {
        sServices = std::make_unique<Services>();
        ASSERT_TRUE(sServices->startManager());
        sServices->startDaemon();
        sPolite = std::make_unique<RawBinder>();
        ASSERT_TRUE(eventually([] { return (sPoliteHandle = sPolite->get(kService)) != 0; }))
                << readFile(Services::kDaemonLog);
    }
    static void TearDownTestSuite() {
        sPolite.reset();
        sServices.reset();
    }
    /** Nothing that a test does may cost a polite client anything. */
    void TearDown() override { expectService(); }

    static void expectService() {
        EXPECT_NE(sPolite->get(kService), 0U);
        for (const auto& [interface, code] :
             {std::pair(raw::kBase, raw::kPing), std::pair(kVibrator1_0, kOff)}) {
            const RawAnswer answer = sPolite->call(sPoliteHandle, code, RawParcel(interface));
            EXPECT_TRUE(answer.isOk()) << code << ": " << answer.text();
        }
        EXPECT_TRUE(sServices->manager.isAlive());
        EXPECT_TRUE(sServices->daemon.isAlive()) << readFile(Services::kDaemonLog);
    }
    uint32_t handleOf(const Target& target) {
        return target.interface == std::string(raw::kManager) ? 0 : mHostile.get(kService);
    }
    static void expectRefusal(const RawAnswer& answer, int32_t status = kAny) {
        EXPECT_NE(answer.kind, RawAnswer::kNothingInTime);
        EXPECT_NE(answer.kind, RawAnswer::kDead);
        EXPECT_FALSE(answer.isOk()) << answer.text();
        if (status != kAny) {
            EXPECT_EQ(answer.status, status) << answer.text();
        }
    }

    static std::unique_ptr<Services> sServices;
    static std::unique_ptr<RawBinder> sPolite;
    static uint32_t sPoliteHandle;
    RawBinder mHostile;
};

std::unique_ptr<Services> HostileBinderTest::sServices;
std::unique_ptr<RawBinder> HostileBinderTest::sPolite;
uint32_t HostileBinderTest::sPoliteHandle = 0;

class HostileRequestTest : public HostileBinderTest,
                           public ::testing::WithParamInterface<Target> {};

INSTANTIATE_TEST_SUITE_P(Of, HostileRequestTest, ::testing::ValuesIn(kTargets),
                         [](const auto& target) { return target.param.name; });

TEST_P(HostileRequestTest, RightRequestIsAnswered) {
    const Target& target = GetParam();
    RawParcel request(target.interface);
    request.vector(target.count, target.elements);
    target.rest(request);
    const RawAnswer answer = mHostile.call(handleOf(target), target.code, request);
    EXPECT_TRUE(answer.isOk()) << answer.text();
}

TEST_P(HostileRequestTest, WrongArgumentsAreRefused) {
    const Target& target = GetParam();
    const uint32_t handle = handleOf(target);
    for (const Attack& attack : kAttacks) {
        SCOPED_TRACE(attack.name);
        RawParcel request(target.interface);
        attack.write(request, target);
        expectRefusal(mHostile.call(handle, target.code, request), attack.status);
        expectService();
    }
}

TEST_P(HostileRequestTest, WrongTokensAreRefused) {
    const Target& target = GetParam();
    const std::string right = target.interface;
    const std::string tokens[] = {"",
                                  kVibrator1_0,
                                  raw::kBase,
                                  right + "x",
                                  right.substr(0, right.size() - 1),
                                  std::string(60'000, 'x')};
    for (const std::string& token : tokens) {
        if (token == right) continue;
        SCOPED_TRACE(token.substr(0, 60));
        RawParcel request(token);
        request.vector(target.count, target.elements);
        target.rest(request);
        expectRefusal(mHostile.call(handleOf(target), target.code, request), raw::kBadType);
    }
    // Without its end, and without anything.
    expectRefusal(mHostile.call(handleOf(target), target.code, RawParcel(right).cut(right.size())));
    expectRefusal(mHostile.call(handleOf(target), target.code, RawParcel()));
}

TEST_P(HostileRequestTest, UnknownCodesAreRefused) {
    for (const uint32_t code : {0U, 26U, 0x0f000000U, 0x5f504e47U, UINT32_MAX}) {
        SCOPED_TRACE(code);
        expectRefusal(mHostile.call(handleOf(GetParam()), code, RawParcel(GetParam().interface)),
                      raw::kUnknownTransaction);
    }
}

TEST_P(HostileRequestTest, OnewayOfEverythingCostsNobodyAnything) {
    const Target& target = GetParam();
    const uint32_t handle = handleOf(target);
    std::vector<uint32_t> codes = {raw::kPing, raw::kInterfaceChain, raw::kDebug};
    for (uint32_t code = 0; code <= 26; ++code)
        codes.push_back(code);
    for (const uint32_t code : codes) {
        for (const char* token : {target.interface, kVibrator1_0, raw::kBase}) {
            RawParcel request(token);
            request.vector(target.count, target.elements);
            target.rest(request);
            // The driver may refuse it, as long as others of the same process wait.
            mHostile.call(handle, code, request, TF_ONE_WAY);
        }
    }
    expectService();
    RawParcel cut(target.interface);
    for (int i = 0; i < 300; ++i)
        mHostile.call(handle, target.code, cut, TF_ONE_WAY);
}

TEST_P(HostileRequestTest, LargeRefusedRequestsLeaveNothing) {
    const Target& target = GetParam();
    const uint32_t handle = handleOf(target);
    const std::string large(200'000, 'x');
    for (int i = 0; i < 300; ++i) {
        RawParcel wrong("x");
        wrong.bytes(large.data(), large.size());
        expectRefusal(mHostile.call(handle, target.code, wrong), raw::kBadType);
        RawParcel count(target.interface);
        count.vector(UINT32_MAX, large);
        target.rest(count);
        const RawAnswer answer = mHostile.call(handle, target.code, count);
        // Not for lack of space.
        ASSERT_EQ(answer.kind, RawAnswer::kStatus) << "request " << i << ": " << answer.text();
    }
}

TEST_P(HostileRequestTest, DescriptorsDoNotStay) {
    const Target& target = GetParam();
    const uint32_t handle = handleOf(target);
    const ChildProcess& process = handle == 0 ? sServices->manager : sServices->daemon;
    const size_t before = process.descriptors();
    // As the platform carries a native handle: its size, its three numbers, and eight descriptors.
    const uint32_t native[11] = {12, 8};
    for (int i = 0; i < 100; ++i) {
        RawParcel debug(raw::kBase);
        debug.u32(sizeof(native)).u32(0);
        auto descriptors = typed<binder_fd_array_object>(BINDER_TYPE_FDA);
        descriptors.num_fds = 8;
        descriptors.parent =
                debug.buffer({reinterpret_cast<const char*>(native), sizeof(native)}, {});
        descriptors.parent_offset = 12;
        debug.object(descriptors).strings({"-h"});
        mHostile.call(handle, raw::kDebug, debug, TF_ACCEPT_FDS);
        RawParcel request(target.interface);
        request.vector(target.count, target.elements);
        target.rest(request);
        mHostile.call(handle, target.code, request.object(descriptor()), TF_ACCEPT_FDS);
    }
    EXPECT_TRUE(eventually([&] { return process.descriptors() <= before; }))
            << process.descriptors() << " descriptors, " << before << " before";
}

TEST_F(HostileBinderTest, ClientsMayDieInACall) {
    for (int i = 0; i < 50; ++i) {
        ChildProcess client;
        client.start([&](const std::function<void()>& ready) {
            RawBinder binder;
            binder.send(binder.get(kService), kOff, RawParcel(kVibrator1_0));
            ready();
            _exit(0);
        });
    }
}

TEST_F(HostileBinderTest, PeerThatSharesNoCodeFindsTheServiceByEachNameOfItsChain) {
    const RawAnswer chain =
            mHostile.call(mHostile.get(kService), raw::kInterfaceChain, RawParcel(raw::kBase));
    ASSERT_TRUE(chain.isOk()) << chain.text();
    ASSERT_EQ(chain.buffers.size(), 2U + 7U);
    EXPECT_EQ(chain.string(2), kService);
    EXPECT_EQ(chain.string(8), raw::kBase);
    for (size_t i = 2; i < 8; ++i)
        EXPECT_NE(mHostile.get(chain.string(i)), 0U) << chain.string(i);
    EXPECT_EQ(mHostile.get(kService, "other"), 0U);
}

TEST_F(HostileBinderTest, PeerThatSharesNoCodeIsServed) {
    const RawAnswer answer =
            mHostile.call(mHostile.get(kVibrator1_0), kOn, RawParcel(kVibrator1_0).u32(20));
    EXPECT_TRUE(answer.isOk()) << answer.text();
    EXPECT_EQ(answer.word(1), 0U);
}

/** A process that registers an object, whose interfaceChain() it answers as the test wants. */
class Registrant {
  public:
    using Chain = std::function<int32_t(RawParcel& reply)>;
    Registrant(uint32_t code, const Chain& chain, bool serves) {
        mProcess.start([=](const std::function<void()>& ready) {
            RawBinder binder;
            binder.onRequest([&](uint32_t request, const RawAnswer&, RawParcel& reply) {
                if (request == raw::kInterfaceChain) return chain(reply);
                if (request != raw::kPing) return raw::kUnknownTransaction;
                reply.u32(0);
                return 0;
            });
            RawParcel add(code == raw::kAdd ? raw::kManager : raw::kManager1_2);
            add.string("peer").object(RawBinder::object());
            if (code == raw::kAddWithChain) add.strings(kChain);
            binder.call(0, code, add);
            ready();
            binder.serveWhile([=] { return serves; });
        });
    }

    static const std::vector<std::string> kChain;

  private:
    ChildProcess mProcess;
};

const std::vector<std::string> Registrant::kChain = {"vendor.velmora.hardware.peer@1.0::IPeer",
                                                     raw::kBase};

int32_t rightChain(RawParcel& reply) {
    reply.u32(0).strings(Registrant::kChain);
    return 0;
}

TEST_F(HostileBinderTest, PeerRegistersAndIsFoundAndIsForgottenWhenItDies) {
    for (const uint32_t code : {raw::kAdd, raw::kAddWithChain}) {
        SCOPED_TRACE(code);
        {
            const Registrant peer(code, rightChain, true);
            const uint32_t handle = mHostile.get(Registrant::kChain[0], "peer");
            ASSERT_NE(handle, 0U);
            EXPECT_TRUE(mHostile.call(handle, raw::kPing, RawParcel(raw::kBase)).isOk());
        }
        EXPECT_TRUE(eventually([&] { return mHostile.get(Registrant::kChain[0], "peer") == 0; }));
    }
}

TEST_F(HostileBinderTest, WrongChainsRegisterNothing) {
    const Registrant::Chain chains[] = {
            [](RawParcel&) { return raw::kBadType; },
            [](RawParcel&) { return 0; },
            [](RawParcel& reply) {
                reply.u32(0).strings({});
                return 0;
            },
            [](RawParcel& reply) {
                reply.u32(0).vector(1000, std::string(16, '\0'));
                return 0;
            },
            [](RawParcel& reply) {
                reply.u32(0).strings(Registrant::kChain).cut(48);
                return 0;
            },
            [](RawParcel&) -> int32_t { _exit(0); },
    };
    for (const auto& chain : chains) {
        SCOPED_TRACE(&chain - chains);
        const Registrant peer(raw::kAdd, chain, true);
        EXPECT_EQ(mHostile.get(Registrant::kChain[0], "peer"), 0U);
        expectService();
    }
}

}  // namespace
