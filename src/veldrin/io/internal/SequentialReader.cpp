#include <veldrin/io/internal/StreamReader.h>

#include <nexil/JobCancel.h>
#include <nexil/String.h>
#include <veldrin/io/StreamKeys.h>
#include <veldrin/io/internal/StreamHeader.h>
#include <veldrin/io/internal/UnpackVisitor.h>

#include <memory>

namespace Veldrin::IO {

namespace {

    /// In version 4 a number stands for an earlier top-level object.
    class EarlierObjects final : public V3::References {
    public:
        explicit EarlierObjects(Nexil::Array<Nexil::Ptr<Object>> const& objects) : objects_(objects) {}

        [[nodiscard]] Nexil::Any resolve(std::uint64_t number, unsigned int code) override
        {
            if (code != TypeCode::kObject)
                throwMalformed();
            if (number >= objects_.size())
                throw Nexil::String("object index out of range");
            if (!objects_[number])
                throw Nexil::String("ptr not found in map");
            return objects_[number];
        }

    private:
        Nexil::Array<Nexil::Ptr<Object>> const& objects_;
    };

    std::unique_ptr<V1::UnpackVisitor> makeVisitor(unsigned int version, ItemReader& reader, V3::References* references)
    {
        if (version == 1)
            return std::make_unique<V1::UnpackVisitor>(reader);
        if (version == 2)
            return std::make_unique<V2::UnpackVisitor>(reader);
        return std::make_unique<V3::UnpackVisitor>(reader, true, references, nullptr);
    }

} // namespace

Nexil::Array<Nexil::Ptr<Object>> readSequentialStream(ByteSource& source, Object const& header, unsigned int version)
{
    Nexil::Array<Nexil::Ptr<Object>> objects;
    EarlierObjects earlier(objects);
    bool const hasReferences = version == 4 && headerFlag(header, sStreamHandles);
    ItemReader reader(source);
    auto const visitor = makeVisitor(version, reader, hasReferences ? &earlier : nullptr);
    // Up to where the bytes end, not to where reading them fails: what is missing was not read.
    while (source.bytesLeft() != 0) {
        Nexil::Internal::throwIfJobCancelled();
        auto const& item = reader.next(source.end());
        objects.push_back(visitor->unpackObjectPointer(item));
        reader.finish();
    }
    return objects;
}

} // namespace Veldrin::IO
