#pragma once
// PostProcessingPanel: the ambient-occlusion and exposure/bloom settings of the renderer, to
// tune while looking at the level. It starts from the settings files (see
// PostProcessingSettings), applies changes live (the spin boxes of one event-loop turn make one
// call to the engine per group) and puts the files' values back on "Reset to file". It does not
// write the files.
#include <QWidget>

#include "panels/PostProcessingSettings.h"

class QDoubleSpinBox;
class QLabel;

namespace LumoraEditor
{
class EngineThread;

class PostProcessingPanel : public QWidget
{
	Q_OBJECT

public:
	explicit PostProcessingPanel(EngineThread& anEngine, QWidget* aParent = nullptr);

	// What the panel shows (and the engine was last given, once pending calls have gone).
	PostProcessingSettings GetSettings() const;
	// Shows the values and applies them (one call per group on the next event-loop turn).
	void SetSettings(const PostProcessingSettings& someSettings);
	// Reads the files again (relative to the working directory) and applies their values.
	void ResetToFile();

private:
	// Shows the files' values; false when something in them could not be read (see the note).
	bool Load();
	void ShowValues(const PostProcessingSettings& someSettings);
	void ScheduleApply(bool anSsaoFlag);
	void Apply();

	EngineThread& myEngine;
	QDoubleSpinBox* mySsaoScale = nullptr;
	QDoubleSpinBox* mySsaoSampleRadius = nullptr;
	QDoubleSpinBox* mySsaoBias = nullptr;
	QDoubleSpinBox* mySsaoIntensity = nullptr;
	QDoubleSpinBox* myAutoExposure = nullptr;
	QDoubleSpinBox* myLumMin = nullptr;
	QDoubleSpinBox* myLumMax = nullptr;
	QDoubleSpinBox* myBloomThreshold = nullptr;
	QDoubleSpinBox* myBloomFactor = nullptr;
	QDoubleSpinBox* myEmissiveMultiplier = nullptr;
	QLabel* myNote = nullptr;
	bool mySsaoPendingFlag = false;
	bool myHdrPendingFlag = false;
};
} // namespace LumoraEditor
