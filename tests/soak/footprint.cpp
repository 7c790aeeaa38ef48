// SPDX-License-Identifier: Apache-2.0
#include "tests/soak/footprint.h"

#include <fcntl.h>
#include <sys/mount.h>
#include <unistd.h>

#include <algorithm>
#include <fstream>
#include <optional>
#include <regex>

#include <fmt/format.h>

#include "tests/support/process_view.h"

namespace qvx::test {
namespace {

// What the sanitizers keep of what is freed.
constexpr long kKibNoise = 256;
constexpr long kSanitizedKibNoise = 65536;
constexpr long kCountNoise = 4;

// The driver's totals: "node: active 4 total 17", up to its first process.
void addBinderTotals(Footprint* footprint) {
    constexpr const char* kStatistics = "/sys/kernel/debug/binder/stats";
    if (access(kStatistics, R_OK) != 0) mount("none", "/sys/kernel/debug", "debugfs", 0, nullptr);
    std::ifstream file(kStatistics);
    for (std::string word; file >> word && word != "proc";) {
        std::string active;
        long count = 0;
        if (word.ends_with(':') && file >> active && active == "active" && file >> count) {
            (*footprint)["binder " + word + " active"] = count;
        }
    }
}

// Of a process that is killed in the middle of a call the driver keeps a node now and then, to which
// nobody has a reference any more, with a count below zero; they head the list.
long lostNodes() {
    std::ifstream file(kBinderState);
    long count = 0;
    for (std::string line; std::getline(file, line) && !line.starts_with("proc ");) {
        if (line.find(" ls -1 ") != std::string::npos) ++count;
    }
    return count;
}

// Nothing where no sample has it.
std::optional<long> medianOf(const std::string& name, std::vector<Footprint>::const_iterator from,
                             std::vector<Footprint>::const_iterator to) {
    std::vector<long> values;
    for (; from != to; ++from) {
        if (const auto found = from->find(name); found != from->end()) {
            values.push_back(found->second);
        }
    }
    if (values.empty()) return std::nullopt;
    const auto middle = values.begin() + static_cast<ptrdiff_t>(values.size() / 2);
    std::nth_element(values.begin(), middle, values.end());
    return *middle;
}

long noiseOf(const std::string& name) {
    if (!name.ends_with("KiB")) return kCountNoise;
    const char* const service = getenv("PHONE_SERVICE");
    const bool isSanitized =
            service != nullptr && std::string(service).find("san/") != std::string::npos;
    return isSanitized ? kSanitizedKibNoise : kKibNoise;
}

}  // namespace

Footprint footprintOf(const std::map<std::string, pid_t>& processes) {
    Footprint footprint;
    for (const auto& [name, process] : processes) {
        footprint[name + " KiB"] = privateMemory(process);
        footprint[name + " descriptors"] = static_cast<long>(entriesOf(process, "fd").size());
        footprint[name + " threads"] = static_cast<long>(entriesOf(process, "task").size());
    }
    addBinderTotals(&footprint);
    footprint["binder node: active"] -= lostNodes();
    return footprint;
}

std::vector<std::string> growthOver(const std::vector<Footprint>& samples,
                                    const std::string& owner) {
    std::vector<std::string> grown;
    if (samples.size() < 3) return {"too few samples to compare"};
    const auto tenth = static_cast<ptrdiff_t>(std::max<size_t>(1, samples.size() / 10));
    for (const auto& [name, ignored] : samples.back()) {
        if (!name.starts_with(owner)) continue;
        const auto first = medianOf(name, samples.begin() + 1, samples.begin() + 1 + tenth);
        const auto last = medianOf(name, samples.end() - tenth, samples.end());
        if (!first || !last || *last <= *first + noiseOf(name)) continue;
        grown.push_back(fmt::format("{}: {}, then {}", name, *first, *last));
    }
    return grown;
}

KernelComplaints::KernelComplaints() : mLog(open("/dev/kmsg", O_RDONLY | O_NONBLOCK | O_CLOEXEC)) {
    lseek(mLog, 0, SEEK_END);
}

KernelComplaints::~KernelComplaints() {
    close(mLog);
}

std::vector<std::string> KernelComplaints::next() const {
    // What the driver says of a transaction whose sender or receiver died meanwhile (29189 is
    // BR_DEAD_REPLY), and of a callback for a process that does not read (29201, without room).
    static const std::regex kDeath(
            "callbacks suppressed|binder_linux: (undelivered |release .* still active|send failed "
            "reply for transaction|"
            ".*(dead process or thread|reply target not found|cannot find target node|no vma|vma "
            "cleared|failed "
            ".*/29189/|failed "
            ".*/29201/-28))");
    static const std::regex kTrouble("binder|BUG|WARNING|Oops|Call Trace|hung|Out of memory");
    std::vector<std::string> complaints;
    char record[8192];
    for (ssize_t size; (size = read(mLog, record, sizeof record)) > 0;) {
        const std::string text(record, static_cast<size_t>(size));
        if (std::regex_search(text, kTrouble) && !std::regex_search(text, kDeath)) {
            complaints.push_back(text);
        }
    }
    return complaints;
}

}  // namespace qvx::test
