/* The functions of the platform library, each listed once: the prototypes in telix/telix_platform.h and the
 * binding of the plug-in are generated from this list, in this order. That header describes the rules for
 * all functions.
 *
 * Define TELIX_CALL(name, parameters, arguments) before including this file; it is undefined after the list.
 * `parameters` is the parameter list in parentheses, `arguments` the names of the parameters in parentheses,
 * to forward a call. TELIX_CALL_UNBOUND has the same form and stands for TELIX_CALL unless it is defined: it
 * marks the one function that the plug-in declares and never looks up.
 *
 * There is no include guard on purpose: each inclusion expands the list again. The formatter is off because
 * it parses a parameter list that begins with a pointer as a product. */
/* clang-format off */
#ifndef TELIX_CALL_UNBOUND
#define TELIX_CALL_UNBOUND TELIX_CALL
#endif

/* ==== APP: the set as applications see it ============================================================= */

/* Preferred languages and country of the viewer, as ISO codes of three letters, for the configuration
 * object. Each is called until it returns a string that is not empty, which the page's object then keeps.
 * Refused or empty: the page reads null. */
TELIX_CALL(TELIX_JS_APP_Config_GetPreferredAudioLanguage, (char** language), (language))
TELIX_CALL(TELIX_JS_APP_Config_GetPreferredSubtitleLanguage, (char** language), (language))
TELIX_CALL(TELIX_JS_APP_Config_GetCountryId, (char** country), (country))

/* Memory that is free for applications. The set defines the unit: the page gets the number unchanged. Called
 * at each call of the page. Refused: the page gets the last value, initially 0. */
TELIX_CALL(TELIX_JS_APP_GetFreeMem, (uint32_t* amount), (amount))

/* Registers and unregisters a callback for low memory. Registered when the first application manager is
 * embedded, unregistered when the last one is destroyed. The return codes are ignored. */
TELIX_CALL(TELIX_JS_APP_RegisterLowMemory, (TELIX_JS_APP_LOW_MEMORY_CB callback), (callback))
TELIX_CALL(TELIX_JS_APP_UnRegisterLowMemory, (TELIX_JS_APP_LOW_MEMORY_CB callback), (callback))

/* The groups of remote control keys that pages receive: 0x1 red, 0x2 green, 0x4 yellow, 0x8 blue, 0x10
 * navigation, 0x20 VCR keys, 0x40 scroll, 0x80 info, 0x100 numeric, 0x200 alpha. There is one mask for the
 * set, shared by all applications. The set routes the keys.
 *
 * The current mask. Called until it is not 0. Refused: the page reads 0. */
TELIX_CALL(TELIX_JS_APP_GetKeySetValue, (uint32_t* mask), (mask))

/* Sets a mask of any bits. Write the mask that is then in force through `granted`, which is NOT preset: the
 * page gets it as the result of its call. Refused: the page gets the mask that it set last. */
TELIX_CALL(TELIX_JS_APP_SetKeySetValue, (uint32_t mask, uint32_t* granted), (mask, granted))

/* The channel that the set presents. Called at each read. Refused: the page gets the last channel. */
TELIX_CALL(TELIX_JS_APP_GetCurrentChannel, (TELIX_JS_CM_HANDLE* channel), (channel))

/* ==== AV: players of the A/V control object =========================================================== */

/* Creates a player for one A/V control object. The codes are derived from the MIME type of the element:
 * container 2 MPEG audio, 512 a system stream or adaptive streaming, 1280 unknown; audio codec 1 MPEG audio,
 * 4 AAC, 0 unknown. `memoryAudio` is 1 if the URL ends in ".aac" or ".wav" (a short sound that may be loaded
 * completely), else 0. Refused: the browser cannot create the object. */
TELIX_CALL(TELIX_JS_AV_CreatePlayer,
           (TELIX_JS_AV_HANDLE* player, int32_t containerCode, int32_t audioCodecCode, uint32_t memoryAudio),
           (player, containerCode, audioCodecCode, memoryAudio))

/* Destroys a player; called after TELIX_JS_AV_Stop for it. The return code is ignored. */
TELIX_CALL(TELIX_JS_AV_DestroyPlayer, (TELIX_JS_AV_HANDLE player), (player))

