#pragma once
// EngineThread: the one thread that owns the engine facade. The user-interface thread never
// waits for a frame: it queues work here (edits, picking, loading, saving, bakes) and gets
// results back as queued calls on its own thread. Between frames the thread runs what was
// queued, puts the camera where the view last asked (moves merged: only the latest placement
// counts), and renders only while something asks for frames: a change, a moving camera or
// the eye adaptation settling after one. Idle, it sleeps on a condition variable.
//
//   EngineThread engine;
//   engine.Start(view->winId(), view->size() * ratio);    // creates the facade on the thread
//   engine.LoadLevel(u"sample_small", [](const LevelSnapshot& s) { ... });  // on the UI thread
//   engine.SetCamera(camera);                              // a frame follows
//   engine.Stop();                                         // joins, shuts the facade down
#include <QObject>
#include <QSize>
#include <QString>
#include <condition_variable>
#include <deque>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <thread>
#include <utility>
#include <vector>

#include "bridge/BakeRequest.h"
#include "bridge/CameraPlacement.h"
#include "bridge/EngineApi.h"
#include "bridge/LevelSnapshot.h"
#include "view/MovingResolution.h"

namespace Lumora
{
class LumoraWrapper;
}

namespace LumoraEditor
{
struct DisplayOptions
{
	bool myMeshesFlag = false;
	bool myRoomsFlag = false;
	bool myLightIconsFlag = true;
	// 0 none, 1 the selection's, 2 every light's falloff sphere and cone.
	int myLightVolumes = 1;
	// While the camera moves, frames are drawn smaller (a half to a quarter of the width and
	// height, as the frame budget allows: view/MovingResolution.h), scaled up with the overlays
	// sharp, and the first frame with the camera still at full size: on a software rasterizer a
	// flight through a level gets about 20 frames a second instead of 3 to 4.
	bool myFastCameraFlag = true;
};

class EngineThread : public QObject, public EngineApi
{
	Q_OBJECT

public:
	// How long frames keep coming after the last change, for the eye adaptation to settle.
	static constexpr int ourSettleMs = 1200;

	explicit EngineThread(QObject* aParent = nullptr);
	~EngineThread() override;

	// Creates the facade on the thread for the native window (0: headless) at a size in
	// device pixels; started() tells how it went.
	void Start(quint64 aWindow, QSize aSize);
	// Stops the loop, waits for the thread and shuts the facade down.
	void Stop();
	bool IsRunning() const { return myThread.joinable(); }

	// Everything below is queued; results arrive on the user-interface thread.
	void Resize(QSize aSize);
	void SetCamera(const CameraPlacement& aCamera);
	void RequestFrames();
	void SetDisplay(const DisplayOptions& someOptions);
	// Everything of the current mode under the pixel, nearest first (empty: nothing there).
	using PickHits = std::vector<std::pair<Kind, int>>;
	void Pick(float anX, float aY, std::function<void(const PickHits&)> aResult);
	void LoadLevel(const QString& aLevel, std::function<void(const LevelSnapshot&)> aDone);
	// Lights, path graph and decals; aDone gets the problems reported while saving (empty: saved).
	void Save(const QString& aLevel, std::function<void(const QStringList&)> aDone);
	void UpdateSsao(float aScale, float aSampleRadius, float aBias, float anIntensity);
	void UpdateHdrAndBloom(float anAutoExposure, float aLumMin, float aLumMax, float aBloomThreshold,
	                       float aBloomFactor, float anEmissiveMultiplier);
	// Runs the bake on the engine thread (frames stop meanwhile); aDone gets how it ended and
	// the bake's last message.
	void Bake(const BakeRequest& aRequest, std::function<void(BakeOutcome, const QString&)> aDone);
	// Any thread: the running bake stops within one probe or cube face.
	void CancelBake();
	// Any thread: where the running bake is, or how the last one ended.
	BakeProgress GetBakeProgress() const;
	// Runs aWork on the engine thread between frames, then aDone on this thread.
	void Run(std::function<void(Lumora::LumoraWrapper&)> aWork, std::function<void()> aDone = {});

	// EngineApi (queued).
	void AddObject(const ObjectState& aState) override;
	void ApplyState(int anIndex, const ObjectState& aState) override;
	void RemoveObject(Kind aKind, int anIndex) override;
	void SelectObject(Kind aKind, int anIndex) override;

	// What the engine reports as it works, delivered on the user-interface thread.
signals:
	void started(bool anOkFlag, const QString& aProblem);
	void frameRendered(double aMilliseconds, QSize aSize);
	void logReport(int aLevel, const QString& aFunction, const QString& aText);

private:
	using Work = std::function<void(Lumora::LumoraWrapper&)>;

	void Queue(Work aWork, bool aFrameFlag = true);
	void PostToUi(std::function<void()> aCall);
	void Loop(quint64 aWindow, QSize aSize);
	bool HasWork() const;

	// The last queued ApplyState while it is still the queue's last item: a further change of the
	// same object replaces its values instead of queueing another (a drag's moves between two
	// frames become one).
	struct PendingState
	{
		Kind myKind;
		int myIndex;
		ObjectState myState;
	};
	std::shared_ptr<PendingState> myPendingState;
	size_t myPendingPlace = 0;

	std::thread myThread;
	mutable std::mutex myMutex;
	std::condition_variable myWake;
	std::deque<Work> myQueue;
	std::optional<CameraPlacement> myCamera;
	std::optional<QSize> mySize;
	bool myStopFlag = false;
	bool myFrameFlag = false;
	// Frames are rendered until then (eye adaptation after a change).
	std::chrono::steady_clock::time_point mySettleUntil{};
	// The engine thread's own: the fast camera's switch and the divisor its frames are drawn at.
	bool myFastCameraFlag = true;
	int myMovingDivisor = ourSmallestMovingDivisor + 1;
};
} // namespace LumoraEditor
