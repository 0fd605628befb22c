#pragma once
// KeptContent: what the three rewritten level files (lights.xml, nodegraph.xml, decals.xml)
// held that the editor did not take in, so that a save gives it back. The loaders fill it; the
// savers fold it into what they write; the editing operations keep the per-record lists in
// step with the facade's arrays. The facade owns one.
//
// Two kinds, each kept as XML text (XMLElement::GetText):
// - per section, a copy of the section without the records the editor holds: comments,
//   misspelt or foreign elements, records the loader left out (a decal of an unknown type, an
//   edge to a missing node, nodes past the limit). A save writes them after the records.
// - per record, beside the array of the records and at the same index: the record stripped of
//   the values read, holding its unknown attributes and children (empty when there are none).
//   A save folds them into the record it builds (XMLElement::AddKept).
#include <set>
#include <string>
#include <vector>

namespace Lumora
{
struct KeptContent
{
	std::string myPointLights;
	std::string mySpotLights;
	// The "node-graph" element, with its "nodes" and "edges" stripped of the records held.
	std::string myNodeGraph;
	std::string myDecals;

	std::vector<std::string> myPointLightParts;
	std::vector<std::string> mySpotLightParts;
	std::vector<std::string> myNodeParts;
	std::vector<std::string> myEdgeParts;
	std::vector<std::string> myDecalParts;

	// The path node IDs that kept nodes carry and kept edges name: new nodes never get one, or a
	// kept edge would join a node it never knew on the next load.
	std::set<int> myNodeIDs;

	// A record appended to an array of aCount records: it (and any record that came without
	// parts) has none.
	static void Added(std::vector<std::string>& someParts, int aCount);
	// Mirrors GrowingArray::RemoveCyclicAtIndex: the last record's parts move to anIndex.
	static void RemovedCyclic(std::vector<std::string>& someParts, int anIndex);
	// The parts of record anIndex, or none.
	static const std::string& PartsOf(const std::vector<std::string>& someParts, int anIndex);
};
} // namespace Lumora
