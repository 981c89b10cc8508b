// A recursive FileEnumerator walk against std::filesystem's
// recursive_directory_iterator over the same tree of 10 000 empty files
// (99 directories of 100 files and 100 files at the top), in pairs whose
// ratio reads off directly (items/s counts the entries):
//   Walk    each entry's full path and whether it is a directory
//   Status  the same and each entry's size and last write time: the
//           enumerator's search reads them with the entry (one status call
//           per entry), the iterator asks the system for each value
// On POSIX a search reads each entry's status, which Win32 reports with the
// name; that call is the Walk pair's difference.
// The tree is made once in the temporary folder and removed at the end.
#include <vaskel/fs.h>

#include <benchmark/benchmark.h>

#include <filesystem>
#include <string>
#include <system_error>

namespace {

namespace fs = std::filesystem;

const int64_t treeEntries = 99 + 100 * 100;

fs::path& TreeRoot() {
    static fs::path root;
    return root;
}

// The library writes paths with backslashes on every platform.
vaskel::CString Win32Text(const fs::path& path) {
    std::string text = path.string();
    for (char& c : text)
        if (c == '/')
            c = '\\';
    return text.c_str();
}

vaskel::CString TreeRootText() {
    return Win32Text(TreeRoot());
}

void CountEntries(benchmark::State& state, int64_t entries) {
    if (entries != treeEntries)
        state.SkipWithError("the walk missed entries");
    state.SetItemsProcessed(static_cast<int64_t>(state.iterations()) * entries);
}

void BM_Walk_FileEnumerator(benchmark::State& state) {
    const vaskel::CString root = TreeRootText();
    int64_t entries = 0;
    for (auto _ : state) {
        vaskel::FileEnumerator walk(root, "*", true);
        walk.Reset();
        entries = 0;
        while (walk.MoveNext()) {
            const vaskel::CFileFind& entry = walk.Current();
            vaskel::CString path = entry.GetFilePath();
            benchmark::DoNotOptimize(path.GetString());
            benchmark::DoNotOptimize(entry.IsDirectory());
            ++entries;
        }
    }
    CountEntries(state, entries);
}

void BM_Walk_RecursiveDirectoryIterator(benchmark::State& state) {
    int64_t entries = 0;
    for (auto _ : state) {
        entries = 0;
        for (const fs::directory_entry& entry : fs::recursive_directory_iterator(TreeRoot())) {
            benchmark::DoNotOptimize(entry.path().c_str());
            benchmark::DoNotOptimize(entry.is_directory());
            ++entries;
        }
    }
    CountEntries(state, entries);
}

void BM_Status_FileEnumerator(benchmark::State& state) {
    const vaskel::CString root = TreeRootText();
    int64_t entries = 0;
    for (auto _ : state) {
        vaskel::FileEnumerator walk(root, "*", true);
        walk.Reset();
        entries = 0;
        while (walk.MoveNext()) {
            const vaskel::CFileFind& entry = walk.Current();
            vaskel::CString path = entry.GetFilePath();
            FILETIME written;
            entry.GetLastWriteTime(&written);
            benchmark::DoNotOptimize(path.GetString());
            benchmark::DoNotOptimize(entry.IsDirectory());
            benchmark::DoNotOptimize(entry.GetLength());
            benchmark::DoNotOptimize(written);
            ++entries;
        }
    }
    CountEntries(state, entries);
}

void BM_Status_RecursiveDirectoryIterator(benchmark::State& state) {
    int64_t entries = 0;
    for (auto _ : state) {
        entries = 0;
        for (const fs::directory_entry& entry : fs::recursive_directory_iterator(TreeRoot())) {
            const bool directory = entry.is_directory();
            benchmark::DoNotOptimize(entry.path().c_str());
            benchmark::DoNotOptimize(directory);
            if (!directory)
                benchmark::DoNotOptimize(entry.file_size());
            benchmark::DoNotOptimize(entry.last_write_time());
            ++entries;
        }
    }
    CountEntries(state, entries);
}

BENCHMARK(BM_Walk_FileEnumerator)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Walk_RecursiveDirectoryIterator)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Status_FileEnumerator)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Status_RecursiveDirectoryIterator)->Unit(benchmark::kMillisecond);

} // namespace

int main(int argc, char** argv) {
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 1;
    const vaskel::CString name = vaskel::FileSystem::BuildUniqueDirectoryName(
        Win32Text(fs::temp_directory_path()), "vaskel-bench-tree");
    if (name.IsEmpty())
        return 1;
    TreeRoot() = fs::temp_directory_path() / name.GetString();
    if (!vaskel::FileSystem::PopulateDirectoryTree(TreeRootText(), 1, 99, 100, nullptr, nullptr)) {
        std::error_code ignored;
        fs::remove_all(TreeRoot(), ignored);
        return 1;
    }
    benchmark::RunSpecifiedBenchmarks();
    std::error_code ignored;
    fs::remove_all(TreeRoot(), ignored);
    benchmark::Shutdown();
    return 0;
}
