// A tour of vaskel: each family at work, printing what it did.
// The small event source that the tests use serves the tour too.
#include "support/event_source.h"

#include <vaskel/calendar.h>
#include <vaskel/diag.h>
#include <vaskel/event_sink.h>
#include <vaskel/framework/archive.h>
#include <vaskel/framework/array.h>
#include <vaskel/framework/list.h>
#include <vaskel/framework/mem_file.h>
#include <vaskel/framework/ole_safe_array.h>
#include <vaskel/framework/string.h>
#include <vaskel/fs.h>
#include <vaskel/marshal.h>
#include <vaskel/namevalue.h>
#include <vaskel/queue.h>
#include <vaskel/registry.h>
#include <vaskel/sync.h>
#include <vaskel/text.h>
#include <vaskel/timer.h>
#include <vaskel/value.h>

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <string>
#include <thread>
#include <vector>

using namespace vaskel;

namespace {

void Section(const char* title) {
    std::printf("\n== %s\n", title);
}

void TourStrings() {
    Section("Strings and containers");
    CString greeting("Hello");
    CString copy = greeting;
    copy += ", world";
    std::printf("'%s' copied and extended to '%s'; the original is unchanged\n",
                greeting.GetString(), copy.GetString());
    CString formatted;
    formatted.Format("%d items at %.2f each", 3, 9.5);
    std::printf("formatted: '%s'\n", formatted.GetString());

    CStringArray words;
    CString sentence("red green blue");
    int position = 0;
    for (CString word = sentence.Tokenize(" ", position); position >= 0;
         word = sentence.Tokenize(" ", position))
        words.Add(word);
    std::printf("tokenized into %d words; the last is '%s'\n", static_cast<int>(words.GetSize()),
                words[words.GetUpperBound()].GetString());

    CStringList list;
    list.AddTail("second");
    list.AddHead("first");
    std::printf("list:");
    for (POSITION pos = list.GetHeadPosition(); pos;)
        std::printf(" %s", list.GetNext(pos).GetString());
    std::printf("\n");
}

void TourArchive() {
    Section("Archives");
    CMemFile file;
    {
        CArchive store(&file, CArchive::store);
        store << CString('a', 300) << 42L << 2.5;
    }
    BYTE* bytes = nullptr;
    file.SeekToBegin();
    file.GetBufferPtr(CFile::bufferRead, 3, reinterpret_cast<void**>(&bytes));
    std::printf("stored %d bytes; a 300-character string starts %02X %02X %02X\n",
                static_cast<int>(file.GetLength()), bytes[0], bytes[1], bytes[2]);
    file.SeekToBegin();
    CArchive load(&file, CArchive::load);
    CString text;
    long number = 0;
    double fraction = 0;
    load >> text >> number >> fraction;
    std::printf("loaded back: %d characters, %ld, %.1f\n", text.GetLength(), number, fraction);
    try {
        load >> number;
    } catch (const CArchiveException& error) {
        std::printf("reading past the end: archive exception, cause %d\n", error.m_cause);
    }
}

void TourDiagnostics() {
    Section("Diagnostics");
    try {
        throw unexpected_error();
    } catch (const std::exception&) {
        std::printf("unexpected_error caught as std::exception\n");
    }
    {
        CVKInsideAssert reporting;
        std::printf("inside an assertion report: %s\n",
                    CVKInsideAssert::IsInsideAssert() ? "yes" : "no");
    }
    CVKDebugConditions::SetCondition(3, 7);
    std::printf("debug condition 3 = %u, table of %u entries\n",
                static_cast<unsigned>(CVKDebugConditions::GetCondition(3)),
                static_cast<unsigned>(CVKDebugConditions::GetConditionCount()));
    ClearStatus87();
    volatile double zero = 0.0;
    volatile double infinity = 1.0 / zero;
    (void)infinity;
    std::printf("after 1/0 the zero-divide flag is %s\n",
                (ClearStatus87() & _SW_ZERODIVIDE) ? "set" : "clear");
}

struct PrintCmd : CVKAsyncCmd {
    explicit PrintCmd(const char* what) : what(what) {}
    void Execute() override { std::printf("command runs: %s\n", what); }
    void Canceled() override { std::printf("command cancelled: %s\n", what); }
    const char* what;
};

void TourCommands() {
    Section("Commands");
    old_auto_ptr<CVKAsyncCmd> owner(new PrintCmd("print a line"));
    old_auto_ptr<CVKAsyncCmd> queued(owner); // ownership moves with the copy
    std::printf("after handing over: the first holder owns it: %s, the second: %s\n",
                owner.owns() ? "yes" : "no", queued.owns() ? "yes" : "no");
    queued->Execute();
    owner->Canceled();
}

void TourLifetime() {
    Section("Lifetime marker");
    auto* marker = new SimpleDestroyedMarker;
    SimpleDestroyedMarker::Watcher watcher(*marker);
    marker->SetDestroying();
    std::printf("while tearing down the watcher sees: %s\n",
                watcher.IsDestroying() ? "destroying" : "?");
    delete marker;
    std::printf("after the object is gone it sees: %s\n",
                watcher.IsDestroyed() ? "destroyed" : "?");
}

void TourValuesAndText() {
    Section("Values and text");
    CRGBColor orange;
    orange.SetColor(255, 128, 0);
    std::printf("orange is 0x%06X, written %s\n", static_cast<unsigned>(orange.GetColor()),
                orange.ToString().GetString());
    const char* text = "Find the NEEDLE here";
    const char* hit = VKFindStringNoCase(text, 20, "needle", 6);
    std::printf("'needle' found without case at offset %d\n",
                hit ? static_cast<int>(hit - text) : -1);
    char buffer[6];
    VKCopyStringToBuffer(buffer, sizeof buffer, CString("truncated"));
    std::printf("copied into 6 bytes: '%s'\n", buffer);
}

// Runs the registry tool that is built beside the tour; true when it succeeds.
bool RunRegistryTool(const std::string& arguments) {
    std::printf("vaskel-reg %s\n", arguments.c_str());
    // The tool writes to the same output: ours goes first.
    std::fflush(stdout);
    std::string command(Process::GetModulePath(nullptr).GetString());
    command.erase(command.find_last_of("\\/") + 1);
    command = "\"" + command + "vaskel-reg\" " + arguments;
    STARTUPINFOA startup{};
    startup.cb = sizeof startup;
    PROCESS_INFORMATION process{};
    if (!CreateProcessA(nullptr, &command[0], nullptr, nullptr, FALSE, 0, nullptr, nullptr,
                        &startup, &process))
        return false;
    WaitForSingleObject(process.hProcess, INFINITE);
    DWORD exitCode = 1;
    GetExitCodeProcess(process.hProcess, &exitCode);
    CloseHandle(process.hThread);
    CloseHandle(process.hProcess);
    return exitCode == 0;
}

void TourAutomationValues() {
    Section("Automation values");
    const orvariant_t values[] = {orvariant_t(42L), orvariant_t(-2.5), orvariant_t(true),
                                  orvariant_t(CDateTime(2024, 2, 29, 13, 45, 10)),
                                  orvariant_t("text")};
    for (const orvariant_t& value : values)
        std::printf("%s as text: '%s'\n", VarTypeX::ToString(value.vt),
                    value.ToString().GetString());

    orvariant_t number("1,234.5");
    orvariant_t date("March 1, 2024");
    const bool converted = VariantChangeType(number, number, 0, VT_R8) == S_OK &&
                           VariantChangeType(date, date, 0, VT_DATE) == S_OK;
    std::printf("'1,234.5' reads back as the double %.1f, 'March 1, 2024' as the date %s: %s\n",
                number.dblVal, CDateTime(date.date).ToString().GetString(),
                converted ? "converted" : "failed");
    std::printf("1 < 2.5 as variants: %s; 'apple' < 'banana': %s\n",
                orvariant_t(1L) < orvariant_t(2.5) ? "yes" : "no",
                orvariant_t("apple") < orvariant_t("banana") ? "yes" : "no");

    orvariant_t array;
    array.parray = SafeArrayCreateVector(VT_I4, 1, 3);
    array.vt = VT_ARRAY | VT_I4;
    for (LONG index = 1; index <= 3; ++index) {
        LONG square = index * index;
        SafeArrayPutElement(array.parray, &index, &square);
    }
    const safearrayvector vector(array, OwnershipBorrow);
    std::printf("a safe array from index 1 as a vector of %u:",
                static_cast<unsigned>(vector.size()));
    for (const_safearrayiterator it = vector.begin(); it != vector.end(); ++it)
        std::printf(" %d", static_cast<int>((*it).lVal));
    std::printf("\n");

    const char clsid[] = "{6B29FC40-CA47-1067-B31D-00DD010662DA}";
    const bool registered =
        RunRegistryTool(std::string("add HKCR\\VaskelTour.Greeter\\CLSID /ve /d ") + clsid +
                        " /f") &&
        RunRegistryTool(std::string("add HKCR\\CLSID\\") + clsid +
                        "\\ProgID /ve /d VaskelTour.Greeter /f");
    std::printf("the registry tool registered VaskelTour.Greeter: %s\n", registered ? "yes" : "no");
    std::printf("VaskelTour.Greeter names the class %s, whose ProgID is %s\n",
                AsGUIDStringFromProgID("VaskelTour.Greeter").GetString(),
                AsProgID(AsGUID("VaskelTour.Greeter")).GetString());
    RunRegistryTool("delete HKCR\\VaskelTour.Greeter /f");
    RunRegistryTool(std::string("delete HKCR\\CLSID\\") + clsid + " /f");
    CString name;
    std::printf("once deleted, AsProgID of the GUID text gives it back unchanged: %s\n",
                AsProgID(clsid, name) == S_OK && name == clsid ? "yes" : "no");
}

void TourNameValues() {
    Section("Name-value lists and blobs");
    CVKNameValueVector pairs;
    pairs.push_back(CVKNameValue("name", CGenericVal("tour")));
    pairs.push_back(CVKNameValue("count", CGenericVal(42)));
    pairs.push_back(CVKNameValue("ratio", CGenericVal(0.25)));
    pairs.push_back(CVKNameValue("enabled", CGenericVal(true)));
    pairs.push_back(CVKNameValue("since", CGenericVal(CDateTime(2024, 2, 29, 13, 45, 10))));
    CVKNameValueGrammar grammar;
    grammar.SetSeparator("; ", true);
    const CString text = grammar.Write(pairs);
    std::printf("written: %s\n", text.GetString());
    CVKNameValueVector read;
    const bool ok = grammar.Read(text, read);
    std::printf("read back: %s, %u pairs, every value now text\n", ok ? "yes" : "no",
                static_cast<unsigned>(read.size()));
    const CVKNameValue* count = read.GetNoCase("COUNT");
    CGenericVal number;
    if (count != nullptr && number.Parse(count->GetValue().ToString(), VT_I4))
        std::printf("'COUNT' found without case, parsed as %s: %ld\n", number.GetType().ToString(),
                    static_cast<long>(number.GetLong()));

    const char bytes[] = "vaskel keeps bytes in blobs";
    CBlob blob(bytes, sizeof bytes - 1);
    CBlob shared = blob;
    shared.GetBuffer()[0] = 'V';
    std::printf("a blob of %u bytes in Base64: %s\n", static_cast<unsigned>(blob.GetSize()),
                blob.ToString().GetString());
    std::printf("its copy was changed on write; the original still starts with '%c'\n",
                blob.GetData()[0]);
}

void TourFiles() {
    Section("Paths and directory trees");
    const CPathUrl sample(CString("C:\\tour\\data\\notes.txt"));
    std::printf("%s: parent '%s', nodes", sample.GetUrl().GetString(),
                sample.GetParentUrl().GetUrl().GetString());
    for (POSITION pos = sample.GetFirstNodePosition(); pos;)
        std::printf(" [%s]", sample.GetNextNodePosition(pos).GetString());
    std::printf("\n");

    // The library writes paths with backslashes on every platform.
    std::string temp = std::filesystem::temp_directory_path().string();
    std::replace(temp.begin(), temp.end(), '/', '\\');
    const CString name = FileSystem::BuildUniqueDirectoryName(temp.c_str(), "vaskel-tour");
    CPathUrl root(CString(temp.c_str()));
    root.AddChild(name);
    const bool built = FileSystem::PopulateDirectoryTree(root, 1, 2, 1, nullptr, nullptr) &&
                       FileSystem::CreateEmptyFile(root.GetUrl() + "\\notes.txt");
    std::printf("a fresh folder in the temporary folder, with 2 directories, a file in each "
                "and 2 files beside them: %s\n",
                built ? "yes" : "no");
    // The search order is the file system's own; sorted, the names read the same everywhere.
    std::vector<std::string> entries;
    FileEnumerator walk(root, "*", true);
    walk.Reset();
    while (walk.MoveNext()) {
        const CString relative = walk.Current().GetFilePath().Mid(root.GetUrl().GetLength() + 1);
        entries.push_back(std::string(relative.GetString()) +
                          (walk.Current().IsDirectory() ? "\\" : ""));
    }
    std::sort(entries.begin(), entries.end());
    std::printf("enumerated recursively, sorted:\n");
    for (const std::string& entry : entries)
        std::printf("  %s\n", entry.c_str());
    const bool removed = FileSystem::DeleteDirectory(root, false);
    std::printf("removed with its content: %s; still there: %s\n", removed ? "yes" : "no",
                FileSystem::DirectoryExists(root) ? "yes" : "no");
}

void TourTimers() {
    Section("Stopwatches and timers");
    CVKTimer timer(20, tuMilliseconds);
    std::printf("a 20 ms timer not yet started has %u ms remaining\n",
                static_cast<unsigned>(timer.GetRemainingTime(tuMilliseconds)));
    CVKStopWatch watch(true);
    timer.Start(true);
    while (!timer.TimeoutExpired())
        Sleep(1);
    watch.Stop();
    std::printf("once it has expired it has %u ms remaining\n",
                static_cast<unsigned>(timer.GetRemainingTime(tuMilliseconds)));
    std::printf("a stopwatch started before it read at least 20 ms: %s\n",
                watch.GetReading(tuMilliseconds) >= 20.0 ? "yes" : "no");
    std::printf("a stopped stopwatch has no sample reading: %.1f\n",
                watch.GetSampleReading(tuMilliseconds));
    COperationStatistic parse("parse", tuMilliseconds);
    parse.LogExecution(4);
    parse.LogExecution(2);
    std::printf("'%s' logged %u times: fastest %.0f ms, slowest %.0f ms, on average %.0f ms\n",
                parse.m_strName.GetString(), static_cast<unsigned>(parse.m_nCount),
                parse.m_dMinimum, parse.m_dMaximum, parse.m_dAverage);
}

// Prints each delivery at the due time it served: the controller delivers in
// due order, however late the thread gets to it.
struct TimerReport : ITimerEvents {
    void OnTimeElapsed(DWORD eventId) override {
        const DWORD due = eventId == 1 ? 300 * ++periodicCount : 500;
        early = early || timeGetTime() - setAt < due;
        std::printf("  +%u ms: the %s timer\n", static_cast<unsigned>(due),
                    eventId == 1 ? "300 ms periodic" : "500 ms one-shot");
    }
    DWORD setAt = 0;
    DWORD periodicCount = 0;
    bool early = false;
};

void TourTimerController() {
    Section("Timer controller");
    CTimerController controller;
    controller.Create();
    TimerReport report;
    report.setAt = timeGetTime();
    controller.SetTimer(&report, 1, 300, false);
    controller.SetTimer(&report, 2, 500, true);
    std::printf("two timers on one controller, delivered on this thread:\n");
    const DWORD safetyNet = 30000;
    while (report.periodicCount < 3 && timeGetTime() - report.setAt < safetyNet) {
        MsgWaitForMultipleObjects(0, nullptr, FALSE, 50, QS_ALLINPUT);
        MSG msg;
        while (PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE))
            DispatchMessageA(&msg);
    }
    std::printf("none fired early: %s; timers left: %u\n", report.early ? "no" : "yes",
                static_cast<unsigned>(controller.GetSize()));
}

