#include "Side.h"

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <memory>
#include <utility>

// The practical limit: one serial loop over plain arrays for each kernel, for meshes of one face size that are known to be
// sound, without a check or a flag that such a mesh does not need.
namespace compare {

namespace {

    Point operator+(Point a, Point b)
    {
        return {a.x + b.x, a.y + b.y, a.z + b.z};
    }
    Point operator-(Point a, Point b)
    {
        return {a.x - b.x, a.y - b.y, a.z - b.z};
    }
    Point operator*(Point a, float s)
    {
        return {a.x * s, a.y * s, a.z * s};
    }
    float dot(Point a, Point b)
    {
        return a.x * b.x + a.y * b.y + a.z * b.z;
    }
    Point cross(Point a, Point b)
    {
        return {a.y * b.z - a.z * b.y, a.z * b.x - a.x * b.z, a.x * b.y - a.y * b.x};
    }

    Point unit(Point v)
    {
        float const length = std::sqrt(dot(v, v));
        return length > FLT_MIN ? v * (1 / length) : Point{0, 1, 0};
    }

    template <std::uint32_t N>
    Point areaVector(Point const* points, std::uint32_t const* face)
    {
        Point const origin = points[face[0]];
        Point sum{};
        for (std::uint32_t k = 2; k < N; ++k)
            sum = sum + cross(points[face[k - 1]] - origin, points[face[k]] - origin);
        return sum;
    }

    template <std::uint32_t N>
    Point newellVector(Point const* points, std::uint32_t const* face)
    {
        Point sum{};
        for (std::uint32_t k = 0; k < N; ++k)
            sum = sum + cross(points[face[k]], points[face[(k + 1) % N]]);
        return sum;
    }

    /// M. Abramowitz, I. A. Stegun, "Handbook of Mathematical Functions", 1964, 4.4.46; over a block of values, so that the
    /// compiler makes it vector code.
    template <std::size_t Count>
    void arcCosines(float* values)
    {
        for (std::size_t i = 0; i < Count; ++i) {
            float const x = std::min(std::fabs(values[i]), 1.0f);
            float p = -0.0012624911f;
            p = p * x + 0.0066700901f;
            p = p * x - 0.0170881256f;
            p = p * x + 0.0308918810f;
            p = p * x - 0.0501743046f;
            p = p * x + 0.0889789874f;
            p = p * x - 0.2145988016f;
            p = p * x + 1.5707963050f;
            float const angle = std::sqrt(1 - x) * p;
            values[i] = values[i] < 0 ? 3.14159265f - angle : angle;
        }
    }

    struct FaceCorner {
        std::uint32_t face;
        std::uint32_t corner;
    };

    template <std::uint32_t N>
    class Loops {
    public:
        Loops(PlainMesh const& mesh, std::vector<Point>& normals, std::vector<Point>& faceNormals)
            : points_(mesh.points.data()), corners_(mesh.corners.data()), pointCount_(mesh.points.size()),
              cornerCount_(mesh.corners.size()), normals_(normals.data()), faceNormals_(faceNormals.data())
        {
        }

        void faceNormals() const
        {
            Point* normal = faceNormals_;
            for (std::size_t c = 0; c < cornerCount_; c += N)
                *normal++ = unit(areaVector<N>(points_, corners_ + c));
        }

        void uniformNormals() const
        {
            accumulate([&](std::size_t c) { return unit(areaVector<N>(points_, corners_ + c)); });
        }

        /// The arithmetic that the library promises: the unit normal times the area, taken from positions as they are. What
        /// that adds to the shorter formula, the plain sum of cross products, is the price of the promise, not of the loop.
        void areaNormals() const
        {
            accumulate([&](std::size_t c) {
                Point const newell = newellVector<N>(points_, corners_ + c);
                return unit(areaVector<N>(points_, corners_ + c)) * (0.5f * std::sqrt(dot(newell, newell)));
            });
        }

