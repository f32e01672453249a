// docs/performance.md and the chart in it, as the benchmark prints them.
#include "report.h"

#include "peers/peers.h"
#include "targets.h"

#include <algorithm>
#include <cmath>
#include <fstream>
#include <iomanip>
#include <map>
#include <stdexcept>

namespace quillon::bench {
namespace {

std::ofstream create(const std::string &path) {
    std::ofstream file(path);
    if (!file)
        throw std::runtime_error("cannot write " + path);
    file << std::fixed << std::setprecision(2);
    return file;
}

std::string processorName() {
    std::ifstream info("/proc/cpuinfo");
    for (std::string line; std::getline(info, line);) {
        if (line.rfind("model name", 0) == 0)
            return line.substr(line.find(':') + 2);
    }
    return "an unnamed processor";
}

// The instruction sets that decide which kernels run.
std::string instructionSets() {
    std::ifstream info("/proc/cpuinfo");
    for (std::string line; std::getline(info, line);) {
        if (line.rfind("flags", 0) != 0)
            continue;
        line += ' ';
        for (const char *set : {"avx512bw", "avx2", "sse4_1"}) {
            if (line.find(std::string(" ") + set + " ") != std::string::npos)
                return set;
        }
    }
    return "none of the vector sets looked for";
}

void writeStanding(std::ofstream &file, const Standing *standing) {
    if (standing != nullptr)
        file << standing->ourSpeed << " (" << standing->name << ")";
}

void writeTable(std::ofstream &file, const std::vector<Result> &results, const char *areaName) {
    file << "\n| Operation | A call, ns | / limit | / best peer |\n|---|--:|--:|--:|\n";
    for (const Result &result : results) {
        if (result.area.name != std::string(areaName))
            continue;
        file << "| " << result.operation << " | "
             << std::setprecision(result.nanoseconds < 100 ? 1 : 0) << result.nanoseconds
             << std::setprecision(2) << " | ";
        writeStanding(file, result.best(true));
        file << " | ";
        writeStanding(file, result.best(false));
        file << " |\n";
    }
}

// The measurements that come out lowest beside the limits, or beside the peers.
void writeLowest(std::ofstream &file, const std::vector<Result> &results, bool besideLimit) {
    constexpr size_t kShown = 10;
    const auto speed = [&](const Result *result) {
        return besideLimit ? result->limitSpeed : result->peerSpeed;
    };
    std::vector<const Result *> sorted;
    for (const Result &result : results) {
        if (speed(&result) > 0)
            sorted.push_back(&result);
    }
    std::sort(sorted.begin(), sorted.end(),
              [&](const Result *a, const Result *b) { return speed(a) < speed(b); });
    sorted.resize(std::min(sorted.size(), kShown));
    file << "\nLowest beside the " << (besideLimit ? "limit" : "best peer") << ":\n\n";
    for (const Result *result : sorted) {
        file << "- " << result->operation << ", " << result->area.name << ": ";
        writeStanding(file, result->best(besideLimit));
        file << "\n";
    }
}

std::vector<std::string> areaNames(const std::vector<Result> &results) {
    std::vector<std::string> names;
    for (const Result &result : results) {
        if (std::find(names.begin(), names.end(), result.area.name) == names.end())
            names.emplace_back(result.area.name);
    }
    return names;
}

// ---- Chart --------------------------------------------------------------

struct Bar {
    std::string family;
    std::map<std::string, double> speeds; // of each area, beside the best peer
};

std::vector<Bar> barsOf(const std::vector<Result> &results) {
    std::vector<Bar> bars;
    std::map<std::string, std::map<std::string, std::pair<double, int>>> logs;
    for (const Result &result : results) {
        if (result.peerSpeed <= 0 || result.area.name[0] == 0)
            continue;
        if (logs.find(result.family) == logs.end())
            bars.push_back({result.family, {}});
        auto &[sum, count] = logs[result.family][result.area.name];
        sum += std::log(result.peerSpeed);
        ++count;
    }
    for (Bar &bar : bars) {
        for (const auto &[area, log] : logs[bar.family])
            bar.speeds[area] = std::exp(log.first / log.second);
    }
    return bars;
}

// Bars on a logarithmic scale from 1/2 to 64 times the best peer.
void writeChart(const std::vector<Result> &results, const std::string &path) {
    constexpr int kLabels = 190, kWidth = 860, kBar = 9, kTop = 46;
    constexpr const char *kColours[] = {"#8fb8de", "#2f6fa7", "#6aa84f", "#d98c3f", "#999999"};
    const std::vector<Bar> bars = barsOf(results);
    std::vector<std::string> areas;
    for (const std::string &name : areaNames(results)) {
        if (std::any_of(bars.begin(), bars.end(),
                        [&](const Bar &bar) { return bar.speeds.count(name) != 0; }))
            areas.push_back(name);
    }
    const int rowHeight = kBar * static_cast<int>(areas.size()) + 8;
    const int height = kTop + rowHeight * static_cast<int>(bars.size()) + 10;
    const auto at = [](double speed) {
        const double octaves = std::log2(std::clamp(speed, 0.5, 64.0)) + 1;
        return kLabels + octaves / 7 * (kWidth - kLabels - 40);
    };

    std::ofstream file = create(path);
    file << "<svg xmlns=\"http://www.w3.org/2000/svg\" viewBox=\"0 0 " << kWidth << " " << height
         << "\" font-family=\"sans-serif\" font-size=\"11\">\n"
         << "<rect width=\"100%\" height=\"100%\" fill=\"white\"/>\n";
    for (size_t i = 0; i < areas.size(); ++i)
        file << "<rect x=\"" << kLabels + 150 * i << "\" y=\"8\" width=\"10\" height=\"10\" fill=\""
             << kColours[i % 5] << "\"/><text x=\"" << kLabels + 150 * i + 15 << "\" y=\"17\">"
             << areas[i] << "</text>\n";
    for (int octave = -1; octave <= 6; ++octave) {
        const double x = at(std::exp2(octave));
        file << "<line x1=\"" << x << "\" x2=\"" << x << "\" y1=\"" << kTop - 6 << "\" y2=\""
             << height - 6 << "\" stroke=\"" << (octave == 0 ? "#333" : "#ddd") << "\"/><text x=\""
             << x << "\" y=\"" << kTop - 10 << "\" text-anchor=\"middle\">"
             << (octave < 0 ? "1/2" : std::to_string(1 << octave)) << "</text>\n";
    }
    int y = kTop;
    for (const Bar &bar : bars) {
        file << "<text x=\"" << kLabels - 8 << "\" y=\"" << y + rowHeight / 2
             << "\" text-anchor=\"end\">" << bar.family << "</text>\n";
        for (size_t i = 0; i < areas.size(); ++i) {
            const auto speed = bar.speeds.find(areas[i]);
            if (speed == bar.speeds.end())
                continue;
            const double from = std::min(at(1), at(speed->second));
            file << "<rect x=\"" << from << "\" y=\"" << y + kBar * static_cast<int>(i)
                 << "\" width=\"" << std::abs(at(speed->second) - at(1)) << "\" height=\""
                 << kBar - 1 << "\" fill=\"" << kColours[i % 5] << "\"/>\n";
        }
        y += rowHeight;
    }
    file << "</svg>\n";
}

} // namespace

void writeReport(const std::vector<Result> &results, const std::string &folder) {
    std::ofstream file = create(folder + "/performance.md");
    file << "# Performance\n\n"
            "Written by `scripts/bench --report=docs`; not by hand.\n\n"
            "Measured on one core of "
         << processorName() << " (" << instructionSets() << "). ";
    file << "Peers: ";
    const char *separator = "";
    for (const Peer &peer : peers()) {
        file << separator << peer.name
             << (peer.offer == nullptr ? " (not installed, left out)" : "");
        separator = ", ";
    }
    file << ".\n\n"
            "Numbers are speeds, ours divided by theirs, so that 2 means half their time: medians "
            "over rounds in which everybody takes a turn. The limit is the fastest that the same "
            "bytes can be moved by a plain or streaming loop, memset or memcpy. Peers often do "
            "less: they round less exactly, or leave the top byte of a pixel undefined; where they "
            "have to give the same bytes, these are compared.\n\n"
            "- 32x32: a rectangle in a surface 1920 pixels wide; the cost of a call\n"
            "- 256x128: in cache; once with the rows end to end, once in a surface 1920 wide\n"
            "- 1920x1080: each call on memory that has left every cache\n\n"
            "Speed beside the best peer, geometric mean over each family:\n\n"
            "![chart](performance.svg)\n\n"
         << summaryText(results);
    writeLowest(file, results, true);
    writeLowest(file, results, false);
    for (const std::string &name : areaNames(results)) {
        file << "\n## " << (name.empty() ? "Lists of rectangles" : name) << "\n";
        writeTable(file, results, name.c_str());
    }
    writeChart(results, folder + "/performance.svg");
}

} // namespace quillon::bench
