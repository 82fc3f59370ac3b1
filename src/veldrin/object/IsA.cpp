#include <veldrin/object/internal/ObjectAccess.h>

#include <cstddef>
#include <functional>
#include <unordered_set>
#include <vector>

namespace Veldrin {

namespace {

    using ObjectPtr = Nexil::Ptr<Object>;
    using AnyArrayPtr = Nexil::Ptr<Nexil::Array<Nexil::Any>>;

    /// A pair still to be compared. The pointers keep alive what a class that computes its properties handed out.
    struct Pair {
        ObjectPtr object;
        ObjectPtr prototype;

        friend bool operator==(Pair const&, Pair const&) = default;
    };

    struct PairHash {
        std::size_t operator()(Pair const& pair) const noexcept
        {
            std::hash<Object const*> const hash;
            return hash(pair.object.get()) * 31 + hash(pair.prototype.get());
        }
    };

    // Ordinary objects hold a handful of others, and looking a pair up costs as much as comparing it. Beyond that many,
    // objects that share their parts would be compared once for every path that leads to them.
    constexpr std::size_t kMostPairsNotRemembered = 64;

    class Comparison {
    public:
        bool run(Object const& object, Object const& prototype)
        {
            if (!compareTop(object, prototype))
                return false;
            while (!pending_.empty()) {
                Pair const pair = std::move(pending_.back());
                pending_.pop_back();
                if (++comparedCount_ > kMostPairsNotRemembered && !compared_.insert(pair).second)
                    continue;
                if (!compareTop(*pair.object, *pair.prototype))
                    return false;
            }
            return true;
        }

    private:
        bool compareTop(Object const& object, Object const& prototype)
        {
            if (&object == &prototype)
                return true;
            auto const* objectTable = ObjectAccess::table(object);
            if (auto const* table = ObjectAccess::table(prototype))
                return table->visitWhile([&](Nexil::String const& key, Nexil::Any const& wanted) {
                    return compareValue(object, objectTable, key, wanted);
                });
            for (Nexil::String const& key : prototype.keys()) {
                // Only objects and wildcards need the prototype's value; the type of anything else is enough.
                auto const info = prototype.propertyInfo(key);
                bool const isObject = info.type == Nexil::TypeId::of<ObjectPtr>();
                if (!compareInfo(object.propertyInfo(key), info.type))
                    return false;
                if (isObject && !compareFetched(object, key, prototype.getProperty(key)))
                    return false;
            }
            return true;
        }

        bool compareValue(Object const& object, Internal::PropertyTable const* objectTable, Nexil::String const& key,
                          Nexil::Any const& wanted)
        {
            if (!objectTable) {
                return compareInfo(object.propertyInfo(key), wanted.type()) &&
                       (!wanted.holds<ObjectPtr>() || compareFetched(object, key, wanted));
            }
            auto const* value = objectTable->find(key.view());
            if (!value)
                return false;
            if (wanted.holds<ObjectPtr>())
                return compareObjects(value->get<ObjectPtr>(), wanted.get<ObjectPtr>());
            return compareInfo({true, Nexil::AnyArray::is_any_array(*value), value->type(), 0}, wanted.type());
        }

        static bool compareInfo(PropertyInfo const& info, Nexil::TypeId wanted)
        {
            if (!info.exists)
                return false;
            if (!wanted || info.type == wanted)
                return true;
            return info.isArray && wanted == Nexil::TypeId::of<AnyArrayPtr>();
        }

        bool compareFetched(Object const& object, Nexil::String const& key, Nexil::Any const& wanted)
        {
            // Where the prototype's object is null the type alone decides, and that was compared.
            auto const* prototype = wanted.get<ObjectPtr>();
            if (prototype && !*prototype)
                return true;
            Nexil::Any const value = object.getProperty(key);
            return compareObjects(value.get<ObjectPtr>(), prototype);
        }

        /// Null arguments stand for values that are no objects, whatever was promised of them.
        bool compareObjects(ObjectPtr const* object, ObjectPtr const* prototype)
        {
            if (!object || !prototype)
                return false;
            if (!*prototype || *object == *prototype)
                return true;
            if (!*object)
                return false;
            pending_.push_back({*object, *prototype});
            return true;
        }

        std::vector<Pair> pending_;
        // The pointers in it keep addresses from being given to other objects while the question lasts.
        std::unordered_set<Pair, PairHash> compared_;
        std::size_t comparedCount_ = 0;
    };

} // namespace

bool Object::isA(Object const& object, Object const& prototype)
{
    return Comparison().run(object, prototype);
}

} // namespace Veldrin
