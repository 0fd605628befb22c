#include "platform/fx/CompiledFormat.h"

#include <cmath>
#include <cstring>
#include <set>

#include "platform/fx/Fnv1a.h"

namespace Fx
{
namespace
{
constexpr char ourMagic[4] = {'L', 'F', 'X', 'A'};
// Magic, version, source hash, body checksum.
constexpr size_t ourHeaderSize = 24;
constexpr uint32_t ourMaxStringLength = 16u << 20;
constexpr uint32_t ourMaxElementCount = 65536;

class Writer
{
public:
	explicit Writer(std::vector<uint8_t>& someBytes) : myBytes(someBytes) {}

	void U8(uint8_t aValue) { myBytes.push_back(aValue); }
	void U32(uint32_t aValue)
	{
		for (int shift = 0; shift < 32; shift += 8)
		{
			myBytes.push_back(static_cast<uint8_t>(aValue >> shift));
		}
	}
	void U64(uint64_t aValue)
	{
		U32(static_cast<uint32_t>(aValue));
		U32(static_cast<uint32_t>(aValue >> 32));
	}
	void I32(int aValue) { U32(static_cast<uint32_t>(aValue)); }
	void F32(float aValue)
	{
		uint32_t bits = 0;
		std::memcpy(&bits, &aValue, 4);
		U32(bits);
	}
	void Bool(bool aValue) { U8(aValue ? 1 : 0); }
	void String(const std::string& aText)
	{
		U32(static_cast<uint32_t>(aText.size()));
		myBytes.insert(myBytes.end(), aText.begin(), aText.end());
	}
	template <typename Enum> void Enum8(Enum aValue) { U8(static_cast<uint8_t>(aValue)); }

private:
	std::vector<uint8_t>& myBytes;
};

// Reads fields in order; the first failure sticks, names the field, and every
// later read returns zero without touching the bytes.
class Reader
{
public:
	Reader(std::span<const uint8_t> someBytes, std::string& anError) : myBytes(someBytes), myError(anError) {}

	bool Ok() const { return myError.empty(); }
	size_t Remaining() const { return myBytes.size() - myOffset; }
	bool Fail(const std::string& aMessage)
	{
		if (myError.empty())
		{
			myError = aMessage + " (at byte " + std::to_string(myOffset) + ")";
		}
		return false;
	}

	uint8_t U8(const char* aField) { return static_cast<uint8_t>(Bits(1, aField)); }
	uint32_t U32(const char* aField) { return static_cast<uint32_t>(Bits(4, aField)); }
	uint64_t U64(const char* aField) { return Bits(8, aField); }
	int I32(const char* aField) { return static_cast<int>(U32(aField)); }
	float F32(const char* aField)
	{
		const uint32_t bits = U32(aField);
		float value = 0.0f;
		std::memcpy(&value, &bits, 4);
		if (!std::isfinite(value))
		{
			Fail(std::string("non-finite ") + aField);
			return 0.0f;
		}
		return value;
	}
	bool Bool(const char* aField)
	{
		const uint8_t value = U8(aField);
		if (value > 1)
		{
			Fail(std::string("bad flag ") + aField);
		}
		return value == 1;
	}
	template <typename Enum> Enum Enum8(Enum aCount, const char* aField)
	{
		const uint8_t value = U8(aField);
		if (value >= static_cast<uint8_t>(aCount))
		{
			Fail(std::string("bad ") + aField + " " + std::to_string(value));
			return Enum{};
		}
		return static_cast<Enum>(value);
	}
	std::string String(const char* aField)
	{
		const uint32_t length = U32(aField);
		if (!Ok())
		{
			return {};
		}
		if (length > ourMaxStringLength || length > Remaining())
		{
			Fail(std::string("length ") + std::to_string(length) + " of " + aField + " runs past the end");
			return {};
		}
		std::string text(reinterpret_cast<const char*>(myBytes.data() + myOffset), length);
		myOffset += length;
		return text;
	}
	// A count of records each at least aMinimumSize bytes long: larger counts cannot fit.
	uint32_t Count(size_t aMinimumSize, const char* aField)
	{
		const uint32_t count = U32(aField);
		if (Ok() && count > Remaining() / aMinimumSize)
		{
			Fail(std::string("count ") + std::to_string(count) + " of " + aField + " runs past the end");
			return 0;
		}
		return count;
	}

private:
	uint64_t Bits(size_t aSize, const char* aField)
	{
		if (!Ok())
		{
			return 0;
		}
		if (Remaining() < aSize)
		{
			Fail(std::string("truncated in ") + aField);
			return 0;
		}
		uint64_t value = 0;
		for (size_t index = 0; index < aSize; ++index)
		{
			value |= uint64_t{myBytes[myOffset + index]} << (8 * index);
		}
		myOffset += aSize;
		return value;
	}

