#include <veldrin/geometry/Names.h>

namespace Veldrin::Geometry {

char const* const sNullString = "";
char const* const sComponentSuffix = "_component";
char const* const sIndexSuffix = "_index";
char const* const sComponentTagPrefix_point = "point_";
char const* const sComponentTagPrefix_face = "face_";
char const* const sComponentTagSuffix = "_tag";

char const* const sCount = "count";
char const* const sData = "data";
char const* const sTarget = "target";
char const* const sDependsOn = "depends_on";
char const* const sDefault = "default";
char const* const sInterp = "interpolation_mode";
char const* const sIndices = "indices";

char const* const sPointComp = "point_component";
char const* const sFaceComp = "face_component";
char const* const sFaceVertexComp = "face_vertex_component";
char const* const sVoxelComp = "voxel_component";
char const* const sStrandComp = "strand_component";

char const* const sPointPosition = "point_position";
char const* const sPointVelocity = "point_velocity";
char const* const sPointColor = "point_color";
char const* const sPointSize = "point_size";
char const* const sPointOrientation = "point_orientation";
char const* const sPointNormal = "point_normal";
char const* const sPointUV = "point_uv";
char const* const sPointStrandIndex = "point_strand_index";
char const* const sPointTangent = "point_tangent";
char const* const sPointRatio = "point_ratio";
char const* const sPointLength = "point_length";

char const* const sStrandOffset = "strand_offset";
char const* const sStrandLength = "strand_length";

char const* const sFaceVertex = "face_vertex";
char const* const sFaceOffset = "face_offset";
char const* const sFaceCenter = "face_center";
char const* const sFaceNormal = "face_normal";
char const* const sFaceUV = "face_uv";
char const* const sFaceVertexNormal = "face_vertex_normal";
char const* const sFaceVertexUV = "face_vertex_uv";
char const* const sFaceVertexAdjacency = "face_vertex_adjacent_edge";
char const* const sPointFaceAdjacency = "point_face_adjacency";
char const* const sPointFaceAdjacencyIndex = "point_face_adjacency_index";

char const* const sVoxelTileTree = "voxel_tile_tree";
char const* const sInstanceShape = "instance_shape";
char const* const sRenderSettings = "render_settings";
char const* const sMaterialSurface = "material_surface";
char const* const sMaterialDisplacement = "material_displacement";
char const* const sMaterialVolume = "material_volume";
char const* const sMaterialReferenceID = "material_reference_id";
char const* const sOperatorReferenceID = "operator_reference_id";
char const* const sOperators = "operators";
char const* const sDccName = "dcc_name";

char const* const sGenericDataGeoProp = "generic_data_geo_property";

char const* const sAcceleratorGeo = "geometry";
char const* const sAcceleratorGrid = "grid";
char const* const sAcceleratorComponent = "component";

char const* const sVoxelPosition = "voxel_position";
char const* const sVoxelVelocity = "voxel_velocity";
char const* const sVoxelFogDensity = "voxel_fog_density";
char const* const sVoxelMassDensity = "voxel_mass_density";
char const* const sVoxelSignedDistance = "voxel_signed_distance";
char const* const sVoxelDepth = "voxel_depth";
char const* const sVoxelDetailSize = "voxel_detail_size";
char const* const sVoxelAcceleration = "voxel_acceleration";
char const* const sVoxelTemperature = "voxel_temperature";
char const* const sVoxelIgnitionTemperature = "voxel_ignition_temperature";
char const* const sVoxelPointRadius = "voxel_point_radius";
char const* const sVoxelDegreeOfFreedom = "voxel_degree_of_freedom";
char const* const sVoxelVorticity = "voxel_vorticity";
char const* const sVoxelExpansionRate = "voxel_expansion_rate";
char const* const sVoxelFogDensitySignedDistance = "voxel_fog_density_signed_distance";
char const* const sVoxelFlameLevelSet = "voxel_flame_level_set";
char const* const sVoxelCombustionRate = "voxel_combustion_rate";
char const* const sVoxelFlameSpeed = "voxel_flame_speed";
char const* const sVoxelRefinement = "voxel_refinement";
char const* const sVoxelSignificance = "voxel_significance";
char const* const sVoxelSamplingError = "voxel_sampling_error";
char const* const sVoxelFuel = "voxel_fuel";
char const* const sVoxelFuelPropane = "voxel_fuel_propane";
char const* const sVoxelFuelEthane = "voxel_fuel_ethane";
char const* const sVoxelFuelButane = "voxel_fuel_butane";
char const* const sVoxelFuelMethane = "voxel_fuel_methane";
char const* const sVoxelFuelPropylene = "voxel_fuel_propylene";
char const* const sVoxelFuelPropyne = "voxel_fuel_propyne";
char const* const sVoxelFuelPropadiene = "voxel_fuel_propadiene";
char const* const sVoxelGasCarbonDioxide = "voxel_gas_carbon_dioxide";
char const* const sVoxelGasNitrogen = "voxel_gas_nitrogen";
char const* const sVoxelGasOxygen = "voxel_gas_oxygen";
char const* const sVoxelGasVapor = "voxel_gas_vapor";

} // namespace Veldrin::Geometry
