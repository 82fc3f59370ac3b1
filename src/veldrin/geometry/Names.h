#pragma once

#include <veldrin/geometry/Export.h>

/// The names by which geometry keeps its parts. They are stored in files: a text never changes.
///
///     mesh->getProperty(Veldrin::Geometry::sPointPosition);
namespace Veldrin::Geometry {

/// No element; also the default of index-valued geo properties.
inline constexpr unsigned int kInvalidIndex = 0xFFFFFFFFu;
/// An element that was removed but is not yet compacted away.
inline constexpr unsigned int kDeletedElement = 0xFFFFFFFEu;

/// Texts that names are built from: a component's name ends in "_component", a range's is its data property's plus
/// "_index", a tag's starts with its component's prefix and ends in "_tag".
VELDRIN_API extern char const* const sNullString;
VELDRIN_API extern char const* const sComponentSuffix;
VELDRIN_API extern char const* const sIndexSuffix;
VELDRIN_API extern char const* const sComponentTagPrefix_point;
VELDRIN_API extern char const* const sComponentTagPrefix_face;
VELDRIN_API extern char const* const sComponentTagSuffix;

/// Keys inside geo properties.
VELDRIN_API extern char const* const sCount;
VELDRIN_API extern char const* const sData;
VELDRIN_API extern char const* const sTarget;
VELDRIN_API extern char const* const sDependsOn;
VELDRIN_API extern char const* const sDefault;
VELDRIN_API extern char const* const sInterp;
VELDRIN_API extern char const* const sIndices;

/// Components.
VELDRIN_API extern char const* const sPointComp;
VELDRIN_API extern char const* const sFaceComp;
VELDRIN_API extern char const* const sFaceVertexComp;
VELDRIN_API extern char const* const sVoxelComp;
VELDRIN_API extern char const* const sStrandComp;

/// Geo properties over points.
VELDRIN_API extern char const* const sPointPosition;
VELDRIN_API extern char const* const sPointVelocity;
VELDRIN_API extern char const* const sPointColor;
VELDRIN_API extern char const* const sPointSize;
VELDRIN_API extern char const* const sPointOrientation;
VELDRIN_API extern char const* const sPointNormal;
VELDRIN_API extern char const* const sPointUV;
VELDRIN_API extern char const* const sPointStrandIndex;
VELDRIN_API extern char const* const sPointTangent;
VELDRIN_API extern char const* const sPointRatio;
VELDRIN_API extern char const* const sPointLength;

/// Geo properties over strands.
VELDRIN_API extern char const* const sStrandOffset;
VELDRIN_API extern char const* const sStrandLength;

/// Geo properties over faces and their corners. The text of `sFaceVertexAdjacency` differs from its name on purpose.
VELDRIN_API extern char const* const sFaceVertex;
VELDRIN_API extern char const* const sFaceOffset;
VELDRIN_API extern char const* const sFaceCenter;
VELDRIN_API extern char const* const sFaceNormal;
VELDRIN_API extern char const* const sFaceUV;
VELDRIN_API extern char const* const sFaceVertexNormal;
VELDRIN_API extern char const* const sFaceVertexUV;
VELDRIN_API extern char const* const sFaceVertexAdjacency;
VELDRIN_API extern char const* const sPointFaceAdjacency;
VELDRIN_API extern char const* const sPointFaceAdjacencyIndex;

/// Other properties of geometry.
VELDRIN_API extern char const* const sVoxelTileTree;
VELDRIN_API extern char const* const sInstanceShape;
VELDRIN_API extern char const* const sRenderSettings;
VELDRIN_API extern char const* const sMaterialSurface;
VELDRIN_API extern char const* const sMaterialDisplacement;
VELDRIN_API extern char const* const sMaterialVolume;
VELDRIN_API extern char const* const sMaterialReferenceID;
VELDRIN_API extern char const* const sOperatorReferenceID;
VELDRIN_API extern char const* const sOperators;
VELDRIN_API extern char const* const sDccName;

/// The name that always asks for the generic data geo property prototype.
VELDRIN_API extern char const* const sGenericDataGeoProp;

/// Kinds of acceleration structures.
VELDRIN_API extern char const* const sAcceleratorGeo;
VELDRIN_API extern char const* const sAcceleratorGrid;
VELDRIN_API extern char const* const sAcceleratorComponent;

/// Voxel channels.
VELDRIN_API extern char const* const sVoxelPosition;
VELDRIN_API extern char const* const sVoxelVelocity;
VELDRIN_API extern char const* const sVoxelFogDensity;
VELDRIN_API extern char const* const sVoxelMassDensity;
VELDRIN_API extern char const* const sVoxelSignedDistance;
VELDRIN_API extern char const* const sVoxelDepth;
VELDRIN_API extern char const* const sVoxelDetailSize;
VELDRIN_API extern char const* const sVoxelAcceleration;
VELDRIN_API extern char const* const sVoxelTemperature;
VELDRIN_API extern char const* const sVoxelIgnitionTemperature;
VELDRIN_API extern char const* const sVoxelPointRadius;
VELDRIN_API extern char const* const sVoxelDegreeOfFreedom;
VELDRIN_API extern char const* const sVoxelVorticity;
VELDRIN_API extern char const* const sVoxelExpansionRate;
VELDRIN_API extern char const* const sVoxelFogDensitySignedDistance;
VELDRIN_API extern char const* const sVoxelFlameLevelSet;
VELDRIN_API extern char const* const sVoxelCombustionRate;
VELDRIN_API extern char const* const sVoxelFlameSpeed;
VELDRIN_API extern char const* const sVoxelRefinement;
VELDRIN_API extern char const* const sVoxelSignificance;
VELDRIN_API extern char const* const sVoxelSamplingError;
VELDRIN_API extern char const* const sVoxelFuel;
VELDRIN_API extern char const* const sVoxelFuelPropane;
VELDRIN_API extern char const* const sVoxelFuelEthane;
VELDRIN_API extern char const* const sVoxelFuelButane;
VELDRIN_API extern char const* const sVoxelFuelMethane;
VELDRIN_API extern char const* const sVoxelFuelPropylene;
VELDRIN_API extern char const* const sVoxelFuelPropyne;
VELDRIN_API extern char const* const sVoxelFuelPropadiene;
VELDRIN_API extern char const* const sVoxelGasCarbonDioxide;
VELDRIN_API extern char const* const sVoxelGasNitrogen;
VELDRIN_API extern char const* const sVoxelGasOxygen;
VELDRIN_API extern char const* const sVoxelGasVapor;

} // namespace Veldrin::Geometry