// Answers on the thread that created it: a posted number is remembered, a
// sent one is doubled.
struct DoublingWnd : CVKMsgWnd {
    bool OnWndMsg(UINT message, WPARAM wParam, LPARAM lParam, LRESULT* result) override {
        if (message == WM_USER) {
            posted = static_cast<int>(wParam);
            onOwnThread = IsInThreadCtx();
            SetEvent(handled);
            *result = 0;
            return true;
        }
        if (message == WM_USER + 1) {
            *result = static_cast<LRESULT>(wParam * 2);
            return true;
        }
        return CVKMsgWnd::OnWndMsg(message, wParam, lParam, result);
    }
    HANDLE handled = nullptr;
    int posted = 0;
    bool onOwnThread = false;
};

void TourMessageWindow() {
    Section("Message windows");
    CVKEvent created, handled;
    DoublingWnd window;
    window.handled = handled;
    DWORD ownerId = 0;
    std::thread owner([&] {
        ownerId = GetCurrentThreadId();
        window.Create();
        created.SetEvent();
        MSG msg;
        while (GetMessageA(&msg, nullptr, 0, 0) > 0)
            DispatchMessageA(&msg);
    });
    created.Lock(INFINITE);
    std::printf("a window created on another thread; asked from here, in its thread: %s\n",
                window.IsInThreadCtx() ? "yes" : "no");
    window.PostMessageA(WM_USER, 7, 0);
    // Waiting keeps this thread's own messages moving too.
    WaitOnHandleWithMessageLoop(handled, INFINITE, false);
    std::printf("the posted 7 was handled on the window's thread: %s\n",
                window.posted == 7 && window.onOwnThread ? "yes" : "no");
    const LRESULT doubled = ::SendMessageA(window.GetWndHandle(), WM_USER + 1, 21, 0);
    std::printf("sent 21 and got back %d once the window's thread had answered\n",
                static_cast<int>(doubled));
    window.Destroy();
    std::printf("destroyed from here: the object lets go at once, created %s\n",
                window.Created() ? "yes" : "no");
    PostThreadMessageA(ownerId, WM_QUIT, 0, 0);
    owner.join();
}

