#include "panels/PostProcessingSettings.h"

#include <QCoreApplication>
#include <QFile>
#include <QXmlStreamReader>
#include <initializer_list>
#include <optional>
#include <utility>

namespace LumoraEditor
{
namespace
{
QString Translate(const char* aText)
{
	return QCoreApplication::translate("PostProcessingSettings", aText);
}

// Reads the attributes of the first element named anElement into the values they name.
void ReadElement(const QString& aFile, const QString& anElement,
                 std::initializer_list<std::pair<const char*, float*>> someValues, QStringList& someNotesOut)
{
	QFile file(aFile);
	if (!file.exists())
	{
		someNotesOut << Translate("%1 is missing: the defaults are used.").arg(aFile);
		return;
	}
	if (!file.open(QIODevice::ReadOnly))
	{
		someNotesOut << Translate("%1 could not be opened (%2): the defaults are used.")
		                    .arg(aFile, file.errorString());
		return;
	}
	// The whole file must parse, as the engine reads it: a file broken after the element
	// gives the engine nothing either.
	QXmlStreamReader reader(&file);
	std::optional<QXmlStreamAttributes> attributes;
	while (!reader.atEnd())
	{
		if (reader.readNext() == QXmlStreamReader::StartElement && !attributes && reader.name() == anElement)
		{
			attributes = reader.attributes();
		}
	}
	if (reader.hasError())
	{
		someNotesOut << Translate("%1 could not be read (line %2: %3): the defaults are used.")
		                    .arg(aFile)
		                    .arg(reader.lineNumber())
		                    .arg(reader.errorString());
		return;
	}
	if (!attributes)
	{
		someNotesOut << Translate("%1 has no <%2> element: the defaults are used.").arg(aFile, anElement);
		return;
	}
	for (const auto& [name, value] : someValues)
	{
		const QString attribute = QString::fromLatin1(name);
		if (!attributes->hasAttribute(attribute))
		{
			someNotesOut
			    << Translate("%1: <%2> has no %3: %4 is used.").arg(aFile, anElement, attribute).arg(*value);
			continue;
		}
		const QString text = attributes->value(attribute).toString();
		bool numberFlag = false;
		const float read = text.trimmed().toFloat(&numberFlag);
		if (!numberFlag)
		{
			someNotesOut << Translate("%1: %3 of <%2> is not a number (\"%4\"): %5 is used.")
			                    .arg(aFile, anElement, attribute, text)
			                    .arg(*value);
			continue;
		}
		*value = read;
	}
}
} // namespace

PostProcessingSettings PostProcessingSettings::Read(const QString& aSsaoFile, const QString& aHdrFile,
                                                    QStringList& someNotesOut)
{
	PostProcessingSettings read;
	ReadElement(aSsaoFile, QStringLiteral("ssao"),
	            {{"scale", &read.mySsaoScale},
	             {"sample-rad", &read.mySsaoSampleRadius},
	             {"bias", &read.mySsaoBias},
	             {"intensity", &read.mySsaoIntensity}},
	            someNotesOut);
	ReadElement(aHdrFile, QStringLiteral("hdr-bloom"),
	            {{"auto-exposure", &read.myAutoExposure},
	             {"lum-min", &read.myLumMin},
	             {"lum-max", &read.myLumMax},
	             {"bloom-threshold", &read.myBloomThreshold},
	             {"bloom-factor", &read.myBloomFactor},
	             {"emissive-mult", &read.myEmissiveMultiplier}},
	            someNotesOut);
	return read;
}
} // namespace LumoraEditor
