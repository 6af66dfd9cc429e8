// SPDX-License-Identifier: Apache-2.0
#include <getopt.h>
#include <stdlib.h>

#include <exception>
#include <fstream>
#include <iostream>

#include "chart.h"
#include "kernel_bench.h"
#include "machine.h"
#include "report.h"
#include "stack.h"
#include "threads.h"

using namespace bench;

namespace {

constexpr char kUsage[] =
    "Measures the library beside its peers and prints one table; without a filter, another of "
    "what\n"
    "threads cost.\n"
    "\n"
    "  --filter TEXT   only cases whose family or name holds TEXT\n"
    "  --isa SET       our kernels: scalar, avx2 or avx512 (default: the library's choice)\n"
    "  --rounds N      samples of each contender in a case (default 31)\n"
    "  --cold          before every call, drop both pictures from the caches\n"
    "  --quick         few and short samples: a first impression\n"
    "  --json FILE     write all numbers\n"
    "  --chart FILE    write what bench/chart.gp draws\n"
    "  --stack         measure instead how much stack our calls take\n"
    "  --threads       measure instead what threads cost\n"
    "  --kernels       measure instead each kernel of each set alone\n";

struct Options {
    std::string filter;
    std::string isa;
    std::string json;
    std::string chart;
    Effort effort = {Caches::kWarm, 31, 5e-4, 8};
    bool stack = false;
    bool threads = false;
    bool kernels = false;
};

[[noreturn]] void give_up(const std::string& why) {
    std::cerr << "bench: " << why << '\n';
    exit(2);
}

int positive_number(const char* text) {
    char* end = nullptr;
    const long number = strtol(text, &end, 10);
    if (*end != '\0' || number < 1 || number > 1000000) {
        give_up(std::string("'") + text + "' is no number from 1 to 1000000");
    }
    return static_cast<int>(number);
}

Options parse(int argc, char** argv) {
    static const option kOptions[] = {
        {"filter", required_argument, nullptr, 'f'}, {"isa", required_argument, nullptr, 'i'},
        {"rounds", required_argument, nullptr, 'r'}, {"cold", no_argument, nullptr, 'C'},
        {"quick", no_argument, nullptr, 'q'},        {"json", required_argument, nullptr, 'j'},
        {"chart", required_argument, nullptr, 'c'},  {"stack", no_argument, nullptr, 's'},
        {"threads", no_argument, nullptr, 't'},      {"kernels", no_argument, nullptr, 'k'},
        {"help", no_argument, nullptr, 'h'},         {nullptr, 0, nullptr, 0}};
    Options options;
    for (int c; (c = getopt_long(argc, argv, "", kOptions, nullptr)) != -1;) {
        switch (c) {
            case 'f':
                options.filter = optarg;
                break;
            case 'i':
                options.isa = optarg;
                break;
            case 'r':
                options.effort.rounds = positive_number(optarg);
                break;
            case 'C':
                options.effort.caches = Caches::kCold;
                break;
            case 'q':
                options.effort.rounds = 7;
                options.effort.least_seconds = 1e-4;
                options.effort.most_seconds = 1;
                break;
            case 'j':
                options.json = optarg;
                break;
            case 'c':
                options.chart = optarg;
                break;
            case 's':
                options.stack = true;
                break;
            case 't':
                options.threads = true;
                break;
            case 'k':
                options.kernels = true;
                break;
            case 'h':
                std::cout << kUsage;
                exit(0);
            default:
                std::cerr << kUsage;
                exit(2);
        }
    }
    if (optind < argc) give_up(std::string("what is '") + argv[optind] + "'?");
    return options;
}

std::vector<Case> wanted_cases(const std::string& filter) {
    std::vector<Case> wanted;
    for (Case& test : all_cases()) {
        if ((test.family + " " + test.name).find(filter) != std::string::npos) {
            wanted.push_back(std::move(test));
        }
    }
    if (wanted.empty()) give_up("no case holds '" + filter + "'");
    return wanted;
}

std::vector<Result> run(const std::vector<Case>& cases, const Effort& effort) {
    std::vector<Result> results;
    Table table = result_table(std::cout);
    for (const Case& test : cases) {
        const std::vector<Contender> contenders = contenders_of(test);
        results.push_back({test, contenders, measure(test.job, contenders, effort)});
        print_result(table, results.back());
    }
    std::cout << '\n';
    print_means(std::cout, results);
    return results;
}

std::ofstream create(const std::string& path) {
    std::ofstream file(path);
    if (!file) give_up("cannot write " + path);
    return file;
}

void print_lines(const std::vector<std::string>& lines) {
    for (const std::string& line : lines) std::cout << line << '\n';
    std::cout << '\n';
}

void run_bench(const Options& options) {
    if (!choose_kernels(options.isa)) {
        give_up("this processor has no kernels '" + options.isa + "'");
    }
    if (options.kernels) {
        print_lines(describe_machine());
        if (!print_kernels(std::cout, options.filter, options.effort)) {
            give_up("no kernel holds '" + options.filter + "'");
        }
        return;
    }
    const std::vector<Case> cases = wanted_cases(options.filter);
    std::vector<std::string> machine = describe_machine();
    const bool cold = options.effort.caches == Caches::kCold;
    machine.push_back(cold ? "caches: cold" : "caches: warm");
    print_lines(machine);
    if (options.stack) {
        print_stack_use(std::cout, cases);
        return;
    }
    if (options.threads) {
        print_thread_costs(std::cout, options.effort);
        return;
    }
    const std::vector<Result> results = run(cases, options.effort);
    if (options.filter.empty()) {
        std::cout << '\n';
        print_thread_costs(std::cout, options.effort);
    }
    if (!options.json.empty()) {
        std::ofstream file = create(options.json);
        write_json(file, machine, results);
    }
    if (!options.chart.empty()) {
        std::ofstream file = create(options.chart);
        write_chart_data(file, results);
    }
}

}  // namespace

int main(int argc, char** argv) {
    try {
        run_bench(parse(argc, argv));
    } catch (const std::exception& error) {
        give_up(error.what());
    }
}
