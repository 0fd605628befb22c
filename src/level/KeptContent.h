#pragma once
// KeptContent: what the sections of the three rewritten level files (lights.xml,
// nodegraph.xml, decals.xml) held beside the records the editor took in, so that a save gives
// it back. The loaders fill it, the savers write it after the records; the facade owns one.
//
// Each section is kept as XML text (XMLElement::GetText) of the section without the records
// taken: comments, misspelt or foreign elements, records the loader left out (a decal of an
// unknown type, an edge the graph cannot hold, nodes past the limit). A record the editor
// took is written from the editor's data alone: what else it held (a hand-written attribute,
// an unknown child) is not kept.
#include <set>
#include <string>

namespace Lumora
{
struct KeptContent
{
	std::string myPointLights;
	std::string mySpotLights;
	// "nodes" and "edges" of "node-graph", and the graph's other children (kept as the
	// "node-graph" element without its first "nodes" and "edges"). Only the children go back:
	// the saver writes "nodes" and "edges" anew, with their counts.
	std::string myNodes;
	std::string myEdges;
	std::string myNodeGraph;
	std::string myDecals;

	// The path node IDs that kept nodes carry and kept edges name: new nodes never get one, or a
	// kept edge would join a node it never knew on the next load.
	std::set<int> myNodeIDs;
};
} // namespace Lumora