// Prints the events that reach it.
class TourSink : public CKXEventSink {
public:
    explicit TourSink(const IID& events) { SetUUID(events); }

protected:
    HRESULT OnInvoke(DISPID id, WORD, DISPPARAMS* params, VARIANT*) override {
        std::printf("the sink received event %d with the argument %s\n", static_cast<int>(id),
                    params && params->cArgs > 0
                        ? orvariant_t(params->rgvarg[0]).ToString().GetString()
                        : "-");
        return S_OK;
    }
};

void TourCom() {
    Section("COM plumbing");
    CoInitializeEx(nullptr, COINIT_MULTITHREADED);

    COleSafeArray values;
    values.CreateOneDim(VT_VARIANT, 3);
    orvariant_t elements[] = {orvariant_t(42L), orvariant_t("marshalled"), orvariant_t(2.5)};
    for (long index = 0; index < 3; ++index)
        values.PutElement(&index, &elements[index]);
    IStream* stream = nullptr;
    CreateStreamOnHGlobal(nullptr, TRUE, &stream);
    ULONG size = 0;
    CMarshalHelper::GetVariantSizeForMarshalling(values, size, MSHCTX_INPROC, nullptr,
                                                 MSHLFLAGS_NORMAL);
    const HRESULT written = CMarshalHelper::WriteVariantForMarshalling(
        values, stream, MSHCTX_INPROC, nullptr, MSHLFLAGS_NORMAL);
    std::printf("an array of three variants takes %u bytes in a stream; written: %s\n",
                static_cast<unsigned>(size), SUCCEEDED(written) ? "yes" : "no");
    const LARGE_INTEGER start = {};
    stream->Seek(start, STREAM_SEEK_SET, nullptr);
    orvariant_t back;
    const HRESULT read = CMarshalHelper::ReadVariantFromMarshalling(back, stream);
    stream->Release();
    const safearrayvector vector(back, OwnershipBorrow);
    std::printf("read back (%s) as an array of %u variants:", SUCCEEDED(read) ? "ok" : "failed",
                static_cast<unsigned>(vector.size()));
    for (const_safearrayiterator it = vector.begin(); it != vector.end(); ++it)
        std::printf(" '%s'", orvariant_t(*it).ToString().GetString());
    std::printf("\n");

    const IID events = {
        0x3D5A1C40, 0x77E2, 0x4B19, {0x9A, 0x0E, 0x61, 0x2F, 0xC4, 0x58, 0xB3, 0x07}};
    vaskel_test::EventSource source(events);
    TourSink* sink = new TourSink(events);
    std::printf("the sink connects to the source: %s\n", sink->ConnectSink(&source) ? "yes" : "no");
    VARIANT argument;
    VariantInit(&argument);
    argument.vt = VT_I4;
    argument.lVal = 7;
    source.Fire(1, {argument});
    std::printf("the sink disconnects: %s\n", sink->DisconnectSink() ? "yes" : "no");
    std::printf("a second event reaches %u sinks\n",
                static_cast<unsigned>(source.Fire(2, {argument}).size()));
    sink->ExternalRelease();
    CoUninitialize();
}

} // namespace

