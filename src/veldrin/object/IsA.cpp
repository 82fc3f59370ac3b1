#include <veldrin/object/internal/ObjectAccess.h>

#include <vector>

namespace Veldrin {

namespace {

    using ObjectPtr = Nexil::Ptr<Object>;
    using AnyArrayPtr = Nexil::Ptr<Nexil::Array<Nexil::Any>>;

    /// A pair still to be compared. The pointers keep alive what a class that computes its properties handed out.
    struct Pair {
        ObjectPtr object;
        ObjectPtr prototype;
    };

    class Comparison {
    public:
        bool run(Object const& object, Object const& prototype)
        {
            if (!compareTop(object, prototype))
                return false;
            while (!pending_.empty()) {
                Pair const pair = std::move(pending_.back());
                pending_.pop_back();
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
                if (isObject && !compareObjects(object.getProperty(key), prototype.getProperty(key)))
                    return false;
            }
            return true;
        }

        bool compareValue(Object const& object, Internal::PropertyTable const* objectTable, Nexil::String const& key,
                          Nexil::Any const& wanted)
        {
            if (!objectTable) {
                return compareInfo(object.propertyInfo(key), wanted.type()) &&
                       (!wanted.holds<ObjectPtr>() || compareObjects(object.getProperty(key), wanted));
            }
            auto const* value = objectTable->find(key.view());
            if (!value)
                return false;
            if (wanted.holds<ObjectPtr>())
                return value->holds<ObjectPtr>() && compareObjects(*value, wanted);
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

        bool compareObjects(Nexil::Any const& value, Nexil::Any const& wanted)
        {
            auto const& object = *value.get<ObjectPtr>();
            auto const& prototype = *wanted.get<ObjectPtr>();
            if (!prototype || object == prototype)
                return true;
            if (!object)
                return false;
            pending_.push_back({object, prototype});
            return true;
        }

        std::vector<Pair> pending_;
    };

} // namespace

bool Object::isA(Object const& object, Object const& prototype)
{
    return Comparison().run(object, prototype);
}

} // namespace Veldrin
