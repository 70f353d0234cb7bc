// Reads the same tree in the INFO format with the peer's read_info, and frees it.
#include "driver_common.h"

#include <boost/property_tree/info_parser.hpp>
#include <boost/property_tree/ptree.hpp>

#include <memory>

namespace {

long CountNodes(const boost::property_tree::ptree& tree) {
    long count = 0;
    for (const auto& child : tree) {
        count += 1 + CountNodes(child.second);
    }
    return count;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 2) {
        fprintf(stderr, "usage: %s FILE\n", argv[0]);
        return 2;
    }
    auto root = std::make_unique<boost::property_tree::ptree>();
    return dwxbench::RunDriver(
        "boost", argv[1],
        [&root](const char* path) -> long {
            try {
                boost::property_tree::read_info(path, *root);
            } catch (const std::exception& error) {
                fprintf(stderr, "%s\n", error.what());
                return -1;
            }
            return 1;
        },
        [&root] { fprintf(stderr, "boost: %ld nodes\n", CountNodes(*root)); },
        [&root] { root.reset(); });
}
