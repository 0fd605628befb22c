#include "bake/BakeRunner.h"

#include <QPointer>
#include <QTimer>
#include <cmath>
#include <utility>

#include "bridge/EngineThread.h"

namespace LumoraEditor
{
BakeRunner::BakeRunner(EngineThread& anEngine, QObject* aParent)
    : BakeRunner(Backend{[&anEngine](const BakeRequest& aRequest,
                                     std::function<void(BakeOutcome, const QString&)> aDone) {
	                         anEngine.Bake(aRequest, std::move(aDone));
                         },
                         [&anEngine] { anEngine.CancelBake(); },
                         [&anEngine] { return anEngine.GetBakeProgress(); }},
                 aParent)
{
}

BakeRunner::BakeRunner(Backend aBackend, QObject* aParent) : QObject(aParent), myBackend(std::move(aBackend))
{
	myPollTimer = new QTimer(this);
	myPollTimer->setInterval(ourPollMs);
	connect(myPollTimer, &QTimer::timeout, this, &BakeRunner::Poll);
}

double BakeRunner::GetElapsedSeconds() const
{
	return IsRunning() ? static_cast<double>(myClock.elapsed()) / 1000.0 : myLastSeconds;
}

bool BakeRunner::Start(const BakeRequest& aRequest)
{
	if (IsRunning() || (!aRequest.myAmbientFlag && !aRequest.myReflectionsFlag) || aRequest.myLevel.isEmpty())
	{
		return false;
	}
	myRequest = aRequest;
	myProgress = BakeProgress();
	myCancelFlag = false;
	myClock.start();
	SetState(State::RUNNING);
	myPollTimer->start();
	// The runner may be gone by the time a long bake ends.
	QPointer<BakeRunner> self(this);
	myBackend.myBake(aRequest, [self](BakeOutcome anOutcome, const QString& aMessage) {
		if (self)
		{
			self->OnDone(anOutcome, aMessage);
		}
	});
	return true;
}

void BakeRunner::Cancel()
{
	if (!IsRunning() || myCancelFlag)
	{
		return;
	}
	myCancelFlag = true;
	myBackend.myCancel();
}

void BakeRunner::Poll()
{
	if (!IsRunning())
	{
		return;
	}
	myProgress = myBackend.myProgress();
	if (myCancelFlag && myProgress.myPhase != Zeph::BakePhase::IDLE)
	{
		myBackend.myCancel();
	}
	emit progressChanged(myProgress);
}

void BakeRunner::OnDone(BakeOutcome anOutcome, const QString& aMessage)
{
	if (!IsRunning())
	{
		return;
	}
	myPollTimer->stop();
	myLastSeconds = static_cast<double>(myClock.elapsed()) / 1000.0;
	myProgress = myBackend.myProgress();
	switch (anOutcome)
	{
	case BakeOutcome::FINISHED:
		SetState(State::FINISHED);
		break;
	case BakeOutcome::CANCELLED:
		SetState(State::CANCELLED);
		break;
	case BakeOutcome::FAILED:
		SetState(State::FAILED);
		break;
	}
	myCancelFlag = false;
	emit finished(anOutcome, aMessage);
}

void BakeRunner::SetState(State aState)
{
	if (myState == aState)
	{
		return;
	}
	myState = aState;
	emit stateChanged(aState);
}

QString BakeRunner::DescribeSeconds(double aSeconds)
{
	const long long seconds = std::llround(std::max(0.0, aSeconds));
	if (seconds < 60)
	{
		return tr("%1 s").arg(seconds);
	}
	if (seconds < 3600)
	{
		return tr("%1 min %2 s").arg(seconds / 60).arg(seconds % 60, 2, 10, QLatin1Char('0'));
	}
	return tr("%1 h %2 min").arg(seconds / 3600).arg((seconds % 3600) / 60, 2, 10, QLatin1Char('0'));
}

QString BakeRunner::Describe(const BakeProgress& aProgress)
{
	if (aProgress.myPhase == Zeph::BakePhase::IDLE)
	{
		return QString();
	}
	QStringList parts;
	QString phase;
	if (aProgress.myPhase == Zeph::BakePhase::AMBIENT)
	{
		phase = tr("Ambient");
		if (aProgress.myBounceCount > 0)
		{
			parts << tr("bounce %1/%2").arg(aProgress.myBounce).arg(aProgress.myBounceCount);
		}
		if (aProgress.myProbesTotal > 0)
		{
			parts << tr("%1/%2 probes").arg(aProgress.myProbesDone).arg(aProgress.myProbesTotal);
		}
	}
	else if (aProgress.myPhase == Zeph::BakePhase::REFLECTIONS)
	{
		phase = tr("Reflections");
		if (aProgress.myRoomsTotal > 0)
		{
			parts << tr("%1/%2 rooms").arg(aProgress.myRoomsDone).arg(aProgress.myRoomsTotal);
		}
	}
	else
	{
		phase = tr("Preparing");
	}
	parts << (aProgress.mySecondsLeft >= 0.0
	              ? tr("about %1 left").arg(DescribeSeconds(aProgress.mySecondsLeft))
	              : tr("%1 so far").arg(DescribeSeconds(aProgress.myElapsedSeconds)));
	return phase + QStringLiteral(": ") + parts.join(QStringLiteral(", "));
}
} // namespace LumoraEditor