	std::span<const uint8_t> myBytes;
	size_t myOffset = 0;
	std::string& myError;
};

// Enum counts for the reader's range checks (the Gpu enums have no Count member).
constexpr Gpu::Blend ourBlendCount =
    static_cast<Gpu::Blend>(static_cast<int>(Gpu::Blend::InvBlendFactor) + 1);
constexpr Gpu::BlendOp ourBlendOpCount = static_cast<Gpu::BlendOp>(static_cast<int>(Gpu::BlendOp::Max) + 1);
constexpr Gpu::Comparison ourComparisonCount =
    static_cast<Gpu::Comparison>(static_cast<int>(Gpu::Comparison::Always) + 1);
constexpr Gpu::FillMode ourFillModeCount =
    static_cast<Gpu::FillMode>(static_cast<int>(Gpu::FillMode::Wireframe) + 1);
constexpr Gpu::CullMode ourCullModeCount =
    static_cast<Gpu::CullMode>(static_cast<int>(Gpu::CullMode::Back) + 1);
constexpr Gpu::Filter ourFilterCount =
    static_cast<Gpu::Filter>(static_cast<int>(Gpu::Filter::Anisotropic) + 1);
constexpr Gpu::TextureAddress ourAddressCount =
    static_cast<Gpu::TextureAddress>(static_cast<int>(Gpu::TextureAddress::Border) + 1);
constexpr StageKind ourStageKindCount = static_cast<StageKind>(static_cast<int>(StageKind::Fragment) + 1);

void WriteSampler(Writer& aWriter, const Gpu::SamplerDesc& aDesc)
{
	aWriter.Enum8(aDesc.myFilter);
	aWriter.Enum8(aDesc.myAddressU);
	aWriter.Enum8(aDesc.myAddressV);
	aWriter.Enum8(aDesc.myAddressW);
	aWriter.F32(aDesc.myMipLodBias);
	aWriter.F32(aDesc.myMaxAnisotropy);
	aWriter.Bool(aDesc.myComparisonFlag);
	aWriter.Enum8(aDesc.myComparison);
	for (const float channel : aDesc.myBorderColor)
	{
		aWriter.F32(channel);
	}
	aWriter.F32(aDesc.myMinLod);
	aWriter.F32(aDesc.myMaxLod);
}

Gpu::SamplerDesc ReadSampler(Reader& aReader)
{
	Gpu::SamplerDesc desc;
	desc.myFilter = aReader.Enum8(ourFilterCount, "sampler filter");
	desc.myAddressU = aReader.Enum8(ourAddressCount, "sampler address");
	desc.myAddressV = aReader.Enum8(ourAddressCount, "sampler address");
	desc.myAddressW = aReader.Enum8(ourAddressCount, "sampler address");
	desc.myMipLodBias = aReader.F32("sampler LOD bias");
	desc.myMaxAnisotropy = aReader.F32("sampler anisotropy");
	desc.myComparisonFlag = aReader.Bool("sampler comparison flag");
	desc.myComparison = aReader.Enum8(ourComparisonCount, "sampler comparison");
	for (float& channel : desc.myBorderColor)
	{
		channel = aReader.F32("sampler border colour");
	}
	desc.myMinLod = aReader.F32("sampler min LOD");
	desc.myMaxLod = aReader.F32("sampler max LOD");
	if (aReader.Ok() &&
	    (desc.myMaxAnisotropy < 1.0f || desc.myMaxAnisotropy > 16.0f || desc.myMinLod > desc.myMaxLod))
	{
		aReader.Fail("bad sampler anisotropy or LOD range");
	}
	return desc;
}

void WritePass(Writer& aWriter, const PassDesc& aPass)
{
	aWriter.String(aPass.myName);
	aWriter.I32(aPass.myVertexStage);
	aWriter.I32(aPass.myGeometryStage);
	aWriter.I32(aPass.myFragmentStage);
	aWriter.U8(aPass.myStateGroups);
	const Gpu::BlendState& blend = aPass.myBlend;
	aWriter.Bool(blend.myEnableFlag);
	for (const Gpu::BlendEquation* equation : {&blend.myColor, &blend.myAlpha})
	{
		aWriter.Enum8(equation->mySource);
		aWriter.Enum8(equation->myDestination);
		aWriter.Enum8(equation->myOp);
	}
	aWriter.U8(blend.myWriteMask);
	aWriter.Bool(aPass.myDepthStencil.myDepthEnableFlag);
	aWriter.Bool(aPass.myDepthStencil.myDepthWriteFlag);
	aWriter.Enum8(aPass.myDepthStencil.myDepthFunc);
	const Gpu::RasterizerState& rasterizer = aPass.myRasterizer;
	aWriter.Enum8(rasterizer.myFillMode);
	aWriter.Enum8(rasterizer.myCullMode);
	aWriter.Bool(rasterizer.myFrontCounterClockwiseFlag);
	aWriter.Bool(rasterizer.myDepthClipFlag);
	aWriter.Bool(rasterizer.myScissorFlag);
	aWriter.U32(static_cast<uint32_t>(aPass.myInputs.size()));
	for (const VertexInput& input : aPass.myInputs)
	{
		aWriter.String(input.myVariableName);
		aWriter.String(input.mySemanticName);
		aWriter.U32(input.mySemanticIndex);
		aWriter.Enum8(input.myType);
		aWriter.I32(input.myLocation);
	}
}

bool StageOk(const EffectDesc& aDesc, int anIndex, StageKind aKind, bool anOptionalFlag)
{
	if (anIndex == -1)
	{
		return anOptionalFlag;
	}
	return anIndex >= 0 && anIndex < static_cast<int>(aDesc.myStages.size()) &&
	       aDesc.myStages[static_cast<size_t>(anIndex)].myKind == aKind;
}

PassDesc ReadPass(Reader& aReader, const EffectDesc& aDesc)
{
	PassDesc pass;
	pass.myName = aReader.String("pass name");
	pass.myVertexStage = aReader.I32("vertex stage");
	pass.myGeometryStage = aReader.I32("geometry stage");
	pass.myFragmentStage = aReader.I32("fragment stage");
	if (aReader.Ok() &&
	    (pass.myName.empty() || !StageOk(aDesc, pass.myVertexStage, StageKind::Vertex, false) ||
	     !StageOk(aDesc, pass.myGeometryStage, StageKind::Geometry, true) ||
	     !StageOk(aDesc, pass.myFragmentStage, StageKind::Fragment, false)))
	{
		aReader.Fail("bad stage reference or name of pass '" + pass.myName + "'");
	}
	pass.myStateGroups = aReader.U8("state groups");
	if (pass.myStateGroups > StateGroup::All)
	{
		aReader.Fail("bad state groups");
	}
	Gpu::BlendState& blend = pass.myBlend;
	blend.myEnableFlag = aReader.Bool("blend enable");
	for (Gpu::BlendEquation* equation : {&blend.myColor, &blend.myAlpha})
	{
		equation->mySource = aReader.Enum8(ourBlendCount, "blend factor");
		equation->myDestination = aReader.Enum8(ourBlendCount, "blend factor");
		equation->myOp = aReader.Enum8(ourBlendOpCount, "blend operation");
	}
	blend.myWriteMask = aReader.U8("write mask");
	if (blend.myWriteMask > Gpu::ColorWrite::All)
	{
		aReader.Fail("bad write mask");
	}
	pass.myDepthStencil.myDepthEnableFlag = aReader.Bool("depth enable");
	pass.myDepthStencil.myDepthWriteFlag = aReader.Bool("depth write");
	pass.myDepthStencil.myDepthFunc = aReader.Enum8(ourComparisonCount, "depth function");
	Gpu::RasterizerState& rasterizer = pass.myRasterizer;
	rasterizer.myFillMode = aReader.Enum8(ourFillModeCount, "fill mode");
	rasterizer.myCullMode = aReader.Enum8(ourCullModeCount, "cull mode");
	rasterizer.myFrontCounterClockwiseFlag = aReader.Bool("front counter-clockwise");
	rasterizer.myDepthClipFlag = aReader.Bool("depth clip");
	rasterizer.myScissorFlag = aReader.Bool("scissor");
	// Two name lengths, index, type and location: at least 17 bytes each.
	const uint32_t inputCount = aReader.Count(17, "vertex inputs");
	std::set<std::pair<std::string, uint32_t>> semantics;
	for (uint32_t index = 0; index < inputCount && aReader.Ok(); ++index)
	{
		VertexInput input;
		input.myVariableName = aReader.String("vertex input name");
		input.mySemanticName = aReader.String("semantic name");
		input.mySemanticIndex = aReader.U32("semantic index");
		input.myType = aReader.Enum8(VariableType::Count, "vertex input type");
		input.myLocation = aReader.I32("vertex input location");
		if (aReader.Ok() &&
		    (input.mySemanticName.empty() || input.myVariableName.empty() ||
		     !IsVertexInputType(input.myType) || input.myLocation != static_cast<int>(index) ||
		     !semantics.insert({input.mySemanticName, input.mySemanticIndex}).second))
		{
			aReader.Fail("bad vertex input '" + input.mySemanticName + "'");
		}
		pass.myInputs.push_back(std::move(input));
	}
	return pass;
}
} // namespace

void WriteCompiled(const EffectDesc& aDesc, std::vector<uint8_t>& someBytesOut)
{
	someBytesOut.clear();
	Writer writer(someBytesOut);
	for (const char letter : ourMagic)
	{
		writer.U8(static_cast<uint8_t>(letter));
	}
	writer.U32(ourCompiledFormatVersion);
	writer.U64(aDesc.mySourceHash);
	writer.U64(0); // the body checksum, filled in below

	writer.U32(static_cast<uint32_t>(aDesc.myFiles.size()));
	for (const std::string& file : aDesc.myFiles)
	{
		writer.String(file);
	}
	writer.U32(static_cast<uint32_t>(aDesc.myStages.size()));
	for (const StageDesc& stage : aDesc.myStages)
	{
		writer.Enum8(stage.myKind);
		writer.String(stage.myName);
		writer.String(stage.mySource);
	}
	writer.U32(static_cast<uint32_t>(aDesc.myVariables.size()));
	for (const VariableDesc& variable : aDesc.myVariables)
	{
		writer.String(variable.myName);
		writer.Enum8(variable.myType);
		writer.U32(static_cast<uint32_t>(variable.myElementCount));
		writer.I32(variable.myUnit);
		if (IsSampler(variable.myType))
		{
			WriteSampler(writer, variable.mySampler);
		}
	}
	writer.U32(static_cast<uint32_t>(aDesc.myTechniques.size()));
	for (const TechniqueDesc& technique : aDesc.myTechniques)
	{
		writer.String(technique.myName);
		writer.U32(static_cast<uint32_t>(technique.myPasses.size()));
		for (const PassDesc& pass : technique.myPasses)
		{
			WritePass(writer, pass);
		}
	}
	ResealCompiled(someBytesOut);
}

void ResealCompiled(std::vector<uint8_t>& someBytes)
{
	if (someBytes.size() < ourHeaderSize)
	{
		return;
	}
	const uint64_t checksum = Fnv1a(someBytes.data() + ourHeaderSize, someBytes.size() - ourHeaderSize);
	for (int index = 0; index < 8; ++index)
	{
		someBytes[16 + static_cast<size_t>(index)] = static_cast<uint8_t>(checksum >> (8 * index));
	}
}

bool ReadCompiledSourceHash(std::span<const uint8_t> someBytes, uint64_t& aHashOut, std::string& anError)
{
	anError.clear();
	Reader reader(someBytes, anError);
	uint8_t magic[4] = {};
	for (uint8_t& letter : magic)
	{
		letter = reader.U8("magic");
	}
	if (reader.Ok() && std::memcmp(magic, ourMagic, 4) != 0)
	{
		return reader.Fail("not a compiled effect (no LFXA magic)");
	}
	const uint32_t version = reader.U32("format version");
	if (reader.Ok() && version != ourCompiledFormatVersion)
	{
		return reader.Fail("format version " + std::to_string(version) + ", this build reads version " +
		                   std::to_string(ourCompiledFormatVersion));
	}
	aHashOut = reader.U64("source hash");
	return reader.Ok();
}

bool ReadCompiled(std::span<const uint8_t> someBytes, EffectDesc& aDescOut, std::string& anError)
{
	aDescOut = EffectDesc{};
	uint64_t sourceHash = 0;
	if (!ReadCompiledSourceHash(someBytes, sourceHash, anError))
	{
		return false;
	}
	Reader reader(someBytes, anError);
	reader.U32("magic");
	reader.U32("format version");
	reader.U64("source hash");
	const uint64_t checksum = reader.U64("checksum");
	if (reader.Ok() && checksum != Fnv1a(someBytes.data() + ourHeaderSize, someBytes.size() - ourHeaderSize))
	{
		return reader.Fail("checksum mismatch: the file is damaged");
	}
	EffectDesc desc;
	desc.mySourceHash = sourceHash;

	const uint32_t fileCount = reader.Count(4, "files");
	for (uint32_t index = 0; index < fileCount && reader.Ok(); ++index)
	{
		desc.myFiles.push_back(reader.String("file name"));
	}
	if (reader.Ok() && desc.myFiles.empty())
	{
		reader.Fail("no source file named");
	}
	const uint32_t stageCount = reader.Count(9, "stages");
	std::set<std::string> names;
	for (uint32_t index = 0; index < stageCount && reader.Ok(); ++index)
	{
		StageDesc stage;
		stage.myKind = reader.Enum8(ourStageKindCount, "stage kind");
		stage.myName = reader.String("stage name");
		stage.mySource = reader.String("stage source");
		if (reader.Ok() &&
		    (stage.myName.empty() || stage.mySource.empty() || !names.insert(stage.myName).second))
		{
			reader.Fail("bad stage '" + stage.myName + "'");
		}
		desc.myStages.push_back(std::move(stage));
	}
	const uint32_t variableCount = reader.Count(13, "variables");
	names.clear();
	int nextUnit = 0;
	for (uint32_t index = 0; index < variableCount && reader.Ok(); ++index)
	{
		VariableDesc variable;
		variable.myName = reader.String("variable name");
		variable.myType = reader.Enum8(VariableType::Count, "variable type");
		const uint32_t elementCount = reader.U32("element count");
		variable.myUnit = reader.I32("texture unit");
		if (reader.Ok() && IsSampler(variable.myType))
		{
			variable.mySampler = ReadSampler(reader);
		}
		if (!reader.Ok())
		{
			break;
		}
		variable.myElementCount = static_cast<int>(elementCount);
		// Samplers take consecutive units in declaration order; everything else has none.
		const bool unitOkFlag =
		    IsSampler(variable.myType) ? variable.myUnit == nextUnit : variable.myUnit == -1;
		if (variable.myName.empty() || elementCount > ourMaxElementCount || !unitOkFlag ||
		    !names.insert(variable.myName).second)
		{
			reader.Fail("bad variable '" + variable.myName + "'");
			break;
		}
		if (IsSampler(variable.myType))
		{
			nextUnit += std::max(1, variable.myElementCount);
			if (nextUnit > ourMaxTextureUnits)
			{
				reader.Fail("samplers need more than " + std::to_string(ourMaxTextureUnits) +
				            " texture units");
			}
		}
		desc.myVariables.push_back(std::move(variable));
	}
	const uint32_t techniqueCount = reader.Count(8, "techniques");
	names.clear();
	for (uint32_t index = 0; index < techniqueCount && reader.Ok(); ++index)
	{
		TechniqueDesc technique;
		technique.myName = reader.String("technique name");
		// Name length, three stage indices, groups and the states: at least 37 bytes a pass.
		const uint32_t passCount = reader.Count(37, "passes");
		if (reader.Ok() &&
		    (technique.myName.empty() || passCount == 0 || !names.insert(technique.myName).second))
		{
			reader.Fail("bad technique '" + technique.myName + "'");
		}
		std::set<std::string> passNames;
		for (uint32_t passIndex = 0; passIndex < passCount && reader.Ok(); ++passIndex)
		{
			technique.myPasses.push_back(ReadPass(reader, desc));
			if (reader.Ok() && !passNames.insert(technique.myPasses.back().myName).second)
			{
				reader.Fail("two passes named '" + technique.myPasses.back().myName + "'");
			}
		}
		desc.myTechniques.push_back(std::move(technique));
	}
	if (reader.Ok() && reader.Remaining() != 0)
	{
		reader.Fail(std::to_string(reader.Remaining()) + " bytes after the last technique");
	}
	if (!reader.Ok())
	{
		return false;
	}
	aDescOut = std::move(desc);
	return true;
}
} // namespace Fx