struct CountCmd : CVKAsyncCmd {
    CountCmd(CVKAsyncCmdQueueThread& queue, int* count) : queue(queue), count(count) {}
    void Execute() override {
        ++*count; // runs on the queue thread, one command at a time
        onQueueThread = queue.IsInThreadCtx();
    }
    CVKAsyncCmdQueueThread& queue;
    int* count;
    bool onQueueThread = false;
};

void TourCommandQueue() {
    Section("Command queues");
    CVKAsyncCmdQueueThread worker(2);
    worker.Create();
    int count = 0;
    CountCmd first(worker, &count);
    worker.SendCmd(first); // returns once it has run
    std::printf("a synchronous send ran on the queue thread: %s\n",
                first.onQueueThread ? "yes" : "no");
    for (int i = 0; i < 100; ++i)
        worker.QueueCmd(new CountCmd(worker, &count), i % 2);
    worker.Destroy(false); // lets what was queued run, then stops the thread
    std::printf("commands run before shut-down: %d; the thread is alive: %s\n", count,
                worker.IsAlive() ? "yes" : "no");
}

void TourConversionsAndSpans() {
    Section("Conversions and time spans");
    std::printf("1.1 as text: %s; 2.5 with no digits: %s; 0.05: %s; 1.1f: %s\n",
                AsString(1.1).GetString(), AsString(2.5, 0).GetString(), AsString(0.05).GetString(),
                AsString(1.1f).GetString());
    std::printf("'  yes' reads as %s, '12abc' as %d\n", AsBool("  yes") ? "true" : "false",
                AsInteger("12abc", 5));
    CTimeSpan span(1, 2, 30, 15, 250);
    std::printf("a span of 1 day 2 h 30 min 15.25 s: '%s', or '%s' remaining, '%s' to the minute\n",
                span.ToString().GetString(), span.ToStringAsTimeRemaining().GetString(),
                span.ToStringAsTimeRemaining(Minutes).GetString());
    DaysOfWeek days;
    days.FromString("mon, fri");
    std::printf("'mon, fri' as days of the week: %s\n", days.ToString().GetString());
}

