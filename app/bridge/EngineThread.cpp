#include "bridge/EngineThread.h"

#include <QMetaObject>
#include <algorithm>
#include <chrono>
#include <cmath>

#include "editor/DecalStruct.h"
#include "editor/DecalTypeStruct.h"
#include "editor/LumoraWrapper.h"
#include "editor/PointLightStruct.h"
#include "editor/SpotLightStruct.h"
#include "engine/Room.h"

namespace LumoraEditor
{
namespace
{
using Clock = std::chrono::steady_clock;
using Lumora::LumoraWrapper;

// The engine's update steps at most this long after an idle spell, so the eye adaptation
// moves on from where it was instead of jumping.
constexpr float ourLongestStepMs = 100.0f;
// Reports of this level and above (error, severe, critical) are problems of what was asked.
constexpr int ourProblemLevel = 1;

LumoraWrapper::ObjectKind FacadeKind(Kind aKind)
{
	switch (aKind)
	{
	case Kind::POINT_LIGHT:
		return LumoraWrapper::ObjectKind::POINT_LIGHT;
	case Kind::SPOT_LIGHT:
		return LumoraWrapper::ObjectKind::SPOT_LIGHT;
	case Kind::DECAL:
		return LumoraWrapper::ObjectKind::DECAL;
	case Kind::PATH_NODE:
		return LumoraWrapper::ObjectKind::PATH_NODE;
	}
	return LumoraWrapper::ObjectKind::POINT_LIGHT;
}

Kind EditorKind(LumoraWrapper::ObjectKind aKind)
{
	switch (aKind)
	{
	case LumoraWrapper::ObjectKind::POINT_LIGHT:
		return Kind::POINT_LIGHT;
	case LumoraWrapper::ObjectKind::SPOT_LIGHT:
		return Kind::SPOT_LIGHT;
	case LumoraWrapper::ObjectKind::DECAL:
		return Kind::DECAL;
	case LumoraWrapper::ObjectKind::PATH_NODE:
		return Kind::PATH_NODE;
	}
	return Kind::POINT_LIGHT;
}

int FacadeCount(const LumoraWrapper& aFacade, Kind aKind)
{
	switch (aKind)
	{
	case Kind::POINT_LIGHT:
		return aFacade.GetPointLights().Count();
	case Kind::SPOT_LIGHT:
		return aFacade.GetSpotLights().Count();
	case Kind::DECAL:
		return aFacade.GetDecals().Count();
	case Kind::PATH_NODE:
		return aFacade.GetNodes().Count();
	}
	return 0;
}

std::u16string ToU16(const QString& aText)
{
	return aText.toStdU16String();
}

// The values of the object at anIndex, read through the facade's selection queries.
ObjectState ReadObject(LumoraWrapper& aFacade, Kind aKind, int anIndex)
{
	ObjectState state;
	state.myKind = aKind;
	aFacade.Select(FacadeKind(aKind), anIndex);
	switch (aKind)
	{
	case Kind::POINT_LIGHT: {
		Lumora::PointLightStruct light;
		aFacade.TryGetCurrentPointLight(light);
		state.myPosition = light.pos;
		state.myColor = {light.col[0], light.col[1], light.col[2]};
		state.myFalloff = light.falloff;
		break;
	}
	case Kind::SPOT_LIGHT: {
		Lumora::SpotLightStruct light;
		aFacade.TryGetCurrentSpotLight(light);
		state.myPosition = light.pos;
		state.myColor = {light.col[0], light.col[1], light.col[2]};
		state.myFalloff = light.falloff;
		state.myDirection = light.direction;
		state.myInnerCos = light.angles[0];
		state.myOuterCos = light.angles[1];
		break;
	}
	case Kind::DECAL: {
		Lumora::DecalStruct decal;
		aFacade.TryGetCurrentDecal(decal);
		state.myPosition = decal.pos;
		state.myColor = {decal.col[0], decal.col[1], decal.col[2]};
		state.myDirection = decal.direction;
		state.mySize = decal.size;
		state.myDepth = decal.depth;
		state.myDecalType = decal.decalID ? QString::fromStdU16String(*decal.decalID).toStdString() : "";
		break;
	}
	case Kind::PATH_NODE: {
		const Vector3<float>& position = aFacade.GetNodes()[anIndex].GetPosition();
		state.myPosition = {position.x, position.y, position.z};
		break;
	}
	}
	return state;
}

void WriteObject(LumoraWrapper& aFacade, int anIndex, const ObjectState& aState)
{
	if (!aFacade.Select(FacadeKind(aState.myKind), anIndex))
	{
		return;
	}
	const auto& p = aState.myPosition;
	const auto& c = aState.myColor;
	const auto& d = aState.myDirection;
	aFacade.SetSelectedPosition(Vector3<float>(p[0], p[1], p[2]));
	switch (aState.myKind)
	{
	case Kind::POINT_LIGHT:
		aFacade.ChangeColorPointLight(c[0], c[1], c[2]);
		aFacade.ChangeFalloffPointLight(aState.myFalloff);
		break;
	case Kind::SPOT_LIGHT:
		aFacade.ChangeColorSpotLight(c[0], c[1], c[2]);
		aFacade.ChangeFalloffSpotLight(aState.myFalloff);
		aFacade.SetSelectedDirection(Vector3<float>(d[0], d[1], d[2]));
		aFacade.ChangeAnglesSpotLight(aState.myInnerCos, aState.myOuterCos);
		break;
	case Kind::DECAL:
		aFacade.ChangeColorDecal(c[0], c[1], c[2]);
		aFacade.SetSelectedDirection(Vector3<float>(d[0], d[1], d[2]));
		aFacade.ChangeDecalSize(aState.mySize);
		aFacade.ChangeDecalDepth(aState.myDepth);
		if (!aState.myDecalType.empty())
		{
			aFacade.ChangeDecalType(QString::fromStdString(aState.myDecalType).toStdU16String());
		}
		break;
	case Kind::PATH_NODE:
		break;
	}
}

// A designer's first look at a level: standing at eye height by the middle of the first room's
// +z wall, looking across to the room's middle a little below eye height (the engine's own
// start looks from above the level out over it; from a corner a pillar is too often in the way).
CameraPlacement ViewIntoRoom(const std::array<float, 3>& aMin, const std::array<float, 3>& aMax)
{
	std::array<float, 3> size{};
	for (int axis = 0; axis < 3; ++axis)
	{
		size[axis] = aMax[axis] - aMin[axis];
	}
	CameraPlacement view;
	view.myPosition = {aMin[0] + 0.5f * size[0], aMin[1] + std::min(1.8f, 0.6f * size[1]),
	                   aMax[2] - 0.08f * size[2]};
	const std::array<float, 3> target{aMin[0] + 0.5f * size[0], aMin[1] + 0.3f * size[1],
	                                  aMin[2] + 0.5f * size[2]};
	const float dx = target[0] - view.myPosition[0];
	const float dy = target[1] - view.myPosition[1];
	const float dz = target[2] - view.myPosition[2];
	const float length = std::sqrt(dx * dx + dy * dy + dz * dz);
	if (length > 1e-3f)
	{
		// forward = (-sin yaw cos pitch, -sin pitch, cos yaw cos pitch)
		view.myYaw = std::atan2(-dx, dz);
		view.myPitch = std::asin(std::clamp(-dy / length, -1.0f, 1.0f));
	}
	return view;
}

// Collects the problems the engine reports on this thread while a call runs.
struct ProblemCollector
{
	static thread_local QStringList* ourActive;
	QStringList myProblems;
	ProblemCollector() { ourActive = &myProblems; }
	~ProblemCollector() { ourActive = nullptr; }
	ProblemCollector(const ProblemCollector&) = delete;
	ProblemCollector& operator=(const ProblemCollector&) = delete;
};
thread_local QStringList* ProblemCollector::ourActive = nullptr;
} // namespace

EngineThread::EngineThread(QObject* aParent) : QObject(aParent)
{
}

EngineThread::~EngineThread()
{
	Stop();
}

void EngineThread::Start(quint64 aWindow, QSize aSize)
{
	if (myThread.joinable())
	{
		return;
	}
	myStopFlag = false;
	LumoraWrapper::SetReportListener(
	    [this](int aLevel, const std::string& aFunction, const std::string& aText) {
		    const QString function = QString::fromStdString(aFunction);
		    const QString text = QString::fromStdString(aText);
		    if (aLevel >= ourProblemLevel && ProblemCollector::ourActive != nullptr)
		    {
			    ProblemCollector::ourActive->push_back(text);
		    }
		    // The listener is removed (Stop) before this object goes.
		    QMetaObject::invokeMethod(
		        this, [this, aLevel, function, text] { emit logReport(aLevel, function, text); },
		        Qt::QueuedConnection);
	    });
	// Nothing the engine reports ends the editor: the designer's work outlives a bad file.
	LumoraWrapper::SetFatalReportLevels(0);
	myThread = std::thread([this, aWindow, aSize] { Loop(aWindow, aSize); });
}

void EngineThread::Stop()
{
	if (!myThread.joinable())
	{
		return;
	}
	CancelBake();
	{
		std::lock_guard lock(myMutex);
		myStopFlag = true;
	}
	myWake.notify_all();
	myThread.join();
	LumoraWrapper::SetReportListener({});
}

void EngineThread::PostToUi(std::function<void()> aCall)
{
	QMetaObject::invokeMethod(this, std::move(aCall), Qt::QueuedConnection);
}

void EngineThread::Queue(Work aWork, bool aFrameFlag)
{
	{
		std::lock_guard lock(myMutex);
		myQueue.push_back(std::move(aWork));
		myFrameFlag = myFrameFlag || aFrameFlag;
	}
	myWake.notify_one();
}

bool EngineThread::HasWork() const
{
	return myStopFlag || !myQueue.empty() || myCamera || mySize || myFrameFlag ||
	       Clock::now() < mySettleUntil;
}

void EngineThread::Loop(quint64 aWindow, QSize aSize)
{
	if (!LumoraWrapper::Create(aWindow, std::max(1, aSize.width()), std::max(1, aSize.height())))
	{
		PostToUi(
		    [this] { emit started(false, tr("The engine could not start (see the log, DebugLogger.txt)")); });
		return;
	}
	LumoraWrapper& facade = *LumoraWrapper::GetInstance();
	PostToUi([this] { emit started(true, QString()); });
	auto lastFrame = Clock::now();
	for (;;)
	{
		std::deque<Work> work;
		std::optional<CameraPlacement> camera;
		std::optional<QSize> size;
		bool frameFlag = false;
		{
			std::unique_lock lock(myMutex);
			if (!HasWork())
			{
				myWake.wait(lock, [this] { return HasWork(); });
			}
			if (myStopFlag)
			{
				break;
			}
			work.swap(myQueue);
			// What was queued is about to run: a change from now on is queued anew.
			myPendingState.reset();
			camera = std::exchange(myCamera, std::nullopt);
			size = std::exchange(mySize, std::nullopt);
			frameFlag = std::exchange(myFrameFlag, false);
			if (frameFlag || camera || size)
			{
				mySettleUntil = Clock::now() + std::chrono::milliseconds(ourSettleMs);
			}
		}
		if (size)
		{
			facade.Resize(size->width(), size->height());
		}
		for (Work& item : work)
		{
			item(facade);
		}
		if (camera)
		{
			const auto& p = camera->myPosition;
			facade.PlaceCamera(Vector3<float>(p[0], p[1], p[2]), camera->myYaw, camera->myPitch);
		}
		const auto start = Clock::now();
		const float stepMs =
		    std::min(ourLongestStepMs, std::chrono::duration<float, std::milli>(start - lastFrame).count());
		facade.Update(stepMs);
		facade.Render();
		lastFrame = Clock::now();
		const double frameMs = std::chrono::duration<double, std::milli>(lastFrame - start).count();
		if (myFastCameraFlag && facade.IsFrameReduced())
		{
			const int divisor = NextMovingDivisor(myMovingDivisor, frameMs);
			if (divisor != myMovingDivisor)
			{
				myMovingDivisor = divisor;
				facade.SetInteractiveDivisor(divisor);
			}
		}
		const QSize drawn(facade.GetWidth(), facade.GetHeight());
		PostToUi([this, frameMs, drawn] { emit frameRendered(frameMs, drawn); });
	}
	LumoraWrapper::ShutDown();
}

void EngineThread::Resize(QSize aSize)
{
	{
		std::lock_guard lock(myMutex);
		mySize = aSize;
	}
	myWake.notify_one();
}

void EngineThread::SetCamera(const CameraPlacement& aCamera)
{
	{
		std::lock_guard lock(myMutex);
		myCamera = aCamera;
	}
	myWake.notify_one();
}

void EngineThread::RequestFrames()
{
	{
		std::lock_guard lock(myMutex);
		myFrameFlag = true;
	}
	myWake.notify_one();
}

void EngineThread::SetDisplay(const DisplayOptions& someOptions)
{
	Queue([this, someOptions](LumoraWrapper& aFacade) {
		aFacade.RenderMeshes(someOptions.myMeshesFlag);
		myFastCameraFlag = someOptions.myFastCameraFlag;
		aFacade.SetInteractiveDivisor(myFastCameraFlag ? myMovingDivisor : 1);
		aFacade.RenderRooms(someOptions.myRoomsFlag);
		aFacade.SetLightIconsFlag(someOptions.myLightIconsFlag);
		static constexpr LumoraWrapper::LightVolumes ourVolumes[] = {LumoraWrapper::LightVolumes::NONE,
		                                                             LumoraWrapper::LightVolumes::SELECTED,
		                                                             LumoraWrapper::LightVolumes::ALL};
		aFacade.SetLightVolumes(ourVolumes[std::clamp(someOptions.myLightVolumes, 0, 2)]);
	});
}

void EngineThread::Pick(float anX, float aY, std::function<void(const PickHits&)> aResult)
{
	Queue([this, anX, aY, aResult = std::move(aResult)](LumoraWrapper& aFacade) {
		PickHits hits;
		for (const LumoraWrapper::PickHit& hit : aFacade.PickAll(anX, aY))
		{
			hits.emplace_back(EditorKind(hit.myKind), hit.myIndex);
		}
		PostToUi([aResult, hits] { aResult(hits); });
	});
}

void EngineThread::LoadLevel(const QString& aLevel, std::function<void(const LevelSnapshot&)> aDone)
{
	Queue([this, aLevel, aDone = std::move(aDone)](LumoraWrapper& aFacade) {
		LevelSnapshot snapshot;
		snapshot.myLevel = aLevel;
		{
			ProblemCollector collector;
			aFacade.ParseLevel(ToU16(aLevel));
			snapshot.myProblems = collector.myProblems;
		}
		for (int kind = 0; kind < ourKindCount; ++kind)
		{
			const int count = FacadeCount(aFacade, static_cast<Kind>(kind));
			for (int index = 0; index < count; ++index)
			{
				snapshot.myObjects[kind].push_back(ReadObject(aFacade, static_cast<Kind>(kind), index));
			}
		}
		aFacade.Select(LumoraWrapper::ObjectKind::POINT_LIGHT, -1);
		Lumora::DecalTypeStruct types;
		aFacade.GetCurrentDecalTypes(types);
		for (const std::u16string& type : types.decalTypes)
		{
			snapshot.myDecalTypes.push_back(QString::fromStdU16String(type));
		}
		for (int index = 0; index < aFacade.GetRooms().Count(); ++index)
		{
			const Zeph::Room& room = *aFacade.GetRooms()[index];
			snapshot.myRoomIds.push_back(QString::fromStdString(room.GetID()));
			snapshot.myRoomBounds.push_back({{room.GetMin().x, room.GetMin().y, room.GetMin().z},
			                                 {room.GetMax().x, room.GetMax().y, room.GetMax().z}});
		}
		Vector3<float> position;
		aFacade.GetCameraPlacement(position, snapshot.myStartView.myYaw, snapshot.myStartView.myPitch);
		snapshot.myStartView.myPosition = {position.x, position.y, position.z};
		if (aFacade.GetRooms().Count() > 0)
		{
			const Zeph::Room& room = *aFacade.GetRooms()[0];
			snapshot.myStartView = ViewIntoRoom({room.GetMin().x, room.GetMin().y, room.GetMin().z},
			                                    {room.GetMax().x, room.GetMax().y, room.GetMax().z});
		}
		PostToUi([aDone, snapshot] { aDone(snapshot); });
	});
}

void EngineThread::Save(const QString& aLevel, std::function<void(const QStringList&)> aDone)
{
	Queue(
	    [this, aLevel, aDone = std::move(aDone)](LumoraWrapper& aFacade) {
		    ProblemCollector collector;
		    aFacade.SaveLights(ToU16(aLevel));
		    aFacade.SaveDecals(ToU16(aLevel));
		    const QStringList problems = collector.myProblems;
		    PostToUi([aDone, problems] { aDone(problems); });
	    },
	    false);
}

void EngineThread::UpdateSsao(float aScale, float aSampleRadius, float aBias, float anIntensity)
{
	Queue([=](LumoraWrapper& aFacade) { aFacade.UpdateSSAO(aScale, aSampleRadius, aBias, anIntensity); });
}

void EngineThread::UpdateHdrAndBloom(float anAutoExposure, float aLumMin, float aLumMax,
                                     float aBloomThreshold, float aBloomFactor, float anEmissiveMultiplier)
{
	Queue([=](LumoraWrapper& aFacade) {
		aFacade.UpdateHDRandBloom(anAutoExposure, aLumMin, aLumMax, aBloomThreshold, aBloomFactor,
		                          anEmissiveMultiplier);
	});
}

void EngineThread::Bake(const BakeRequest& aRequest, std::function<void(BakeOutcome, const QString&)> aDone)
{
	Queue([this, aRequest, aDone = std::move(aDone)](LumoraWrapper& aFacade) {
		const std::u16string level = ToU16(aRequest.myLevel);
		std::vector<std::string> rooms;
		for (const QString& room : aRequest.myRoomIds)
		{
			rooms.push_back(room.toStdString());
		}
		BakeOutcome outcome = BakeOutcome::FINISHED;
		QStringList messages;
		ProblemCollector collector;
		const auto ended = [&]() {
			const Zeph::BakeStatus status = aFacade.GetBakeStatus();
			if (!status.myLastMessage.empty())
			{
				messages.push_back(QString::fromStdString(status.myLastMessage));
			}
			if (status.myLastResult == Zeph::BakeResult::CANCELLED)
			{
				outcome = BakeOutcome::CANCELLED;
			}
			else if (status.myLastResult != Zeph::BakeResult::FINISHED)
			{
				outcome = BakeOutcome::FAILED;
			}
			return outcome == BakeOutcome::FINISHED;
		};
		std::string problem;
		bool goOnFlag = true;
		if (aRequest.myAmbientFlag)
		{
			if (rooms.empty())
			{
				aFacade.BakeAmbient(level, aRequest.myBounces, false);
			}
			else if (!aFacade.BakeAmbientRooms(level, aRequest.myBounces, rooms, problem) && !problem.empty())
			{
				messages.push_back(QString::fromStdString(problem));
			}
			goOnFlag = ended();
		}
		if (goOnFlag && aRequest.myReflectionsFlag)
		{
			problem.clear();
			if (rooms.empty())
			{
				aFacade.BakeSpecular(level);
			}
			else if (!aFacade.BakeSpecularRooms(level, rooms, problem) && !problem.empty())
			{
				messages.push_back(QString::fromStdString(problem));
			}
			ended();
		}
		if (outcome == BakeOutcome::FAILED)
		{
			messages += collector.myProblems;
		}
		messages.removeDuplicates();
		const QString message = messages.join(QStringLiteral("\n"));
		PostToUi([aDone, outcome, message] { aDone(outcome, message); });
	});
}

void EngineThread::CancelBake()
{
	if (LumoraWrapper* facade = LumoraWrapper::GetInstance())
	{
		facade->CancelBake();
	}
}

BakeProgress EngineThread::GetBakeProgress() const
{
	const LumoraWrapper* facade = LumoraWrapper::GetInstance();
	return facade != nullptr ? facade->GetBakeStatus() : BakeProgress();
}

void EngineThread::Run(std::function<void(LumoraWrapper&)> aWork, std::function<void()> aDone)
{
	Queue([this, aWork = std::move(aWork), aDone = std::move(aDone)](LumoraWrapper& aFacade) {
		aWork(aFacade);
		if (aDone)
		{
			PostToUi(aDone);
		}
	});
}

void EngineThread::AddObject(const ObjectState& aState)
{
	Queue([aState](LumoraWrapper& aFacade) {
		const int before = FacadeCount(aFacade, aState.myKind);
		switch (aState.myKind)
		{
		case Kind::POINT_LIGHT:
			aFacade.AddPointLight();
			break;
		case Kind::SPOT_LIGHT:
			aFacade.AddSpotLight();
			break;
		case Kind::DECAL:
			aFacade.AddDecal();
			break;
		case Kind::PATH_NODE:
			aFacade.AddPathNode();
			break;
		}
		if (FacadeCount(aFacade, aState.myKind) == before + 1)
		{
			WriteObject(aFacade, before, aState);
		}
	});
}

void EngineThread::ApplyState(int anIndex, const ObjectState& aState)
{
	{
		std::lock_guard lock(myMutex);
		if (myPendingState && myPendingPlace + 1 == myQueue.size() &&
		    myPendingState->myKind == aState.myKind && myPendingState->myIndex == anIndex)
		{
			myPendingState->myState = aState;
			myFrameFlag = true;
			return;
		}
		auto pending = std::make_shared<PendingState>(PendingState{aState.myKind, anIndex, aState});
		myPendingState = pending;
		myPendingPlace = myQueue.size();
		myQueue.push_back([this, pending](LumoraWrapper& aFacade) {
			ObjectState state;
			{
				std::lock_guard valuesLock(myMutex);
				state = pending->myState;
			}
			WriteObject(aFacade, pending->myIndex, state);
		});
		myFrameFlag = true;
	}
	myWake.notify_one();
}

void EngineThread::RemoveObject(Kind aKind, int anIndex)
{
	Queue([aKind, anIndex](LumoraWrapper& aFacade) {
		if (!aFacade.Select(FacadeKind(aKind), anIndex))
		{
			return;
		}
		switch (aKind)
		{
		case Kind::POINT_LIGHT:
			aFacade.RemoveSelectedPointLight();
			break;
		case Kind::SPOT_LIGHT:
			aFacade.RemoveSelectedSpotLight();
			break;
		case Kind::DECAL:
			aFacade.RemoveSelectedDecal();
			break;
		case Kind::PATH_NODE:
			aFacade.RemoveSelectedNode();
			break;
		}
	});
}

void EngineThread::SelectObject(Kind aKind, int anIndex)
{
	Queue([aKind, anIndex](LumoraWrapper& aFacade) { aFacade.Select(FacadeKind(aKind), anIndex); });
}
} // namespace LumoraEditor
