// SPDX-License-Identifier: Apache-2.0
//
// Runs where request_figures runs, and prints what the service's start costs on each device class, from
// its exec until a client that waits for the name is told of it, by part; then what a run of vibctl
// costs. Nobody polls meanwhile: who waits is blocked. The programs and their libraries lie in memory, as a
// guest that waits for the machine's files counts time instead of instructions.
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <map>
#include <regex>
#include <string>
#include <thread>
#include <vector>

#include <android-base/file.h>
#include <android-base/unique_fd.h>
#include <android/binder_manager.h>
#include <android/binder_process.h>
#include <fmt/format.h>

#include "bench/guest_figures.h"
#include "bench/recorded_request.h"
#include "handset/phone/process.h"
#include "tests/support/command.h"

namespace bench {
namespace {

using android::base::unique_fd;
using qvx::test::runCommand;

constexpr const char* kLog = "/run/start.log";
constexpr int kStarts = 5;
constexpr int64_t kVibctlAim = 10'000'000;
constexpr const char* kClasses[] = {"legacy", "leds", "ff"};

// How the copy of a program in memory is started, its libraries beside it.
std::vector<std::string> copyIntoMemory(const std::string& program) {
    const std::filesystem::path directory = "/run/start";
    std::filesystem::create_directory(directory);
    const std::filesystem::path copy = directory / std::filesystem::path(program).filename();
    constexpr auto kOnce = std::filesystem::copy_options::skip_existing;
    std::filesystem::copy_file(program, copy, kOnce);
    // "libc.so.6 => /lib/x86_64-linux-gnu/libc.so.6 (0x7f...)", "/lib64/ld-linux-x86-64.so.2 (0x7f...)"
    static const std::regex kLibrary(R"((\S+ => )?(/\S+) \(0x)");
    const std::string listed = runCommand({"ldd", program}).out;
    std::string loader;
    for (std::sregex_iterator found(listed.begin(), listed.end(), kLibrary), end; found != end;
         ++found) {
        const std::filesystem::path library = (*found)[2].str();
        std::filesystem::copy_file(library, directory / library.filename(), kOnce);
        if (!(*found)[1].matched) loader = directory / library.filename();
    }
    if (loader.empty()) fail("ldd " + program + " names no loader");
    return {loader, "--library-path", directory, copy};
}

const std::vector<std::string>& inMemory(const std::string& program) {
    static std::map<std::string, std::vector<std::string>> copied;
    std::vector<std::string>& words = copied[program];
    if (words.empty()) words = copyIntoMemory(program);
    return words;
}

// A process that becomes a program when it is let go.
class Waiting {
  public:
    Waiting(const std::vector<std::string>& words, const char* log, unsigned user) {
        unique_fd go;
        unique_fd output;
        if (!Pipe(&go, &mGo) || !Pipe(&mOutput, &output)) fail("no pipe");
        mProcess = inChild(log, [&] {
            handset::Launch launch;
            launch.user = user;
            char byte = 0;
            if (!handset::becomeWhatLaunchAsks(launch) || ::read(go.get(), &byte, 1) != 1) return;
            dup2(output.get(), STDOUT_FILENO);
            std::vector<char*> arguments;
            arguments.reserve(words.size() + 1);
            for (const std::string& word : words)
                arguments.push_back(const_cast<char*>(word.c_str()));
            arguments.push_back(nullptr);
            execv(arguments[0], arguments.data());
        });
    }
    ~Waiting() { endChild(mProcess); }
    Waiting(const Waiting&) = delete;
    Waiting& operator=(const Waiting&) = delete;

    pid_t process() const { return mProcess; }
    void letGo() const {
        if (::write(mGo.get(), "x", 1) != 1) fail("a program has ended before its start");
    }
    // Until it has written something.
    void awaitOutput() const {
        char byte = 0;
        if (::read(mOutput.get(), &byte, 1) != 1) fail("a program has not started");
    }