void TourTokenLists() {
    Section("Token lists and byte dumps");
    CDelimitedString colours(" red, green ,, blue ");
    std::printf("'%s' holds %u tokens; green is token %u\n", colours.GetString(),
                static_cast<unsigned>(colours.GetTokenCount()),
                static_cast<unsigned>(colours.FindToken("green")));
    colours.InsertTokenAt(1, "orange");
    colours.RemoveToken("blue");
    std::printf("orange inserted as token 1, blue removed: '%s'\n", colours.GetString());
    const CDelimitedString::SortingTraits ascending = {true, false, false};
    colours.SortTokens(ascending);
    colours.AddToken("Purple", ascending);
    std::printf("sorted, then Purple added in order: '%s'\n", colours.GetString());

    CSimpleTokenizer tokenizer("name=tour; size=3");
    std::printf("the tokenizer reads:");
    for (bool more = tokenizer.MoveFirstToken('='); more;) {
        std::printf(" [%s]", tokenizer.GetCurToken().GetString());
        more = tokenizer.MoveNextToken(tokenizer.GetCurPositionIndex() < 6 ? ";" : "=");
    }
    std::printf("\n");

    const unsigned char bytes[] = {0xDE, 0xAD, 0xBE, 0xEF, 0x00, 0x01, 0x7F, 0x80, 0xFF};
    std::printf("9 bytes in groups of 4, 2 groups a line:\n%s\n",
                VKBytesToString(bytes, sizeof bytes, 4, 2).GetString());
    CString drive, directory, name, extension;
    VKSplitPath("C:\\tour\\data\\bytes.tar.gz", &drive, &directory, &name, &extension);
    std::printf("C:\\tour\\data\\bytes.tar.gz splits into '%s' '%s' '%s' '%s'\n", drive.GetString(),
                directory.GetString(), name.GetString(), extension.GetString());
}

