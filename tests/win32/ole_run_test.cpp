// OleRun: an object with IRunnableObject is asked to run, with no bind
// context, and its answer returned; any other object is running already.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cstring>

namespace {

bool Same(const IID& a, const IID& b) {
    return std::memcmp(&a, &b, sizeof(IID)) == 0;
}

// Counts its references and never frees itself; runnable only when asked to be.
class Runnable : public IRunnableObject {
public:
    explicit Runnable(bool runnable, HRESULT runResult = S_OK)
        : runnable(runnable), runResult(runResult) {}
    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
        if (Same(riid, IID_IUnknown) || (runnable && Same(riid, IID_IRunnableObject))) {
            AddRef();
            *object = static_cast<IRunnableObject*>(this);
            return S_OK;
        }
        *object = nullptr;
        return E_NOINTERFACE;
    }
    ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
    ULONG STDMETHODCALLTYPE Release() override { return --references; }
    HRESULT STDMETHODCALLTYPE GetRunningClass(LPCLSID) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE Run(LPBINDCTX context) override {
        ++runs;
        contextGiven = context != nullptr;
        return runResult;
    }
    BOOL STDMETHODCALLTYPE IsRunning() override { return runs > 0; }
    HRESULT STDMETHODCALLTYPE LockRunning(BOOL, BOOL) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE SetContainedObject(BOOL) override { return E_NOTIMPL; }

    bool runnable;
    HRESULT runResult;
    ULONG references = 1;
    int runs = 0;
    bool contextGiven = false;
};

TEST(OleRun, AsksARunnableObjectToRunAndReturnsItsAnswer) {
    Runnable object(true);
    EXPECT_EQ(S_OK, OleRun(&object));
    EXPECT_EQ(1, object.runs);
    EXPECT_FALSE(object.contextGiven);
    EXPECT_EQ(1u, object.references);

    Runnable failing(true, E_ACCESSDENIED);
    EXPECT_EQ(E_ACCESSDENIED, OleRun(&failing));
    EXPECT_EQ(1, failing.runs);
    EXPECT_EQ(1u, failing.references);
}

TEST(OleRun, AnyOtherObjectIsRunningAlready) {
    Runnable object(false);
    EXPECT_EQ(S_OK, OleRun(&object));
    EXPECT_EQ(0, object.runs);
    EXPECT_EQ(1u, object.references);
}

} // namespace
