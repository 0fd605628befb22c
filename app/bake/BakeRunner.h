#pragma once
// BakeRunner: one bake at a time on the engine thread, as a state machine the bake panel and
// the main window watch: idle -> running -> finished, failed or cancelled (and running again
// on the next Start). While running it asks the engine where the bake is every ourPollMs and
// passes that on.
//
//   BakeRunner runner(engine);
//   connect(&runner, &BakeRunner::finished, ...);
//   runner.Start(request);   // false while a bake runs
//   runner.Cancel();         // the bake stops within a probe or a cube face; finished(CANCELLED)
//
// Tests give it a Backend of their own instead of the engine thread.
#include <QElapsedTimer>
#include <QObject>
#include <functional>

#include "bridge/BakeRequest.h"

class QTimer;

namespace LumoraEditor
{
class EngineThread;

class BakeRunner : public QObject
{
	Q_OBJECT

public:
	enum class State
	{
		IDLE,
		RUNNING,
		FINISHED,
		FAILED,
		CANCELLED,
	};
	Q_ENUM(State)

	// What the runner needs of the engine: start a bake (aDone called on this thread when it
	// ends), cancel it (any time), and where it is.
	struct Backend
	{
		std::function<void(const BakeRequest&, std::function<void(BakeOutcome, const QString&)>)> myBake;
		std::function<void()> myCancel;
		std::function<BakeProgress()> myProgress;
	};

	static constexpr int ourPollMs = 200;

	explicit BakeRunner(EngineThread& anEngine, QObject* aParent = nullptr);
	explicit BakeRunner(Backend aBackend, QObject* aParent = nullptr);

	State GetState() const { return myState; }
	bool IsRunning() const { return myState == State::RUNNING; }
	bool IsCancelling() const { return myCancelFlag; }
	const BakeRequest& GetRequest() const { return myRequest; }
	// The latest progress of the running (or last) bake.
	const BakeProgress& GetProgress() const { return myProgress; }
	// Since the running bake started, or how long the last one took.
	double GetElapsedSeconds() const;

	// Starts the bake; false (nothing done) while one runs or when it asks for nothing.
	bool Start(const BakeRequest& aRequest);
	// Asks the running bake to stop; finished(CANCELLED) follows once it has.
	void Cancel();

	// One line for a progress: "Ambient: bounce 1/2, 120/468 probes, about 12 s left",
	// "Reflections: 3/8 rooms, 2 s so far"; empty when nothing runs.
	static QString Describe(const BakeProgress& aProgress);
	// "12 s", "3 min 05 s", "1 h 02 min".
	static QString DescribeSeconds(double aSeconds);

signals:
	void stateChanged(LumoraEditor::BakeRunner::State aState);
	void progressChanged(const LumoraEditor::BakeProgress& aProgress);
	void finished(LumoraEditor::BakeOutcome anOutcome, const QString& aMessage);

private:
	void Poll();
	void OnDone(BakeOutcome anOutcome, const QString& aMessage);
	void SetState(State aState);

	Backend myBackend;
	QTimer* myPollTimer = nullptr;
	State myState = State::IDLE;
	BakeRequest myRequest;
	BakeProgress myProgress;
	QElapsedTimer myClock;
	double myLastSeconds = 0.0;
	// Cancel was asked for: asked again at each poll while the engine still bakes, since the
	// engine forgets a cancel that comes before a bake (or its second half) begins.
	bool myCancelFlag = false;
};
} // namespace LumoraEditor
