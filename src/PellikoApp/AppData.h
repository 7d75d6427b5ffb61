#pragma once

#include "PellikoUploadDataManager/UploadItem.h"

#include <Evas.h>
#include <app_control.h>
#include <cstdint>

typedef struct _Elm_Theme Elm_Theme;
typedef struct _Ecore_Pipe Ecore_Pipe;
typedef struct _GList GList;
typedef struct tapi_handle TapiHandle;
typedef struct _Uxt_Color_Table Uxt_Color_Table;
typedef struct _Uxt_Font_Table Uxt_Font_Table;

namespace pelliko
{

/// What the application is doing; the numbers are compared everywhere and fixed (3 stays free).
enum PellikoOperationType : int32_t {
    OPERATION_DEFAULT = 0,
    OPERATION_PUSH = 1,
    OPERATION_SEND_SMS = 2,
    OPERATION_SHARE = 4,
    OPERATION_MULTI_SHARE = 5,
    OPERATION_UPLOADING_NOTI_PRESSED = 6
};

/// Values of action_type.
enum PellikoActionType : int32_t { ACTION_UPLOAD = 0, ACTION_RESHARE_UPLOAD = 1 };

constexpr int maxNumberIds = 10;        ///< recipients kept from one request
constexpr int maxUploadResumeIds = 100; ///< ids to resume kept from one request
constexpr int TAPI_HANDLE_MAX = 2;      ///< SIM slots that are asked for

/// The one record that every module works on. Fields of one launch request stay for the next; each
/// writer frees or clears what it owns. No locks: a worker starts after the fields that it reads
/// are set and hands back before it signals the main loop. Texts are owned heap copies unless said
/// otherwise.
class PellikoAppData
{
public:
    PellikoAppData() = default;
    virtual ~PellikoAppData();
    PellikoAppData(const PellikoAppData &) = delete;
    PellikoAppData &operator=(const PellikoAppData &) = delete;

    Evas_Object *win = nullptr;           ///< popup-style main window, made when first needed
    Evas_Object *progressbar = nullptr;   ///< of the shown popup, deleted with it
    Evas_Object *cancel_button = nullptr; ///< of the uploading-status popup
    Evas_Object *popup_layout = nullptr;  ///< content layout of the shown popup
    Evas_Object *processing_popup = nullptr;
    Evas_Object *wifi_check_box = nullptr;
    app_control_h app_control = nullptr; ///< clone of the last launch request

    int32_t number_id_count = 0; ///< as long as the request's list: read min(count, maxNumberIds)
    int32_t number_id_list[maxNumberIds] = {};

    uint8_t is_resume_by_reboot = 0; ///< 1: plain launch with nothing to share
    uint8_t has_upload_resume = 0;   ///< 1: the launch carried ids to resume
    int32_t upload_resume_count =
        0; ///< as long as the request's list: read min(count, maxUploadResumeIds)
    int32_t upload_resume_id_list[maxUploadResumeIds] = {};

    int32_t rotation = 0;            ///< of the window, degrees
    int32_t req_id_to_reshare = 0;   ///< an earlier upload to share again, 0: none
    int32_t reshared_request_id = 0; ///< given back by the reshare call
    int32_t action_type = 0;         ///< PellikoActionType
    int32_t operation_type = 0;      ///< PellikoOperationType

    Evas_Object *popup = nullptr; ///< confirmation or uploading-status popup while one is shown
    Elm_Theme *theme = nullptr;
    uint8_t wifi_check = 0; ///< 1: upload over Wi-Fi only
    UploadItem *upload_item = nullptr;
    char *sender_ccc = nullptr; ///< country calling code of the user, set once
    int32_t sim_index = 0;      ///< SIM slot used for data, from 0
    TapiHandle *tapi_handle[4] = {};
    char **cp_name_list = nullptr;

    char *sender_msisdn = nullptr;        ///< of the last received share
    char *sender_name = nullptr;          ///< contact name, or the number
    char *sender_name_fallback = nullptr; ///< not owned
    int32_t thumbnails_count = 0;
    Ecore_Pipe *pipe = nullptr; ///< from the push worker to the main loop
    char *sender_image_path = nullptr;
    char **contents_token_list = nullptr;
    int32_t token_length = 0;
    char **contents_token_list_head = nullptr; ///< second pointer to the same array
    GList *push_info_list = nullptr;           ///< char *
    int32_t data_index = 0;

    char *url = nullptr; ///< SMS: the address in the message
    char *from_msisdn = nullptr;
    char *expired_time = nullptr; ///< decimal seconds since the epoch
    char *req_id = nullptr;       ///< decimal request id
    char *sms_key = nullptr;      ///< SMS: the share in the journal; null: the request has none
    int32_t file_count = 0;
    int32_t to_msisdn_count = 0;
    Eina_List *to_msisdn_list = nullptr; ///< char *

    char *vcf_path = nullptr;
    Uxt_Color_Table *color_table = nullptr;
    Uxt_Font_Table *font_table = nullptr;
};

/// The record; never null, lives as long as the process, exists before main() runs.
PellikoAppData *getAppData();

/// 1 after an upload notification was tapped; the confirmation popup's back key resets it.
extern uint8_t is_noti_pressed;

/// 1 while the popup of a tapped notification is shown: only then status reports refresh it.
extern uint8_t popup_update_enabled;

/// Files of the request in hand that were left out because their type is not supported.
extern int32_t unsupported_file_count;

} // namespace pelliko
