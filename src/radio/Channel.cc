#include "radio/Channel.h"

#include "platform/NumberText.h"

namespace radio {

std::string megahertzText(std::uint32_t kHz) {
  std::string text;
  platform::appendDecimal(text, kHz / 1000);
  text += '.';
  std::uint32_t fraction = kHz % 1000;
  for (int place = 0; place < 3 && (place == 0 || fraction != 0); ++place) {
    text += static_cast<char>('0' + fraction / 100);
    fraction = fraction % 100 * 10;
  }
  return text;
}

}  // namespace radio