/* Registers and unregisters the callback for messages of a player. Every player registers the same callback,
 * right after it has been created. Unregistering names no player: it is called once for each object that is
 * destroyed, after TELIX_JS_AV_DestroyPlayer, and also for an object that never got a player. Other players
 * still expect their messages, so it should only remove the registrations of players that have been
 * destroyed. The return codes are ignored. */
TELIX_CALL(TELIX_JS_AV_RegisterOnPlayStateChange,
           (TELIX_JS_AV_HANDLE player, TELIX_JS_AV_PLAYSTATE_CB callback), (player, callback))
TELIX_CALL(TELIX_JS_AV_UnregisterOnPlayStateChange, (TELIX_JS_AV_PLAYSTATE_CB callback), (callback))

/* The same for rights errors. */
TELIX_CALL(TELIX_JS_AV_RegisterOnDRMRightsError,
           (TELIX_JS_AV_HANDLE player, TELIX_JS_AV_DRM_RIGHTS_CB callback), (player, callback))
TELIX_CALL(TELIX_JS_AV_UnregisterOnDRMRightsError, (TELIX_JS_AV_DRM_RIGHTS_CB callback), (callback))

/* Plays `url` `playCount` times. `sourceCode` is 6 for ordinary media, 7 for a URL that can be fetched only
 * once, 23 for smooth streaming, 25 for HTTP live streaming; the other codes are those of
 * TELIX_JS_AV_CreatePlayer. The last two arguments are always 0. The set has one media pipeline: playing on
 * one player preempts any other. TELIX_AV_CB_MSG_PLAYSTART follows when presentation begins, or an error
 * message. Refused: the page's call of play returns false. */
TELIX_CALL(TELIX_JS_AV_Play,
           (TELIX_JS_AV_HANDLE player, const char* url, uint32_t playCount, int32_t sourceCode,
            int32_t containerCode, int32_t audioCodecCode, uint32_t reserved32, uint16_t reserved16),
           (player, url, playCount, sourceCode, containerCode, audioCodecCode, reserved32, reserved16))

/* Queues `url` to be played after the current media; the queue may hold several. Each begins with
 * TELIX_AV_CB_MSG_PLAYSTART, without TELIX_AV_CB_MSG_PLAYEND before it. A null `url` removes everything from
 * the queue. The codes are those of TELIX_JS_AV_Play. Refused: the page's call of queue returns false. */
TELIX_CALL(TELIX_JS_AV_Queue,
           (TELIX_JS_AV_HANDLE player, const char* url, uint32_t playCount, int32_t sourceCode,
            int32_t containerCode, int32_t audioCodecCode, uint32_t reserved32, uint16_t reserved16),
           (player, url, playCount, sourceCode, containerCode, audioCodecCode, reserved32, reserved16))

/* Looked up and never called: short sounds are played through TELIX_JS_AV_Play. */
TELIX_CALL(TELIX_JS_AV_PlaySound,
           (uint32_t value1, uint32_t value2, uint32_t value3, uint32_t value4, uint32_t value5,
            uint32_t value6, uint32_t value7),
           (value1, value2, value3, value4, value5, value6, value7))

/* Stops, pauses and resumes. All three are also called on the buffering thread. Pausing keeps the position
 * and the fetched media. Refused: after Stop the page's object keeps its state; after Pause too, unless the
 * return code is TELIX_RETCODE_PAUSE_TAKEN; after Resume the object counts as playing nevertheless. */
TELIX_CALL(TELIX_JS_AV_Stop, (TELIX_JS_AV_HANDLE player), (player))
TELIX_CALL(TELIX_JS_AV_Pause, (TELIX_JS_AV_HANDLE player), (player))
TELIX_CALL(TELIX_JS_AV_Resume, (TELIX_JS_AV_HANDLE player), (player))

/* Sets the volume, 0 to 100. Refused: the page's call returns false. */
TELIX_CALL(TELIX_JS_AV_SetVolume, (TELIX_JS_AV_HANDLE player, uint32_t volume), (player, volume))

/* Switches full screen on (1) or off (0). Refused: the page's object keeps its state. */
TELIX_CALL(TELIX_JS_AV_SetFullScreen, (TELIX_JS_AV_HANDLE player, ___UINT8 fullScreen), (player, fullScreen))

