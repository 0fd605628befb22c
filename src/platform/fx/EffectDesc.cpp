#include "platform/fx/EffectDesc.h"

#include <algorithm>

namespace Fx
{
bool VariableDesc::operator==(const VariableDesc& anOther) const
{
	const Gpu::SamplerDesc& a = mySampler;
	const Gpu::SamplerDesc& b = anOther.mySampler;
	const bool samplerEqualFlag =
	    a.myFilter == b.myFilter && a.myAddressU == b.myAddressU && a.myAddressV == b.myAddressV &&
	    a.myAddressW == b.myAddressW && a.myMipLodBias == b.myMipLodBias &&
	    a.myMaxAnisotropy == b.myMaxAnisotropy && a.myComparisonFlag == b.myComparisonFlag &&
	    a.myComparison == b.myComparison &&
	    std::equal(a.myBorderColor, a.myBorderColor + 4, b.myBorderColor) && a.myMinLod == b.myMinLod &&
	    a.myMaxLod == b.myMaxLod;
	return samplerEqualFlag && myName == anOther.myName && myType == anOther.myType &&
	       myElementCount == anOther.myElementCount && myUnit == anOther.myUnit;
}
} // namespace Fx
