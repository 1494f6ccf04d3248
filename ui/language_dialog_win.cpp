#include <windows.h>

#include "ui/language_dialog.h"

#include "resources/resource_ids.h"
#include "text/localization.h"

namespace {

// What the dialog procedure works with; it arrives with the dialog's
// initialisation and is kept in the dialog's user data.
struct DialogContext {
    const LanguageDialog& dialog;
    std::string chosen;
};

// The list sorts what it shows; each entry carries its position in the
// language table, so the chosen name is always the one shown.
void FillList(HWND list, const LanguageDialog& dialog) {
    const std::vector<std::string>& names = dialog.GetNames();
    const int current = dialog.CurrentIndex();
    for (size_t i = 0; i < names.size(); ++i) {
        const LRESULT position = SendMessageA(list, CB_ADDSTRING, 0, reinterpret_cast<LPARAM>(names[i].c_str()));
        if (position < 0) continue;
        SendMessageA(list, CB_SETITEMDATA, static_cast<WPARAM>(position), static_cast<LPARAM>(i));
    }
    for (LRESULT position = 0; current >= 0 && position < static_cast<LRESULT>(names.size()); ++position) {
        if (SendMessageA(list, CB_GETITEMDATA, static_cast<WPARAM>(position), 0) == current) {
            SendMessageA(list, CB_SETCURSEL, static_cast<WPARAM>(position), 0);
        }
    }
}

std::string SelectedName(HWND list, const LanguageDialog& dialog) {
    const LRESULT position = SendMessageA(list, CB_GETCURSEL, 0, 0);
    if (position < 0) return std::string();
    return dialog.NameAt(SendMessageA(list, CB_GETITEMDATA, static_cast<WPARAM>(position), 0));
}

INT_PTR CALLBACK DialogProcedure(HWND dialog, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == WM_INITDIALOG) {
        SetWindowLongPtrW(dialog, GWLP_USERDATA, lParam);
        SetWindowTextW(dialog, GetWindowTitle().c_str());
        FillList(GetDlgItem(dialog, IDC_LANGUAGE_LIST), reinterpret_cast<DialogContext*>(lParam)->dialog);
        return TRUE;
    }
    auto* context = reinterpret_cast<DialogContext*>(GetWindowLongPtrW(dialog, GWLP_USERDATA));
    if (context == nullptr) return FALSE;
    const bool command = message == WM_COMMAND;
    if (command && LOWORD(wParam) == IDOK) {
        context->chosen = SelectedName(GetDlgItem(dialog, IDC_LANGUAGE_LIST), context->dialog);
        EndDialog(dialog, IDOK);
        return TRUE;
    }
    if ((command && LOWORD(wParam) == IDCANCEL) || message == WM_CLOSE) {
        EndDialog(dialog, IDCANCEL);
        return TRUE;
    }
    return FALSE;
}

}  // namespace

bool LanguageDialog::Run(std::string& name) {
    DialogContext context{*this, std::string()};
    const INT_PTR result = DialogBoxParamW(GetModuleHandleW(nullptr), MAKEINTRESOURCEW(IDD_LANGUAGE), nullptr,
                                           DialogProcedure, reinterpret_cast<LPARAM>(&context));
    if (result != IDOK) return false;
    chosenName = context.chosen;
    name = chosenName;
    return true;
}
