#include "collectors/cellular_snapshot.h"

#include <array>
#include <utility>

#include "platform/agent_log.h"
#include "platform/property_list_writer.h"
#include "platform/telephony.h"

namespace zal {
namespace {

constexpr std::string_view kYes = "YES";
constexpr std::string_view kNo = "NO";

struct SignalRow {
  std::string_view key;
  int CellularSignal::*number;
};
/// One query gives all of them.
constexpr std::array kSignalRows = {
    SignalRow{"rssi", &CellularSignal::rssi},
    SignalRow{"percentage", &CellularSignal::percentage},
    SignalRow{"graded", &CellularSignal::graded},
};

enum class Form {
  asReturned,
  yesOrNo,
  second,  ///< the other value of the query of the row before
};

struct QueryRow {
  std::string_view key;
  CellularQuery query;
  Form form;
};
constexpr std::array kQueryRows = {
    QueryRow{"operator-name", CellularQuery::operatorName, Form::asReturned},
    QueryRow{"provider-name", CellularQuery::providerName, Form::asReturned},
    QueryRow{"allowed-mode", CellularQuery::allowedMode, Form::asReturned},
    QueryRow{"numeric-network-code-mode", CellularQuery::numericNetworkCode, Form::asReturned},
    QueryRow{"firmware-version", CellularQuery::firmwareVersion, Form::asReturned},
    QueryRow{"firmware-baseline-version", CellularQuery::firmwareBaselineVersion, Form::asReturned},
    QueryRow{"bootloader-version", CellularQuery::bootloaderVersion, Form::asReturned},
    QueryRow{"mobile-identity", CellularQuery::mobileIdentity, Form::asReturned},
    QueryRow{"sim-identity", CellularQuery::simIdentity, Form::asReturned},
    QueryRow{"subscriber-identity", CellularQuery::subscriberIdentity, Form::asReturned},
    QueryRow{"subscriber-country-code", CellularQuery::subscriberCountryCode, Form::asReturned},
    QueryRow{"sim-status", CellularQuery::simStatus, Form::asReturned},
    QueryRow{"registration-status", CellularQuery::registrationStatus, Form::asReturned},
    QueryRow{"radio-rat", CellularQuery::radioAccessTechnology, Form::asReturned},
    QueryRow{"service-center-address", CellularQuery::serviceCenterAddress, Form::asReturned},
    QueryRow{"home-country", CellularQuery::isInHomeCountry, Form::yesOrNo},
    QueryRow{"tty-mode", CellularQuery::ttyMode, Form::yesOrNo},
    QueryRow{"data-attached", CellularQuery::isDataAttached, Form::yesOrNo},
    QueryRow{"reset-state", CellularQuery::resetState, Form::yesOrNo},
    QueryRow{"data-enabled", CellularQuery::isDataEnabled, Form::yesOrNo},
    QueryRow{"data-disallowed", CellularQuery::isDataDisallowed, Form::yesOrNo},
    QueryRow{"international-data-enabled", CellularQuery::internationalDataAccess, Form::yesOrNo},
    QueryRow{"cell-id", CellularQuery::servingCellId, Form::asReturned},
    QueryRow{"packet-context-count", CellularQuery::packetContextCount, Form::asReturned},
    QueryRow{"rat-selection", CellularQuery::radioSelection, Form::asReturned},
    QueryRow{"rat-preferred", CellularQuery::radioSelection, Form::second},
    QueryRow{"active-supported-bands", CellularQuery::activeAndSupportedBands, Form::asReturned},
    QueryRow{"sim-mcc", CellularQuery::lastKnownSubscriberCountryCode, Form::asReturned},
    QueryRow{"sim-mnc", CellularQuery::subscriberNetworkCode, Form::asReturned},
    QueryRow{"network-mcc", CellularQuery::currentNetworkCountryCode, Form::asReturned},
    QueryRow{"network-mnc", CellularQuery::currentNetworkCode, Form::asReturned},
};

Value failed() { return std::string(CellularSnapshot::kFailed); }

/// What stands under the row's key; null where the service has no value.
Value valueOf(Form form, const CellularAnswer& answer) {
  if (form == Form::second) return answer.second;
  if (form == Form::asReturned) return answer.value;
  const bool* const yes = answer.value.as<bool>();
  return std::string(yes != nullptr && *yes ? kYes : kNo);
}

void addSignal(TelephonyConnection& connection, ValueMap& state) {
  const auto signal = connection.signalStrength();
  for (const SignalRow& row : kSignalRows) {
    state.emplace(row.key, signal ? Value(std::int64_t{*signal.*row.number}) : failed());
  }
}

void addQueries(TelephonyConnection& connection, ValueMap& state) {
  std::optional<CellularAnswer> answer;
  for (const QueryRow& row : kQueryRows) {
    if (row.form != Form::second) answer = connection.query(row.query);
    Value value = answer ? valueOf(row.form, *answer) : failed();
    if (value.as<std::nullptr_t>() == nullptr) state.emplace(row.key, std::move(value));
  }
}

}  // namespace

ValueMap CellularSnapshot::CopyCellularState() {
  ValueMap state;
  const auto connection = _telephony.connect();
  if (!connection) {
    _log.warning("CT Network information query failed, could not connect to Telvane");
    return state;
  }
  addSignal(*connection, state);
  addQueries(*connection, state);
  return state;
}

void CellularSnapshot::WriteCellularState(const std::string& directory) {
  // Whoever reads the dump sees whether the file is there.
  (void)_propertyLists.write(CopyCellularState(), directory + "/" + std::string(kFileName));
}

bool CellularSnapshot::DumpBasebandState(const std::optional<std::string>& reason, const std::string& label) {
  const std::string text = reason ? *reason : "Baseband dump for " + label + " logging";
  const auto connection = _telephony.connect();
  if (!connection) {
    _log.warning("Baseband snapshot failed, could not connect to Telvane");
    return false;
  }
  connection->dumpBasebandState(text);
  _log.notice("Baseband snapshot successful");
  return true;
}

}  // namespace zal