  private:
    unique_fd mGo;
    unique_fd mOutput;
    pid_t mProcess = 0;
};

void awaitNobody() {
    while (ndk::SpAIBinder(AServiceManager_checkService(kInstance)).get() != nullptr)
        std::this_thread::sleep_for(std::chrono::milliseconds(2));
}

// Instructions from the service's exec until this process is told that it is registered.
int64_t start() {
    awaitNobody();
    const Waiting service(inMemory(serviceProgram()), kNoLog, 1000);
    int64_t begin = 0;
    std::thread starter([&] {
        // By now the main thread waits.
        std::this_thread::sleep_for(std::chrono::milliseconds(100));
        begin = now();
        service.letGo();
    });
    const ndk::SpAIBinder found(AServiceManager_waitForService(kInstance));
    const int64_t end = now();
    starter.join();
    return end - begin;
}

std::string besideThis(const std::string& name) {
    return android::base::GetExecutableDirectory() + "/" + name;
}

int64_t startEmpty() {
    const Waiting empty(inMemory(besideThis("empty_program")), kNoLog, 1000);
    const int64_t begin = now();
    empty.letGo();
    empty.awaitOutput();
    return now() - begin;
}

int64_t registerEmpty() {
    return std::atoll(
            runCommand({besideThis("empty_program"), "bench.IEmpty/default"}).out.c_str());
}

int64_t runVibctl() {
    std::vector<std::string> words = inMemory(besideThis("vibctl"));
    words.insert(words.end(), {"std", "getCompositionDelayMax"});
    const Waiting vibctl(words, kNoLog, 1000);
    const int64_t begin = now();
    vibctl.letGo();
    waitid(P_PID, static_cast<id_t>(vibctl.process()), nullptr, WEXITED | WNOWAIT);
    return now() - begin;
}

RecordedRequest recordStart(BareDriver* driver) {
    awaitNobody();
    const Waiting service(inMemory(serviceProgram()), kLog, 1000);
    RecordedRequest done;
    done.calls = traceCalls(service.process(), [&] {
        service.letGo();
        const ndk::SpAIBinder found(AServiceManager_waitForService(kInstance));
    });
    std::string log;
    android::base::ReadFileToString(kLog, &log);
    done.lines = linesOf(log, service.process());
    driver->prepare(done.calls);
    return done;
}

template <typename Count>
int64_t medianOf(const Count& count) {
    Series series;
    for (int i = 0; i < kStarts; ++i) series.add(count());
    return series.median();
}

template <typename Call>
int64_t countOnce(const Call& call) {
    const int64_t begin = now();
    call();
    return now() - begin;
}

void printClass(const char* phoneClass) {
    BareDriver driver;
    const RecordedRequest done = recordStart(&driver);
    const int64_t whole = medianOf(start);
    const int64_t linking = medianOf(startEmpty);
    const int64_t registration = medianOf(registerEmpty);
    int64_t probing = 0;
    int64_t logging = 0;
    // In a process of its own, which leaves open what the service does.
    unique_fd counts;
    unique_fd told;
    if (!Pipe(&counts, &told)) fail("no pipe");
    const pid_t bare = inChild(kNoLog, [&] {
        const int64_t both[] = {medianOf([&] {
                                    return countOnce([&] {
                                        for (const DriverCall& call : done.calls)
                                            driver.carryOut(call);
                                    });
                                }),
                                medianOf([&] {
                                    return countOnce([&] {
                                        for (const LogLine& line : done.lines) write(line);
                                    });
                                })};
        android::base::WriteFully(told.get(), both, sizeof(both));
    });
    if (!android::base::ReadFully(counts.get(), &probing, sizeof(probing)) ||
        !android::base::ReadFully(counts.get(), &logging, sizeof(logging))) {
        fail("the bare start has ended");
    }
    endChild(bare);
    fmt::print("{:>5.2f} {:>10} {:>9} {:>9} {:>9} {:>12} {:>9}  {}\n",
               static_cast<double>(whole) / static_cast<double>(linking + probing), whole, linking,
               probing, logging, registration, whole - linking - probing - logging - registration,
               phoneClass);
    fflush(stdout);
}

int run() {
    runSteadily(0);
    setenv("TZ", "UTC0", 1);  // else each program reads the machine's file for its first line
    fmt::print("{:>5} {:>10} {:>9} {:>9} {:>9} {:>12} {:>9}  {}\n", "ratio", "registered",
               "linking", "probing", "logging", "registration", "rest", "start");
    for (const char* const phoneClass : kClasses) {
        withPhone(phoneClass, [&] {
            ABinderProcess_startThreadPool();  // to be told of a registration
            printClass(phoneClass);
        });
    }
    withPhone("leds", [] {
        const Service service(kNoLog);
        const int64_t count = medianOf(runVibctl);
        fmt::print(
                "{:>5.2f} {:>10}  vibctl std getCompositionDelayMax beside its aim, exec to end\n",
                static_cast<double>(count) / kVibctlAim, count);
    });
    return 0;
}

}  // namespace
}  // namespace bench

int main() {
    return bench::run();
}
