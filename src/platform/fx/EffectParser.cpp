#include "platform/fx/EffectParser.h"

#include <algorithm>
#include <cctype>
#include <cstdlib>
#include <map>
#include <set>

#include "platform/fx/CompiledFormat.h"

namespace Fx
{
namespace
{
enum class TokenKind
{
	Identifier,
	Number,
	Punctuation,
};

struct Token
{
	TokenKind myKind = TokenKind::Punctuation;
	size_t myOffset = 0;
	std::string myText;
};

// A stage block, a sampler block or a technique: the keyword's token and the
// tokens between its braces.
struct Block
{
	std::string myKeyword;
	std::string myName;
	size_t myKeywordToken = 0;
	size_t myFirstToken = 0; // after '{'
	size_t myEndToken = 0;   // the closing '}'
};

struct StageReference
{
	std::string myName;
	size_t myOffset = 0;
};

struct PendingPass
{
	PassDesc myDesc;
	size_t myOffset = 0;
	StageReference myStages[3];
};

// Upper case without underscores, so "SRC_ALPHA", "SrcAlpha" and "srcalpha" all match.
std::string Normalized(const std::string& aText)
{
	std::string result;
	for (const char letter : aText)
	{
		if (letter != '_')
		{
			result += static_cast<char>(std::toupper(static_cast<unsigned char>(letter)));
		}
	}
	return result;
}

template <typename Value> struct Named
{
	const char* myName;
	Value myValue;
};

constexpr Named<Gpu::Blend> ourBlends[] = {
    {"ZERO", Gpu::Blend::Zero},
    {"ONE", Gpu::Blend::One},
    {"SRCCOLOR", Gpu::Blend::SrcColor},
    {"INVSRCCOLOR", Gpu::Blend::InvSrcColor},
    {"SRCALPHA", Gpu::Blend::SrcAlpha},
    {"INVSRCALPHA", Gpu::Blend::InvSrcAlpha},
    {"DESTALPHA", Gpu::Blend::DestAlpha},
    {"INVDESTALPHA", Gpu::Blend::InvDestAlpha},
    {"DESTCOLOR", Gpu::Blend::DestColor},
    {"INVDESTCOLOR", Gpu::Blend::InvDestColor},
    {"SRCALPHASAT", Gpu::Blend::SrcAlphaSat},
    {"BLENDFACTOR", Gpu::Blend::BlendFactor},
    {"INVBLENDFACTOR", Gpu::Blend::InvBlendFactor},
};
constexpr Named<Gpu::BlendOp> ourBlendOps[] = {
    {"ADD", Gpu::BlendOp::Add},
    {"SUBTRACT", Gpu::BlendOp::Subtract},
    {"REVSUBTRACT", Gpu::BlendOp::RevSubtract},
    {"MIN", Gpu::BlendOp::Min},
    {"MAX", Gpu::BlendOp::Max},
};
constexpr Named<Gpu::Comparison> ourComparisons[] = {
    {"NEVER", Gpu::Comparison::Never},
    {"LESS", Gpu::Comparison::Less},
    {"EQUAL", Gpu::Comparison::Equal},
    {"LESSEQUAL", Gpu::Comparison::LessEqual},
    {"GREATER", Gpu::Comparison::Greater},
    {"NOTEQUAL", Gpu::Comparison::NotEqual},
    {"GREATEREQUAL", Gpu::Comparison::GreaterEqual},
    {"ALWAYS", Gpu::Comparison::Always},
};
constexpr Named<Gpu::TextureAddress> ourAddresses[] = {
    {"WRAP", Gpu::TextureAddress::Wrap},
    {"CLAMP", Gpu::TextureAddress::Clamp},
    {"MIRROR", Gpu::TextureAddress::Mirror},
    {"BORDER", Gpu::TextureAddress::Border},
};
constexpr Named<Gpu::FillMode> ourFillModes[] = {{"SOLID", Gpu::FillMode::Solid},
                                                 {"WIREFRAME", Gpu::FillMode::Wireframe}};
constexpr Named<Gpu::CullMode> ourCullModes[] = {
    {"NONE", Gpu::CullMode::None}, {"FRONT", Gpu::CullMode::Front}, {"BACK", Gpu::CullMode::Back}};
constexpr Named<bool> ourDepthWriteMasks[] = {{"ALL", true}, {"ZERO", false}};
constexpr Named<bool> ourBools[] = {{"TRUE", true}, {"FALSE", false}, {"1", true}, {"0", false}};

// Direct3D's filter names that Gpu::SamplerState can realise.
struct FilterName
{
	const char* myName;
	Gpu::Filter myFilter;
	bool myComparisonFlag;
};
constexpr FilterName ourFilters[] = {
    {"MINMAGMIPPOINT", Gpu::Filter::Point, false},
    {"MINMAGMIPLINEAR", Gpu::Filter::Linear, false},
    {"ANISOTROPIC", Gpu::Filter::Anisotropic, false},
    {"COMPARISONMINMAGMIPPOINT", Gpu::Filter::Point, true},
    {"COMPARISONMINMAGMIPLINEAR", Gpu::Filter::Linear, true},
    {"COMPARISONANISOTROPIC", Gpu::Filter::Anisotropic, true},
};

template <typename Value, size_t Size> std::string Choices(const Named<Value> (&someNames)[Size])
{
	std::string text;
	for (const Named<Value>& name : someNames)
	{
		text += (text.empty() ? "" : ", ") + std::string(name.myName);
	}
	return text;
}

bool IsIdentifierStart(char aLetter)
{
	return std::isalpha(static_cast<unsigned char>(aLetter)) || aLetter == '_';
}

bool IsIdentifierPart(char aLetter)
{
	return std::isalnum(static_cast<unsigned char>(aLetter)) || aLetter == '_';
}

class Parser
{
public:
	Parser(const EffectSource& aSource, std::string& someMessages)
	    : mySource(aSource), myText(aSource.GetText()), myMessages(someMessages)
	{
	}

