#include "main/KeyTable.h"

#include <QCoreApplication>

namespace LumoraEditor
{
const std::vector<KeyBinding>& KeyBindings()
{
	static const std::vector<KeyBinding> ourBindings = {
	    {"Right mouse button held + mouse", "Look around"},
	    {"W / A / S / D", "Fly forward, left, back, right (in the view)"},
	    {"Q / E", "Fly down / up"},
	    {"Shift", "Fly and nudge faster"},
	    {"Mouse wheel", "Move along the view"},
	    {"Ctrl+= / Ctrl+-", "Camera faster / slower"},
	    {"F", "Frame the selection"},
	    {"Home", "The level's start view"},
	    {"Left click", "Select what is under the cursor (the current mode's objects)"},
	    {"Left click on the selection", "Select the next object behind it at that spot"},
	    {"Left drag", "Move the selection in the plane facing the camera"},
	    {"X / Y / Z held while dragging", "Move along that world axis only"},
	    {"Ctrl+left drag", "Turn a spot light or decal"},
	    {"Arrow keys", "Nudge the selection along the ground (0.1 m; Shift: 1 m)"},
	    {"Page Up / Page Down", "Nudge the selection up / down"},
	    {"Esc", "Cancel the drag, else clear the selection"},
	    {"1 / 2 / 3", "Mode: lights / path nodes / decals (in the view)"},
	    {"Ctrl+1 / 2 / 3 / 4", "Add a point light / spot light / decal / path node"},
	    {"Ctrl+D", "Duplicate the selection"},
	    {"Delete", "Delete the selection"},
	    {"Ctrl+Z / Ctrl+Shift+Z", "Undo / redo"},
	    {"Ctrl+O", "Open a level"},
	    {"Ctrl+S", "Save lights, path graph and decals"},
	    {"F1", "This list"},
	    {"Ctrl+Q", "Quit"},
	};
	return ourBindings;
}

QString KeyTableHtml()
{
	QString html = QStringLiteral("<table cellspacing='6'>");
	for (const KeyBinding& binding : KeyBindings())
	{
		html += QStringLiteral("<tr><td><b>%1</b></td><td>%2</td></tr>")
		            .arg(QString::fromUtf8(binding.myKeys).toHtmlEscaped(),
		                 QCoreApplication::translate("KeyTable", binding.myWhat).toHtmlEscaped());
	}
	return html + QStringLiteral("</table>");
}
} // namespace LumoraEditor