/* Sets the speed: `positive` is 1 forward, 0 backward; `integerPart` the absolute integer part; `tenths` the
 * first digit after the decimal point. 1.5 backward is 0, 1, 5. The arguments are the speed that was set
 * before the page's call; the requested speed comes with the next call. Refused: the speed is unchanged, and
 * the page gets no event. */
TELIX_CALL(TELIX_JS_AV_SetPlaySpeed,
           (TELIX_JS_AV_HANDLE player, ___UINT8 positive, int16_t integerPart, uint16_t tenths),
           (player, positive, integerPart, tenths))

/* Places the video plane. Called when the element has moved or changed its size. Refused: called again with
 * the next window event, even if nothing has changed. */
TELIX_CALL(TELIX_JS_AV_SetDisplayArea, (TELIX_JS_AV_HANDLE player, const TELIX_JS_DISPLAY_AREA* area),
           (player, area))

/* Returns the progress of the player. The library owns the records: it keeps one for each player, updates it
 * at each call, and keeps it valid until the next call for that player. The plug-in never frees a record,
 * but may write into it. Called at each read of position or duration by the page, and once a second by the
 * buffering thread while the player is playing, possibly concurrently: a record that lives as long as its
 * player is safe. Refused, or a null record: the page reads the last values, and buffering does not change
 * the player. */
TELIX_CALL(TELIX_JS_AV_GetPlayInfo, (TELIX_JS_AV_HANDLE player, TELIX_JS_AV_PLAY_INFO** info), (player, info))

/* Seeks to a position, in milliseconds from the start of the media. For MPEG audio and for URLs that begin
 * with "mms://", TELIX_JS_AV_Stop is called before and TELIX_JS_AV_Play after it: keep the position for
 * that. Refused: the page's call returns false. */
TELIX_CALL(TELIX_JS_AV_Seek, (TELIX_JS_AV_HANDLE player, uint32_t milliseconds), (player, milliseconds))

/* The components of one type: all of the media, or the active ones. Note the order of the outputs: first the
 * array, then the count. `components` must not be null on success, even if the count is 0: the browser
 * crashes with a null array. The function for all components is called until it has succeeded once, and the
 * page's object keeps the result; the function for active components is called at each call of the page.
 * `type` may be any number of the page. Refused: the page gets null. */
TELIX_CALL(TELIX_JS_AV_GetComponents,
           (TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPTYPE type, TELIX_JS_AVCOMPHANDLE** components,
            uint32_t* count),
           (player, type, components, count))
TELIX_CALL(TELIX_JS_AV_GetCurrActiveComponents,
           (TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPTYPE type, TELIX_JS_AVCOMPHANDLE** components,
            uint32_t* count),
           (player, type, components, count))

/* Selects and unselects a component, which may be any that a page has ever got. The return codes are
 * ignored. */
TELIX_CALL(TELIX_JS_AV_SelectComponent,
           (TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type),
           (player, component, type))
TELIX_CALL(TELIX_JS_AV_UnselectComponent,
           (TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type),
           (player, component, type))

/* Properties of a component. The first argument is the handle of the component, not of the player; `type` is
 * the type under which it was listed. Every property is called until it has succeeded once (a string: until
 * it is not empty) and is then kept, so it must not change for a component: return new handles when the
 * stream changes. The set defines the strings; the language is an ISO code. Flags: 0 is false, any other
 * value true. Aspect ratio: width divided by height, as 1.7777778; pages read two decimals. Refused: the
 * page reads an empty string, false or 0. */
TELIX_CALL(TELIX_JS_AV_AVComponent_GetEncoding,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, char** encoding),
           (component, type, encoding))
TELIX_CALL(TELIX_JS_AV_AVComponent_GetEncrypted,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, ___UINT8* encrypted),
           (component, type, encrypted))
TELIX_CALL(TELIX_JS_AV_AVComponent_GetAspectRatio,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, float* aspectRatio),
           (component, type, aspectRatio))
TELIX_CALL(TELIX_JS_AV_AVComponent_GetLanguage,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, char** language),
           (component, type, language))
TELIX_CALL(TELIX_JS_AV_AVComponent_GetAudioDescription,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, ___UINT8* audioDescription),
           (component, type, audioDescription))
TELIX_CALL(TELIX_JS_AV_AVComponent_GetAudioChannels,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, uint32_t* audioChannels),
           (component, type, audioChannels))
