#pragma once

#include <functional>
#include <type_traits>

#include "framework/layout/CViewBuilder.h"
#include "framework/layout/CViewProxy.h"
#include "framework/layout/CZilGenerator.h"

namespace Tarsa {

// The builder of a pane class T. A class made as T(id, parent, frame)
// needs nothing more than the template; others give a factory, and any
// class may add its own configuration and the size its content needs.
template <class T>
class CPaneBuilder : public CViewBuilder {
 public:
  using Factory = std::function<T*(CView* parent, CZilGenerator& generator)>;
  using Configurer = std::function<void(T& view, CZilGenerator& generator)>;
  using Sizer = std::function<CSize(const CViewProxy& proxy)>;

  explicit CPaneBuilder(Factory factory = {}, Configurer configure = {}, Sizer size = {})
      : factory_(std::move(factory)), configure_(std::move(configure)), size_(std::move(size)) {}

  CView* Construct(CView* parent, CZilGenerator& generator) override {
    if (factory_) return factory_(parent, generator);
    if constexpr (std::is_constructible_v<T, CObjID, CView*, CRect>) {
      return new T(generator.ViewId(), parent, generator.Frame());
    } else {
      return nullptr;
    }
  }
  void Configure(CView& view, CZilGenerator& generator) override {
    CViewBuilder::Configure(view, generator);
    if (configure_) {
      if (auto* pane = dynamic_cast<T*>(&view)) configure_(*pane, generator);
    }
  }
  CSize NaturalSize(const CViewProxy& proxy) const override {
    return size_ ? size_(proxy) : CSize{};
  }

 private:
  Factory factory_;
  Configurer configure_;
  Sizer size_;
};

}  // namespace Tarsa
