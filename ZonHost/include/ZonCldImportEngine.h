#pragma once
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "ZonCldBody.h"
#include "ZonGeoFactoryProtected.h"
#include "ZonHostExport.h"
#include "ZonICkeUnit.h"
#include "ZonMath.h"

class ZonICloudReadFile;

// Gives the display text of a statistics label ("Points", "Scans", ...). The
// texts are the caller's: the engine looks up no catalog.
using ZonCldStatLabeler = std::function<std::string(const std::string& key)>;

// The host's cloud import engine: walks any reader through the reader
// interfaces only, and builds the body's entities with the geometric factory.
//
// - The reader's type of digitization chooses the walk: 1 one cloud, 2 sets
//   of scans, 3 sets of grids (rows with validity), 4 polygons. A reader that
//   does not offer the interface of its type is taken as one cloud.
// - A non-empty box clips with the reader's own box queries (in the file's
//   coordinates); an empty box takes everything.
// - Coordinates are converted to millimetres with the reader's unit, or with
//   `unit` when the file carries none, then multiplied by `scale`.
// - Double precision is used when asked for and the reader has it.
// - Triangles are kept only when `createTriangles` is set; otherwise a mesh
//   gives its vertices alone.
// - Colours and the per-point arrays of a cloud are kept when they have one
//   entry per point: colours R, G, B bytes; attributes 1 and 2 one 32-bit
//   integer per point (alpha, symbol index); attribute 3 one std::string per
//   point (text). A reader that answers ZonICloudReadPointTextValues gives
//   its texts as a label and one integer per point instead, and the cloud
//   keeps them in that form.
// - Counts a reader gives through ZonICloudReadFileCounts (slices, ...) are
//   added to the statistics under their own labels.
//
// `statistics` receives one line per count of what was created, labelled
// by `labeler` (by the bare key when it is empty); the note on triangles left
// out is labelled the same way ("InvalidTriangles"). Errors raised by the reader
// pass through unchanged; memory exhaustion raises the host's memory error.
class ZON_HOST_API ZonCldImportEngine {
public:
    static void InsertFile(ZonCldBody& body, ZonGeoFactoryProtected& factory,
                           const std::shared_ptr<ZonICloudReadFile>& reader, bool doublePrecision,
                           const ZonICkeUnit_var& unit, const ZonMathBox& box, double scale,
                           std::vector<std::string>& messages, std::string& statistics, bool createTriangles,
                           const ZonCldStatLabeler& labeler = {});
};
