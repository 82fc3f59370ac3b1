#include <veldrin/geometry/Prototypes.h>

#include <veldrin/geometry/GeoPropertyCreation.h>
#include <veldrin/geometry/Population.h>
#include <veldrin/object/Properties.h>

#include <atomic>
#include <memory>
#include <mutex>
#include <utility>
#include <vector>

namespace Veldrin::Geometry {

namespace {

    using ObjectPtr = Nexil::Ptr<Object>;

    /// Places in the list of geometry types.
    enum class Kind : unsigned int { Volume, Instances, Mesh, Strand, PointCloud };
    constexpr unsigned int kKindCount = 5;

    struct Registry {
        Nexil::Ptr<Nexil::Array<ObjectPtr>> geometryTypes;
        ObjectPtr levelSet;
        ObjectPtr fogVolume;
        ObjectPtr component;
        ObjectPtr genericData;
        ObjectPtr range;
        ObjectPtr emptyNameData;
        /// The data geo properties that the geometry types declare, each name once.
        std::vector<std::pair<Nexil::String, ObjectPtr>> declaredData;
    };

    template <class Populate>
    ObjectPtr made(Populate const& populate)
    {
        auto object = createObject();
        populate(*object);
        return object;
    }

    ObjectPtr makeGenericData()
    {
        return made([](Object& geoProp) { createDataGeoProperty(Nexil::Any(), geoProp); });
    }

    ObjectPtr makeGeometryType(Kind kind)
    {
        return made([kind](Object& geometry) {
            switch (kind) {
            case Kind::Volume: return populateVolume(geometry);
            case Kind::Instances: return populateInstances(geometry);
            case Kind::Mesh: return populateMesh(geometry);
            case Kind::Strand: return populateStrand(geometry);
            default: return populatePointCloud(geometry);
            }
        });
    }

    bool hasEveryKeyOf(Object const& object, Object const& prototype)
    {
        for (Nexil::String const& key : prototype.keys())
            if (!object.hasProperty(key))
                return false;
        return true;
    }

    ObjectPtr findDeclaredData(Registry const& registry, Nexil::String const& name)
    {
        for (auto const& [declaredName, geoProp] : registry.declaredData)
            if (declaredName == name)
                return geoProp;
        return nullptr;
    }

    void collectDeclaredData(Registry& registry)
    {
        for (ObjectPtr const& geometry : *registry.geometryTypes)
            for (Nexil::String const& name : geometry->keys()) {
                auto part = getPropertyAs<ObjectPtr>(*geometry, name);
                // The first kind that declares a name decides.
                if (part && hasEveryKeyOf(*part, *registry.genericData) && !findDeclaredData(registry, name))
                    registry.declaredData.emplace_back(name, std::move(part));
            }
    }

    std::unique_ptr<Registry const> makeRegistry()
    {
        auto registry = std::make_unique<Registry>();
        Nexil::Array<ObjectPtr> types;
        types.reserve(kKindCount);
        for (unsigned int kind = 0; kind < kKindCount; ++kind)
            types.push_back(makeGeometryType(static_cast<Kind>(kind)));
        registry->geometryTypes = Nexil::makePtr<Nexil::Array<ObjectPtr>>(std::move(types));
        registry->levelSet = made(&populateLevelSet);
        registry->fogVolume = made(&populateFogVolume);
        registry->component = made([](Object& component) { populateComponentGeoProperty(0, component); });
        registry->genericData = makeGenericData();
        registry->range = made([](Object& range) { populateRangeGeoProperty(range); });
        registry->emptyNameData = makeGenericData();
        collectDeclaredData(*registry);
        return registry;
    }

    // A plain pointer, so that getters take no lock and nothing is left to do when the process ends.
    constinit std::atomic<Registry const*> publishedRegistry = nullptr;
    constinit std::mutex buildMutex;

    Registry const& buildRegistry()
    {
        std::lock_guard const lock(buildMutex);
        if (auto const* other = publishedRegistry.load(std::memory_order_acquire))
            return *other;
        auto const* const registry = makeRegistry().release();
        publishedRegistry.store(registry, std::memory_order_release);
        return *registry;
    }

    Registry const& registry()
    {
        auto const* const published = publishedRegistry.load(std::memory_order_acquire);
        return published ? *published : buildRegistry();
    }

    ObjectPtr geometryType(Kind kind)
    {
        return (*registry().geometryTypes)[static_cast<unsigned int>(kind)];
    }

} // namespace

Nexil::Ptr<Nexil::Array<Nexil::Ptr<Object>>> getGeometryTypes()
{
    return registry().geometryTypes;
}

Nexil::Ptr<Object> getVolumePrototype()
{
    return geometryType(Kind::Volume);
}

Nexil::Ptr<Object> getInstancesPrototype()
{
    return geometryType(Kind::Instances);
}

Nexil::Ptr<Object> getMeshPrototype()
{
    return geometryType(Kind::Mesh);
}

Nexil::Ptr<Object> getStrandPrototype()
{
    return geometryType(Kind::Strand);
}

Nexil::Ptr<Object> getPointCloudPrototype()
{
    return geometryType(Kind::PointCloud);
}

Nexil::Ptr<Object> getLevelSetPrototype()
{
    return registry().levelSet;
}

Nexil::Ptr<Object> getFogVolumePrototype()
{
    return registry().fogVolume;
}

Nexil::Ptr<Object> getComponentGeoPropPrototype()
{
    return registry().component;
}

Nexil::Ptr<Object> getRangeGeoPropPrototype()
{
    return registry().range;
}

Nexil::Ptr<Object> getDataGeoPropPrototype(Nexil::String const& name)
{
    Registry const& prototypes = registry();
    if (name.empty())
        return prototypes.emptyNameData;
    if (name == sGenericDataGeoProp)
        return prototypes.genericData;
    auto declared = findDeclaredData(prototypes, name);
    return declared ? declared : prototypes.genericData;
}

void clearGeometryPrototypes()
{
    std::lock_guard const lock(buildMutex);
    std::unique_ptr<Registry const> const doomed(publishedRegistry.exchange(nullptr, std::memory_order_acq_rel));
}

} // namespace Veldrin::Geometry