void TourRegistry() {
    Section("Registry");
    const char path[] = "Software\\vaskel-tour";
    {
        CRegistry key(path, true);
        CStringArray colours;
        colours.Add("red");
        colours.Add("green");
        const bool written = key.SetValue("Count", 3) && key.SetValue("Ratio", 0.25) &&
                             key.SetValue("Name", "tour") && key.SetValue("Colours", colours);
        std::printf("four typed values written under HKCU\\%s: %s\n", path, written ? "yes" : "no");
        CStringArray back;
        key.GetValue("Colours", back);
        std::printf("read back: Count %d, Ratio %.2f, Name '%s', Colours %s and %s; "
                    "a missing value gives its default %d\n",
                    key.GetInteger("Count", 0), key.GetDouble("Ratio", 0.0),
                    key.GetString("Name", "").GetString(),
                    back.GetSize() > 0 ? back[0].GetString() : "?",
                    back.GetSize() > 1 ? back[1].GetString() : "?", key.GetInteger("Missing", -1));
    }
    CRegistry software(HKEY_CURRENT_USER, "Software", false, false);
    const bool deleted = software.DeleteKey("vaskel-tour", true);
    std::printf("the key deleted with its values: %s; still there: %s\n", deleted ? "yes" : "no",
                software.KeyExist("vaskel-tour") ? "yes" : "no");
}