        void angleNormals() const
        {
            std::fill_n(normals_, pointCount_, Point{});
            constexpr std::size_t kBlock = 64;
            float angles[kBlock * N];
            Point units[kBlock];
            for (std::size_t first = 0; first < cornerCount_; first += kBlock * N) {
                std::size_t const faceCount = std::min(kBlock, (cornerCount_ - first) / N);
                for (std::size_t f = 0; f < faceCount; ++f) {
                    std::uint32_t const* const face = corners_ + first + f * N;
                    Point sides[N];
                    for (std::uint32_t k = 0; k < N; ++k)
                        sides[k] = unit(points_[face[(k + 1) % N]] - points_[face[k]]);
                    for (std::uint32_t k = 0; k < N; ++k)
                        angles[f * N + k] = -dot(sides[(k + N - 1) % N], sides[k]);
                    units[f] = unit(areaVector<N>(points_, face));
                }
                arcCosines<kBlock * N>(angles);
                for (std::size_t f = 0; f < faceCount; ++f)
                    for (std::uint32_t k = 0; k < N; ++k) {
                        Point& sum = normals_[corners_[first + f * N + k]];
                        sum = sum + units[f] * angles[f * N + k];
                    }
            }
            normalise();
        }

        /// Faces and their corners by point, and for each side of a face the side that runs the other way.
        std::int64_t adjacency(FaceCorner* opposite, FaceCorner* pointFaces, std::uint32_t* ends) const
        {
            std::fill_n(ends, pointCount_ + 1, 0u);
            for (std::size_t c = 0; c < cornerCount_; ++c)
                ++ends[corners_[c]];
            std::uint32_t sum = 0;
            for (std::size_t p = 0; p <= pointCount_; ++p)
                sum += std::exchange(ends[p], sum);
            for (std::uint32_t f = 0; f < cornerCount_ / N; ++f)
                for (std::uint32_t k = 0; k < N; ++k)
                    pointFaces[ends[corners_[f * N + k]]++] = {f, k};
            std::int64_t found = 0;
            for (std::size_t f = 0; f < cornerCount_; f += N)
                for (std::uint32_t k = 0; k < N; ++k) {
                    std::uint32_t const from = corners_[f + k];
                    std::uint32_t const to = corners_[f + (k + 1) % N];
                    opposite[f + k] = {~0u, ~0u};
                    for (std::uint32_t i = to == 0 ? 0 : ends[to - 1]; i < ends[to]; ++i) {
                        auto const [face, corner] = pointFaces[i];
                        if (corners_[face * N + (corner + 1) % N] == from) {
                            opposite[f + k] = {face, corner};
                            ++found;
                            break;
                        }
                    }
                }
            return found;
        }

        std::int64_t components() const
        {
            std::unique_ptr<std::uint32_t[]> const parents(new std::uint32_t[pointCount_]);
            for (std::size_t p = 0; p < pointCount_; ++p)
                parents[p] = static_cast<std::uint32_t>(p);
            auto const find = [&](std::uint32_t p) {
                while (parents[p] != p)
                    p = parents[p] = parents[parents[p]];
                return p;
            };
            auto count = static_cast<std::int64_t>(pointCount_);
            for (std::size_t f = 0; f < cornerCount_; f += N) {
                std::uint32_t root = find(corners_[f]);
                for (std::uint32_t k = 1; k < N; ++k) {
                    std::uint32_t const other = find(corners_[f + k]);
                    if (other == root)
                        continue;
                    if (root < other) {
                        parents[other] = root;
                    } else {
                        parents[root] = other;
                        root = other;
                    }
                    --count;
                }
            }
            return count;
        }

