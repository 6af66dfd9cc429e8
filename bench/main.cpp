// SPDX-License-Identifier: Apache-2.0
#include <CLI/CLI.hpp>
#include <algorithm>
#include <exception>
#include <fstream>
#include <iostream>
#include <stdexcept>

#include "chart.h"
#include "kernel_bench.h"
#include "machine.h"
#include "report.h"
#include "stack.h"
#include "threads.h"

using namespace bench;

namespace {

struct Options {
    std::string filter;
    std::string isa = "best";
    std::string json;
    std::string chart;
    Effort effort = {Caches::kWarm, 31, 5e-4, 8};
    bool stack = false;
    bool threads = false;
    bool kernels = false;
};

std::vector<std::string> isa_names() {
    std::vector<std::string> names = {"best", "all"};
    for (const ovrin::NamedKernels& set : all_sets()) names.push_back(set.name);
    return names;
}

void declare(CLI::App* app, Options* options) {
    app->add_option("--filter", options->filter, "Only cases whose family or name holds this text")
        ->type_name("TEXT");
    app->add_option("--isa", options->isa, "Our kernels: those of a set, the best, or of all sets")
        ->type_name("SET")
        ->check(CLI::IsMember(isa_names()))
        ->capture_default_str();
    app->add_option("--rounds", options->effort.rounds, "Samples of each contender in a case")
        ->type_name("N")
        ->check(CLI::Range(1, 1000000))
        ->capture_default_str();
    const auto be_cold = [=] { options->effort.caches = Caches::kCold; };
    app->add_flag_callback("--cold", be_cold,
                           "Before every call, drop both pictures from the caches");
    const auto be_quick = [=] {
        options->effort.rounds = 7;
        options->effort.least_seconds = 1e-4;
        options->effort.most_seconds = 1;
    };
    app->add_flag_callback("--quick", be_quick, "Few and short samples: a first impression")
        ->excludes("--rounds");
    app->add_option("--json", options->json, "Write all numbers")->type_name("FILE");
    app->add_option("--chart", options->chart, "Write what bench/chart.gp draws")
        ->type_name("FILE");
    app->add_flag("--stack", options->stack, "Measure instead how much stack our calls take");
    app->add_flag("--threads", options->threads, "Measure instead what threads cost");
    app->add_flag("--kernels", options->kernels, "Measure instead each kernel of each set alone");
}

// The last one is the best.
std::vector<ovrin::NamedKernels> wanted_sets(const std::string& isa) {
    std::vector<ovrin::NamedKernels> sets = all_sets();
    if (isa == "all") return sets;
    if (isa == "best") return {sets.back()};
    sets.erase(std::remove_if(sets.begin(), sets.end(),
                              [&](const ovrin::NamedKernels& set) { return isa != set.name; }),
               sets.end());
    return sets;
}

std::vector<Case> wanted_cases(const std::string& filter) {
    std::vector<Case> wanted;
    for (Case& test : all_cases()) {
        if ((test.family + " " + test.name).find(filter) != std::string::npos) {
            wanted.push_back(std::move(test));
        }
    }
    if (wanted.empty()) throw std::runtime_error("no case holds '" + filter + "'");
    return wanted;
}

std::vector<Result> run(const std::vector<Case>& cases,
                        const std::vector<ovrin::NamedKernels>& sets, const Effort& effort) {
    std::vector<Result> results;
    Table table = result_table(std::cout);
    for (const Case& test : cases) {
        const std::vector<Contender> contenders = contenders_of(test, sets);
        results.push_back({test, contenders, measure(test.job, contenders, effort)});
        print_result(table, results.back());
    }
    std::cout << '\n';
    print_means(std::cout, results);
    print_copiers(std::cout, results);
    return results;
}

std::ofstream create(const std::string& path) {
    std::ofstream file(path);
    if (!file) throw std::runtime_error("cannot write " + path);
    return file;
}

void print_lines(const std::vector<std::string>& lines) {
    for (const std::string& line : lines) std::cout << line << '\n';
    std::cout << '\n';
}

void run_bench(const Options& options) {
    const std::vector<ovrin::NamedKernels> sets = wanted_sets(options.isa);
    ovrin::force_kernels(*sets.back().kernels);
    if (options.kernels) {
        print_lines(describe_machine(all_sets()));
        if (!print_kernels(std::cout, options.filter, options.effort)) {
            throw std::runtime_error("no kernel holds '" + options.filter + "'");
        }
        return;
    }
    const std::vector<Case> cases = wanted_cases(options.filter);
    std::vector<std::string> machine = describe_machine(sets);
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
    const std::vector<Result> results = run(cases, sets, options.effort);
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
    CLI::App app(
        "Measures the library beside its peers and prints one table; without a filter, "
        "another of what threads cost.",
        "bench");
    Options options;
    declare(&app, &options);
    try {
        app.parse(argc, argv);
        run_bench(options);
    } catch (const CLI::ParseError& error) {
        return app.exit(error);
    } catch (const std::exception& error) {
        std::cerr << "bench: " << error.what() << '\n';
        return 2;
    }
}
