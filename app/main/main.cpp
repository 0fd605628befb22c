// lumora-editor [--data DIR] [LEVEL]: the desktop level lighting editor. The engine reads
// data/... relative to the working directory, so the editor works in the folder holding data/
// (DIR, else the current folder).
#include <QApplication>
#include <QCommandLineParser>
#include <QDir>
#include <QMessageBox>
#include <QSize>
#include <cstdio>
#include <cstdlib>

#include "main/MainWindow.h"

int main(int argc, char** argv)
{
	// The engine presents into an X11 window through its own connection to $DISPLAY: under a
	// Wayland session the editor runs through XWayland.
	if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM"))
	{
		qputenv("QT_QPA_PLATFORM", "xcb");
	}
	// The view's native window must not drag its siblings into being native windows too.
	QApplication::setAttribute(Qt::AA_DontCreateNativeWidgetSiblings);
	QApplication application(argc, argv);
	QApplication::setOrganizationName(QStringLiteral("Lumora"));
	QApplication::setApplicationName(QStringLiteral("lumora-editor"));
	QApplication::setApplicationVersion(QStringLiteral("0.1"));

	QCommandLineParser parser;
	parser.setApplicationDescription(QStringLiteral("Lumora's level lighting editor"));
	parser.addHelpOption();
	parser.addVersionOption();
	const QCommandLineOption dataOption(
	    QStringLiteral("data"), QStringLiteral("The folder holding data/ (default: the current folder)"),
	    QStringLiteral("DIR"));
	const QCommandLineOption sizeOption(
	    QStringLiteral("size"), QStringLiteral("The window's size, e.g. 1600x900"), QStringLiteral("WxH"));
	const QCommandLineOption screenshotOption(
	    QStringLiteral("screenshot"),
	    QStringLiteral("Open LEVEL, let the frames settle, save a picture of the window to FILE and quit"),
	    QStringLiteral("FILE"));
	const QCommandLineOption selectOption(
	    QStringLiteral("select"),
	    QStringLiteral(
	        "Once LEVEL is open, select an object as the outliner names it: point-light:N, spot-light:N, "
	        "decal:N or path-node:N (N from 1)"),
	    QStringLiteral("KIND:N"));
	parser.addOptions({dataOption, sizeOption, screenshotOption, selectOption});
	parser.addPositionalArgument(QStringLiteral("LEVEL"),
	                             QStringLiteral("A level under data/XML/levels/ to open"));
	parser.process(application);

	const QString screenshot = parser.isSet(screenshotOption)
	                               ? QDir::current().absoluteFilePath(parser.value(screenshotOption))
	                               : QString();
	const QString data = parser.isSet(dataOption) ? parser.value(dataOption) : QDir::currentPath();
	if (!QDir(data).exists(QStringLiteral("data")) || !QDir::setCurrent(data))
	{
		const QString problem = QStringLiteral("No data/ folder in %1: start the editor in the folder that "
		                                       "holds data/, or name it with --data DIR")
		                            .arg(QDir(data).absolutePath());
		std::fprintf(stderr, "lumora-editor: %s\n", qPrintable(problem));
		if (screenshot.isEmpty())
		{
			QMessageBox::critical(nullptr, QStringLiteral("Lumora Editor"), problem);
		}
		return 2;
	}

	LumoraEditor::MainWindow window;
	if (parser.isSet(sizeOption))
	{
		const QStringList size = parser.value(sizeOption).split('x');
		if (size.size() == 2)
		{
			window.resize(size[0].toInt(), size[1].toInt());
		}
	}
	const QStringList levels = parser.positionalArguments();
	if (!screenshot.isEmpty())
	{
		if (levels.isEmpty())
		{
			std::fprintf(stderr, "lumora-editor: --screenshot needs a LEVEL\n");
			return 2;
		}
		window.ScreenshotThenQuit(screenshot, 4000);
	}
	if (parser.isSet(selectOption))
	{
		static const QStringList ourKinds = {QStringLiteral("point-light"), QStringLiteral("spot-light"),
		                                     QStringLiteral("decal"), QStringLiteral("path-node")};
		const QStringList choice = parser.value(selectOption).split(':');
		const int kind = static_cast<int>(ourKinds.indexOf(choice.value(0)));
		const int number = choice.value(1).toInt();
		if (kind < 0 || number < 1)
		{
			std::fprintf(
			    stderr,
			    "lumora-editor: --select takes point-light:N, spot-light:N, decal:N or path-node:N\n");
			return 2;
		}
		QObject::connect(&window, &LumoraEditor::MainWindow::levelOpened, &window,
		                 [&window, kind, number](const QString&, bool anOpenedFlag) {
			                 if (anOpenedFlag)
			                 {
				                 window.GetDocument().SelectAt(static_cast<LumoraEditor::Kind>(kind),
				                                               number - 1);
			                 }
		                 });
	}
	window.show();
	if (!levels.isEmpty())
	{
		window.OpenLevel(levels.front());
	}
	return application.exec();
}
