//===-- tests/support/SlowComponent.cpp - components with a slow or failing init --===//
//
// Built twice. venlomer_test_slow_component takes a while to initialise, so that other
// threads load it while its init runs. venlomer_test_flaky_component (FLAKY_INIT) fails
// its first init by throwing and succeeds at the next. Each registers its class only at
// the very end of a successful init.
//
//===------------------------------------------------------------------------------===//
#include "CitP/Factory.h"
#include "CommonI/TRefCountHelper.h"

#include <atomic>
#include <chrono>
#include <stdexcept>
#include <thread>

namespace {

#ifdef FLAKY_INIT
constexpr Port::XUID kClassId{0xf1a4f1a4f1a4f1a4ull, 0x0123456789abcdefull};
#else
constexpr Port::XUID kClassId{0x5105105105105105ull, 0x0123456789abcdefull};
#endif
std::atomic<int> g_inits{0};

class SlowObject final : public CommonI::TRefCountHelperBase<SlowObject, 0> {
public:
    CitI::IInterface* GetInterface(const Port::XUID& id) override {
        return id == CommonI::IID_IRefCount || id == CitI::IID_IInterface ? this : nullptr;
    }
};

CitI::IInterface* CreateSlowObject() {
    return new SlowObject();
}

} // namespace

extern "C" VN_VISIBLE void CitP_ComponentInit() {
    const int attempt = ++g_inits;
    std::this_thread::sleep_for(std::chrono::milliseconds(200));
#ifdef FLAKY_INIT
    if (attempt == 1) {
        throw std::runtime_error("first init fails");
    }
#else
    (void)attempt;
#endif
    CitP::Factory::RegisterClass(kClassId, &CreateSlowObject);
}

/// How many times the init ran.
extern "C" VN_VISIBLE int SlowComponent_Inits() {
    return g_inits.load();
}
