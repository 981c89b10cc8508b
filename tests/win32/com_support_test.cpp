// The compiler's COM support types: shared strings with their ANSI view,
// owning variants with their typed extraction, and the error exception.
#include "support/counting_unknown.h"
#include "support/ole_text.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cstring>

namespace {

using vaskel_test::CountingUnknown;
using vaskel_test::Ole;

TEST(CompilerString, SharesOneStringAndCopiesOnRequest) {
    _bstr_t empty;
    EXPECT_TRUE(!empty);
    EXPECT_EQ(empty.length(), 0u);
    EXPECT_EQ(static_cast<const OLECHAR*>(empty), nullptr);

    _bstr_t text("hello");
    EXPECT_EQ(text.length(), 5u);
    _bstr_t shared(text);
    EXPECT_EQ(static_cast<const OLECHAR*>(shared), static_cast<const OLECHAR*>(text));
    BSTR copy = text.copy();
    EXPECT_NE(copy, static_cast<const OLECHAR*>(text));
    EXPECT_EQ(Ole(copy), Ole("hello"));
    SysFreeString(copy);
    EXPECT_STREQ(static_cast<const char*>(text), "hello");
}

TEST(CompilerString, JoinsComparesAndTakesOver) {
    _bstr_t left("ab");
    left += _bstr_t("cd");
    EXPECT_STREQ(static_cast<const char*>(left), "abcd");
    EXPECT_TRUE(_bstr_t("abc") < _bstr_t("abd"));
    EXPECT_TRUE(_bstr_t("abc") == _bstr_t(Ole("abc").c_str()));
    EXPECT_TRUE(_bstr_t("ab") < _bstr_t("abc"));

    BSTR owned = SysAllocString(Ole("owned").c_str());
    _bstr_t adopted(owned, false);
    EXPECT_EQ(static_cast<const OLECHAR*>(adopted), owned);
    BSTR back = adopted.Detach();
    EXPECT_EQ(back, owned);
    SysFreeString(back);
}

TEST(CompilerVariant, BuildsAndExtractsValues) {
    _variant_t number(42L);
    EXPECT_EQ(number.vt, VT_I4);
    EXPECT_EQ(static_cast<long>(number), 42);
    EXPECT_EQ(static_cast<double>(number), 42.0);
    _variant_t text("17");
    EXPECT_EQ(text.vt, VT_BSTR);
    EXPECT_EQ(static_cast<long>(text), 17);
    EXPECT_STREQ(static_cast<const char*>(static_cast<_bstr_t>(number)), "42");

    _variant_t flag(true);
    EXPECT_EQ(flag.boolVal, VARIANT_TRUE);
    _variant_t copy(text);
    EXPECT_NE(copy.bstrVal, text.bstrVal);
    EXPECT_TRUE(copy == text);
    copy = 3.5;
    EXPECT_EQ(copy.vt, VT_R8);
    EXPECT_FALSE(copy == text);
}

TEST(CompilerVariant, ThrowsTheConversionsFailure) {
    _variant_t word("word");
    HRESULT code = S_OK;
    try {
        static_cast<void>(static_cast<long>(word));
    } catch (const _com_error& error) {
        code = error.Error();
    }
    EXPECT_EQ(code, DISP_E_TYPEMISMATCH);
}

TEST(CompilerVariant, BalancesInterfaceReferences) {
    CountingUnknown object;
    {
        _variant_t held(static_cast<IUnknown*>(&object));
        EXPECT_EQ(object.references, 2u);
        _variant_t copy(held);
        EXPECT_EQ(object.references, 3u);
        VARIANT detached = copy.Detach();
        EXPECT_EQ(copy.vt, VT_EMPTY);
        VariantClear(&detached);
        EXPECT_EQ(object.references, 2u);
    }
    EXPECT_EQ(object.references, 1u);
}

TEST(CompilerError, CarriesItsCodeAndAMessage) {
    const _com_error error(E_OUTOFMEMORY);
    EXPECT_EQ(error.Error(), E_OUTOFMEMORY);
    EXPECT_EQ(error.WCode(), 0);
    ASSERT_NE(error.ErrorMessage(), nullptr);
    EXPECT_GT(std::strlen(error.ErrorMessage()), 0u);
    const _com_error dispatch(_com_error::WCodeToHRESULT(5));
    EXPECT_EQ(dispatch.WCode(), 5);
    EXPECT_STREQ(dispatch.ErrorMessage(), "IDispatch error #5");
}

} // namespace