	bool Run(EffectDesc& aDescOut);

private:
	void Error(size_t anOffset, const std::string& aMessage)
	{
		myMessages += mySource.GetLocation(anOffset) + ": error: " + aMessage + "\n";
		myOkFlag = false;
	}
	void Tokenize();
	const Token& At(size_t anIndex) const { return anIndex < myTokens.size() ? myTokens[anIndex] : myEnd; }
	bool Is(size_t anIndex, const char* aText) const { return At(anIndex).myText == aText; }
	size_t MatchingBrace(size_t anOpenToken) const;

	void ParseDeclarations(size_t aFirst, size_t anEnd, StageDesc* aStage);
	void ParseStatement(size_t aFirst, size_t anEnd, StageDesc* aStage);
	void ParseUniform(size_t aFirst, size_t anEnd);
	void ParseVertexInput(size_t aFirst, size_t anEnd, StageDesc& aStage);
	void AddVariable(const std::string& aName, VariableType aType, int anElementCount, size_t anOffset);

	void ParseSampler(const Block& aBlock);
	void ParseTechnique(const Block& aBlock);
	void ParsePass(const std::string& aTechnique, size_t aFirst, size_t anEnd, PendingPass& aPass);
	// Reads "Name = value tokens ;" pairs; calls aHandler(name token, first value token, end token).
	template <typename Handler> void ParseAssignments(size_t aFirst, size_t anEnd, Handler aHandler);

	template <typename Value, size_t Size>
	bool Lookup(const Named<Value> (&someNames)[Size], size_t aValueToken, const std::string& aState,
	            Value& aValueOut);
	bool Number(size_t aFirst, size_t anEnd, const std::string& aState, double& aValueOut);

	void AppendRange(std::string& aGlsl, size_t aBegin, size_t anEnd) const;
	void ResolvePasses(EffectDesc& aDesc);

	const EffectSource& mySource;
	const std::string& myText;
	std::string& myMessages;
	bool myOkFlag = true;
	std::vector<Token> myTokens;
	Token myEnd;

