package tarnwick;

/**
	An EOS result code as the library hands it to the game (sign-in, leaving
	and destroying lobbies). The named values are the codes a game commonly
	meets; any other EOS code converts to and from `Int` unchanged.
**/
enum abstract Result(Int) from Int to Int {
	var Success = 0;
	var NoConnection = 1;
	var InvalidCredentials = 2;
	/** The Connect login found no user; the library creates it itself. **/
	var InvalidUser = 3;
	var InvalidAuth = 4;
	var AccessDenied = 5;
	var TooManyRequests = 8;
	var AlreadyPending = 9;
	var InvalidParameters = 10;
	var NotConfigured = 14;
	var AlreadyConfigured = 15;
	var Canceled = 17;
	var NotFound = 18;
	var OperationWillRetry = 19;
	var NoChange = 20;
	var LimitExceeded = 22;
	var TimedOut = 27;
	var InvalidState = 38;
	var UnexpectedError = 0x7fffffff;

	/** True for `Success`. **/
	public inline function isSuccess():Bool {
		return this == 0;
	}

	/** The EOS name of the code (e.g. `EOS_NotFound`), or `EOS_Result(<code>)` for codes not named here. **/
	public function toString():String {
		return switch (cast this : Result) {
			case Success: "EOS_Success";
			case NoConnection: "EOS_NoConnection";
			case InvalidCredentials: "EOS_InvalidCredentials";
			case InvalidUser: "EOS_InvalidUser";
			case InvalidAuth: "EOS_InvalidAuth";
			case AccessDenied: "EOS_AccessDenied";
			case TooManyRequests: "EOS_TooManyRequests";
			case AlreadyPending: "EOS_AlreadyPending";
			case InvalidParameters: "EOS_InvalidParameters";
			case NotConfigured: "EOS_NotConfigured";
			case AlreadyConfigured: "EOS_AlreadyConfigured";
			case Canceled: "EOS_Canceled";
			case NotFound: "EOS_NotFound";
			case OperationWillRetry: "EOS_OperationWillRetry";
			case NoChange: "EOS_NoChange";
			case LimitExceeded: "EOS_LimitExceeded";
			case TimedOut: "EOS_TimedOut";
			case InvalidState: "EOS_InvalidState";
			case UnexpectedError: "EOS_UnexpectedError";
			default: "EOS_Result(" + this + ")";
		}
	}
}
