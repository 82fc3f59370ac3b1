#include "Report.h"
#include "ScanFile.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <limits>
#include <utility>

// mesh_compare [SCAN.zon [KERNEL [MOST [alone]]]]
//
// Measures our mesh algorithms beside CGAL, OpenMesh, meshoptimizer, plain loops and a copy of the same bytes, all in one
// run, and prints tables for docs/performance.md. KERNEL: only those whose names contain it; MOST: only meshes of up to so
// many faces; alone: without the peers, which take most of the time. Exit code 1 when results differ.
int main(int argc, char** argv)
{
    using namespace compare;
    char const* const only = argc > 2 ? argv[2] : "";
    auto const mostFaces = argc > 3 ? std::strtoul(argv[3], nullptr, 10) : std::numeric_limits<unsigned long>::max();
    bool const withPeers = argc <= 4;
    bool isEqual = true;
    auto const compareOrders = [&](char const* name, std::uint32_t rows, std::uint32_t columns,
                                   std::uint32_t faceSize) {
        if (std::size_t(rows) * columns * (faceSize == 3 ? 2 : 1) > mostFaces)
            return;
        std::vector<Row> table;
        auto const natural = torus(rows, columns, faceSize);
        for (Order const order : {Order::Natural, Order::PointsPermuted, Order::Shuffled})
            for (Row& row : measure(reordered(natural, order), only, withPeers))
                table.push_back(std::move(row));
        std::stable_sort(table.begin(), table.end(), [](Row const& a, Row const& b) { return a.kernel < b.kernel; });
        print(name, table);
        isEqual = isEqual && std::all_of(table.begin(), table.end(), [](Row const& row) { return row.isEqual; });
    };
    compareOrders("4 million triangles", 2000, 1000, 3);
    compareOrders("4 million quads", 2000, 2000, 4);
    compareOrders("100 thousand triangles", 250, 200, 3);
    if (argc > 1 && *argv[1]) {
        auto const scan = readScan(argv[1]);
        if (scan.offsets.size() < 2) {
            std::fprintf(stderr, "mesh_compare: no triangles in %s\n", argv[1]);
            return EXIT_FAILURE;
        }
        auto const table = measure(scan, only, withPeers);
        print("A scan of " + std::to_string(scan.faceCount()) + " triangles", table);
        isEqual = isEqual && std::all_of(table.begin(), table.end(), [](Row const& row) { return row.isEqual; });
    }
    return isEqual ? EXIT_SUCCESS : EXIT_FAILURE;
}