// Today, or the date-time given on the command line (the pinned output
// uses one so that it stays the same every day).
void TourDatesAndTimes(const char* today) {
    Section("Dates and times");
    CDateTime now = CDateTime::Now();
    if (today && !now.FromString(today))
        std::printf("'%s' is not a date-time; showing today\n", today);
    std::printf("today is %s: %s; the date alone %s; the time alone %s\n",
                DayOfWeekX::ToString(now.GetDayOfTheWeek(), true), now.ToString().GetString(),
                now.Format(VAR_DATEVALUEONLY, LOCALE_USER_DEFAULT).GetString(),
                now.Format(VAR_TIMEVALUEONLY, LOCALE_USER_DEFAULT).GetString());
    std::printf(
        "as '%%A, %%#d %%B %%Y': %s; as '%%Y-%%m-%%d %%H:%%M:%%S': %s; day %s of the year\n",
        now.Format("%A, %#d %B %Y").GetString(), now.Format("%Y-%m-%d %H:%M:%S").GetString(),
        now.Format("%#j").GetString());

    CDateTime parsed;
    parsed.FromString("March 31, 2024 6:30 PM");
    CDateTime earlier = parsed;
    earlier.AddMonths(-1);
    std::printf("'March 31, 2024 6:30 PM' parses to %s; a month earlier is %s\n",
                parsed.ToString().GetString(), earlier.ToString().GetString());
    CJulianDate leapDay(2024, 2, 29);
    CJulianDate nextYear = leapDay;
    nextYear.AddYears(1);
    std::printf("a year after %s comes %s, %s days later\n", leapDay.ToString().GetString(),
                nextYear.ToString().GetString(),
                AsString((nextYear - leapDay).GetTotalDays(), 0).GetString());
    CTime evening(18, 0, 0);
    evening.AddMinutes(7 * 60);
    std::printf("6:00 PM plus 7 hours wraps to %s\n", evening.ToString().GetString());
}

int main(int argc, char* argv[]) {
    std::printf("vaskel tour\n");
    TourStrings();
    TourArchive();
    TourDiagnostics();
    TourCommands();
    TourMessageWindow();
    TourCommandQueue();
    TourLifetime();
    TourValuesAndText();
    TourConversionsAndSpans();
    TourTokenLists();
    TourRegistry();
    TourDatesAndTimes(argc > 1 ? argv[1] : nullptr);
    TourNameValues();
    TourFiles();
    TourTimers();
    TourTimerController();
    TourAutomationValues();
    TourCom();
    return 0;
}
