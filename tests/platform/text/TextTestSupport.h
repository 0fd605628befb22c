#pragma once
// Shared by the text suites: a FreeType instance, and the reports the layer makes collected.

#include "platform/ReportTest.h"
#include "platform/text/Factory.h"

class TextReportTest : public ReportTest
{
protected:
	void SetUp() override
	{
		ReportTest::SetUp();
		ASSERT_TRUE(myFactory.Init());
	}

	void TearDown() override
	{
		myFactory.Destroy();
		ReportTest::TearDown();
	}

	Glyphs::Factory myFactory;
};