TELIX_CALL(TELIX_JS_AV_AVComponent_GetHearingImpaired,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, ___UINT8* hearingImpaired),
           (component, type, hearingImpaired))

/* ==== CAP: capabilities =============================================================================== */

/* The capabilities of the set as an XML document. Called until the page's parser has accepted the document.
 * Refused: the page reads null. */
TELIX_CALL(TELIX_JS_CAP_GetXmlCapabilities, (char** xml), (xml))

/* Whether the set supports the profile of that name, which is never empty; 0 is false, any other value true.
 * Refused: the page gets false. */
TELIX_CALL(TELIX_JS_CAP_HasCapability, (const char* profile, ___UINT8* supported), (profile, supported))

/* Number of further SD or HD videos that the set could decode at this moment. Called at each read. Refused:
 * the page reads the last value, initially 0. */
TELIX_CALL(TELIX_JS_CAP_GetExtraSDVideoDecodes, (uint32_t* count), (count))
TELIX_CALL(TELIX_JS_CAP_GetExtraHDVideoDecodes, (uint32_t* count), (count))

/* ==== CM: channels ==================================================================================== */

/* Looked up and never called. */
TELIX_CALL(TELIX_JS_CM_GetChannelHandle, (uint32_t value), (value))

/* All channels of the set, in the order of its list. Note the order of the outputs: first the count, then
 * the array. Without channels return the count 0 and an array that is not null. Called once for each
 * video/broadcast object, which keeps the list: later changes are not seen. Refused, or a null array: the
 * page reads null, and the next read calls again. */
TELIX_CALL(TELIX_JS_CM_GetChannelList, (uint32_t* count, TELIX_JS_CM_HANDLE** channels), (count, channels))

/* Properties of a channel. The type is 0 television, 1 radio, 2 other, and is called at each read; refused:
 * the page reads 3. The ids are called until they are not 0, the delivery system descriptor and the name
 * until they are not empty; refused or empty: the page reads null. Pages get the handle itself, in decimal,
 * as the "ccid" of the channel. */
TELIX_CALL(TELIX_JS_CM_GetChannelType, (TELIX_JS_CM_HANDLE channel, int32_t* type), (channel, type))
TELIX_CALL(TELIX_JS_CM_GetSid, (TELIX_JS_CM_HANDLE channel, uint32_t* sid), (channel, sid))
TELIX_CALL(TELIX_JS_CM_GetOnid, (TELIX_JS_CM_HANDLE channel, uint32_t* onid), (channel, onid))
TELIX_CALL(TELIX_JS_CM_GetTsid, (TELIX_JS_CM_HANDLE channel, uint32_t* tsid), (channel, tsid))
TELIX_CALL(TELIX_JS_CM_GetDsd, (TELIX_JS_CM_HANDLE channel, char** descriptor), (channel, descriptor))
TELIX_CALL(TELIX_JS_CM_GetName, (TELIX_JS_CM_HANDLE channel, char** name), (channel, name))

/* The channel with the given original network, transport stream and service id. 8191 is passed if the page
 * leaves out the transport stream. The page gets the channel only if the channel list contains its handle.
 * Refused: the page gets null. */
TELIX_CALL(TELIX_JS_CM_GetChannelByTriplet,
           (uint32_t onid, uint32_t tsid, uint32_t sid, TELIX_JS_CM_HANDLE* channel),
           (onid, tsid, sid, channel))

/* ==== SI: programmes and parental ratings ============================================================= */

/* Declared, but neither looked up nor called: a library need not have it. */
TELIX_CALL_UNBOUND(TELIX_JS_SI_GetCurrentProgrammeHandle, (uint32_t value), (value))

/* The programmes of the channel that is presented, the present one first. Note the order of the outputs:
 * first the count, then the array. For the count 0 the page reads null, and the next read calls again;
 * otherwise the page's object keeps the collection, while the properties below are called at each read.
 * Refused: as for the count 0. */
TELIX_CALL(TELIX_JS_SI_GetProgrammeHandles, (uint32_t* count, TELIX_JS_SI_HANDLE** programmes),
           (count, programmes))

/* Sets a property that a page has written. Times have the units of the functions that read them. Refused:
 * the page still reads the previous value. */
