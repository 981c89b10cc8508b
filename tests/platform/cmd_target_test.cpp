// CCmdTarget: run-time classes and dynamic creation, automation identity
// and reference counting, and the routing of IDispatch calls to the hooks.
#include "support/ole_text.h"

#include <vaskel/framework/cmd_target.h>
#include <vaskel/framework/exceptions.h>

#include <gtest/gtest.h>

namespace {

using vaskel::CCmdTarget;
using vaskel::CRuntimeClass;
using vaskel_test::Ole;
using vaskel_test::OleString;

// Counts the destructions of the test classes.
int destroyed = 0;

class Shape : public CCmdTarget {
    DECLARE_DYNAMIC(Shape)
public:
    ~Shape() override { ++destroyed; }
};
IMPLEMENT_DYNAMIC(Shape, CCmdTarget)

class Circle : public Shape {
    DECLARE_DYNCREATE(Circle)
public:
    int radius = 3;
};
IMPLEMENT_DYNCREATE(Circle, Shape)

TEST(CRuntimeClass, DescribesTheClassAndItsBases) {
    const CRuntimeClass* circle = RUNTIME_CLASS(Circle);
    EXPECT_STREQ(circle->m_lpszClassName, "Circle");
    EXPECT_EQ(circle->m_nObjectSize, static_cast<int>(sizeof(Circle)));
    EXPECT_EQ(circle->GetBaseClass(), RUNTIME_CLASS(Shape));
    EXPECT_EQ(RUNTIME_CLASS(Shape)->GetBaseClass(), RUNTIME_CLASS(CCmdTarget));
    EXPECT_EQ(RUNTIME_CLASS(CCmdTarget)->GetBaseClass(), nullptr);
    EXPECT_TRUE(circle->IsDerivedFrom(RUNTIME_CLASS(Shape)));
    EXPECT_TRUE(circle->IsDerivedFrom(RUNTIME_CLASS(CCmdTarget)));
    EXPECT_TRUE(circle->IsDerivedFrom(circle));
    EXPECT_FALSE(RUNTIME_CLASS(Shape)->IsDerivedFrom(circle));
}

TEST(CRuntimeClass, CreatesObjectsByName) {
    CRuntimeClass* found = CRuntimeClass::FromName("Circle");
    ASSERT_EQ(found, RUNTIME_CLASS(Circle));
    CCmdTarget* object = found->CreateObject();
    ASSERT_NE(object, nullptr);
    EXPECT_EQ(object->GetRuntimeClass(), RUNTIME_CLASS(Circle));
    EXPECT_TRUE(object->IsKindOf(RUNTIME_CLASS(Shape)));
    EXPECT_EQ(static_cast<Circle*>(object)->radius, 3);
    delete object;

    EXPECT_EQ(CRuntimeClass::FromName("CCmdTarget"), RUNTIME_CLASS(CCmdTarget));
    EXPECT_EQ(CRuntimeClass::FromName("circle"), nullptr);
    EXPECT_EQ(CRuntimeClass::FromName("NoSuchClass"), nullptr);
    EXPECT_EQ(CRuntimeClass::FromName(nullptr), nullptr);
    // A class declared without dynamic creation makes nothing.
    EXPECT_EQ(RUNTIME_CLASS(Shape)->CreateObject(), nullptr);
}

TEST(CRuntimeClass, IsKindOfFollowsTheObjectsClass) {
    Shape shape;
    const CCmdTarget& asTarget = shape;
    EXPECT_EQ(asTarget.GetRuntimeClass(), RUNTIME_CLASS(Shape));
    EXPECT_TRUE(asTarget.IsKindOf(RUNTIME_CLASS(CCmdTarget)));
    EXPECT_FALSE(asTarget.IsKindOf(RUNTIME_CLASS(Circle)));
}

TEST(CCmdTargetAutomation, AnswersIDispatchOnlyOnceEnabled) {
    Shape target;
    EXPECT_EQ(target.GetIDispatch(FALSE), nullptr);
    void* object = &target;
    EXPECT_EQ(target.ExternalQueryInterface(IID_IUnknown, &object), E_NOINTERFACE);
    EXPECT_EQ(object, nullptr);

    target.EnableAutomation();
    IDispatch* dispatch = target.GetIDispatch(FALSE);
    ASSERT_NE(dispatch, nullptr);
    IUnknown* unknown = nullptr;
    ASSERT_EQ(dispatch->QueryInterface(IID_IUnknown, reinterpret_cast<void**>(&unknown)), S_OK);
    IDispatch* again = nullptr;
    ASSERT_EQ(unknown->QueryInterface(IID_IDispatch, reinterpret_cast<void**>(&again)), S_OK);
    // One identity: IUnknown and IDispatch are the same pointer.
    EXPECT_EQ(static_cast<IUnknown*>(again), unknown);
    EXPECT_EQ(again, dispatch);
    void* stream = &target;
    EXPECT_EQ(dispatch->QueryInterface(IID_IStream, &stream), E_NOINTERFACE);
    EXPECT_EQ(stream, nullptr);
    EXPECT_EQ(again->Release(), 2u);
    EXPECT_EQ(unknown->Release(), 1u);
}

TEST(CCmdTargetAutomation, TheLastReleaseRunsOnFinalRelease) {
    destroyed = 0;
    auto* target = new Shape;
    target->EnableAutomation();
    IDispatch* dispatch = target->GetIDispatch(TRUE);
    EXPECT_EQ(target->ExternalAddRef(), 3u);
    EXPECT_EQ(target->ExternalRelease(), 2u);
    EXPECT_EQ(dispatch->Release(), 1u);
    EXPECT_EQ(destroyed, 0);
    // The creator's reference is the last.
    EXPECT_EQ(target->ExternalRelease(), 0u);
    EXPECT_EQ(destroyed, 1);
}

class KeptAlive : public CCmdTarget {
public:
    void OnFinalRelease() override { ++finalReleases; }
    int finalReleases = 0;
};

TEST(CCmdTargetAutomation, OnFinalReleaseMayKeepTheObject) {
    KeptAlive target;
    target.EnableAutomation();
    EXPECT_EQ(target.GetIDispatch(FALSE)->Release(), 0u);
    EXPECT_EQ(target.finalReleases, 1);
}

// A calculator with two members: Add(a, b) and the property Name.
class Calculator : public CCmdTarget {
public:
    Calculator() { EnableAutomation(); }

