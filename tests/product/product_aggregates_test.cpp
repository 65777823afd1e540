#include "product/product_aggregates.h"

#include <gtest/gtest.h>

#include <cmath>

#include "record_test_util.h"

namespace {

// Orbit members are classes of the orbit library: stand-ins here.
class StubOrbit : public GeneralSAR_Base {
 public:
  int destroyBuffers() override {
    ++destroyed;
    return 0;
  }
  int destroyed = 0;
};

class StubSlots : public GeneralSAROrbitSlots {
 public:
  std::unique_ptr<GeneralSAR_Base> makeStateVectors() const override {
    return std::make_unique<StubOrbit>();
  }
  std::unique_ptr<GeneralSAR_Base> makeOrbit() const override {
    return std::make_unique<StubOrbit>();
  }
  void setLambda(GeneralSAR_Base&, double) const override {}
  void setOrbitLookSign(GeneralSAR_Base&, int) const override {}
  void setStateVectorsLookSign(GeneralSAR_Base&, int) const override {}
  void destroyOrbit(GeneralSAR_Base& o) const override { o.destroyBuffers(); }
  void destroyStateVectors(GeneralSAR_Base& o) const override { o.destroyBuffers(); }
};
const StubSlots kSlots;

TEST(ProductAggregates, EquivalentSpeedFromRatePolynomial) {
  ImageSARData_Obj img(kSlots);
  const double c = 299792458.0;
  img.sampling.fc_hz = 5.3e9;
  img.sampling.frg_hz = 18.96e6;
  img.dataFile.NrOfPixelsPerLine = 5000;
  const double lambda = c / 5.3e9;
  const double T = 5000 / 18.96e6;
  const double tau0 = 5.5e-3;
  img.roi.SetFastAxe(tau0, 1 / 18.96e6, 5000);
  const double V = 7000.0;
  // Azimuth FM rate of a straight flight: -4 V^2 / (lambda c tau).
  const auto ka = [&](double tau) { return -4 * V * V / (lambda * c * tau); };
  img.polynomials.CreatePolys(1, 1);
  img.polynomials.FR[0].trg0 = tau0;
  img.polynomials.FR[0].c[0] = ka(tau0);
  img.polynomials.FR[0].c[1] = (ka(tau0 + T) - ka(tau0)) / T;
  img.polynomials.DC[0].taz0 = 1000.0;
  ASSERT_EQ(img.compute_eqspeed(), 0);
  EXPECT_NEAR(img.attitude.Eq_speed, V, 1e-6 * V);
  EXPECT_NEAR(img.attitude.Eq_distance, c * tau0 / 2, 1e-3);

  // A Doppler centroid adds (lambda fdc / 2)^2 and tilts the distance.
  img.polynomials.DC[0].c[0] = 400.0;
  ASSERT_EQ(img.compute_eqspeed(), 0);
  const double u = lambda * 400.0 / 2;
  const double V2 = std::sqrt(V * V + u * u);
  EXPECT_NEAR(img.attitude.Eq_speed, V2, 1e-6 * V);
  EXPECT_NEAR(img.attitude.Eq_distance, c * tau0 / 2 * V / V2, 1e-3);

  // Equal rates divide by zero: an infinite value, nothing guarded.
  img.polynomials.FR[0].c[1] = 0.0;
  img.polynomials.DC[0].c[0] = 0.0;
  img.compute_eqspeed();
  EXPECT_TRUE(std::isinf(img.attitude.Eq_speed));
  EXPECT_TRUE(std::isinf(img.attitude.Eq_distance));

  ImageSARData_Obj empty(kSlots);
  testing::internal::CaptureStderr();
  EXPECT_EQ(empty.compute_eqspeed(), 10);
  testing::internal::GetCapturedStderr();
}

TEST(ProductAggregates, ProcessedBandwidth) {
  SamplingConstants_Obj s;
  s.Brg_hz = 15.55e6;
  s.Baz_hz = 1378.0;
  SpectralWindows_Obj w;
  w.RgMatchedFilterCoef = 0.0;
  w.AzMatchedFilterCoef = 0.75;
  w.RgLookBandwidth = 10e6;
  w.AzLookBandwidth = 1200.0;
  double r = 0, a = 0;
  ASSERT_EQ(GetProcessedBandwidth(s, w, &r, &a), 0);
  EXPECT_EQ(r, 15.55e6);
  EXPECT_EQ(a, 1200.0);
  w.RgMatchedFilterCoef = 0.75;
  w.AzLookBandwidth = 2000.0;
  GetProcessedBandwidth(&s, &w, &r, &a);
  EXPECT_EQ(r, 10e6);
  EXPECT_EQ(a, 1378.0);
}

}  // namespace