TELIX_CALL(TELIX_JS_SI_SetName, (TELIX_JS_SI_HANDLE programme, const char* name), (programme, name))
TELIX_CALL(TELIX_JS_SI_SetChannelID, (TELIX_JS_SI_HANDLE programme, const char* channelId),
           (programme, channelId))
TELIX_CALL(TELIX_JS_SI_SetDescription, (TELIX_JS_SI_HANDLE programme, const char* description),
           (programme, description))
TELIX_CALL(TELIX_JS_SI_SetStartTime, (TELIX_JS_SI_HANDLE programme, uint32_t startTime),
           (programme, startTime))
TELIX_CALL(TELIX_JS_SI_SetDuration, (TELIX_JS_SI_HANDLE programme, uint32_t duration), (programme, duration))

/* Name and description of a programme, called at each read. The string is `length` bytes, 1 to 255, and need
 * not be terminated. For the length 0 the string is neither read nor freed: return null with it. Refused or
 * empty: the page reads the last string, initially null. */
TELIX_CALL(TELIX_JS_SI_GetName, (TELIX_JS_SI_HANDLE programme, char** name, ___UINT8* length),
           (programme, name, length))
TELIX_CALL(TELIX_JS_SI_GetDescription, (TELIX_JS_SI_HANDLE programme, char** description, ___UINT8* length),
           (programme, description, length))

/* Start, duration and channel of a programme, called at each read. Pages expect seconds, the start since
 * 1970 (UTC), and for the channel its "ccid", the channel handle in decimal; all are passed unchanged.
 * Refused: the page reads the last value, initially 0 or null. */
TELIX_CALL(TELIX_JS_SI_GetStartTime, (TELIX_JS_SI_HANDLE programme, uint32_t* startTime),
           (programme, startTime))
TELIX_CALL(TELIX_JS_SI_GetDuration, (TELIX_JS_SI_HANDLE programme, uint32_t* duration), (programme, duration))
TELIX_CALL(TELIX_JS_SI_GetChannelID, (TELIX_JS_SI_HANDLE programme, char** channelId), (programme, channelId))

/* The parental ratings of a programme, first the count, then the array, which must hold `count` handles.
 * Called once and kept. Refused: the page reads null, and the next read calls again. */
TELIX_CALL(TELIX_JS_SI_GetParentalRatingHandles,
           (TELIX_JS_SI_HANDLE programme, uint32_t* count, TELIX_JS_SI_PARENTALRATING_HANDLE** ratings),
           (programme, count, ratings))

/* Properties of a parental rating. The strings (name, scheme, region) are called until they are not empty;
 * refused or empty: the page reads null, for the region undefined. Value and labels are called at each read,
 * with outputs that are NOT preset: write them on success. Refused: the page reads the last value, initially
 * 0. The set defines the bits of the labels. */
TELIX_CALL(TELIX_JS_SI_PARENTALRATING_GetName, (TELIX_JS_SI_PARENTALRATING_HANDLE rating, char** name),
           (rating, name))
TELIX_CALL(TELIX_JS_SI_PARENTALRATING_GetScheme, (TELIX_JS_SI_PARENTALRATING_HANDLE rating, char** scheme),
           (rating, scheme))
TELIX_CALL(TELIX_JS_SI_PARENTALRATING_GetValue, (TELIX_JS_SI_PARENTALRATING_HANDLE rating, int32_t* value),
           (rating, value))
TELIX_CALL(TELIX_JS_SI_PARENTALRATING_GetLabels, (TELIX_JS_SI_PARENTALRATING_HANDLE rating, int32_t* labels),
           (rating, labels))
TELIX_CALL(TELIX_JS_SI_PARENTALRATING_GetRegion, (TELIX_JS_SI_PARENTALRATING_HANDLE rating, char** region),
           (rating, region))

/* The threshold that the viewer has set for a scheme. The output is NOT preset. Called at each read.
 * Refused: the page reads null. */
TELIX_CALL(TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold,
           (TELIX_JS_SI_PARENTALRATINGSCHEME_HANDLE scheme, int32_t* threshold), (scheme, threshold))

/* All parental rating schemes of the set: first the count, then the array of records, whose pointer is NOT
 * preset. The plug-in copies records and strings before it makes any further call, and frees none of them.
 * For the count 0 the page gets an empty collection. Called once for each parental control manager, which
 * keeps the result. Refused: the page reads null, and the next read calls again. */