    DISPID lastId = 0;
    WORD lastFlags = 0;

protected:
    const DispatchName* GetDispatchNames(UINT* count) const override {
        static const DispatchName names[] = {{"Add", 1}, {"Name", 2}};
        *count = 2;
        return names;
    }
    HRESULT OnInvoke(DISPID id, WORD flags, DISPPARAMS* params, VARIANT* result) override {
        lastId = id;
        lastFlags = flags;
        switch (id) {
        case 1:
            if (params->cArgs != 2)
                return DISP_E_BADPARAMCOUNT;
            if (result) {
                VariantInit(result);
                result->vt = VT_I4;
                // Arguments arrive last first.
                result->lVal = params->rgvarg[1].lVal - params->rgvarg[0].lVal;
            }
            return S_OK;
        case 2:
            vaskel::AfxThrowOleException(E_ACCESSDENIED);
        default:
            return CCmdTarget::OnInvoke(id, flags, params, result);
        }
    }
};

TEST(CCmdTargetDispatch, NamesGoToTheTable) {
    Calculator calculator;
    IDispatch* dispatch = calculator.GetIDispatch(FALSE);
    OleString name = Ole("aDD");
    LPOLESTR names[] = {&name[0]};
    DISPID id = 0;
    EXPECT_EQ(dispatch->GetIDsOfNames(IID_NULL, names, 1, 0, &id), S_OK);
    EXPECT_EQ(id, 1);

    OleString unknown = Ole("Subtract");
    names[0] = &unknown[0];
    EXPECT_EQ(dispatch->GetIDsOfNames(IID_NULL, names, 1, 0, &id), DISP_E_UNKNOWNNAME);
    EXPECT_EQ(id, DISPID_UNKNOWN);

    // Named arguments are unknown.
    OleString member = Ole("Add");
    OleString argument = Ole("left");
    LPOLESTR withArgument[] = {&member[0], &argument[0]};
    DISPID ids[2] = {0, 0};
    EXPECT_EQ(dispatch->GetIDsOfNames(IID_NULL, withArgument, 2, 0, ids), DISP_E_UNKNOWNNAME);
    EXPECT_EQ(ids[0], 1);
    EXPECT_EQ(ids[1], DISPID_UNKNOWN);
}

TEST(CCmdTargetDispatch, CallsGoToOnInvoke) {
    Calculator calculator;
    IDispatch* dispatch = calculator.GetIDispatch(FALSE);
    VARIANT arguments[2];
    VariantInit(&arguments[0]);
    VariantInit(&arguments[1]);
    arguments[0].vt = VT_I4;
    arguments[0].lVal = 2; // the second argument
    arguments[1].vt = VT_I4;
    arguments[1].lVal = 10;
    DISPPARAMS params = {arguments, nullptr, 2, 0};
    VARIANT result;
    VariantInit(&result);
    EXPECT_EQ(dispatch->Invoke(1, IID_NULL, 0, DISPATCH_METHOD, &params, &result, nullptr, nullptr),
              S_OK);
    EXPECT_EQ(calculator.lastId, 1);
    EXPECT_EQ(calculator.lastFlags, DISPATCH_METHOD);
    ASSERT_EQ(result.vt, VT_I4);
    EXPECT_EQ(result.lVal, 8);

    DISPPARAMS none = {nullptr, nullptr, 0, 0};
    EXPECT_EQ(dispatch->Invoke(1, IID_NULL, 0, DISPATCH_METHOD, &none, nullptr, nullptr, nullptr),
              DISP_E_BADPARAMCOUNT);
    EXPECT_EQ(dispatch->Invoke(7, IID_NULL, 0, DISPATCH_METHOD, &none, nullptr, nullptr, nullptr),
              DISP_E_MEMBERNOTFOUND);
    EXPECT_EQ(
        dispatch->Invoke(1, IID_IDispatch, 0, DISPATCH_METHOD, &params, nullptr, nullptr, nullptr),
        DISP_E_UNKNOWNINTERFACE);
}

TEST(CCmdTargetDispatch, ExceptionsBecomeDispatchErrors) {
    Calculator calculator;
    IDispatch* dispatch = calculator.GetIDispatch(FALSE);
    DISPPARAMS none = {nullptr, nullptr, 0, 0};
    EXCEPINFO info;
    EXPECT_EQ(
        dispatch->Invoke(2, IID_NULL, 0, DISPATCH_PROPERTYGET, &none, nullptr, &info, nullptr),
        DISP_E_EXCEPTION);
    EXPECT_EQ(info.scode, E_ACCESSDENIED);
}

TEST(CCmdTargetDispatch, HasNoTypeInformation) {
    Calculator calculator;
    IDispatch* dispatch = calculator.GetIDispatch(FALSE);
    UINT count = 5;
    EXPECT_EQ(dispatch->GetTypeInfoCount(&count), S_OK);
    EXPECT_EQ(count, 0u);
    ITypeInfo* info = reinterpret_cast<ITypeInfo*>(&calculator);
    EXPECT_EQ(dispatch->GetTypeInfo(0, 0, &info), TYPE_E_ELEMENTNOTFOUND);
    EXPECT_EQ(info, nullptr);
}

TEST(CCmdTargetDispatch, WithoutATableNoNameIsKnown) {
    Shape target;
    target.EnableAutomation();
    OleString name = Ole("Anything");
    LPOLESTR names[] = {&name[0]};
    DISPID id = 0;
    EXPECT_EQ(target.GetIDispatch(FALSE)->GetIDsOfNames(IID_NULL, names, 1, 0, &id),
              DISP_E_UNKNOWNNAME);
}

} // namespace
