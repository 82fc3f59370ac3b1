#pragma once

/// Every installed header of both libraries, for programs that want all of it. Headers of the libraries themselves name
/// what they use.

#include <nexil/Any.h>
#include <nexil/Array.h>
#include <nexil/DefaultClass.h>
#include <nexil/Export.h>
#include <nexil/JobCancel.h>
#include <nexil/Ptr.h>
#include <nexil/RuntimeMessage.h>
#include <nexil/SeededHash.h>
#include <nexil/SerializationData.h>
#include <nexil/Stream.h>
#include <nexil/String.h>
#include <nexil/TypeId.h>
#include <veldrin/algorithms/ComponentConversion.h>
#include <veldrin/algorithms/StrandMeasures.h>
#include <veldrin/geometry/DataInterpolationMode.h>
#include <veldrin/geometry/DebugDump.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/geometry/FaceEdge.h>
#include <veldrin/geometry/GeoLocation.h>
#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/GeoPropertyCreation.h>
#include <veldrin/geometry/GraphTransforms.h>
#include <veldrin/geometry/Names.h>
#include <veldrin/geometry/Population.h>
#include <veldrin/geometry/Prototypes.h>
#include <veldrin/io/InputMemoryBuf.h>
#include <veldrin/io/ObjectStream.h>
#include <veldrin/io/StreamInspection.h>
#include <veldrin/io/StreamKeys.h>
#include <veldrin/io/StreamOptions.h>
#include <veldrin/math/BBox.h>
#include <veldrin/math/FCurve.h>
#include <veldrin/math/Matrix.h>
#include <veldrin/math/Quaternion.h>
#include <veldrin/math/Vector.h>
#include <veldrin/object/Object.h>
#include <veldrin/object/Properties.h>
#include <veldrin/object/PropertyTable.h>
#include <vld/Cancellation.h>
#include <vld/ChannelParser.h>
