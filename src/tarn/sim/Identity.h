#pragma once

#include <string>
#include <string_view>

#include "platform/Value.h"
#include "tarn/sim/Network.h"
#include "tarn/sim/Random.h"

namespace tarn::sim {

// The subscription on the SIM.
struct Subscriber {
  std::string imsi;   // MCC, MNC and a 10-digit MSIN
  std::string iccid;  // 19 digits, the last a Luhn check digit
};

Subscriber makeSubscriber(const Plmn& home, Random& random);

// Identities in the binary forms of the NAS messages and SIM files.
namespace identity {

// MCC and MNC as three BCD bytes: MCC2 MCC1, MNC3 MCC3, MNC2 MNC1 (F for a 2-digit MNC).
platform::Bytes encodePlmn(const Plmn& plmn);
// The IMSI as a mobile identity: length, then digits two to a byte, low nibble first, with
// the first nibble holding the odd-length IMSI type (9).
platform::Bytes encodeImsi(std::string_view imsi);
// Digits two to a byte, low nibble first, padded with F to `size` bytes.
platform::Bytes encodeSwappedBcd(std::string_view digits, std::size_t size);
// The Luhn check digit of `digits`.
char luhnCheckDigit(std::string_view digits);

}  // namespace identity
}  // namespace tarn::sim
