// Writing and walking the generated tree: WriteToFile against write_info, and
// GetChildAsInteger on every subtree against ptree::get<int>. The tree is read
// once per process, in both formats, from the files that bench/run made
// (DWXBENCH_DATA names their directory) or from files made here.
#include "bench_register.h"
#include "tree_data.h"

#include <dwxcore/dwxparse.h>
#include <services/utilhub.h>

#include <benchmark/benchmark.h>

#include <stdio.h>
#include <stdlib.h>
#include <unistd.h>

#include <memory>
#include <string>

#if DWXBENCH_HAVE_BOOST
#include <boost/property_tree/info_parser.hpp>
#include <boost/property_tree/ptree.hpp>

#include <fstream>
#endif

namespace dwxbench {
namespace {

// The directory of the tree files, made and filled on first use when
// DWXBENCH_DATA does not name one.
const std::string& DataDir() {
    static const std::string dir = [] {
        const char* given = getenv("DWXBENCH_DATA");
        if (given && *given) {
            return std::string(given);
        }
        char pattern[] = "/tmp/dwxbench.XXXXXX";
        const char* made = mkdtemp(pattern);
        if (!made) {
            perror("mkdtemp");
            exit(1);
        }
        std::string path(made);
        const char* subtrees = getenv("DWXBENCH_SUBTREES");
        int count = subtrees ? atoi(subtrees) : kTreeSubtrees;
        if (!WriteOursFile((path + "/tree.dwx").c_str(), count) ||
            !WriteInfoFile((path + "/tree.info").c_str(), count)) {
            fprintf(stderr, "cannot write the tree files in %s\n", path.c_str());
            exit(1);
        }
        return path;
    }();
    return dir;
}

std::string DataFile(const char* name) {
    return DataDir() + "/" + name;
}

// Our tree, read as a host reads it; the "config" subtree is the tree itself.
const PTNSubTree& OurTree() {
    static const std::unique_ptr<PTNSubTree> root = [] {
        auto tree = std::make_unique<PTNSubTree>("root");
        FILE* stream = DKOpen(DataFile("tree.dwx").c_str(), 4, "r");
        if (!stream) {
            fprintf(stderr, "cannot open the tree file\n");
            exit(1);
        }
        tree->BuildFromFile(stream);
        DKClose(stream);
        return tree;
    }();
    auto* config = static_cast<PTNSubTree*>(root->GetChild("config", "PTNSubTree"));
    if (!config) {
        fprintf(stderr, "the tree file holds no config subtree\n");
        exit(1);
    }
    return *config;
}

void TreeWriteOurs(benchmark::State& state) {
    const PTNSubTree& tree = OurTree();
    const std::string out = DataFile("written.dwx");
    for (auto _ : state) {
        FILE* stream = fopen(out.c_str(), "w");
        tree.WriteToFile(stream);
        fclose(stream);
    }
    unlink(out.c_str());
}

void TreeWalkOurs(benchmark::State& state) {
    const PTNSubTree& tree = OurTree();
    for (auto _ : state) {
        long sum = 0;
        DWXIter iter(tree.GetChildren());
        for (DWXObject* item = iter.Current(); item; item = iter.Next()) {
            sum += static_cast<const PTNSubTree*>(item)->GetChildAsInteger(kWalkLeaf);
        }
        benchmark::DoNotOptimize(sum);
    }
}

#if DWXBENCH_HAVE_BOOST
using boost::property_tree::ptree;

// The peer's tree; its root holds "config" as its only child.
const ptree& PeerRoot() {
    static const ptree root = [] {
        ptree tree;
        boost::property_tree::read_info(DataFile("tree.info"), tree);
        return tree;
    }();
    return root;
}

void TreeWriteBoost(benchmark::State& state) {
    const ptree& root = PeerRoot();
    const std::string out = DataFile("written.info");
    for (auto _ : state) {
        std::ofstream stream(out);
        boost::property_tree::write_info(stream, root);
    }
    unlink(out.c_str());
}

void TreeWalkBoost(benchmark::State& state) {
    const ptree& config = PeerRoot().get_child("config");
    for (auto _ : state) {
        long sum = 0;
        for (const auto& item : config) {
            sum += item.second.get<int>(kWalkLeaf);
        }
        benchmark::DoNotOptimize(sum);
    }
}
#endif

}  // namespace

void RegisterTreeBenchmarks() {
    benchmark::RegisterBenchmark("TreeWrite/ours", TreeWriteOurs)->Unit(benchmark::kMillisecond);
    benchmark::RegisterBenchmark("TreeWalk/ours", TreeWalkOurs)->Unit(benchmark::kMillisecond);
#if DWXBENCH_HAVE_BOOST
    benchmark::RegisterBenchmark("TreeWrite/boost", TreeWriteBoost)->Unit(benchmark::kMillisecond);
    benchmark::RegisterBenchmark("TreeWalk/boost", TreeWalkBoost)->Unit(benchmark::kMillisecond);
#endif
}

}  // namespace dwxbench
