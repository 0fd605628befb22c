#pragma once
// GlProgram: compiling and linking an effect's GLSL, shared by the compiler
// (which validates every pass) and Fx::Effect (which keeps the programs).
//
//   Fx::DebugOutputPause pause;   // the driver's own error callbacks stay quiet
//   std::string log;
//   GLuint vertex = Fx::CompileStage(Fx::StageKind::Vertex, source, log);
//   GLuint program = Fx::LinkPass({vertex, 0, fragment}, pass.myInputs, log);
//   std::string lines = Fx::MapDriverLog(log, desc.myFiles, "data/x.fx(12)");
//
// Compile and link errors are collected from the info logs and reported by the
// caller with the effect's file names, so the GL debug output that would repeat
// them is paused meanwhile.

#include <epoxy/gl.h>
#include <span>
#include <string>
#include <vector>

#include "platform/fx/EffectDesc.h"

namespace Fx
{
// The shader object, or 0; the driver's log (warnings too) is appended to aLog.
GLuint CompileStage(StageKind aKind, const std::string& aSource, std::string& aLog);
// Links the stages (0 entries are skipped) with each vertex input bound to its location.
// Returns the program or 0; the driver's log is appended to aLog.
GLuint LinkPass(std::span<const GLuint> someShaders, std::span<const VertexInput> someInputs,
                std::string& aLog);

// Rewrites the driver's "source:line(column): message" lines as "file(line): message",
// naming files by the #line source numbers. Lines without a location get aFallback.
std::string MapDriverLog(const std::string& aLog, const std::vector<std::string>& someFiles,
                         const std::string& aFallback);

class DebugOutputPause
{
public:
	DebugOutputPause();
	~DebugOutputPause();
	DebugOutputPause(const DebugOutputPause&) = delete;
	DebugOutputPause& operator=(const DebugOutputPause&) = delete;

private:
	bool myWasEnabledFlag = false;
};
} // namespace Fx
