// The registry store shared by processes: writers at once, writers killed in
// the middle of their writes, and files private to the user wherever the store
// is found. The program starts copies of itself as the writers, all on the
// store the program itself uses unless a test points one elsewhere.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <fcntl.h>
#include <signal.h>
#include <spawn.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <map>
#include <string>
#include <vector>

extern char** environ;

namespace {

namespace fs = std::filesystem;

const char writerFlag[] = "--registry-writer";
// Descriptors a writer finds its pipes at: out of the way of any the
// runtime opens before main.
const int reportFd = 100;
const int goFd = 101;

// Writes count DWORD values "<prefix><i>" = i below HKEY_CURRENT_USER\path.
// With a go pipe it first waits for a byte; with a report pipe it writes each
// index there once its write has returned. The exit code tells what failed.
int RunWriter(const char* path, const std::string& prefix, long count, bool report, bool wait) {
    char go = 0;
    if (wait && read(goFd, &go, 1) != 1)
        return 10;
    HKEY key = nullptr;
    if (RegCreateKeyExA(HKEY_CURRENT_USER, path, 0, nullptr, REG_OPTION_NON_VOLATILE,
                        KEY_ALL_ACCESS, nullptr, &key, nullptr) != ERROR_SUCCESS)
        return 11;
    for (DWORD i = 0; i < static_cast<DWORD>(count); ++i) {
        const std::string name = prefix + std::to_string(i);
        if (RegSetValueExA(key, name.c_str(), 0, REG_DWORD, reinterpret_cast<const BYTE*>(&i),
                           sizeof i) != ERROR_SUCCESS)
            return 12;
        if (report && write(reportFd, &i, sizeof i) != sizeof i)
            return 13;
    }
    return RegCloseKey(key) == ERROR_SUCCESS ? 0 : 14;
}

struct Pipe {
    Pipe() { EXPECT_EQ(pipe2(fds, O_CLOEXEC), 0); }
    ~Pipe() {
        CloseRead();
        CloseWrite();
    }
    void CloseRead() { Close(fds[0]); }
    void CloseWrite() { Close(fds[1]); }
    static void Close(int& fd) {
        if (fd >= 0)
            close(fd);
        fd = -1;
    }
    int fds[2] = {-1, -1};
};

struct WriterOptions {
    std::string path;
    std::string prefix;
    long count = 1;
    int report = -1;                        // write end of a report pipe
    int go = -1;                            // read end of a go pipe
    std::map<std::string, std::string> env; // replaced, or removed when empty
    mode_t umask = 022;
};

pid_t SpawnWriter(const WriterOptions& options) {
    std::vector<std::string> env;
    for (char** entry = environ; *entry != nullptr; ++entry) {
        const std::string text = *entry;
        if (options.env.count(text.substr(0, text.find('='))) == 0)
            env.push_back(text);
    }
    for (const auto& [name, value] : options.env) {
        if (!value.empty())
            env.push_back(name + "=" + value);
    }
    std::vector<char*> envp;
    for (std::string& entry : env)
        envp.push_back(entry.data());
    envp.push_back(nullptr);

    std::string self = fs::read_symlink("/proc/self/exe").string();
    std::vector<std::string> args = {self,
                                     writerFlag,
                                     options.path,
                                     options.prefix,
                                     std::to_string(options.count),
                                     options.report >= 0 ? "report" : "-",
                                     options.go >= 0 ? "wait" : "-"};
    std::vector<char*> argv;
    for (std::string& arg : args)
        argv.push_back(arg.data());
    argv.push_back(nullptr);

    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    if (options.report >= 0)
        posix_spawn_file_actions_adddup2(&actions, options.report, reportFd);
    if (options.go >= 0)
        posix_spawn_file_actions_adddup2(&actions, options.go, goFd);
    const mode_t previous = umask(options.umask);
    pid_t pid = -1;
    const int error = posix_spawn(&pid, self.c_str(), &actions, nullptr, argv.data(), envp.data());
    umask(previous);
    posix_spawn_file_actions_destroy(&actions);
    EXPECT_EQ(error, 0) << std::strerror(error);
    return error == 0 ? pid : -1;
}

// The exit code, or 1000 + the signal that ended the process.
int Wait(pid_t pid) {
    int status = 0;
    while (waitpid(pid, &status, 0) < 0 && errno == EINTR) {
    }
    return WIFEXITED(status) ? WEXITSTATUS(status) : 1000 + WTERMSIG(status);
}

// How many of "<prefix>0".."<prefix><count - 1>" hold their index.
long CountIntact(const char* path, const std::string& prefix, long count) {
    HKEY key = nullptr;
    if (RegOpenKeyExA(HKEY_CURRENT_USER, path, 0, KEY_READ, &key) != ERROR_SUCCESS)
        return -1;
    long intact = 0;
    for (long i = 0; i < count; ++i) {
        DWORD value = 0;
        DWORD size = sizeof value;
        const std::string name = prefix + std::to_string(i);
        if (RegQueryValueExA(key, name.c_str(), nullptr, nullptr, reinterpret_cast<BYTE*>(&value),
                             &size) == ERROR_SUCCESS &&
            value == static_cast<DWORD>(i))
            ++intact;
    }
    RegCloseKey(key);
    return intact;
}

mode_t Mode(const fs::path& path) {
    struct stat st;
    return stat(path.c_str(), &st) == 0 ? st.st_mode & 07777 : 0;
}

class TempDir {
public:
    TempDir() {
        std::string pattern = (fs::temp_directory_path() / "vaskel-registry-XXXXXX").string();
        if (mkdtemp(pattern.data()) != nullptr)
            m_path = pattern;
    }
    ~TempDir() {
        std::error_code ignored;
        fs::remove_all(m_path, ignored);
    }
    const fs::path& Path() const { return m_path; }

private:
    fs::path m_path;
};

TEST(RegistryStoreTest, FourProcessesWriteAtOnce) {
    const long perWriter = 5000;
    Pipe go;
    std::vector<pid_t> writers;
    for (int w = 0; w < 4; ++w) {
        WriterOptions options;
        options.path = "Software\\Concurrent";
        options.prefix = "w" + std::to_string(w) + "-";
        options.count = perWriter;
        options.go = go.fds[0];
        writers.push_back(SpawnWriter(options));
    }
    // Released together, so that they open the new store and write at once.
    go.CloseRead();
    ASSERT_EQ(write(go.fds[1], "gogo", 4), 4);
    go.CloseWrite();
    for (const pid_t writer : writers)
        EXPECT_EQ(Wait(writer), 0);
    for (int w = 0; w < 4; ++w) {
        const std::string prefix = "w" + std::to_string(w) + "-";
        EXPECT_EQ(CountIntact("Software\\Concurrent", prefix, perWriter), perWriter) << prefix;
    }
}

TEST(RegistryStoreTest, EveryReturnedWriteSurvivesAKilledWriter) {
    for (int round = 0; round < 20; ++round) {
        SCOPED_TRACE(round);
        Pipe report;
        WriterOptions options;
        options.path = "Software\\Killed";
        options.prefix = "r" + std::to_string(round) + "-";
        options.count = 1000000; // far more than it gets to write
        options.report = report.fds[1];
        const pid_t writer = SpawnWriter(options);
        ASSERT_GT(writer, 0);
        report.CloseWrite();
        // Killed after a number of writes that varies by round, wherever
        // that finds it; then whatever it reported before dying is read.
        const long killAfter = 1 + (round * 37) % 300;
        long reported = 0;
        bool killed = false;
        DWORD indices[256];
        for (ssize_t got; (got = read(report.fds[0], indices, sizeof indices)) != 0;) {
            if (got < 0 && errno == EINTR)
                continue;
            ASSERT_GT(got, 0);
            ASSERT_EQ(got % sizeof(DWORD), 0u);
            for (ssize_t i = 0; i < got / static_cast<ssize_t>(sizeof(DWORD)); ++i)
                ASSERT_EQ(indices[i], static_cast<DWORD>(reported++));
            if (!killed && reported >= killAfter)
                killed = kill(writer, SIGKILL) == 0;
        }
        EXPECT_EQ(Wait(writer), 1000 + SIGKILL);
        EXPECT_EQ(CountIntact("Software\\Killed", options.prefix, reported), reported);
    }
    // A new process opens the store and writes on.
    WriterOptions after;
    after.path = "Software\\Killed";
    after.prefix = "after-";
    EXPECT_EQ(Wait(SpawnWriter(after)), 0);
    EXPECT_EQ(CountIntact("Software\\Killed", "after-", 1), 1);
}

TEST(RegistryStoreTest, FilesArePrivateWhateverTheUmask) {
    // Nothing opened up by a permissive mask, nothing of the owner's taken by a strict one.
    for (const mode_t mask : {mode_t{022}, mode_t{0}, mode_t{0277}}) {
        SCOPED_TRACE(mask);
        TempDir base;
        const fs::path store = base.Path() / "made" / "registry";
        WriterOptions options;
        options.path = "Software\\Private";
        options.count = 10;
        options.env = {{"VASKEL_REGISTRY", store.string()}};
        options.umask = mask;
        ASSERT_EQ(Wait(SpawnWriter(options)), 0);
        EXPECT_EQ(Mode(base.Path() / "made"), 0700u);
        EXPECT_EQ(Mode(store), 0700u);
        std::vector<std::string> files;
        for (const fs::directory_entry& entry : fs::directory_iterator(store)) {
            files.push_back(entry.path().filename().string());
            EXPECT_EQ(Mode(entry.path()), 0600u) << files.back();
        }
        EXPECT_EQ(std::count(files.begin(), files.end(), "user.db"), 1);
        EXPECT_GE(files.size(), 2u); // the database and its log
    }
}

TEST(RegistryStoreTest, StoreLocations) {
    TempDir base;
    const std::string home = (base.Path() / "home").string();
    const std::string data = (base.Path() / "data").string();
    const struct {
        std::map<std::string, std::string> env;
        fs::path database;
    } cases[] = {
        {{{"VASKEL_REGISTRY", ""}, {"XDG_DATA_HOME", data}, {"HOME", home}},
         base.Path() / "data/vaskel/registry/user.db"},
        {{{"VASKEL_REGISTRY", ""}, {"XDG_DATA_HOME", ""}, {"HOME", home}},
         base.Path() / "home/.local/share/vaskel/registry/user.db"},
        // XDG rules ignore a relative data home.
        {{{"VASKEL_REGISTRY", ""}, {"XDG_DATA_HOME", "relative"}, {"HOME", home + "2"}},
         base.Path() / "home2/.local/share/vaskel/registry/user.db"},
    };
    for (const auto& location : cases) {
        SCOPED_TRACE(location.database);
        WriterOptions options;
        options.path = "Software\\Located";
        options.env = location.env;
        EXPECT_EQ(Wait(SpawnWriter(options)), 0);
        EXPECT_EQ(Mode(location.database), 0600u);
    }
}

TEST(RegistryStoreTest, DamagedStoreFailsCleanly) {
    TempDir base;
    std::ofstream(base.Path() / "user.db") << std::string(8192, 'x');
    WriterOptions options;
    options.path = "Software\\Damaged";
    options.env = {{"VASKEL_REGISTRY", base.Path().string()}};
    EXPECT_EQ(Wait(SpawnWriter(options)), 11); // the key could not be created
}

TEST(RegistryStoreTest, ChildMadeByForkWorksOnItsOwn) {
    HKEY key = nullptr;
    ASSERT_EQ(RegCreateKeyExA(HKEY_CURRENT_USER, "Software\\Forked", 0, nullptr, 0, KEY_ALL_ACCESS,
                              nullptr, &key, nullptr),
              ERROR_SUCCESS);
    const DWORD parent = 1;
    ASSERT_EQ(RegSetValueExA(key, "Parent", 0, REG_DWORD, reinterpret_cast<const BYTE*>(&parent),
                             sizeof parent),
              ERROR_SUCCESS);
    const pid_t child = fork();
    if (child == 0) {
        // Through the inherited handle and through a new one.
        const DWORD value = 2;
        DWORD back = 0;
        DWORD size = sizeof back;
        HKEY again = nullptr;
        const bool done =
            RegSetValueExA(key, "Child", 0, REG_DWORD, reinterpret_cast<const BYTE*>(&value),
                           sizeof value) == ERROR_SUCCESS &&
            RegOpenKeyExA(HKEY_CURRENT_USER, "Software\\Forked", 0, KEY_READ, &again) ==
                ERROR_SUCCESS &&
            RegQueryValueExA(again, "Parent", nullptr, nullptr, reinterpret_cast<BYTE*>(&back),
                             &size) == ERROR_SUCCESS &&
            back == parent;
        _exit(done ? 0 : 1);
    }
    ASSERT_GT(child, 0);
    EXPECT_EQ(Wait(child), 0);
    DWORD back = 0;
    DWORD size = sizeof back;
    EXPECT_EQ(
        RegQueryValueExA(key, "Child", nullptr, nullptr, reinterpret_cast<BYTE*>(&back), &size),
        ERROR_SUCCESS);
    EXPECT_EQ(back, 2u);
    RegCloseKey(key);
}

TEST(RegistryStoreTest, RootsCannotBeDeleted) {
    // Even when empty: HKEY_CLASSES_ROOT's key in a fresh machine hive is.
    EXPECT_EQ(RegDeleteKeyA(HKEY_LOCAL_MACHINE, "Software\\Classes"), ERROR_ACCESS_DENIED);
    EXPECT_EQ(RegDeleteKeyA(HKEY_CLASSES_ROOT, ""), ERROR_ACCESS_DENIED);
    EXPECT_EQ(RegDeleteKeyA(HKEY_CURRENT_USER, ""), ERROR_ACCESS_DENIED);
    EXPECT_EQ(RegDeleteKeyA(HKEY_LOCAL_MACHINE, ""), ERROR_ACCESS_DENIED);
    HKEY key = nullptr;
    EXPECT_EQ(RegOpenKeyExA(HKEY_LOCAL_MACHINE, "Software\\Classes", 0, KEY_READ, &key),
              ERROR_SUCCESS);
    RegCloseKey(key);
}

} // namespace

int main(int argc, char** argv) {
    if (argc == 7 && std::strcmp(argv[1], writerFlag) == 0)
        return RunWriter(argv[2], argv[3], std::atol(argv[4]), std::strcmp(argv[5], "-") != 0,
                         std::strcmp(argv[6], "-") != 0);
    // One store for the program and the writers it starts, set before the
    // first registry call reads it.
    TempDir store;
    setenv("VASKEL_REGISTRY", store.Path().c_str(), 1);
    ::testing::InitGoogleTest(&argc, argv);
    return RUN_ALL_TESTS();
}
