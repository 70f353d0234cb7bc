// Writing, walking and merging the generated tree: WriteToFile against
// write_info, GetChildAsInteger on every subtree against ptree::get<int>, and
// SetFrom of one such tree into another (compared with the read of one by
// bench/run). Lookups by name among 100,000 siblings against ptree::find. The
// tree is read once per process, in both formats, from the files that
// bench/run made (DWXBENCH_DATA names their directory) or from files made here.
#include "bench_register.h"
#include "tree_data.h"

#include <dwxcore/dwxparse.h>
#include <services/utilhub.h>

#include <benchmark/benchmark.h>

#include <stdio.h>
#include <stdlib.h>
#include <unistd.h>

#include <memory>
#include <random>
#include <string>
#include <vector>

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

// A second copy of the tree, merged into the first: every leaf finds its
// namesake and takes its value, so each iteration does the whole merge.
void TreeMergeOurs(benchmark::State& state) {
    auto& tree = const_cast<PTNSubTree&>(OurTree());
    static const std::unique_ptr<PTNSubTree> other(tree.DeepCopy());
    ExceptionList exceptions;
    exceptions.Add("label");
    for (auto _ : state) {
        tree.SetFrom(other.get(), exceptions);
    }
}

// The siblings of the lookup benchmarks, and the names looked up: a fixed
// random sample of them, the same for both contenders.
constexpr int kSiblings = 100000;
constexpr int kLookups = 1024;

std::string SiblingName(int i) {
    return "key" + std::to_string(i);
}

const std::vector<std::string>& LookedUp() {
    static const std::vector<std::string> names = [] {
        std::mt19937 random(42);
        std::vector<std::string> sample;
        for (int i = 0; i < kLookups; ++i) {
            sample.push_back(SiblingName(static_cast<int>(random() % kSiblings)));
        }
        return sample;
    }();
    return names;
}

void LookupOurs(benchmark::State& state) {
    PTNSubTree tree("siblings");
    for (int i = 0; i < kSiblings; ++i) {
        tree.AddChild(new PTNInteger(SiblingName(i).c_str(), i));
    }
    const std::vector<std::string>& names = LookedUp();
    tree.GetChild(names[0].c_str());  // the index is built by the first lookup
    for (auto _ : state) {
        long sum = 0;
        for (const std::string& name : names) {
            sum += static_cast<PTNInteger*>(tree.GetChild(name.c_str()))->GetValue();
        }
        benchmark::DoNotOptimize(sum);
    }
}

#if DWXBENCH_HAVE_BOOST
using boost::property_tree::ptree;

void LookupBoost(benchmark::State& state) {
    ptree tree;
    for (int i = 0; i < kSiblings; ++i) {
        tree.push_back(ptree::value_type(SiblingName(i), ptree(std::to_string(i))));
    }
    const std::vector<std::string>& names = LookedUp();
    for (auto _ : state) {
        long sum = 0;
        for (const std::string& name : names) {
            sum += static_cast<long>(tree.find(name)->second.data().size());
        }
        benchmark::DoNotOptimize(sum);
    }
}

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
    benchmark::RegisterBenchmark("TreeMerge/ours", TreeMergeOurs)->Unit(benchmark::kMillisecond);
    benchmark::RegisterBenchmark("Lookup/ours", LookupOurs)->Unit(benchmark::kMicrosecond);
#if DWXBENCH_HAVE_BOOST
    benchmark::RegisterBenchmark("Lookup/boost", LookupBoost)->Unit(benchmark::kMicrosecond);
    benchmark::RegisterBenchmark("TreeWrite/boost", TreeWriteBoost)->Unit(benchmark::kMillisecond);
    benchmark::RegisterBenchmark("TreeWalk/boost", TreeWalkBoost)->Unit(benchmark::kMillisecond);
#endif
}

}  // namespace dwxbench
