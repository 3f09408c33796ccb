// Copies of a bag are deep and carry no defaults link.
#include <gtest/gtest.h>

#include <memory>

#include "Nimbo/Context.h"
#include "Nimbo/ResultCodes.h"
#include "Tarn/Parameters.h"
#include "Tarn/Types.h"
#include "parameters/ErrorCapture.h"
#include "parameters/KindSamples.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {
namespace {

using Testing::KindSample;

class ParametersCopyTest : public ::testing::Test {
protected:
    ParametersImpl& Impl(Parameters& p) { return ParametersInternal::Impl(p); }

    Testing::ErrorCapture errors;
    Nimbo::Context context;
    Types types{context};
};

TEST_F(ParametersCopyTest, CopyOutlivesItsSourceWithEveryKind) {
    auto source = std::make_unique<Parameters>(types);
    for (const KindSample& row : Testing::OneSamplePerKind()) row.write(*source, row.kind);
    Impl(*source).SetObjectType("Point");
    Parameters copy(*source);
    source.reset();
    EXPECT_EQ("Point", copy.GetObjectType());
    for (const KindSample& row : Testing::OneSamplePerKind()) {
        SCOPED_TRACE(row.kind);
        EXPECT_EQ(S_OK, row.read(copy, row.kind));
    }
}

TEST_F(ParametersCopyTest, CopyHasNoDefaultsLink) {
    Parameters defaults(types);
    defaults.WriteInt32("d", 1);
    Parameters linked(types);
    Impl(linked).SetDefaults(&defaults);
    Parameters copy(linked);
    EXPECT_TRUE(linked.Exists("d"));
    EXPECT_FALSE(copy.Exists("d"));
    EXPECT_EQ(nullptr, Impl(copy).GetDefaults());
    int d = 0;
    EXPECT_EQ(E_FAIL, copy.ReadInt32("d", d));
}

TEST_F(ParametersCopyTest, EmptyBagCopyKeepsObjectTypeAndRecordedElementType) {
    Parameters typed(types);
    Impl(typed).SetObjectType("Point");
    Parameters copy(typed);
    EXPECT_TRUE(copy.IsEmpty());
    EXPECT_EQ("Point", copy.GetObjectType());

    Impl(typed).GetOrCreateObjectArray("a", "Point");
    Parameters withArray(typed);
    ZelUnicodeString type;
    EXPECT_TRUE(withArray.HasOwnTarnProperty("a", type));
    EXPECT_EQ("Point[]", type);
}

}  // namespace
}  // namespace Tarn
