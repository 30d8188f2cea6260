#pragma once
// The notices the contact windows show ("Hinweis" buttons) are the call log's notice dialogs;
// the program installs them here. Without them the buttons show nothing.

#include <functional>

class QWidget;

namespace orvanta {

struct ContactNotices {
    std::function<void(QWidget* parent)> designationHint; // advice on the contact designation
    std::function<void(QWidget* parent)> autoRejectHint;  // what rejecting a number means
};

void setContactNotices(ContactNotices notices);
[[nodiscard]] const ContactNotices& contactNotices();

} // namespace orvanta
