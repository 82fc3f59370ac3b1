#pragma once

#include <nexil/Array.h>
#include <nexil/String.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>

#include <utility>

/// Whether an object is a well-formed geometry, asked before something indexes into its arrays.
///
///     if (auto const status = Geometry::validateMesh(*mesh); !status)
///         std::cerr << status.message << '\n'; // face_vertex contains an invalid index into point_component
///
/// There is a validator for each kind: `MeshValidator`, `PointCloudValidator`, `StrandValidator`, `VolumeValidator`; and
/// `GeoValidator`, which judges the geo properties of any object.
namespace Veldrin::Geometry {

/// Judges every geo property of an object, of whatever kind the object is.
///
/// Data, which is whatever holds the five properties of a data geo property with any type of element:
/// - has to target an object of the geometry, and not itself;
/// - over a component, holds at least as many values as the component counts; more are accepted;
/// - over a range, holds a value for each of its indices; `kInvalidIndex` asks for none. Where the range holds one index
///   more than its component counts and that last one equals the number of values, as the end of an offset array does, the
///   last one is not held against the values;
/// - targets nothing but a component or a range.
/// A range has to target a component, not itself, and holds at least as many indices as the component counts.
/// Everything else passes: components, plain values, further objects.
///
/// Objects are only read. No answer depends on the number of threads; of several failures the one whose key comes first in
/// `keys()` is told.
/// Cost:    types and sizes cost a constant per property and build no array; each array of indices is read once, however
///          many properties share it.
/// Errors:  none from malformed geometry; std::bad_alloc, std::runtime_error when the job is cancelled, and what an object
///          that computes its properties throws.
/// Threads: a validator has no state, so one may be used by many at once.
class VELDRIN_API GeoValidator {
public:
    enum class ErrorCode : unsigned int {
        Success = 0,
        /// The object as a whole is not of the kind.
        InvalidObject = 1,
        /// A field that is needed is missing or of another type.
        InvalidProperty = 2,
        // 3 is not in use, and stays so.
        /// An array is shorter than the number of elements it covers.
        InvalidElementCount = 4,
        /// An index lies outside its target, or offsets are no offsets.
        InvalidIndex = 5,
        /// Data or a range targets nothing that is there.
        MissingTarget = 6,
        /// Data or a range targets itself, or what it cannot lie on.
        InvalidTarget = 7
    };

    /// The verdict: true when valid.
    struct Status {
        Status() = default;
        Status(ErrorCode errorCode, Nexil::String text) : code(errorCode), message(std::move(text)) {}

        [[nodiscard]] explicit operator bool() const noexcept { return code == ErrorCode::Success; }

        ErrorCode code = ErrorCode::Success;
        /// Names the offending property in one sentence; "" when valid.
        Nexil::String message;
    };

    /// A failure together with the name of the property that it leaves out; "" where the object as a whole failed.
    struct Failure {
        Nexil::String property;
        Status status;
    };

    virtual ~GeoValidator();
    /// The first failure, or success.
    [[nodiscard]] virtual Status validate(Object const& object);

    /// Every property that fails, each once and in the order in which `validate` would meet them if those before were
    /// left out; none for a valid object. The first one's status is what `validate` gives.
    [[nodiscard]] Nexil::Array<Failure> findFailures(Object const& object) const;

    GeoValidator() = default;
    GeoValidator(GeoValidator const&) = default;
    GeoValidator(GeoValidator&&) noexcept = default;
    GeoValidator& operator=(GeoValidator const&) = default;
    GeoValidator& operator=(GeoValidator&&) noexcept = default;
};

} // namespace Veldrin::Geometry
