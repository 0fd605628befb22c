#pragma once
// NodeStates: where a path node stands in a path search (open and closed lists of an
// A*-style search). The editor keeps the field on every node but never searches.

namespace AI
{
enum NodeStates
{
	NODE_STATE_UNVISITED = 0,
	NODE_STATE_OPEN = 1,
	NODE_STATE_CLOSED = 2,
};
} // namespace AI
