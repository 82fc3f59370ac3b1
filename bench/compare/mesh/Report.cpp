#include "Report.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <limits>

namespace compare {

namespace {

    char const* nameOf(Kernel kernel)
    {
        switch (kernel) {
        case Kernel::FaceNormals: return "face normals";
        case Kernel::UniformNormals: return "vertex normals, uniform";
        case Kernel::AreaNormals: return "vertex normals, area";
        case Kernel::AngleNormals: return "vertex normals, angle";
        case Kernel::Adjacency: return "adjacency";
        case Kernel::Components: return "components";
        case Kernel::Euler: return "edges and Euler";
        }
        return "";
    }

    template <class Run>
    double secondsOf(Run const& run)
    {
        auto const start = std::chrono::steady_clock::now();
        run();
        return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
    }

    /// What a kernel must read and write at least.
    std::size_t bytesOf(PlainMesh const& mesh, Kernel kernel)
    {
        std::size_t const indices = mesh.corners.size() * sizeof(mesh.corners[0]);
        std::size_t const points = mesh.points.size() * sizeof(Point);
        switch (kernel) {
        case Kernel::FaceNormals: return indices + points + mesh.faceCount() * sizeof(Point);
        case Kernel::UniformNormals:
        case Kernel::AreaNormals:
        case Kernel::AngleNormals: return indices + 2 * points;
        case Kernel::Adjacency: return indices + 4 * indices + mesh.points.size() * sizeof(mesh.corners[0]);
        case Kernel::Components: return indices + mesh.points.size() * sizeof(mesh.corners[0]);
        case Kernel::Euler: return indices;
        }
        return 0;
    }

    /// Rounds end after so many, or so much time.
    constexpr unsigned int kMostRounds = 7;
    constexpr unsigned int kLeastRounds = 3;
    constexpr double kSecondsOfRounds = 4;
    /// Peers take many times as long, and noise is small against that.
    constexpr unsigned int kPeerRounds = 2;
    constexpr double kSecondsOfPeer = 1;

    /// How far normals of one element may lie apart. Faces here are a thousandth of the coordinates wide, so that sides which
    /// take other differences of positions, or sum in another order, agree to three or four places; an area that is taken
    /// from positions as they are is some percent off.
    constexpr float toleranceOf(Kernel kernel)
    {
        return kernel == Kernel::AreaNormals ? 2e-3f : 5e-4f;
    }

    struct Kept {
        std::vector<Point> normals;
        std::int64_t number = 0;

        explicit Kept(Result const& result)
            : normals(result.normals.begin(), result.normals.end()), number(result.number)
        {
        }

        [[nodiscard]] bool agrees(Kernel kernel, Result const& other) const
        {
            if (kernel > Kernel::AngleNormals)
                return number == other.number;
            if (normals.size() != other.normals.size())
                return false;
            float worst = 0;
            for (std::size_t i = 0; i < normals.size(); ++i) {
                Point const& a = normals[i];
                Point const& b = other.normals[i];
                for (float const apart : {std::fabs(a.x - b.x), std::fabs(a.y - b.y), std::fabs(a.z - b.z)})
                    worst = apart <= worst ? worst : apart; // also where it is no number
                if (std::isnan(worst))
                    break;
            }
            if (!(worst <= toleranceOf(kernel)))
                std::fprintf(stderr, "[%s: %.2g apart] ", nameOf(kernel), static_cast<double>(worst));
            return worst <= toleranceOf(kernel);
        }
    };

} // namespace

std::vector<Row> measure(PlainMesh const& mesh, std::string const& only, bool withPeers)
{
    auto const flat = makeFlatSide();
    auto const ours = makeVeldrinSide();
    std::vector<std::unique_ptr<Side>> peers;
    if (withPeers) {
        peers.push_back(makeCgalSide());
        peers.push_back(makeOpenMeshSide());
        peers.push_back(makeMeshoptimizerSide());
    }
    flat->prepare(mesh);
    ours->prepare(mesh);
    for (auto const& peer : peers)
        peer->prepare(mesh);

    std::vector<Row> rows;
    for (Kernel const kernel : kKernels) {
        if (std::string(nameOf(kernel)).find(only) == std::string::npos)
            continue;
        constexpr double kNever = std::numeric_limits<double>::infinity();
        Row row{kernel, mesh.order, kNever, kNever, {kNever, kNever}, kNever, "", true};
        std::size_t const half = bytesOf(mesh, kernel) / 2;
        std::vector<char> source(half, 1);
        std::vector<char> target(half, 2);
        double spent = 0;
        auto const best = [&](double& least, auto const& run) {
            double const seconds = secondsOf(run);
            spent += seconds;
            double const time = seconds * 1e9 / static_cast<double>(mesh.faceCount());
            bool const isLess = time < least;
            least = std::min(least, time);
            return isLess;
        };
        flat->run(kernel, 1);
        Kept const expected(flat->result(kernel));
        for (unsigned int round = 0; round < kMostRounds; ++round) {
            if (round >= kLeastRounds && spent > kSecondsOfRounds)
                break;
            best(row.copy, [&] { std::memcpy(target.data(), source.data(), half); });
            best(row.flat, [&] { flat->run(kernel, 1); });
            for (unsigned int const threadCount : {1u, 2u}) {
                best(row.ours[threadCount - 1], [&] { ours->run(kernel, threadCount); });
                if (round == 0)
                    row.isEqual = row.isEqual && expected.agrees(kernel, ours->result(kernel));
            }
            for (auto const& peer : peers) {
                if (round >= kPeerRounds || !peer->has(kernel) || (round > 0 && spent > kSecondsOfPeer))
                    continue;
                if (best(row.peer, [&] { peer->run(kernel, 1); }))
                    row.peerName = peer->name();
                if (round == 0)
                    row.isEqual = row.isEqual && expected.agrees(kernel, peer->result(kernel));
            }
        }
        rows.push_back(std::move(row));
        std::fprintf(stderr, ".");
    }
    std::fprintf(stderr, " %s\n", mesh.order.c_str());
    return rows;
}

void print(std::string const& meshName, std::vector<Row> const& rows)
{
    std::printf("### %s\n\n", meshName.c_str());
    std::printf(
        "| kernel | order | copy | flat loop | 1 thread | 2 threads | 2 against 1 | flat loop against 1 | best peer | "
        "against 1 | against 2 | equal |\n");
    std::printf("|---|---|---|---|---|---|---|---|---|---|---|---|\n");
    for (Row const& row : rows)
        std::printf("| %s | %s | %.1f | %.1f | %.1f | %.1f | %.2f | %.2f | %s %.1f | %.1f | %.1f | %s |\n",
                    nameOf(row.kernel), row.order.c_str(), row.copy, row.flat, row.ours[0], row.ours[1],
                    row.ours[0] / row.ours[1], row.flat / row.ours[0], row.peerName.c_str(), row.peer,
                    row.peer / row.ours[0], row.peer / row.ours[1], row.isEqual ? "yes" : "NO");
    std::printf("\n");
    std::fflush(stdout);
}

} // namespace compare
