#include "platform/linux/bus/network/bus_cellular_data.h"

#include <memory>
#include <utility>

#include "platform/linux/bus/network/cellular_data_question.h"
#include "platform/linux/bus_module/bus_addresses.h"

namespace zal {

void BusCellularData::ask(Handler handler) {
  if (_inquiry.isOpen()) return handler(CellularData::noAnswer);
  if (!mayBeThere(_host.systemBus)) return handler(CellularData::noService);
  auto question = std::make_shared<CellularDataQuestion>();
  _inquiry.ask(question,
               [question, handler = std::move(handler)](InquiryEnd) { handler(question->answer()); });
}

}  // namespace zal