TELIX_CALL(TELIX_JS_SI_PARENTALCONTROL_GetParentalRatingSchemes,
           (uint32_t* count, PARENTALRATTINGSCHEME_STRUCT_T_TAG** schemes), (count, schemes))

/* ==== VB: the video/broadcast object ================================================================== */

/* Returns a handle for a new video/broadcast object. It must be different from all handles in use: events
 * are dispatched by it, and of two objects with one handle only one gets them. Refused: the object has the
 * handle 0 and default values; IsFullScreen, SetFullScreen, SetWidth, SetHeight, GetCurrentChannel and the
 * two CreateChannelObject functions are then called with the handle 0 and should refuse. */
TELIX_CALL(TELIX_JS_VB_GetHandle, (TELIX_JS_VB_HANDLE* object), (object))

/* Releases the tuner and the video plane of the object. It may be called several times for one handle (by
 * the page, and when the object is destroyed), other calls may follow it, and
 * TELIX_JS_VB_UnRegisterStreamEvent is called after it: calls with a released handle must be harmless. The
 * return code is ignored. */
TELIX_CALL(TELIX_JS_VB_Release, (TELIX_JS_VB_HANDLE object), (object))

/* Stops the presentation. The return code is only logged. */
TELIX_CALL(TELIX_JS_VB_Stop, (TELIX_JS_VB_HANDLE object), (object))

/* Presents the current channel of the set in the object. The return code is only logged. */
TELIX_CALL(TELIX_JS_VB_BindToCurrChannel, (TELIX_JS_VB_HANDLE object), (object))

/* Tune requests; they return without waiting, and TELIX_JS_VB_CHANNEL_CHANGE_CB or
 * TELIX_JS_VB_CHANNEL_ERROR_CB follows. The channel 0 means none. `trickPlay` is the second argument of the
 * page's call of setChannel (trick play), 0 if the page leaves it out. PrevChannel and NextChannel return
 * the channel that is selected at the time of the call, before tuning: the page's current channel object
 * changes to it immediately. Refused: the page gets no error. */
TELIX_CALL(TELIX_JS_VB_SetChannel, (TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel, ___UINT8 trickPlay),
           (object, channel, trickPlay))
TELIX_CALL(TELIX_JS_VB_PrevChannel, (TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE* channel),
           (object, channel))
TELIX_CALL(TELIX_JS_VB_NextChannel, (TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE* channel),
           (object, channel))

/* The channel that the object presents. Called at each read; as long as the handle is the same, the page
 * gets the same object. Refused: the page reads null. */
TELIX_CALL(TELIX_JS_VB_GetCurrentChannel, (TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE* channel),
           (object, channel))

/* Requests to tune to a service, like TELIX_JS_VB_SetChannel. The ids are the numbers of the page,
 * unchecked; 8191 is passed if the page leaves out the transport stream. The return code is ignored. */
TELIX_CALL(TELIX_JS_VB_SetChannelByTriplet,
           (TELIX_JS_VB_HANDLE object, int32_t onid, int32_t tsid, int32_t sid), (object, onid, tsid, sid))

/* Creates a channel that need not be in the channel list, from a triplet (8191 as above) or from a delivery
 * system descriptor of `length` bytes and a service id; the descriptor is not null, even if the length is 0.
 * `idType` is the number of the page, truncated to 8 bits. The channel has to work with the CM functions and
 * TELIX_JS_VB_SetChannel. Refused: the page gets null. */
TELIX_CALL(TELIX_JS_VB_CreateChannelObjectByTriplet,
           (TELIX_JS_VB_HANDLE object, ___UINT8 idType, uint32_t onid, uint32_t tsid, uint32_t sid,
            TELIX_JS_CM_HANDLE* channel),
           (object, idType, onid, tsid, sid, channel))
TELIX_CALL(TELIX_JS_VB_CreateChannelObjectByDsd,
           (TELIX_JS_VB_HANDLE object, ___UINT8 idType, const ___UINT8* descriptor, uint32_t length,
            uint32_t sid, TELIX_JS_CM_HANDLE* channel),
           (object, idType, descriptor, length, sid, channel))

