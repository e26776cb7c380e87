#include "board/base/BoardDevio.h"

namespace panelglow {

CDevio& BoardDevio() {
  static CDevio devio;
  return devio;
}

}  // namespace panelglow