	std::vector<std::pair<size_t, size_t>> mySharedRanges; // character ranges of shared GLSL
	std::vector<std::pair<size_t, size_t>> mySharedTokens;
	std::vector<StageDesc> myStages;
	std::vector<size_t> myStageOffsets;
	struct ParsedVariable
	{
		VariableDesc myDesc;
		size_t myOffset = 0;
		bool mySamplerDeclaredFlag = false;
	};
	std::vector<ParsedVariable> myVariables;
	struct SamplerBlock
	{
		std::string myName;
		size_t myOffset = 0;
		Gpu::SamplerDesc myDesc;
	};
	std::vector<SamplerBlock> mySamplers;
	std::vector<std::pair<TechniqueDesc, std::vector<PendingPass>>> myTechniques;
	std::vector<size_t> myTechniqueOffsets;
};

void Parser::Tokenize()
{
	bool lineStartFlag = true;
	size_t at = 0;
	while (at < myText.size())
	{
		const char letter = myText[at];
		if (letter == '\n')
		{
			lineStartFlag = true;
			++at;
		}
		else if (std::isspace(static_cast<unsigned char>(letter)))
		{
			++at;
		}
		else if (myText.compare(at, 2, "//") == 0)
		{
			at = std::min(myText.find('\n', at), myText.size());
		}
		else if (myText.compare(at, 2, "/*") == 0)
		{
			const size_t close = myText.find("*/", at + 2);
			if (close == std::string::npos)
			{
				Error(at, "comment not closed");
				return;
			}
			at = close + 2;
		}
		else if (letter == '#' && lineStartFlag)
		{
			// Directives go to GLSL untouched; lines continued with a backslash belong to them.
			size_t end = at;
			do
			{
				end = std::min(myText.find('\n', end + 1), myText.size());
			} while (end < myText.size() && end > 0 && myText[end - 1] == '\\');
			const std::string directive = myText.substr(at, end - at);
			if (directive.find("version") != std::string::npos &&
			    directive.find_first_not_of(" \t", 1) == directive.find("version"))
			{
				Error(at, "remove the #version line: the effect compiler writes '#version 450 core' itself");
			}
			at = end;
		}
		else
		{
			lineStartFlag = false;
			Token token;
			token.myOffset = at;
			size_t end = at + 1;
			if (IsIdentifierStart(letter))
			{
				token.myKind = TokenKind::Identifier;
				while (end < myText.size() && IsIdentifierPart(myText[end]))
				{
					++end;
				}
			}
			else if (std::isdigit(static_cast<unsigned char>(letter)) ||
			         (letter == '.' && at + 1 < myText.size() &&
			          std::isdigit(static_cast<unsigned char>(myText[at + 1]))))
			{
				token.myKind = TokenKind::Number;
				while (end < myText.size() && (IsIdentifierPart(myText[end]) || myText[end] == '.' ||
				                               ((myText[end] == '-' || myText[end] == '+') &&
				                                (myText[end - 1] == 'e' || myText[end - 1] == 'E'))))
				{
					++end;
				}
			}
			token.myText = myText.substr(at, end - at);
			myTokens.push_back(std::move(token));
			at = end;
		}
	}
	myEnd.myOffset = myText.empty() ? 0 : myText.size() - 1;
}

size_t Parser::MatchingBrace(size_t anOpenToken) const
{
	int depth = 0;
	for (size_t index = anOpenToken; index < myTokens.size(); ++index)
	{
		if (myTokens[index].myText == "{")
		{
			++depth;
		}
		else if (myTokens[index].myText == "}" && --depth == 0)
		{
			return index;
		}
	}
	return myTokens.size();
}

bool Parser::Run(EffectDesc& aDescOut)
{
	Tokenize();
	if (!myOkFlag)
	{
		return false;
	}
	// Top level: the effect's own blocks at brace depth 0; everything else is shared GLSL.
	std::vector<Block> blocks;
	int depth = 0;
	size_t sharedStart = 0;
	size_t sharedToken = 0;
	static const std::set<std::string> keywords = {"vertex", "geometry", "fragment", "sampler", "technique"};
	for (size_t index = 0; index < myTokens.size(); ++index)
	{
		const Token& token = myTokens[index];
		if (depth == 0 && keywords.count(token.myText) && At(index + 1).myKind == TokenKind::Identifier &&
		    Is(index + 2, "{"))
		{
			Block block{token.myText, At(index + 1).myText, index, index + 3, MatchingBrace(index + 2)};
			if (block.myEndToken >= myTokens.size())
			{
				Error(token.myOffset, token.myText + " '" + block.myName + "' has no closing brace");
				return false;
			}
			mySharedRanges.push_back({sharedStart, token.myOffset});
			mySharedTokens.push_back({sharedToken, index});
			sharedStart = myTokens[block.myEndToken].myOffset + 1;
			sharedToken = block.myEndToken + 1;
			index = block.myEndToken;
			blocks.push_back(block);
			continue;
		}
		depth += token.myText == "{" ? 1 : token.myText == "}" ? -1 : 0;
		if (depth < 0)
		{
			Error(token.myOffset, "'}' without a matching '{'");
			return false;
		}
	}
	mySharedRanges.push_back({sharedStart, myText.size()});
	mySharedTokens.push_back({sharedToken, myTokens.size()});

	for (const auto& [first, end] : mySharedTokens)
	{
		ParseDeclarations(first, end, nullptr);
	}
	std::map<std::string, size_t> stageNames;
	for (const Block& block : blocks)
	{
		const size_t offset = myTokens[block.myKeywordToken].myOffset;
		if (block.myKeyword == "sampler")
		{
			ParseSampler(block);
			continue;
		}
		if (block.myKeyword == "technique")
		{
			ParseTechnique(block);
			continue;
		}
		StageDesc stage;
		stage.myKind = block.myKeyword == "vertex"     ? StageKind::Vertex
		               : block.myKeyword == "geometry" ? StageKind::Geometry
		                                               : StageKind::Fragment;
		stage.myName = block.myName;
		if (!stageNames.insert({block.myName, offset}).second)
		{
			Error(offset, "a stage named '" + block.myName + "' is already declared at " +
			                  mySource.GetLocation(stageNames[block.myName]));
			continue;
		}
		ParseDeclarations(block.myFirstToken, block.myEndToken, &stage);
		stage.mySource = "#version 450 core\n";
		for (const auto& [begin, end] : mySharedRanges)
		{
			AppendRange(stage.mySource, begin, end);
		}
		AppendRange(stage.mySource, myTokens[block.myFirstToken - 1].myOffset + 1,
		            myTokens[block.myEndToken].myOffset);
		myStages.push_back(std::move(stage));
		myStageOffsets.push_back(offset);
	}

	EffectDesc desc;
	desc.mySourceHash = mySource.GetHash();
	desc.myFiles = mySource.GetFiles();
	desc.myStages = myStages;

	// Sampler states attach to the sampler variables they name.
	for (const SamplerBlock& sampler : mySamplers)
	{
		auto found =
		    std::find_if(myVariables.begin(), myVariables.end(), [&](const ParsedVariable& aVariable) {
			    return aVariable.myDesc.myName == sampler.myName;
		    });
		if (found == myVariables.end() || !IsSampler(found->myDesc.myType))
		{
			Error(sampler.myOffset, "sampler state '" + sampler.myName + "' names no sampler uniform");
			continue;
		}
		if (found->mySamplerDeclaredFlag)
		{
			Error(sampler.myOffset, "sampler state '" + sampler.myName + "' is declared twice");
			continue;
		}
		found->mySamplerDeclaredFlag = true;
		found->myDesc.mySampler = sampler.myDesc;
	}
	std::stable_sort(myVariables.begin(), myVariables.end(),
	                 [](const ParsedVariable& aLeft, const ParsedVariable& aRight) {
		                 return aLeft.myOffset < aRight.myOffset;
	                 });
	int nextUnit = 0;
	for (ParsedVariable& variable : myVariables)
	{
		if (IsSampler(variable.myDesc.myType))
		{
			variable.myDesc.myUnit = nextUnit;
			nextUnit += std::max(1, variable.myDesc.myElementCount);
			if (nextUnit > ourMaxTextureUnits)
			{
				Error(variable.myOffset, "sampler '" + variable.myDesc.myName +
				                             "' needs a texture unit beyond the " +
				                             std::to_string(ourMaxTextureUnits) + " an effect may use");
			}
		}
		desc.myVariables.push_back(variable.myDesc);
	}
	ResolvePasses(desc);
	if (desc.myTechniques.empty() && myOkFlag)
	{
		Error(0, "the effect declares no technique");
	}
	if (myOkFlag)
	{
		aDescOut = std::move(desc);
	}
	return myOkFlag;
}

void Parser::ParseDeclarations(size_t aFirst, size_t anEnd, StageDesc* aStage)
{
	// Statements at brace and parenthesis depth 0: declarations end with ';',
	// function and struct bodies with the '}' that closes them.
	int braces = 0;
	int parentheses = 0;
	size_t start = aFirst;
	for (size_t index = aFirst; index < anEnd; ++index)
	{
		const std::string& text = myTokens[index].myText;
		braces += text == "{" ? 1 : text == "}" ? -1 : 0;
		parentheses += text == "(" ? 1 : text == ")" ? -1 : 0;
		if (braces == 0 && parentheses == 0 && (text == ";" || text == "}"))
		{
			ParseStatement(start, index + 1, aStage);
			start = index + 1;
		}
	}
	if (start < anEnd)
	{
		ParseStatement(start, anEnd, aStage);
	}
}

void Parser::ParseStatement(size_t aFirst, size_t anEnd, StageDesc* aStage)
{
	static const std::set<std::string> qualifiers = {"flat",      "smooth",  "noperspective", "centroid",
	                                                 "invariant", "precise", "highp",         "mediump",
	                                                 "lowp",      "const"};
	size_t index = aFirst;
	bool layoutFlag = false;
	while (index < anEnd)
	{
		if (Is(index, "layout") && Is(index + 1, "("))
		{
			layoutFlag = true;
			while (index < anEnd && !Is(index, ")"))
			{
				++index;
			}
			++index;
		}
		else if (qualifiers.count(At(index).myText))
		{
			++index;
		}
		else
		{
			break;
		}
	}
	if (index >= anEnd)
	{
		return;
	}
	const Token& keyword = At(index);
	if (keyword.myText == "uniform")
	{
		if (layoutFlag)
		{
			Error(keyword.myOffset, "layout qualifiers on uniforms are not supported: the effect system "
			                        "assigns locations and texture units itself");
			return;
		}
		ParseUniform(index + 1, anEnd);
	}
	else if (keyword.myText == "in" && aStage == nullptr)
	{
		Error(keyword.myOffset, "declare 'in' variables inside a stage block, not in the shared GLSL");
	}
	else if (keyword.myText == "in" && aStage->myKind == StageKind::Vertex)
	{
		if (layoutFlag)
		{
			Error(keyword.myOffset, "vertex inputs take their locations from the declaration order; "
			                        "remove the layout qualifier");
			return;
		}
		ParseVertexInput(index + 1, anEnd, *aStage);
	}
	else if (keyword.myText == "buffer")
	{
		Error(keyword.myOffset, "shader storage blocks are not supported in effects");
	}
}

void Parser::ParseUniform(size_t aFirst, size_t anEnd)
{
	size_t index = aFirst;
	while (index < anEnd && (Is(index, "highp") || Is(index, "mediump") || Is(index, "lowp")))
	{
		++index;
	}
	const Token& typeToken = At(index);
	if (Is(index + 1, "{"))
	{
		Error(typeToken.myOffset,
		      "uniform block '" + typeToken.myText +
		          "' is not supported: declare plain uniforms (float, vecN, mat4, samplers, ...)");
		return;
	}
	VariableType type = VariableType::Float;
	if (typeToken.myKind != TokenKind::Identifier || !ParseVariableType(typeToken.myText, type))
	{
		Error(typeToken.myOffset,
		      "uniform type '" + typeToken.myText +
		          "' is not supported (float, vec2-4, int, ivec2-4, uint, bool, mat3, mat4 "
		          "and samplers are)");
		return;
	}
	++index;
	while (index < anEnd)
	{
		const Token& name = At(index);
		if (name.myKind != TokenKind::Identifier)
		{
			Error(name.myOffset, "expected a uniform name after '" + typeToken.myText + "'");
			return;
		}
		++index;
		int elementCount = 0;
		if (Is(index, "["))
		{
			const Token& size = At(index + 1);
			char* end = nullptr;
			const long count = std::strtol(size.myText.c_str(), &end, 0);
			if (size.myKind != TokenKind::Number || *end != '\0' || count < 1 || count > 4096 ||
			    !Is(index + 2, "]"))
			{
				Error(size.myOffset,
				      "the array size of uniform '" + name.myText + "' must be a number from 1 to 4096");
				return;
			}
			elementCount = static_cast<int>(count);
			index += 3;
		}
		if (Is(index, "="))
		{
			// The initializer stays in the GLSL: GL sets it when the program links.
			int depth = 0;
			while (index < anEnd && !(depth == 0 && (Is(index, ",") || Is(index, ";"))))
			{
				depth += Is(index, "(") || Is(index, "[") || Is(index, "{") ? 1 : 0;
				depth -= Is(index, ")") || Is(index, "]") || Is(index, "}") ? 1 : 0;
				++index;
			}
		}
		AddVariable(name.myText, type, elementCount, name.myOffset);
		if (Is(index, ";"))
		{
			return;
		}
		if (!Is(index, ","))
		{
			Error(At(index).myOffset, "expected ',' or ';' after uniform '" + name.myText + "'");
			return;
		}
		++index;
	}
}

void Parser::AddVariable(const std::string& aName, VariableType aType, int anElementCount, size_t anOffset)
{
	for (const ParsedVariable& variable : myVariables)
	{
		if (variable.myDesc.myName == aName)
		{
			if (variable.myDesc.myType != aType || variable.myDesc.myElementCount != anElementCount)
			{
				Error(anOffset, "uniform '" + aName + "' is declared again with another type (first at " +
				                    mySource.GetLocation(variable.myOffset) + ")");
			}
			return;
		}
	}
	ParsedVariable variable;
	variable.myDesc.myName = aName;
	variable.myDesc.myType = aType;
	variable.myDesc.myElementCount = anElementCount;
	if (IsSampler(aType))
	{
		// Undeclared samplers filter linearly with mips and wrap.
		variable.myDesc.mySampler.myAddressU = Gpu::TextureAddress::Wrap;
		variable.myDesc.mySampler.myAddressV = Gpu::TextureAddress::Wrap;
		variable.myDesc.mySampler.myAddressW = Gpu::TextureAddress::Wrap;
	}
	variable.myOffset = anOffset;
	myVariables.push_back(variable);
}

void Parser::ParseVertexInput(size_t aFirst, size_t anEnd, StageDesc& aStage)
{
	const Token& typeToken = At(aFirst);
	VariableType type = VariableType::Float;
	if (!ParseVariableType(typeToken.myText, type) || !IsVertexInputType(type))
	{
		Error(typeToken.myOffset, "vertex input type '" + typeToken.myText +
		                              "' is not supported (float, vec2-4, int, ivec2-4 and uint are)");
		return;
	}
	size_t index = aFirst + 1;
	while (index < anEnd)
	{
		const Token& name = At(index);
		size_t digits = name.myText.size();
		while (digits > 0 && std::isdigit(static_cast<unsigned char>(name.myText[digits - 1])))
		{
			--digits;
		}
		const std::string semantic = name.myText.substr(0, digits);
		const bool upperFlag =
		    !semantic.empty() && std::all_of(semantic.begin(), semantic.end(), [](char aLetter) {
			    return std::isupper(static_cast<unsigned char>(aLetter)) || aLetter == '_';
		    });
		if (name.myKind != TokenKind::Identifier || !upperFlag || name.myText.size() - digits > 6)
		{
			Error(name.myOffset,
			      "vertex input '" + name.myText +
			          "' must be named by its semantic (POSITION, NORMAL, COLOR, TEXCOORD0, ...)");
			return;
		}
		VertexInput input;
		input.myVariableName = name.myText;
		input.mySemanticName = semantic;
		input.mySemanticIndex =
		    digits < name.myText.size()
		        ? static_cast<uint32_t>(std::strtoul(name.myText.c_str() + digits, nullptr, 10))
		        : 0;
		input.myType = type;
		input.myLocation = static_cast<int>(aStage.myInputs.size());
		for (const VertexInput& other : aStage.myInputs)
		{
			if (other.mySemanticName == input.mySemanticName &&
			    other.mySemanticIndex == input.mySemanticIndex)
			{
				Error(name.myOffset, "vertex input '" + name.myText + "' is declared twice");
				return;
			}
		}
		aStage.myInputs.push_back(input);
		++index;
		if (Is(index, "["))
		{
			Error(name.myOffset, "vertex input '" + name.myText + "' cannot be an array");
			return;
		}
		if (Is(index, ";"))
		{
			return;
		}
		if (!Is(index, ","))
		{
			Error(At(index).myOffset, "expected ',' or ';' after vertex input '" + name.myText + "'");
			return;
		}
		++index;
	}
}

template <typename Handler> void Parser::ParseAssignments(size_t aFirst, size_t anEnd, Handler aHandler)
{
	size_t index = aFirst;
	while (index < anEnd)
	{
		const Token& name = At(index);
		if (name.myKind != TokenKind::Identifier || !Is(index + 1, "="))
		{
			Error(name.myOffset, "expected 'Name = value;' but found '" + name.myText + "'");
			return;
		}
		size_t end = index + 2;
		while (end < anEnd && !Is(end, ";"))
		{
			++end;
		}
		if (end >= anEnd)
		{
			Error(name.myOffset, "missing ';' after '" + name.myText + "'");
			return;
		}
		if (end == index + 2)
		{
			Error(name.myOffset, "'" + name.myText + "' has no value");
		}
		else
		{
			aHandler(index, index + 2, end);
		}
		index = end + 1;
	}
}

template <typename Value, size_t Size>
bool Parser::Lookup(const Named<Value> (&someNames)[Size], size_t aValueToken, const std::string& aState,
                    Value& aValueOut)
{
	const std::string wanted = Normalized(At(aValueToken).myText);
	for (const Named<Value>& name : someNames)
	{
		if (wanted == name.myName)
		{
			aValueOut = name.myValue;
			return true;
		}
	}
	Error(At(aValueToken).myOffset,
	      "'" + At(aValueToken).myText + "' is not a value of " + aState + " (" + Choices(someNames) + ")");
	return false;
}

bool Parser::Number(size_t aFirst, size_t anEnd, const std::string& aState, double& aValueOut)
{
	size_t index = aFirst;
	const bool negativeFlag = Is(index, "-");
	index += negativeFlag ? 1 : 0;
	std::string text = At(index).myText;
	if (!text.empty() && (text.back() == 'f' || text.back() == 'F') &&
	    text.find_first_of("xX") == std::string::npos)
	{
		text.pop_back();
	}
	char* end = nullptr;
	const double value = std::strtod(text.c_str(), &end);
	if (At(index).myKind != TokenKind::Number || *end != '\0' || index + 1 != anEnd)
	{
		Error(At(aFirst).myOffset, aState + " needs a number");
		return false;
	}
	aValueOut = negativeFlag ? -value : value;
	return true;
}

void Parser::ParseSampler(const Block& aBlock)
{
	SamplerBlock sampler;
	sampler.myName = aBlock.myName;
	sampler.myOffset = myTokens[aBlock.myKeywordToken].myOffset;
	Gpu::SamplerDesc& desc = sampler.myDesc;
	std::set<std::string> seen;
	ParseAssignments(aBlock.myFirstToken, aBlock.myEndToken, [&](size_t aName, size_t aValue, size_t anEnd) {
		const std::string state = Normalized(At(aName).myText);
		if (!seen.insert(state).second)
		{
			Error(At(aName).myOffset,
			      "'" + At(aName).myText + "' is set twice in sampler '" + aBlock.myName + "'");
			return;
		}
		double number = 0.0;
		if (state == "FILTER")
		{
			const std::string wanted = Normalized(At(aValue).myText);
			for (const FilterName& filter : ourFilters)
			{
				if (wanted == filter.myName)
				{
					desc.myFilter = filter.myFilter;
					desc.myComparisonFlag = filter.myComparisonFlag;
					return;
				}
			}
			Error(At(aValue).myOffset,
			      "filter '" + At(aValue).myText +
			          "' is not supported (MIN_MAG_MIP_POINT, MIN_MAG_MIP_LINEAR, ANISOTROPIC "
			          "and their COMPARISON_ forms are)");
		}
		else if (state == "ADDRESSU" || state == "ADDRESSV" || state == "ADDRESSW")
		{
			Gpu::TextureAddress& address = state == "ADDRESSU"   ? desc.myAddressU
			                               : state == "ADDRESSV" ? desc.myAddressV
			                                                     : desc.myAddressW;
			Lookup(ourAddresses, aValue, At(aName).myText, address);
		}
		else if (state == "COMPARISONFUNC")
		{
			Lookup(ourComparisons, aValue, At(aName).myText, desc.myComparison);
		}
		else if (state == "MAXANISOTROPY")
		{
			if (Number(aValue, anEnd, At(aName).myText, number))
			{
				if (number < 1 || number > 16)
				{
					Error(At(aValue).myOffset, "MaxAnisotropy must be from 1 to 16");
				}
				desc.myMaxAnisotropy = static_cast<float>(number);
			}
		}
		else if (state == "MIPLODBIAS" || state == "MINLOD" || state == "MAXLOD")
		{
			if (Number(aValue, anEnd, At(aName).myText, number))
			{
				float& field = state == "MIPLODBIAS" ? desc.myMipLodBias
				               : state == "MINLOD"   ? desc.myMinLod
				                                     : desc.myMaxLod;
				field = static_cast<float>(number);
			}
		}
		else if (state == "BORDERCOLOR")
		{
			// float4(r, g, b, a), vec4(r, g, b, a) or {r, g, b, a}
			size_t index = aValue;
			if (At(index).myKind == TokenKind::Identifier)
			{
				++index;
			}
			const bool braceFlag = Is(index, "{");
			if (!braceFlag && !Is(index, "("))
			{
				Error(At(aValue).myOffset, "BorderColor needs four numbers: float4(r, g, b, a)");
				return;
			}
			++index;
			for (int channel = 0; channel < 4; ++channel)
			{
				size_t end = index;
				while (end < anEnd && !Is(end, ",") && !Is(end, ")") && !Is(end, "}"))
				{
					++end;
				}
				if (!Number(index, end, "BorderColor", number) || Is(end, channel < 3 ? ")" : ","))
				{
					Error(At(aValue).myOffset, "BorderColor needs four numbers: float4(r, g, b, a)");
					return;
				}
				desc.myBorderColor[channel] = static_cast<float>(number);
				index = end + 1;
			}
			if (index != anEnd)
			{
				Error(At(aValue).myOffset, "BorderColor needs four numbers: float4(r, g, b, a)");
			}
		}
		else
		{
			Error(At(aName).myOffset,
			      "unknown sampler state '" + At(aName).myText + "' in sampler '" + aBlock.myName + "'");
		}
	});
	if (desc.myMinLod > desc.myMaxLod)
	{
		Error(sampler.myOffset, "MinLOD is above MaxLOD in sampler '" + aBlock.myName + "'");
	}
	mySamplers.push_back(sampler);
}

void Parser::ParseTechnique(const Block& aBlock)
{
	const size_t offset = myTokens[aBlock.myKeywordToken].myOffset;
	for (size_t index = 0; index < myTechniques.size(); ++index)
	{
		if (myTechniques[index].first.myName == aBlock.myName)
		{
			Error(offset, "technique '" + aBlock.myName + "' is already declared at " +
			                  mySource.GetLocation(myTechniqueOffsets[index]));
			return;
		}
	}
	std::pair<TechniqueDesc, std::vector<PendingPass>> technique;
	technique.first.myName = aBlock.myName;
	size_t index = aBlock.myFirstToken;
	while (index < aBlock.myEndToken)
	{
		if (!Is(index, "pass") || At(index + 1).myKind != TokenKind::Identifier || !Is(index + 2, "{"))
		{
			Error(At(index).myOffset, "expected 'pass NAME { ... }' in technique '" + aBlock.myName +
			                              "', found '" + At(index).myText + "'");
			return;
		}
		const size_t close = MatchingBrace(index + 2);
		PendingPass pass;
		pass.myDesc.myName = At(index + 1).myText;
		pass.myOffset = At(index).myOffset;
		for (const PendingPass& other : technique.second)
		{
			if (other.myDesc.myName == pass.myDesc.myName)
			{
				Error(pass.myOffset,
				      "technique '" + aBlock.myName + "' has two passes named '" + pass.myDesc.myName + "'");
			}
		}
		ParsePass(aBlock.myName, index + 3, std::min(close, aBlock.myEndToken), pass);
		technique.second.push_back(std::move(pass));
		index = close + 1;
	}
	if (technique.second.empty())
	{
		Error(offset, "technique '" + aBlock.myName + "' has no pass");
	}
	myTechniques.push_back(std::move(technique));
	myTechniqueOffsets.push_back(offset);
}

void Parser::ParsePass(const std::string& aTechnique, size_t aFirst, size_t anEnd, PendingPass& aPass)
{
	PassDesc& desc = aPass.myDesc;
	std::set<std::string> seen;
	ParseAssignments(aFirst, anEnd, [&](size_t aName, size_t aValue, size_t anEnd) {
		const std::string& stateName = At(aName).myText;
		const std::string state = Normalized(stateName);
		if (!seen.insert(state).second)
		{
			Error(At(aName).myOffset, "'" + stateName + "' is set twice in pass '" + desc.myName + "'");
			return;
		}
		if (state == "VERTEXSHADER" || state == "GEOMETRYSHADER" || state == "PIXELSHADER" ||
		    state == "FRAGMENTSHADER")
		{
			const int slot = state == "VERTEXSHADER" ? 0 : state == "GEOMETRYSHADER" ? 1 : 2;
			if (At(aValue).myKind != TokenKind::Identifier || aValue + 1 != anEnd)
			{
				Error(At(aValue).myOffset, stateName + " needs the name of a stage block");
				return;
			}
			if (Normalized(At(aValue).myText) != "NULL")
			{
				aPass.myStages[slot] = {At(aValue).myText, At(aValue).myOffset};
			}
			return;
		}
		bool flag = false;
		double number = 0.0;
		Gpu::BlendState& blend = desc.myBlend;
		Gpu::DepthStencilState& depth = desc.myDepthStencil;
		Gpu::RasterizerState& rasterizer = desc.myRasterizer;
		const bool blendFlag = state == "BLENDENABLE" || state == "SRCBLEND" || state == "DESTBLEND" ||
		                       state == "BLENDOP" || state == "SRCBLENDALPHA" || state == "DESTBLENDALPHA" ||
		                       state == "BLENDOPALPHA" || state == "RENDERTARGETWRITEMASK";
		const bool depthFlag = state == "DEPTHENABLE" || state == "DEPTHWRITEMASK" || state == "DEPTHFUNC";
		const bool rasterizerFlag = state == "FILLMODE" || state == "CULLMODE" ||
		                            state == "FRONTCOUNTERCLOCKWISE" || state == "DEPTHCLIPENABLE" ||
		                            state == "SCISSORENABLE";
		if (!blendFlag && !depthFlag && !rasterizerFlag)
		{
			Error(At(aName).myOffset, "unknown state '" + stateName + "' in pass '" + desc.myName +
			                              "' of technique '" + aTechnique + "'");
			return;
		}
		desc.myStateGroups |= blendFlag   ? StateGroup::Blend
		                      : depthFlag ? StateGroup::DepthStencil
		                                  : StateGroup::Rasterizer;
		if (aValue + 1 != anEnd && state != "RENDERTARGETWRITEMASK")
		{
			Error(At(aValue).myOffset, stateName + " takes a single value");
			return;
		}
		if (state == "BLENDENABLE" && Lookup(ourBools, aValue, stateName, flag))
		{
			blend.myEnableFlag = flag;
		}
		else if (state == "SRCBLEND")
		{
			Lookup(ourBlends, aValue, stateName, blend.myColor.mySource);
		}
		else if (state == "DESTBLEND")
		{
			Lookup(ourBlends, aValue, stateName, blend.myColor.myDestination);
		}
		else if (state == "BLENDOP")
		{
			Lookup(ourBlendOps, aValue, stateName, blend.myColor.myOp);
		}
		else if (state == "SRCBLENDALPHA")
		{
			Lookup(ourBlends, aValue, stateName, blend.myAlpha.mySource);
		}
		else if (state == "DESTBLENDALPHA")
		{
			Lookup(ourBlends, aValue, stateName, blend.myAlpha.myDestination);
		}
		else if (state == "BLENDOPALPHA")
		{
			Lookup(ourBlendOps, aValue, stateName, blend.myAlpha.myOp);
		}
		else if (state == "RENDERTARGETWRITEMASK")
		{
			if (Normalized(At(aValue).myText) == "ALL" && aValue + 1 == anEnd)
			{
				blend.myWriteMask = Gpu::ColorWrite::All;
			}
			else if (Number(aValue, anEnd, stateName, number))
			{
				if (number < 0 || number > 15 || number != static_cast<int>(number))
				{
					Error(At(aValue).myOffset,
					      "RenderTargetWriteMask must be from 0 to 15 (red 1, green 2, blue 4, alpha 8)");
				}
				blend.myWriteMask = static_cast<uint8_t>(static_cast<int>(number) & 15);
			}
		}
		else if (state == "DEPTHENABLE" && Lookup(ourBools, aValue, stateName, flag))
		{
			depth.myDepthEnableFlag = flag;
		}
		else if (state == "DEPTHWRITEMASK" && Lookup(ourDepthWriteMasks, aValue, stateName, flag))
		{
			depth.myDepthWriteFlag = flag;
		}
		else if (state == "DEPTHFUNC")
		{
			Lookup(ourComparisons, aValue, stateName, depth.myDepthFunc);
		}
		else if (state == "FILLMODE")
		{
			Lookup(ourFillModes, aValue, stateName, rasterizer.myFillMode);
		}
		else if (state == "CULLMODE")
		{
			Lookup(ourCullModes, aValue, stateName, rasterizer.myCullMode);
		}
		else if (state == "FRONTCOUNTERCLOCKWISE" && Lookup(ourBools, aValue, stateName, flag))
		{
			rasterizer.myFrontCounterClockwiseFlag = flag;
		}
		else if (state == "DEPTHCLIPENABLE" && Lookup(ourBools, aValue, stateName, flag))
		{
			rasterizer.myDepthClipFlag = flag;
		}
		else if (state == "SCISSORENABLE" && Lookup(ourBools, aValue, stateName, flag))
		{
			rasterizer.myScissorFlag = flag;
		}
	});
}

void Parser::ResolvePasses(EffectDesc& aDesc)
{
	static const char* const slotNames[3] = {"VertexShader", "GeometryShader", "PixelShader"};
	static const StageKind slotKinds[3] = {StageKind::Vertex, StageKind::Geometry, StageKind::Fragment};
	static const char* const kindNames[3] = {"vertex", "geometry", "fragment"};
	for (auto& [technique, passes] : myTechniques)
	{
		for (PendingPass& pass : passes)
		{
			int* indices[3] = {&pass.myDesc.myVertexStage, &pass.myDesc.myGeometryStage,
			                   &pass.myDesc.myFragmentStage};
			for (int slot = 0; slot < 3; ++slot)
			{
				const StageReference& reference = pass.myStages[slot];
				if (reference.myName.empty())
				{
					if (slot != 1)
					{
						Error(pass.myOffset, "pass '" + pass.myDesc.myName + "' of technique '" +
						                         technique.myName + "' needs a " + slotNames[slot]);
					}
					continue;
				}
				const auto found =
				    std::find_if(myStages.begin(), myStages.end(),
				                 [&](const StageDesc& aStage) { return aStage.myName == reference.myName; });
				if (found == myStages.end())
				{
					Error(reference.myOffset,
					      std::string(slotNames[slot]) + " '" + reference.myName + "' names no stage block");
					continue;
				}
				if (found->myKind != slotKinds[slot])
				{
					Error(reference.myOffset, std::string(slotNames[slot]) + " '" + reference.myName +
					                              "' is a " + kindNames[static_cast<int>(found->myKind)] +
					                              " block");
					continue;
				}
				*indices[slot] = static_cast<int>(found - myStages.begin());
			}
			if (pass.myDesc.myVertexStage >= 0)
			{
				pass.myDesc.myInputs = myStages[static_cast<size_t>(pass.myDesc.myVertexStage)].myInputs;
			}
			technique.myPasses.push_back(pass.myDesc);
		}
		aDesc.myTechniques.push_back(technique);
	}
}

void Parser::AppendRange(std::string& aGlsl, size_t aBegin, size_t anEnd) const
{
	// Whitespace-only ranges between blocks add nothing.
	if (myText.find_first_not_of(" \t\r\n", aBegin) >= anEnd)
	{
		return;
	}
	const std::vector<size_t>& starts = mySource.GetLineStarts();
	const std::vector<EffectSource::LineOrigin>& origins = mySource.GetLineOrigins();
	size_t line =
	    static_cast<size_t>(std::upper_bound(starts.begin(), starts.end(), aBegin) - starts.begin()) - 1;
	size_t at = aBegin;
	EffectSource::LineOrigin previous{-1, 0};
	while (at < anEnd && line < origins.size())
	{
		const size_t lineEnd = std::min(line + 1 < starts.size() ? starts[line + 1] : myText.size(), anEnd);
		const EffectSource::LineOrigin origin = origins[line];
		if (origin.myFile != previous.myFile || origin.myLine != previous.myLine + 1)
		{
			if (!aGlsl.empty() && aGlsl.back() != '\n')
			{
				aGlsl += '\n';
			}
			const unsigned long number = static_cast<unsigned long>(origin.myFile) * ourIncludeLineStride +
			                             static_cast<unsigned long>(origin.myLine);
			aGlsl += "#line " + std::to_string(number) + " " + std::to_string(origin.myFile) + "\n";
		}
		aGlsl.append(myText, at, lineEnd - at);
		previous = origin;
		at = lineEnd;
		++line;
	}
	if (!aGlsl.empty() && aGlsl.back() != '\n')
	{
		aGlsl += '\n';
	}
}
} // namespace

bool ParseEffect(const EffectSource& aSource, EffectDesc& aDescOut, std::string& someMessages)
{
	Parser parser(aSource, someMessages);
	return parser.Run(aDescOut);
}
} // namespace Fx