/* Switches full screen on (1) or off (0), and returns which it is (0 is off, any other value on). Set is
 * called only for a change, Is at each read. Refused: the page's object keeps its state. */
TELIX_CALL(TELIX_JS_VB_SetFullScreen, (TELIX_JS_VB_HANDLE object, ___UINT8 fullScreen), (object, fullScreen))
TELIX_CALL(TELIX_JS_VB_IsFullScreen, (TELIX_JS_VB_HANDLE object, ___UINT8* fullScreen), (object, fullScreen))

/* Sets width and height of the video plane in pixels, and the play state, to any number that a page has
 * written. Width and height are called one iteration of the main loop after the page's write. Refused: for
 * width and height the page still reads the previous value; the return code for the play state is ignored. */
TELIX_CALL(TELIX_JS_VB_SetWidth, (TELIX_JS_VB_HANDLE object, int32_t width), (object, width))
TELIX_CALL(TELIX_JS_VB_SetHeight, (TELIX_JS_VB_HANDLE object, int32_t height), (object, height))
TELIX_CALL(TELIX_JS_VB_SetPlayBackState, (TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state),
           (object, state))

/* Returns the same. Width and height are called until they are not 0, the play state at each read. Refused:
 * the page reads the last value, initially 0. */
TELIX_CALL(TELIX_JS_VB_GetWidth, (TELIX_JS_VB_HANDLE object, int32_t* width), (object, width))
TELIX_CALL(TELIX_JS_VB_GetHeight, (TELIX_JS_VB_HANDLE object, int32_t* height), (object, height))
TELIX_CALL(TELIX_JS_VB_GetPlayBackState, (TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T* state),
           (object, state))

/* Places the video plane, like TELIX_JS_AV_SetDisplayArea. */
TELIX_CALL(TELIX_JS_VB_SetDisplayArea, (TELIX_JS_VB_HANDLE object, const TELIX_JS_DISPLAY_AREA* area),
           (object, area))

/* Registers and unregisters the callbacks for events of all video/broadcast objects. Registered once, when
 * the first object has got its handle, and unregistered when the last object is destroyed; in between, each
 * callback is called with the handle of the object that the event concerns. The return codes are ignored. */
TELIX_CALL(TELIX_JS_VB_RegisterOnChannelChangeSucceeded, (TELIX_JS_VB_CHANNEL_CHANGE_CB callback), (callback))
TELIX_CALL(TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded, (TELIX_JS_VB_CHANNEL_CHANGE_CB callback),
           (callback))
TELIX_CALL(TELIX_JS_VB_RegisterOnChannelChangeError, (TELIX_JS_VB_CHANNEL_ERROR_CB callback), (callback))
TELIX_CALL(TELIX_JS_VB_UnRegisterOnChannelChangeError, (TELIX_JS_VB_CHANNEL_ERROR_CB callback), (callback))
TELIX_CALL(TELIX_JS_VB_RegisterOnFullScreenChange, (TELIX_JS_VB_FULLSCREEN_CB callback), (callback))
TELIX_CALL(TELIX_JS_VB_UnRegisterOnFullScreenChange, (TELIX_JS_VB_FULLSCREEN_CB callback), (callback))
TELIX_CALL(TELIX_JS_VB_RegisterOnPlayStateChange, (TELIX_JS_VB_PLAYSTATE_CB callback), (callback))
TELIX_CALL(TELIX_JS_VB_UnRegisterOnPlayStateChange, (TELIX_JS_VB_PLAYSTATE_CB callback), (callback))

/* The same. `object` is the first object, but these registrations are also for the events of all objects and
 * outlive it. */
TELIX_CALL(TELIX_JS_VB_RegisterOnProgrammesChanged,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_VB_PROGRAMMES_CB callback), (object, callback))
TELIX_CALL(TELIX_JS_VB_RegisterOnParentalRatingChange,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_VB_PARENTAL_RATING_CB callback), (object, callback))
TELIX_CALL(TELIX_JS_VB_RegisterOnParentalRatingError,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_VB_PARENTAL_RATING_CB callback), (object, callback))
TELIX_CALL(TELIX_JS_VB_UnRegisterOnProgrammesChanged, (TELIX_JS_VB_PROGRAMMES_CB callback), (callback))
TELIX_CALL(TELIX_JS_VB_UnRegisterOnParentalRatingChange, (TELIX_JS_VB_PARENTAL_RATING_CB callback),
           (callback))