        /// Sides sorted by their lower point, and the distinct ones of each point counted.
        std::int64_t euler() const
        {
            std::unique_ptr<std::uint32_t[]> const ends(new std::uint32_t[pointCount_ + 1]());
            forEachSide([&](std::uint32_t lower, std::uint32_t) { ++ends[lower]; });
            std::uint32_t sum = 0;
            for (std::size_t p = 0; p <= pointCount_; ++p)
                sum += std::exchange(ends[p], sum);
            std::unique_ptr<std::uint32_t[]> const uppers(new std::uint32_t[cornerCount_]);
            forEachSide([&](std::uint32_t lower, std::uint32_t upper) { uppers[ends[lower]++] = upper; });
            std::int64_t edgeCount = 0;
            std::uint32_t begin = 0;
            for (std::size_t p = 0; p < pointCount_; ++p) {
                for (std::uint32_t i = begin; i < ends[p]; ++i) {
                    bool isRepeated = false;
                    for (std::uint32_t j = begin; j < i; ++j)
                        isRepeated |= uppers[i] == uppers[j];
                    edgeCount += !isRepeated;
                }
                begin = ends[p];
            }
            return static_cast<std::int64_t>(pointCount_ + cornerCount_ / N) - edgeCount;
        }

    private:
        template <class Vector>
        void accumulate(Vector const& vectorOf) const
        {
            std::fill_n(normals_, pointCount_, Point{});
            for (std::size_t c = 0; c < cornerCount_; c += N) {
                Point const vector = vectorOf(c);
                for (std::uint32_t k = 0; k < N; ++k)
                    normals_[corners_[c + k]] = normals_[corners_[c + k]] + vector;
            }
            normalise();
        }

        void normalise() const
        {
            for (std::size_t p = 0; p < pointCount_; ++p)
                normals_[p] = unit(normals_[p]);
        }

        template <class Visit>
        void forEachSide(Visit const& visit) const
        {
            for (std::size_t f = 0; f < cornerCount_; f += N)
                for (std::uint32_t k = 0; k < N; ++k) {
                    std::uint32_t const a = corners_[f + k];
                    std::uint32_t const b = corners_[f + (k + 1) % N];
                    visit(std::min(a, b), std::max(a, b));
                }
        }

        Point const* points_;
        std::uint32_t const* corners_;
        std::size_t pointCount_;
        std::size_t cornerCount_;
        Point* normals_;
        Point* faceNormals_;
    };

    class FlatSide : public Side {
    public:
        std::string name() const override { return "flat loop"; }

        void prepare(PlainMesh const& mesh) override
        {
            mesh_ = &mesh;
            normals_.assign(mesh.points.size(), {});
            faceNormals_.assign(mesh.faceCount(), {});
            opposite_.assign(mesh.corners.size(), {});
            pointFaces_.assign(mesh.corners.size(), {});
            ends_.assign(mesh.points.size() + 1, 0);
        }

        bool has(Kernel) const override { return true; }

        void run(Kernel kernel, unsigned int) override
        {
            if (mesh_->faceSize == 3)
                run(kernel, Loops<3>(*mesh_, normals_, faceNormals_));
            else
                run(kernel, Loops<4>(*mesh_, normals_, faceNormals_));
        }

        Result result(Kernel kernel) override
        {
            if (kernel == Kernel::FaceNormals)
                return {faceNormals_, 0};
            return {normals_, number_};
        }

    private:
        template <class AnyLoops>
        void run(Kernel kernel, AnyLoops const& loops)
        {
            switch (kernel) {
            case Kernel::FaceNormals: return loops.faceNormals();
            case Kernel::UniformNormals: return loops.uniformNormals();
            case Kernel::AreaNormals: return loops.areaNormals();
            case Kernel::AngleNormals: return loops.angleNormals();
            case Kernel::Adjacency:
                number_ = loops.adjacency(opposite_.data(), pointFaces_.data(), ends_.data());
                return;
            case Kernel::Components: number_ = loops.components(); return;
            case Kernel::Euler: number_ = loops.euler(); return;
            }
        }

        PlainMesh const* mesh_ = nullptr;
        std::vector<Point> normals_;
        std::vector<Point> faceNormals_;
        std::vector<FaceCorner> opposite_;
        std::vector<FaceCorner> pointFaces_;
        std::vector<std::uint32_t> ends_;
        std::int64_t number_ = 0;
    };

} // namespace

std::unique_ptr<Side> makeFlatSide()
{
    return std::make_unique<FlatSide>();
}

} // namespace compare
