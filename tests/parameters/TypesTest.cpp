// The registry handle: the bags it makes, clearing a bag, and the publication of error texts.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "Nimbo/Context.h"
#include "Nimbo/ResultCodes.h"
#include "Tarn/Parameters.h"
#include "Tarn/Types.h"
#include "Tarn/TypesImpl.h"
#include "parameters/ErrorCapture.h"
#include "parameters/KindSamples.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {
namespace {

using Testing::PublishedError;

TEST(TypesTest, CreatedBagIsEmptyPlainAndPublishesThroughTheRegistry) {
    Testing::ErrorCapture errors;
    Nimbo::Context context;
    Types types(context);
    Parameters p = types.CreateParameters();
    EXPECT_TRUE(p.IsEmpty());
    EXPECT_EQ("Parameters", p.GetObjectType());
    int out = 0;
    EXPECT_EQ(E_FAIL, p.ReadInt32("a b", out));
    types.GetImpl().PublishError("any text, unchanged <>\n");
    EXPECT_EQ((std::vector<PublishedError>{
                  {"Parameters::ReadInt32() unknown property <a b>", "TarnCommandBinder"},
                  {"any text, unchanged <>\n", "TarnCommandBinder"}}),
              errors.Errors());
}

TEST(TypesTest, ClearParametersEmptiesEveryKindAndResetsTheObjectTypeButKeepsTheLink) {
    Testing::ErrorCapture errors;
    Nimbo::Context context;
    Types types(context);
    Parameters defaults(types);
    defaults.WriteInt32("d", 3);
    Parameters p(types);
    for (const Testing::KindSample& row : Testing::OneSamplePerKind()) row.write(p, row.kind);
    ParametersInternal::Impl(p).GetOrCreateObjectArray("empty", "Point");
    ParametersInternal::Impl(p).SetObjectType("Point");
    ParametersInternal::Impl(p).SetDefaults(&defaults);

    types.GetImpl().ClearParameters(p);
    EXPECT_TRUE(p.IsEmpty());
    EXPECT_EQ("Parameters", p.GetObjectType());
    EXPECT_FALSE(p.HasOwnTarnProperty("int32"));
    int d = 0;
    EXPECT_EQ(S_OK, p.ReadInt32("d", d));
    EXPECT_EQ(3, d);
}

}  // namespace
}  // namespace Tarn