TELIX_CALL(TELIX_JS_VB_UnRegisterOnParentalRatingError, (TELIX_JS_VB_PARENTAL_RATING_CB callback), (callback))

/* Subscribes to and unsubscribes from a stream event of the broadcast. The strings are the id of the event,
 * the component tag and the name of the event. The tag is as the description of the event has it if that
 * came from the broadcast; if it was fetched by HTTP, its decimal number is passed in hexadecimal, in lower
 * case and without prefix (31 is passed as 1f). There may be two subscriptions to the same event. The name
 * may differ between subscription and unsubscription: compare id and tag. The return codes are ignored. */
TELIX_CALL(TELIX_JS_VB_RegisterStreamEvent,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_VB_STREAM_EVENT_CB callback, const char* eventId,
            const char* componentTag, const char* eventName),
           (object, callback, eventId, componentTag, eventName))
TELIX_CALL(TELIX_JS_VB_UnRegisterStreamEvent,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_VB_STREAM_EVENT_CB callback, const char* eventId,
            const char* componentTag, const char* eventName),
           (object, callback, eventId, componentTag, eventName))

/* Components of the channel, like the functions of the same name in the AV family: first the array, which
 * must not be null on success, then the count. */
TELIX_CALL(TELIX_JS_VB_GetComponents,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPTYPE type, TELIX_JS_AVCOMPHANDLE** components,
            uint32_t* count),
           (object, type, components, count))
TELIX_CALL(TELIX_JS_VB_GetCurrActiveComponents,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPTYPE type, TELIX_JS_AVCOMPHANDLE** components,
            uint32_t* count),
           (object, type, components, count))
TELIX_CALL(TELIX_JS_VB_SelectComponent,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type),
           (object, component, type))
TELIX_CALL(TELIX_JS_VB_UnselectComponent,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type),
           (object, component, type))

/* Properties of a component of the broadcast, as in the AV family: the first argument is the handle of the
 * component. */
TELIX_CALL(TELIX_JS_VB_AVComponent_GetEncoding,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, char** encoding),
           (component, type, encoding))
TELIX_CALL(TELIX_JS_VB_AVComponent_GetEncrypted,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, ___UINT8* encrypted),
           (component, type, encrypted))
TELIX_CALL(TELIX_JS_VB_AVComponent_GetAspectRatio,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, float* aspectRatio),
           (component, type, aspectRatio))
TELIX_CALL(TELIX_JS_VB_AVComponent_GetLanguage,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, char** language),
           (component, type, language))
TELIX_CALL(TELIX_JS_VB_AVComponent_GetAudioDescription,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, ___UINT8* audioDescription),
           (component, type, audioDescription))
TELIX_CALL(TELIX_JS_VB_AVComponent_GetAudioChannels,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, uint32_t* audioChannels),
           (component, type, audioChannels))
TELIX_CALL(TELIX_JS_VB_AVComponent_GetHearingImpaired,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, ___UINT8* hearingImpaired),
           (component, type, hearingImpaired))

/* ==== DRM: messages to a DRM agent ==================================================================== */

/* Registers and unregisters the callback for results of messages. Every DRM agent registers the same
 * callback when it is created and unregisters it when it is destroyed, while others may still exist: count
 * the registrations, and do not call the callback after the last one. The return codes are ignored. */
TELIX_CALL(TELIX_JS_DRM_RegisterOnDRMMessageResult, (TELIX_JS_DRM_MESSAGE_RESULT_CB callback), (callback))
TELIX_CALL(TELIX_JS_DRM_UnregisterOnDRMMessageResult, (TELIX_JS_DRM_MESSAGE_RESULT_CB callback), (callback))

/* Sends a message of a MIME type to the DRM system of that id, and returns an id for the message; the result
 * follows through the callback with the same id. Refused, or a null id: the page's call returns the id of
 * the previous message, or null if there was none, and no result is expected. */
TELIX_CALL(TELIX_JS_DRM_SendDRMMessage,
           (const char* messageType, const char* message, const char* drmSystemId, char** messageId),
           (messageType, message, drmSystemId, messageId))

/* clang-format on */

#undef TELIX_CALL
#undef TELIX_CALL_UNBOUND
