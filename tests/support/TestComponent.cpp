//===-- tests/support/TestComponent.cpp - a component the factory tests load by name -===//
//
// Registers one counted class under kTestClassId. Its objects count how many of them are
// alive, so tests can see creation and destruction through the factory.
//
//===------------------------------------------------------------------------------===//
#include "CitP/Factory.h"
#include "CommonI/TRefCountHelper.h"

namespace {

constexpr Port::XUID kTestClassId{0x1111222233334444ull, 0x5555666677778888ull};
int g_alive = 0;

class TestObject final : public CommonI::TRefCountHelperBase<TestObject, 0> {
public:
    TestObject() { ++g_alive; }
    ~TestObject() override { --g_alive; }
    CitI::IInterface* GetInterface(const Port::XUID& id) override {
        return id == CommonI::IID_IRefCount || id == CitI::IID_IInterface ? this : nullptr;
    }
};

CitI::IInterface* CreateTestObject() {
    return new TestObject();
}

} // namespace

extern "C" VN_VISIBLE void CitP_ComponentInit() {
    CitP::Factory::RegisterClass(kTestClassId, &CreateTestObject);
}

extern "C" VN_VISIBLE int TestComponent_Alive() {
    return g_alive;
}
