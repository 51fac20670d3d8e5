// Host stand-in services the module relies on.
#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <random>

#include "ZonCldPointArray.h"
#include "ZonCldSettings.h"
#include "ZonError.h"
#include "ZonICkeUnit.h"
#include "ZonMath.h"
#include "ZonObjectRegistry.h"
#include "ZonUnicodeString.h"

namespace {

TEST(HostMath, TransformationInverseAndIdentity)
{
    EXPECT_TRUE(ZonMathTransformation().IsIdentity());
    const ZonMathTransformation t({0, -2, 0, 1, 0, 0, 0, 0, 3}, {5, -1, 2});
    EXPECT_FALSE(t.IsIdentity());
    const ZonMathTransformation inverse = t.ComputeInverse();
    const ZonMathPoint p(1.5, -2.0, 7.0);
    const ZonMathPoint back = inverse.Apply(t.Apply(p));
    EXPECT_NEAR(back.DistanceTo(p), 0.0, 1e-12);
    EXPECT_TRUE((inverse * t).IsIdentity());
    EXPECT_THROW(ZonMathTransformation({1, 2, 3, 2, 4, 6, 0, 0, 1}, {0, 0, 0}).ComputeInverse(), ZonError);
}

TEST(HostMath, BoxIntersectionAndSameness)
{
    ZonMathBox empty;
    EXPECT_TRUE(empty.IsEmpty());
    ZonMathBox a(0, 1, 0, 1, 0, 1);
    EXPECT_TRUE(a.Intersects(ZonMathBox(1, 2, 1, 2, 1, 2)));  // touching faces meet
    EXPECT_FALSE(a.Intersects(ZonMathBox(1.5, 2, 0, 1, 0, 1)));
    EXPECT_TRUE(a.Intersects(ZonMathBox(1.5, 2, 0, 1, 0, 1), 0.5));
    EXPECT_FALSE(a.Intersects(empty));
    EXPECT_TRUE(a.IsSameAs(ZonMathBox(0, 1, 0, 1, 0, 1)));
    EXPECT_FALSE(a.IsSameAs(ZonMathBox(0, 1, 0, 1, 0, 1.0000001)));
    empty.AddPoint(3, -1, 2);
    empty.AddPoint(-3, 1, 0);
    EXPECT_TRUE(empty.IsSameAs(ZonMathBox(-3, 3, -1, 1, 0, 2)));
}

// The box of a point array leaves out whole points with a coordinate that is
// not finite, wherever they fall among the others, in both precisions.
TEST(HostMath, PointArrayBoxSkipsPointsThatAreNotFinite)
{
    const float inf = std::numeric_limits<float>::infinity(), nan = std::nanf("");
    for (std::size_t count : {1u, 4u, 5u, 9u, 103u}) {
        for (std::size_t odd = 0; odd < count; odd += 3) {
            std::vector<float> xyz;
            for (std::size_t i = 0; i < count; ++i)
                xyz.insert(xyz.end(), {float(i), -float(i), 0.5f * float(i)});
            xyz[3 * odd + odd % 3] = odd % 2 ? inf : nan;  // point `odd` takes no part
            ZonCldPointArray floats, doubles;
            floats.AdoptScaled(std::vector<float>(xyz), 1.0);
            doubles.AssignScaled(std::vector<double>(xyz.begin(), xyz.end()).data(), count, 1.0);
            const double first = odd == 0 ? 1 : 0, last = odd == count - 1 ? double(count) - 2 : double(count) - 1;
            // The same box when the point is left out by its flag instead, whatever it holds.
            std::vector<unsigned char> flags(count, 1);
            flags[odd] = 0;
            xyz[3 * odd] = odd % 2 ? 1e30f : nan;
            ZonCldPointArray flagged;
            flagged.AdoptScaled(std::move(xyz), 1.0);
            ZonMathBox flaggedBox;
            flagged.AddToBox(flaggedBox, flags.data());
            if (count > 1) {
                EXPECT_TRUE(flaggedBox.IsSameAs(ZonMathBox(first, last, -last, -first, 0.5 * first, 0.5 * last)));
            }
            for (const ZonCldPointArray* points : {&floats, &doubles}) {
                ZonMathBox box;
                points->AddToBox(box);
                if (count == 1) {
                    EXPECT_TRUE(box.IsEmpty());
                    continue;
                }
                EXPECT_TRUE(box.IsSameAs(ZonMathBox(first, last, -last, -first, 0.5 * first, 0.5 * last)))
                    << count << " points, point " << odd;
            }
        }
    }
}

// Flags in every pattern over groups of points, against a plain walk: a
// point whose flag is clear never widens the box, however far out it lies.
TEST(HostMath, PointArrayBoxFollowsTheFlagsOfEveryPoint)
{
    std::mt19937 random(5);
    for (int round = 0; round < 200; ++round) {
        const std::size_t count = 1 + random() % 40;
        std::vector<float> xyz;
        std::vector<unsigned char> flags;
        ZonMathBox expected;
        for (std::size_t i = 0; i < count; ++i) {
            const bool kept = random() % 3 != 0;
            const float scale = kept ? 1.0f : 1e6f;
            const float p[3] = {scale * float(int(random() % 201) - 100), scale * float(int(random() % 201) - 100),
                                scale * float(int(random() % 201) - 100)};
            xyz.insert(xyz.end(), p, p + 3);
            flags.push_back(kept ? static_cast<unsigned char>(1 + random() % 255) : 0);
            if (kept) expected.AddPoint(p[0], p[1], p[2]);
        }
        ZonCldPointArray points;
        points.AdoptScaled(std::move(xyz), 1.0);
        ZonMathBox box;
        points.AddToBox(box, flags.data());
        EXPECT_EQ(box.IsEmpty(), expected.IsEmpty()) << "round " << round;
        if (!expected.IsEmpty()) {
            EXPECT_TRUE(box.IsSameAs(expected)) << "round " << round;
        }
    }
}

TEST(HostRegistry, ImplementersAreListedInAStableOrderAndCreatedByName)
{
    struct Thing : ZonBaseUnknown {};
    ZonObjectRegistry::Register("ThingB", "ITestThing", [] { return std::make_shared<Thing>(); });
    ZonObjectRegistry::Register("ThingA", "ITestThing", [] { return std::make_shared<Thing>(); });
    ZonObjectRegistry::Register("ThingA", "ITestThing", [] { return std::make_shared<Thing>(); });
    EXPECT_EQ(ZonObjectRegistry::ListImplementations("ITestThing"), (std::vector<std::string>{"ThingA", "ThingB"}));
    EXPECT_NE(ZonObjectRegistry::CreateByLateType("ThingB"), nullptr);
    EXPECT_EQ(ZonObjectRegistry::CreateByLateType("NoSuchThing"), nullptr);
    EXPECT_FALSE(ZonObjectRegistry::IsInterfaceKnown("INoSuchInterface"));
}

TEST(HostSettings, DefaultsTypedValuesAndReset)
{
    auto& settings = ZonCldSettings::Instance();
    settings.ResetAll();
    EXPECT_EQ(settings.GetImportScaleFactor(), 1.0);
    EXPECT_EQ(settings.GetImportSampling(), 100.0);
    EXPECT_EQ(settings.GetImportFileUnit(), "mm");
    EXPECT_TRUE(settings.GetBool("ImportSTLFacets", true));
    settings.SetImportSampling(12.5);
    settings.SetBool("ImportSTLFacets", false);
    settings.SetValue("ScanDirection", "junk");
    EXPECT_EQ(settings.GetImportSampling(), 12.5);
    EXPECT_FALSE(settings.GetBool("ImportSTLFacets", true));
    EXPECT_EQ(settings.GetInt("ScanDirection", 7), 7);
    settings.ResetAll();
    EXPECT_TRUE(settings.GetBool("ImportSTLFacets", true));
    auto& preferences = ZonPreferenceRepository::Get("ImportOptions");
    preferences.WritePreference("CreateTriangles", "1");
    EXPECT_EQ(ZonPreferenceRepository::Get("ImportOptions").ReadPreference("CreateTriangles"), "1");
    preferences.Clear();
}

TEST(HostText, UnitsAndStrings)
{
    ASSERT_NE(ZonICkeUnit::FromName("inch"), nullptr);
    EXPECT_EQ(ZonICkeUnit::FromName("INCH")->ToMillimetres(), 25.4);
    EXPECT_EQ(ZonICkeUnit::FromName("furlong"), nullptr);
    const ZonUnicodeString path("/Data/Scan.ASC");
    EXPECT_EQ(path.SearchBackward('.'), 10);
    EXPECT_EQ(path.SubString(10).ToLower().ToUtf8(), ".asc");
}

}  // namespace
