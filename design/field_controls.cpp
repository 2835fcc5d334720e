#include "design/field_controls.h"

namespace cx {

FieldControls ControlsForType(FieldType type) {
  FieldControls c;
  if (type == FieldType::NotUsed) return c;
  c.visible = true;
  c.exportPrint = type != FieldType::Image;
  switch (type) {
    case FieldType::Image:
    case FieldType::Link:
    case FieldType::Heading: break;
    default: c.pixelsShown = true;
  }
  switch (type) {
    case FieldType::Text:
      c.maxCharacters = c.editPopups = c.popupsAppend = true;
      break;
    case FieldType::Integer:
    case FieldType::Note:
      c.editPopups = c.popupsAppend = true;
      break;
    case FieldType::Float:
      c.editPopups = c.popupsAppend = c.placesAfterDecimal = true;
      break;
    case FieldType::PopUp:
      c.editPopups = c.defaultValue = true;
      break;
    case FieldType::Date: c.dateBehavior = true; break;
    case FieldType::Time: c.timeBehavior = true; break;
    case FieldType::Link: c.otherDatabase = c.showValueFrom = true; break;
    case FieldType::Linked: c.otherDatabase = true; break;
    case FieldType::DBPopup:
      c.maxCharacters = c.popupsAppend = c.otherDatabase = c.group = true;
      break;
    case FieldType::Calculated: c.calc = true; break;
    default: break;
  }
  return c;
}

OperandControls ControlsForOperand(int listIndex) {
  OperandControls c;
  c.constant = listIndex <= 0;
  c.prevRecord = listIndex > 0;
  return c;
}

}  // namespace cx
