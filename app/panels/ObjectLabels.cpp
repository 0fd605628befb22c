#include "panels/ObjectLabels.h"

#include <QCoreApplication>

#include "core/Document.h"

namespace LumoraEditor
{
QString ObjectLabel(Kind aKind, int anIndex, const ObjectState& aState)
{
	const int number = anIndex + 1;
	switch (aKind)
	{
	case Kind::POINT_LIGHT:
		return QCoreApplication::translate("ObjectLabel", "Point light %1").arg(number);
	case Kind::SPOT_LIGHT:
		return QCoreApplication::translate("ObjectLabel", "Spot light %1").arg(number);
	case Kind::DECAL:
		if (aState.myDecalType.empty())
		{
			return QCoreApplication::translate("ObjectLabel", "Decal %1").arg(number);
		}
		return QCoreApplication::translate("ObjectLabel", "Decal %1 — %2")
		    .arg(number)
		    .arg(QString::fromStdString(aState.myDecalType));
	case Kind::PATH_NODE:
		return QCoreApplication::translate("ObjectLabel", "Path node %1").arg(number);
	}
	return QString();
}

QString ObjectLabel(const Document& aDocument, ObjectId anId)
{
	const ObjectState* state = aDocument.Find(anId);
	if (state == nullptr)
	{
		return QString();
	}
	return ObjectLabel(state->myKind, aDocument.IndexOf(anId), *state);
}

QString PositionText(const ObjectState& aState)
{
	return QStringLiteral("%1, %2, %3")
	    .arg(aState.myPosition[0], 0, 'f', 3)
	    .arg(aState.myPosition[1], 0, 'f', 3)
	    .arg(aState.myPosition[2], 0, 'f', 3);
}
} // namespace LumoraEditor
